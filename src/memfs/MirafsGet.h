// system mirafs get: the inode accounting of the in-memory root file system as one
// "MirafsStatus" structure: seven counters of kernel information node 1579 and two free
// percentages derived from them (0 for a file system that reports no inodes at all). A host
// failure becomes the host's message in its event form (GetMessage(1)) and no result.
#pragma once

#include "frame/CommandModel.h"

namespace TarselCli {
namespace System {

class MirafsGet : public virtual AutoCli::Command {
public:
    static boost::shared_ptr<MirafsGet> New();
    virtual ~MirafsGet();

    InputSpecPtr GetInputSpecInternal() override;
    OutputSpecPtr GetOutputSpecInternal() override;
    void ExecuteInternal(const InputPtr& input, const OutputPtr& output) override;
    virtual StructPtr GetOutputStructure();

protected:
    MirafsGet();
};

}  // namespace System
}  // namespace TarselCli
