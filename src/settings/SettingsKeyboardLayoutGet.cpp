#include "settings/SettingsKeyboardLayoutGet.h"

#include <norlithctl/SystemInfoImpl.h>

namespace TarselCli {
namespace System {

boost::shared_ptr<SettingsKeyboardLayoutGet> SettingsKeyboardLayoutGet::New() {
    return boost::shared_ptr<SettingsKeyboardLayoutGet>(new SettingsKeyboardLayoutGet());
}

SettingsKeyboardLayoutGet::SettingsKeyboardLayoutGet() {
    SetDescription("Get the keyboard layout");
    SetMetaDataField("type", "fetcher");
    SetDefaultOutputFormatter("simple");
}

SettingsKeyboardLayoutGet::~SettingsKeyboardLayoutGet() {}

InputSpecPtr SettingsKeyboardLayoutGet::GetInputSpecInternal() { return MakeInputSpec(); }

OutputSpecPtr SettingsKeyboardLayoutGet::GetOutputSpecInternal() { return StringOutputSpec(); }

void SettingsKeyboardLayoutGet::ExecuteInternal(const InputPtr&, const OutputPtr& output) {
    GuardHost(output, [&] {
        NorlithCtl::System::SystemInfoImpl systemInfo;
        SetResult(output, MetaObj::MetaString::New(systemInfo.GetKeyboardLayout()));
    });
}

}  // namespace System
}  // namespace TarselCli
