#include "module/ModuleSet.h"

#include <norlithctl/ModuleImpl.h>

#include <string>

namespace TarselCli {
namespace System {

boost::shared_ptr<ModuleSet> ModuleSet::New() {
    return boost::shared_ptr<ModuleSet>(new ModuleSet());
}

ModuleSet::ModuleSet() {
    SetDescription("Allow enabling and disabling of a Norlith module.");
    SetMetaDataField("type", "operation");
}

ModuleSet::~ModuleSet() {}

InputSpecPtr ModuleSet::GetInputSpecInternal() {
    return MakeInputSpec({
        {"module", "m", CallSpec::ParameterTypeString, true,
         "The name of the Norlith module to set options for."},
        {"enabled", "e", CallSpec::ParameterTypeBool, true,
         "Set to true to enable the module, set to false to disable the module."},
        {"force", "f", CallSpec::ParameterTypeFlag, false,
         "Skip Norlith module validity checks and set options for a module (or alias) with the "
         "given name."},
    });
}

OutputSpecPtr ModuleSet::GetOutputSpecInternal() { return BoolOutputSpec(); }

void ModuleSet::ExecuteInternal(const InputPtr& input, const OutputPtr& output) {
    const std::string name = input->GetString("module");
    const bool enabled = input->GetBool("enabled");
    const bool force = input->GetFlag("force");
    if (name.empty()) {
        output->SetError("Module name cannot be empty.");
        return;
    }
    GuardHost(output, [&] {
        NorlithCtl::System::ModuleImpl module(name);
        if (!NorlithCtl::System::ModuleImpl::IsValidName(name) && !force) {
            output->SetError("unknown module '" + name + "'");
            return;
        }
        module.SetEnabled(enabled);
        SetSuccess(output);
    });
}

}  // namespace System
}  // namespace TarselCli
