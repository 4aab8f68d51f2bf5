// system secpolicy domain set: sets the enforcement level of one named domain or of all of
// them, until the next boot. The two option conflicts are refused before anything changes; the
// host layer checks the name and the level, and its refusal becomes the error. A failure to
// build the access control object leaves ExecuteInternal.
#pragma once

#include "frame/CommandModel.h"

namespace TarselCli {
namespace System {

class SecpolicyDomainSet : public virtual AutoCli::Command {
public:
    static boost::shared_ptr<SecpolicyDomainSet> New();
    virtual ~SecpolicyDomainSet();

    InputSpecPtr GetInputSpecInternal() override;
    OutputSpecPtr GetOutputSpecInternal() override;
    void ExecuteInternal(const InputPtr& input, const OutputPtr& output) override;

protected:
    SecpolicyDomainSet();
};

}  // namespace System
}  // namespace TarselCli
