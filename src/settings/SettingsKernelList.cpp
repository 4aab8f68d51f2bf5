#include "settings/SettingsKernelList.h"

#include "settings/IsDelta.h"

#include <norlithctl/KernelOpts.h>

#include <string>
#include <vector>

namespace TarselCli {
namespace System {

boost::shared_ptr<SettingsKernelList> SettingsKernelList::New() {
    return boost::shared_ptr<SettingsKernelList>(new SettingsKernelList());
}

SettingsKernelList::SettingsKernelList() {
    SetDescription("List Norlith kernel settings.");
    SetMetaDataField("type", "fetcher");
    SetDefaultOutputFormatter("table");
    SetDefaultOutputParameter("fields:SettingsKernel", "Name,Type,Description,Configured,Runtime,Default");
    SetDefaultOutputParameter("wrap-last", "true");
}

SettingsKernelList::~SettingsKernelList() {}

InputSpecPtr SettingsKernelList::GetInputSpecInternal() {
    return MakeInputSpec({
        {"option", "o", CallSpec::ParameterTypeString, false,
         "The name of the Norlith kernel setting to get."},
        {"delta", "d", CallSpec::ParameterTypeFlag, false,
         "Only display options whose values differ from their default."},
    });
}

OutputSpecPtr SettingsKernelList::GetOutputSpecInternal() {
    return StructListOutputSpec(GetOutputStructure());
}

StructPtr SettingsKernelList::GetOutputStructure() {
    return MakeStructTemplate("SettingsKernel", {{"Name", FieldString},
                                                 {"Type", FieldString},
                                                 {"Description", FieldString},
                                                 {"Configured", FieldString},
                                                 {"Runtime", FieldString},
                                                 {"Default", FieldString}});
}

void SettingsKernelList::ExecuteInternal(const InputPtr& input, const OutputPtr& output) {
    GuardHost(output, [&] {
        NorlithCtl::System::KernelOpts settings;
        const bool delta = input->GetFlag("delta");
        boost::shared_ptr<MetaObj::MetaList> list =
            MetaObj::MetaList::New(MetaObj::MetaTypeStruct, GetOutputStructure());
        const std::vector<std::string> names = input->HasValue("option")
                                                   ? std::vector<std::string>{input->GetString("option")}
                                                   : settings.GetOptionNames();
        for (const std::string& name : names) {
            const Ravel::System::KernelOption::OptionType type = settings.GetOptionType(name);
            const std::string description = settings.GetOptionDescription(name);
            const std::string configured = settings.GetOption(name);
            const std::string runtime = settings.GetRuntimeValue(name);
            const std::string defaultValue = settings.GetOptionDefault(name);
            if (delta && !IsDelta(type, defaultValue, configured, runtime)) continue;

            StructPtr row = GetOutputStructure();
            row->SetField("Name", name);
            row->SetField("Description", description);
            row->SetField("Type", settings.GetOptionTypeString(type));
            row->SetField("Configured", configured);
            row->SetField("Runtime", runtime.empty() ? std::string("<unset>") : runtime);
            row->SetField("Default", defaultValue);
            list->AddStruct(row);
        }
        SetResult(output, list);
    });
}

}  // namespace System
}  // namespace TarselCli
