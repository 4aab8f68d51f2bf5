// system coredump file remove: takes a dump file out of use (the active one only with --force)
// and unlinks it through the operating-system seam. A path that is no dump file of the host
// (known, active or configured) is refused before anything changes, so the command can never
// delete another file of the host.
#pragma once

#include "frame/CommandModel.h"

namespace TarselCli {
namespace System {

class KernelDumpRemoveFile : public virtual AutoCli::Command {
public:
    static boost::shared_ptr<KernelDumpRemoveFile> New();
    virtual ~KernelDumpRemoveFile();

    InputSpecPtr GetInputSpecInternal() override;
    OutputSpecPtr GetOutputSpecInternal() override;
    void ExecuteInternal(const InputPtr& input, const OutputPtr& output) override;

protected:
    KernelDumpRemoveFile();
};

}  // namespace System
}  // namespace TarselCli
