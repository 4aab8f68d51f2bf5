#include "module/ModuleList.h"

#include "settings/Owned.h"

#include <norlithctl/SystemInfoImpl.h>

namespace TarselCli {
namespace System {

boost::shared_ptr<ModuleList> ModuleList::New() {
    return boost::shared_ptr<ModuleList>(new ModuleList());
}

ModuleList::ModuleList() {
    SetDescription("List the Norlith modules that the system knows about.");
    SetMetaDataField("type", "fetcher");
    SetDefaultOutputFormatter("table");
    SetDefaultOutputParameter("fields:Module", "Name,Is Loaded,Is Enabled");
}

ModuleList::~ModuleList() {}

InputSpecPtr ModuleList::GetInputSpecInternal() {
    return MakeInputSpec({
        {"loaded", "l", CallSpec::ParameterTypeBool, false,
         "List the loaded / not loaded Norlith modules and device drivers."},
        {"enabled", "e", CallSpec::ParameterTypeBool, false,
         "List the enabled / disabled Norlith modules and device drivers."},
    });
}

OutputSpecPtr ModuleList::GetOutputSpecInternal() {
    return StructListOutputSpec(GetOutputStructure());
}

StructPtr ModuleList::GetOutputStructure() {
    return MakeStructTemplate("Module", {{"Name", FieldString},
                                         {"Is Loaded", FieldBool},
                                         {"Is Enabled", FieldBool}});
}

void ModuleList::ExecuteInternal(const InputPtr& input, const OutputPtr& output) {
    GuardHost(output, [&] {
        NorlithCtl::System::SystemInfoImpl systemInfo;
        const bool byLoaded = input->HasValue("loaded");
        const bool loaded = byLoaded && input->GetBool("loaded");
        const bool byEnabled = input->HasValue("enabled");
        const bool enabled = byEnabled && input->GetBool("enabled");
        boost::shared_ptr<MetaObj::MetaList> list =
            MetaObj::MetaList::New(MetaObj::MetaTypeStruct, GetOutputStructure());
        Owned<Ravel::System::Module> modules(systemInfo.GetModules());
        for (Ravel::System::Module* module : modules) {
            StructPtr row = GetOutputStructure();
            const bool isLoaded = module->IsLoaded();
            const bool isEnabled = module->IsEnabled();
            if ((byLoaded && loaded != isLoaded) || (byEnabled && enabled != isEnabled)) continue;
            row->SetField("Name", module->GetName());
            row->SetField("Is Loaded", isLoaded);
            row->SetField("Is Enabled", isEnabled);
            list->AddStruct(row);
        }
        modules.Clear();
        SetResult(output, list);
    });
}

}  // namespace System
}  // namespace TarselCli
