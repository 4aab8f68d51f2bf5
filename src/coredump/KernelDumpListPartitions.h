// system coredump partition list: every diagnostic partition with whether it is the active and
// the configured one. A configured partition the host cannot find is reported as "skipping"
// and the list is still set, every row Configured false.
#pragma once

#include "frame/CommandModel.h"

namespace TarselCli {
namespace System {

class KernelDumpListPartitions : public virtual AutoCli::Command {
public:
    static boost::shared_ptr<KernelDumpListPartitions> New();
    virtual ~KernelDumpListPartitions();

    InputSpecPtr GetInputSpecInternal() override;
    OutputSpecPtr GetOutputSpecInternal() override;
    void ExecuteInternal(const InputPtr& input, const OutputPtr& output) override;
    virtual StructPtr GetOutputStructure();

protected:
    KernelDumpListPartitions();
};

}  // namespace System
}  // namespace TarselCli
