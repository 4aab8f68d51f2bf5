// system mirafs ramdisk add: mounts a new ramdisk, a memory file system instance, at a
// directory of the host: mount(2) of type "mirafs" with the seven-field option string "minimum,
// maximum,reserved inodes,maximum inodes,core dump,permissions,name". The construction flag
// withInodeOptions declares and reads the reserved-inodes, max-inodes and coredump parameters.
// A name or permissions holding ',' (which would shift the string's fields) is refused before
// mounting; the kernel's refusal is reported as its strerror text. Calls no host-control object.
#pragma once

#include "frame/CommandModel.h"

namespace TarselCli {
namespace System {

class MirafsRamdiskAdd : public virtual AutoCli::Command {
public:
    static boost::shared_ptr<MirafsRamdiskAdd> New(bool withInodeOptions);
    virtual ~MirafsRamdiskAdd();

    InputSpecPtr GetInputSpecInternal() override;
    OutputSpecPtr GetOutputSpecInternal() override;
    void ExecuteInternal(const InputPtr& input, const OutputPtr& output) override;

protected:
    explicit MirafsRamdiskAdd(bool withInodeOptions);

private:
    bool withInodeOptions_;
};

}  // namespace System
}  // namespace TarselCli
