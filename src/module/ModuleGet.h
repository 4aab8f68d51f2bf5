// system module get: what the host knows about one module (file, license, versions, signature,
// provided and required namespaces) as one "ModuleDetails" structure filled by GetModuleInfo.
// A name the host does not know is reported as "unknown module '<name>'"; a host failure
// (building the module object included) becomes the host's message and no result.
#pragma once

#include "frame/CommandModel.h"

namespace TarselCli {
namespace System {

class ModuleGet : public virtual AutoCli::Command {
public:
    static boost::shared_ptr<ModuleGet> New();
    virtual ~ModuleGet();

    InputSpecPtr GetInputSpecInternal() override;
    OutputSpecPtr GetOutputSpecInternal() override;
    void ExecuteInternal(const InputPtr& input, const OutputPtr& output) override;
    virtual StructPtr GetOutputStructure();

protected:
    ModuleGet();
};

}  // namespace System
}  // namespace TarselCli
