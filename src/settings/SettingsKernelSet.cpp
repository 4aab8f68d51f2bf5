#include "settings/SettingsKernelSet.h"

#include <norlithctl/KernelOpts.h>

#include <string>

namespace TarselCli {
namespace System {

boost::shared_ptr<SettingsKernelSet> SettingsKernelSet::New() {
    return boost::shared_ptr<SettingsKernelSet>(new SettingsKernelSet());
}

SettingsKernelSet::SettingsKernelSet() {
    SetDescription("Set a Norlith setting.");
    SetMetaDataField("type", "operation");
}

SettingsKernelSet::~SettingsKernelSet() {}

InputSpecPtr SettingsKernelSet::GetInputSpecInternal() {
    return MakeInputSpec({
        {"setting", "s", CallSpec::ParameterTypeString, true, "The name of the Norlith setting to set."},
        {"value", "v", CallSpec::ParameterTypeString, true, "The value to set the setting to."},
    });
}

OutputSpecPtr SettingsKernelSet::GetOutputSpecInternal() { return BoolOutputSpec(); }

void SettingsKernelSet::ExecuteInternal(const InputPtr& input, const OutputPtr& output) {
    const std::string setting = input->GetString("setting");
    const std::string value = input->GetString("value");
    GuardHost(output, [&] {
        NorlithCtl::System::KernelOpts settings;
        settings.SetOption(setting, value);
        SetSuccess(output);
    });
}

}  // namespace System
}  // namespace TarselCli
