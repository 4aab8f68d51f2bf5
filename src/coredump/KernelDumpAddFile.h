// system coredump file add: creates a dump file (or, with --auto, one only when the host has
// none and may create one). Sizes, datastores and names are the host's to judge.
#pragma once

#include "frame/CommandModel.h"

namespace TarselCli {
namespace System {

class KernelDumpAddFile : public virtual AutoCli::Command {
public:
    static boost::shared_ptr<KernelDumpAddFile> New();
    virtual ~KernelDumpAddFile();

    InputSpecPtr GetInputSpecInternal() override;
    OutputSpecPtr GetOutputSpecInternal() override;
    void ExecuteInternal(const InputPtr& input, const OutputPtr& output) override;

protected:
    KernelDumpAddFile();
};

}  // namespace System
}  // namespace TarselCli
