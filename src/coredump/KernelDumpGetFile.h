// system coredump file get: the paths of the active dump file and of the one configured for the
// next boot; a look-up that fails counts as none.
#pragma once

#include "frame/CommandModel.h"

namespace TarselCli {
namespace System {

class KernelDumpGetFile : public virtual AutoCli::Command {
public:
    static boost::shared_ptr<KernelDumpGetFile> New();
    virtual ~KernelDumpGetFile();

    InputSpecPtr GetInputSpecInternal() override;
    OutputSpecPtr GetOutputSpecInternal() override;
    void ExecuteInternal(const InputPtr& input, const OutputPtr& output) override;
    virtual StructPtr GetOutputStructure();

protected:
    KernelDumpGetFile();
};

}  // namespace System
}  // namespace TarselCli
