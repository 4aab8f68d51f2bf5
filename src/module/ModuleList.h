// system module list: every module the host knows with its loaded and enabled state, in the
// host's order, as "Module" structures; --loaded and --enabled keep only the modules whose state
// equals the given value (both must match when both are given). A host failure becomes the
// host's message and no list.
#pragma once

#include "frame/CommandModel.h"

namespace TarselCli {
namespace System {

class ModuleList : public virtual AutoCli::Command {
public:
    static boost::shared_ptr<ModuleList> New();
    virtual ~ModuleList();

    InputSpecPtr GetInputSpecInternal() override;
    OutputSpecPtr GetOutputSpecInternal() override;
    void ExecuteInternal(const InputPtr& input, const OutputPtr& output) override;
    virtual StructPtr GetOutputStructure();

protected:
    ModuleList();
};

}  // namespace System
}  // namespace TarselCli
