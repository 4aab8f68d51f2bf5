#include "module/ModuleParametersList.h"

#include <norlithctl/ModuleImpl.h>

#include <map>
#include <string>
#include <vector>

namespace TarselCli {
namespace System {

boost::shared_ptr<ModuleParametersList> ModuleParametersList::New() {
    return boost::shared_ptr<ModuleParametersList>(new ModuleParametersList());
}

ModuleParametersList::ModuleParametersList() {
    SetDescription(
        "List the parameters, a descriptions of each parameter supported for a given module name "
        "and the user defined value for each parameter.");
    SetMetaDataField("type", "fetcher");
    SetDefaultOutputFormatter("table");
    SetDefaultOutputParameter("fields:ModuleParameter", "Name,Type,Value,Description");
}

ModuleParametersList::~ModuleParametersList() {}

InputSpecPtr ModuleParametersList::GetInputSpecInternal() {
    return MakeInputSpec({
        {"module", "m", CallSpec::ParameterTypeString, true,
         "The name of the Norlith module to get the option string for."},
    });
}

OutputSpecPtr ModuleParametersList::GetOutputSpecInternal() {
    return StructListOutputSpec(GetOutputStructure());
}

StructPtr ModuleParametersList::GetOutputStructure() {
    return MakeStructTemplate("ModuleParameter", {{"Name", FieldString},
                                                  {"Type", FieldString},
                                                  {"Value", FieldString},
                                                  {"Description", FieldString}});
}

void ModuleParametersList::ExecuteInternal(const InputPtr& input, const OutputPtr& output) {
    const std::string name = input->GetString("module");
    boost::shared_ptr<MetaObj::MetaList> list =
        MetaObj::MetaList::New(MetaObj::MetaTypeStruct, GetOutputStructure());
    GuardHost(output, [&] {
        NorlithCtl::System::ModuleImpl module(name);
        const std::vector<Ravel::System::ModuleParam> parameters = module.GetParameters();
        const std::map<std::string, std::string> options = module.GetOptions();
        if (!NorlithCtl::System::ModuleImpl::IsValidName(name)) {
            output->SetError("unknown module '" + name + "'");
            return;
        }
        for (const Ravel::System::ModuleParam& parameter : parameters) {
            StructPtr row = GetOutputStructure();
            row->SetField("Name", parameter.name);
            row->SetField("Type", parameter.type);
            row->SetField("Description", parameter.description);
            const auto stored = options.find(parameter.name);
            row->SetField("Value", stored == options.end() ? std::string() : stored->second);
            list->AddStruct(row);
        }
        SetResult(output, list);
    });
}

}  // namespace System
}  // namespace TarselCli
