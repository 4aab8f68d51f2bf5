// system coredump network check: asks the host to probe the configured dump server and sets the
// outcome as a string; every outcome but the verified one is also the error, a host failure
// included (its text is the outcome).
#pragma once

#include "frame/CommandModel.h"

namespace TarselCli {
namespace System {

class KernelDumpCheckNetwork : public virtual AutoCli::Command {
public:
    static boost::shared_ptr<KernelDumpCheckNetwork> New();
    virtual ~KernelDumpCheckNetwork();

    InputSpecPtr GetInputSpecInternal() override;
    OutputSpecPtr GetOutputSpecInternal() override;
    void ExecuteInternal(const InputPtr& input, const OutputPtr& output) override;

protected:
    KernelDumpCheckNetwork();
};

}  // namespace System
}  // namespace TarselCli
