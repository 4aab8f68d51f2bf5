#include "settings/SettingsKeyboardLayoutSet.h"

#include <norlithctl/SystemInfoImpl.h>

#include <string>

namespace TarselCli {
namespace System {

boost::shared_ptr<SettingsKeyboardLayoutSet> SettingsKeyboardLayoutSet::New() {
    return boost::shared_ptr<SettingsKeyboardLayoutSet>(new SettingsKeyboardLayoutSet());
}

SettingsKeyboardLayoutSet::SettingsKeyboardLayoutSet() {
    SetDescription("Set the keyboard layout");
    SetMetaDataField("type", "operation");
}

SettingsKeyboardLayoutSet::~SettingsKeyboardLayoutSet() {}

InputSpecPtr SettingsKeyboardLayoutSet::GetInputSpecInternal() {
    return MakeInputSpec({
        {"layout", "l", CallSpec::ParameterTypeString, false, "The name of the layout to set"},
        {"no-persist", nullptr, CallSpec::ParameterTypeFlag, false,
         "Only apply this layout for the current boot"},
    });
}

OutputSpecPtr SettingsKeyboardLayoutSet::GetOutputSpecInternal() { return BoolOutputSpec(); }

void SettingsKeyboardLayoutSet::ExecuteInternal(const InputPtr& input, const OutputPtr& output) {
    const std::string layout = input->GetString("layout");
    GuardHost(output, [&] {
        NorlithCtl::System::SystemInfoImpl systemInfo;
        if (!layout.empty() && !input->GetFlag("no-persist")) systemInfo.SetKeyboardLayout(layout);
        systemInfo.LoadKeyboardMappings(layout);
        SetSuccess(output);
    });
}

}  // namespace System
}  // namespace TarselCli
