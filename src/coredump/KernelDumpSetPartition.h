// system coredump partition set: activates (the configured or, with --smart, the best
// partition), deactivates, unconfigures, or configures and activates a named partition. The
// option checks run first, in a fixed order, and change nothing when one fails.
#pragma once

#include "frame/CommandModel.h"

namespace TarselCli {
namespace System {

class KernelDumpSetPartition : public virtual AutoCli::Command {
public:
    static boost::shared_ptr<KernelDumpSetPartition> New();
    virtual ~KernelDumpSetPartition();

    InputSpecPtr GetInputSpecInternal() override;
    OutputSpecPtr GetOutputSpecInternal() override;
    void ExecuteInternal(const InputPtr& input, const OutputPtr& output) override;

protected:
    KernelDumpSetPartition();
};

}  // namespace System
}  // namespace TarselCli
