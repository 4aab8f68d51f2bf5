// system module set: enables or disables one module for later boots (what is loaded now does
// not change). --force skips the check that the host knows the name, never the empty-name check.
// A host failure becomes the host's message.
#pragma once

#include "frame/CommandModel.h"

namespace TarselCli {
namespace System {

class ModuleSet : public virtual AutoCli::Command {
public:
    static boost::shared_ptr<ModuleSet> New();
    virtual ~ModuleSet();

    InputSpecPtr GetInputSpecInternal() override;
    OutputSpecPtr GetOutputSpecInternal() override;
    void ExecuteInternal(const InputPtr& input, const OutputPtr& output) override;

protected:
    ModuleSet();
};

}  // namespace System
}  // namespace TarselCli
