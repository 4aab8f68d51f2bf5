// system coredump partition get: the names of the active dump partition and of the one configured
// for the next boot, "" for either when there is none. Any host failure is the error.
#pragma once

#include "frame/CommandModel.h"

namespace TarselCli {
namespace System {

class KernelDumpGetPartition : public virtual AutoCli::Command {
public:
    static boost::shared_ptr<KernelDumpGetPartition> New();
    virtual ~KernelDumpGetPartition();

    InputSpecPtr GetInputSpecInternal() override;
    OutputSpecPtr GetOutputSpecInternal() override;
    void ExecuteInternal(const InputPtr& input, const OutputPtr& output) override;
    virtual StructPtr GetOutputStructure();

protected:
    KernelDumpGetPartition();
};

}  // namespace System
}  // namespace TarselCli
