// system secpolicy domain list: every security domain with its enforcement level now, ordered
// by name, as a list of "DomainList" structures. Any host failure while listing (one domain's
// level included) becomes the host's message as the error and no list; a failure to build the
// access control object leaves ExecuteInternal.
#pragma once

#include "frame/CommandModel.h"

namespace TarselCli {
namespace System {

class SecpolicyDomainList : public virtual AutoCli::Command {
public:
    static boost::shared_ptr<SecpolicyDomainList> New();
    virtual ~SecpolicyDomainList();

    InputSpecPtr GetInputSpecInternal() override;
    OutputSpecPtr GetOutputSpecInternal() override;
    void ExecuteInternal(const InputPtr& input, const OutputPtr& output) override;
    virtual StructPtr GetOutputStructure();

protected:
    SecpolicyDomainList();
};

}  // namespace System
}  // namespace TarselCli
