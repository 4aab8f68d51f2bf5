// system module parameters set: stores the option string a module is loaded with next, unchanged
// (the host checks its form and parameters, docs/host/modules.md). --force skips the check that
// the host knows the name; the host then keeps the string for that name unchecked. A refusal
// becomes the host's message and changes nothing.
#pragma once

#include "frame/CommandModel.h"

namespace TarselCli {
namespace System {

class ModuleParametersSet : public virtual AutoCli::Command {
public:
    static boost::shared_ptr<ModuleParametersSet> New();
    virtual ~ModuleParametersSet();

    InputSpecPtr GetInputSpecInternal() override;
    OutputSpecPtr GetOutputSpecInternal() override;
    void ExecuteInternal(const InputPtr& input, const OutputPtr& output) override;

protected:
    ModuleParametersSet();
};

}  // namespace System
}  // namespace TarselCli
