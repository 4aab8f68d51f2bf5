// system coredump file list: every valid dump file the host knows, and the active and configured
// files even when the host's list lacks them (each once), with their states and sizes in bytes.
#pragma once

#include "frame/CommandModel.h"

namespace TarselCli {
namespace System {

class KernelDumpListFiles : public virtual AutoCli::Command {
public:
    static boost::shared_ptr<KernelDumpListFiles> New();
    virtual ~KernelDumpListFiles();

    InputSpecPtr GetInputSpecInternal() override;
    OutputSpecPtr GetOutputSpecInternal() override;
    void ExecuteInternal(const InputPtr& input, const OutputPtr& output) override;
    virtual StructPtr GetOutputStructure();

protected:
    KernelDumpListFiles();
};

}  // namespace System
}  // namespace TarselCli
