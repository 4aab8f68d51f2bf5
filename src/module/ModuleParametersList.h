// system module parameters list: every parameter one module declares (name, type, description)
// with the value stored for its next load ("" when none), as "ModuleParameter" structures.
// The parameters and stored values are read before the name is checked, so a host failure for
// them is reported in place of "unknown module '<name>'".
#pragma once

#include "frame/CommandModel.h"

namespace TarselCli {
namespace System {

class ModuleParametersList : public virtual AutoCli::Command {
public:
    static boost::shared_ptr<ModuleParametersList> New();
    virtual ~ModuleParametersList();

    InputSpecPtr GetInputSpecInternal() override;
    OutputSpecPtr GetOutputSpecInternal() override;
    void ExecuteInternal(const InputPtr& input, const OutputPtr& output) override;
    virtual StructPtr GetOutputStructure();

protected:
    ModuleParametersList();
};

}  // namespace System
}  // namespace TarselCli
