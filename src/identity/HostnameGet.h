// system hostname get: the host name, DNS domain and fully qualified name of the host's
// default network stack, as one "FullyQualifiedHostName" structure. A host failure while reading
// becomes the host's message as the error; a failure to build the DNS configuration object
// leaves ExecuteInternal.
#pragma once

#include "frame/CommandModel.h"

namespace TarselCli {
namespace System {

class HostnameGet : public virtual AutoCli::Command {
public:
    static boost::shared_ptr<HostnameGet> New();
    virtual ~HostnameGet();

    InputSpecPtr GetInputSpecInternal() override;
    OutputSpecPtr GetOutputSpecInternal() override;
    void ExecuteInternal(const InputPtr& input, const OutputPtr& output) override;
    virtual StructPtr GetOutputStructure();

protected:
    HostnameGet();
};

}  // namespace System
}  // namespace TarselCli
