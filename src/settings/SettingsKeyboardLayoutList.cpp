#include "settings/SettingsKeyboardLayoutList.h"

#include <norlithctl/SystemInfoImpl.h>

#include <string>
#include <vector>

namespace TarselCli {
namespace System {

boost::shared_ptr<SettingsKeyboardLayoutList> SettingsKeyboardLayoutList::New() {
    return boost::shared_ptr<SettingsKeyboardLayoutList>(new SettingsKeyboardLayoutList());
}

SettingsKeyboardLayoutList::SettingsKeyboardLayoutList() {
    SetDescription("List the keyboard layout");
    SetMetaDataField("type", "fetcher");
    SetDefaultOutputFormatter("table");
    SetDefaultOutputParameter("fields:Layout", "Layout");
}

SettingsKeyboardLayoutList::~SettingsKeyboardLayoutList() {}

InputSpecPtr SettingsKeyboardLayoutList::GetInputSpecInternal() { return MakeInputSpec(); }

OutputSpecPtr SettingsKeyboardLayoutList::GetOutputSpecInternal() {
    return StructListOutputSpec(GetOutputStructure());
}

StructPtr SettingsKeyboardLayoutList::GetOutputStructure() {
    return MakeStructTemplate("Layout", {{"Layout", FieldString}});
}

void SettingsKeyboardLayoutList::ExecuteInternal(const InputPtr&, const OutputPtr& output) {
    boost::shared_ptr<MetaObj::MetaList> list =
        MetaObj::MetaList::New(MetaObj::MetaTypeStruct, GetOutputStructure());
    GuardHost(output, [&] {
        NorlithCtl::System::SystemInfoImpl systemInfo;
        const std::vector<std::string> layouts = systemInfo.GetKeyboardLayouts();
        for (const std::string& name : layouts) {
            StructPtr row = MetaObj::MetaStruct::New("Layout");
            row->SetField("Layout", name);
            list->AddStruct(row);
        }
        SetResult(output, list);
    });
}

}  // namespace System
}  // namespace TarselCli
