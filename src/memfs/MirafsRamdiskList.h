// system mirafs ramdisk list: every ramdisk of the host, in the kernel's order, as
// "MirafsRamdisk" rows read from kernel information nodes 1585 (the names) and 1586 (one record
// per ramdisk). Sizes are in KiB; the free percentages are 0 where they would divide by zero. A
// host failure drops the rows read so far and becomes the host's message in its event form
// (GetMessage(1)).
#pragma once

#include "frame/CommandModel.h"

namespace TarselCli {
namespace System {

class MirafsRamdiskList : public virtual AutoCli::Command {
public:
    static boost::shared_ptr<MirafsRamdiskList> New();
    virtual ~MirafsRamdiskList();

    InputSpecPtr GetInputSpecInternal() override;
    OutputSpecPtr GetOutputSpecInternal() override;
    void ExecuteInternal(const InputPtr& input, const OutputPtr& output) override;
    virtual StructPtr GetOutputStructure();

protected:
    MirafsRamdiskList();
};

}  // namespace System
}  // namespace TarselCli
