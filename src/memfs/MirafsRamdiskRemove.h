// system mirafs ramdisk remove: unmounts the ramdisk at a mount point with umount(2); the
// kernel's refusal (not a mount point, a system ramdisk, ...) is reported as its strerror text.
// Calls no host-control object.
#pragma once

#include "frame/CommandModel.h"

namespace TarselCli {
namespace System {

class MirafsRamdiskRemove : public virtual AutoCli::Command {
public:
    static boost::shared_ptr<MirafsRamdiskRemove> New();
    virtual ~MirafsRamdiskRemove();

    InputSpecPtr GetInputSpecInternal() override;
    OutputSpecPtr GetOutputSpecInternal() override;
    void ExecuteInternal(const InputPtr& input, const OutputPtr& output) override;

protected:
    MirafsRamdiskRemove();
};

}  // namespace System
}  // namespace TarselCli
