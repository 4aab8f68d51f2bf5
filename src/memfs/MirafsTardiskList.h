// system mirafs tardisk list: every tardisk of the host, in the kernel's order, as
// "MirafsTardisk" rows (name, system, size in bytes) read from kernel information nodes 1582
// (the names) and 1583 (one record per tardisk). A host failure drops the rows read so far and
// becomes the host's message in its event form (GetMessage(1)).
#pragma once

#include "frame/CommandModel.h"

namespace TarselCli {
namespace System {

class MirafsTardiskList : public virtual AutoCli::Command {
public:
    static boost::shared_ptr<MirafsTardiskList> New();
    virtual ~MirafsTardiskList();

    InputSpecPtr GetInputSpecInternal() override;
    OutputSpecPtr GetOutputSpecInternal() override;
    void ExecuteInternal(const InputPtr& input, const OutputPtr& output) override;
    virtual StructPtr GetOutputStructure();

protected:
    MirafsTardiskList();
};

}  // namespace System
}  // namespace TarselCli
