// system coredump network set: switches network dump on or off, or stores its interface, server
// address and port (6500 when none is given). Every option check runs before the host changes;
// a port must be 1..65535.
#pragma once

#include "frame/CommandModel.h"

namespace TarselCli {
namespace System {

class KernelDumpSetNetwork : public virtual AutoCli::Command {
public:
    static boost::shared_ptr<KernelDumpSetNetwork> New();
    virtual ~KernelDumpSetNetwork();

    InputSpecPtr GetInputSpecInternal() override;
    OutputSpecPtr GetOutputSpecInternal() override;
    void ExecuteInternal(const InputPtr& input, const OutputPtr& output) override;

protected:
    KernelDumpSetNetwork();
};

}  // namespace System
}  // namespace TarselCli
