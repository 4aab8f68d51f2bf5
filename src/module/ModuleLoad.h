// system module load: loads one module now. A disabled module is refused unless --force is
// given; --force also passes a name the host does not know on to the host, which refuses it.
// Empty names, unknown names and disabled modules are reported with fixed messages and change
// nothing; a host failure becomes the host's message.
#pragma once

#include "frame/CommandModel.h"

namespace TarselCli {
namespace System {

class ModuleLoad : public virtual AutoCli::Command {
public:
    static boost::shared_ptr<ModuleLoad> New();
    virtual ~ModuleLoad();

    InputSpecPtr GetInputSpecInternal() override;
    OutputSpecPtr GetOutputSpecInternal() override;
    void ExecuteInternal(const InputPtr& input, const OutputPtr& output) override;

protected:
    ModuleLoad();
};

}  // namespace System
}  // namespace TarselCli
