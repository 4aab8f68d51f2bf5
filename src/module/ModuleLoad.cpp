#include "module/ModuleLoad.h"

#include <norlithctl/ModuleImpl.h>

#include <string>

namespace TarselCli {
namespace System {

boost::shared_ptr<ModuleLoad> ModuleLoad::New() {
    return boost::shared_ptr<ModuleLoad>(new ModuleLoad());
}

ModuleLoad::ModuleLoad() {
    SetDescription(
        "Load a Norlith module with the given name if it is enabled. If the module is disabled then "
        "the use of --force is required to load the module.");
    SetMetaDataField("type", "operation");
}

ModuleLoad::~ModuleLoad() {}

InputSpecPtr ModuleLoad::GetInputSpecInternal() {
    return MakeInputSpec({
        {"module", "m", CallSpec::ParameterTypeString, true, "The name of the Norlith module to load."},
        {"force", "f", CallSpec::ParameterTypeFlag, false,
         "Ignore the enabled/disabled state of this module and force it to load."},
    });
}

OutputSpecPtr ModuleLoad::GetOutputSpecInternal() { return BoolOutputSpec(); }

void ModuleLoad::ExecuteInternal(const InputPtr& input, const OutputPtr& output) {
    const std::string name = input->GetString("module");
    const bool force = input->GetFlag("force");
    GuardHost(output, [&] {
        NorlithCtl::System::ModuleImpl module(name);
        if (name.empty()) {
            output->SetError("Module name cannot be empty.");
            return;
        }
        if (!NorlithCtl::System::ModuleImpl::IsValidName(name) && !force) {
            output->SetError("unknown module '" + name + "'");
            return;
        }
        if (!module.GetEnabled() && !force) {
            output->SetError("module '" + name + "' is disabled, use --force to load.");
            return;
        }
        module.Load("", force);
        SetSuccess(output);
    });
}

}  // namespace System
}  // namespace TarselCli
