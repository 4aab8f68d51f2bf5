// system coredump file set: activates, deactivates, unconfigures, or configures and activates
// a dump file by path; the option checks run first and change nothing when one fails.
#pragma once

#include "frame/CommandModel.h"

namespace TarselCli {
namespace System {

class KernelDumpSetFile : public virtual AutoCli::Command {
public:
    static boost::shared_ptr<KernelDumpSetFile> New();
    virtual ~KernelDumpSetFile();

    InputSpecPtr GetInputSpecInternal() override;
    OutputSpecPtr GetOutputSpecInternal() override;
    void ExecuteInternal(const InputPtr& input, const OutputPtr& output) override;

protected:
    KernelDumpSetFile();
};

}  // namespace System
}  // namespace TarselCli
