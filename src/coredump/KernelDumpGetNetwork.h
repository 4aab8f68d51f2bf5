// system coredump network get: whether network dump is on and, only when it is, the interface,
// server address and port.
#pragma once

#include "frame/CommandModel.h"

namespace TarselCli {
namespace System {

class KernelDumpGetNetwork : public virtual AutoCli::Command {
public:
    static boost::shared_ptr<KernelDumpGetNetwork> New();
    virtual ~KernelDumpGetNetwork();

    InputSpecPtr GetInputSpecInternal() override;
    OutputSpecPtr GetOutputSpecInternal() override;
    void ExecuteInternal(const InputPtr& input, const OutputPtr& output) override;
    virtual StructPtr GetOutputStructure();

protected:
    KernelDumpGetNetwork();
};

}  // namespace System
}  // namespace TarselCli
