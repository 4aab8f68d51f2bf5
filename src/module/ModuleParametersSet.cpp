#include "module/ModuleParametersSet.h"

#include <norlithctl/ModuleImpl.h>

#include <string>

namespace TarselCli {
namespace System {

boost::shared_ptr<ModuleParametersSet> ModuleParametersSet::New() {
    return boost::shared_ptr<ModuleParametersSet>(new ModuleParametersSet());
}

ModuleParametersSet::ModuleParametersSet() {
    SetDescription("Set the load time parameters for the given Norlith module.");
    SetMetaDataField("type", "operation");
}

ModuleParametersSet::~ModuleParametersSet() {}

InputSpecPtr ModuleParametersSet::GetInputSpecInternal() {
    return MakeInputSpec({
        {"module", "m", CallSpec::ParameterTypeString, true,
         "The name of the Norlith module to set parameters for."},
        {"parameter-string", "p", CallSpec::ParameterTypeString, true,
         "The string containing the parameters for this module."},
        {"force", "f", CallSpec::ParameterTypeFlag, false,
         "Skip Norlith module validity checks and set parameters for a module (or alias) with the "
         "given name."},
    });
}

OutputSpecPtr ModuleParametersSet::GetOutputSpecInternal() { return BoolOutputSpec(); }

void ModuleParametersSet::ExecuteInternal(const InputPtr& input, const OutputPtr& output) {
    const std::string name = input->GetString("module");
    const std::string parameters = input->GetString("parameter-string");
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
        // The same false with and without --force: the host tells a module from an alias.
        module.SetOptionString(parameters, false);
        SetSuccess(output);
    });
}

}  // namespace System
}  // namespace TarselCli
