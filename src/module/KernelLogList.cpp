#include "module/KernelLogList.h"

#include "module/OwnedLogLevels.h"

#include <norlithctl/ModuleImpl.h>
#include <norlithctl/SystemInfoImpl.h>

#include <memory>
#include <string>

namespace TarselCli {
namespace System {

boost::shared_ptr<KernelLogList> KernelLogList::New() {
    return boost::shared_ptr<KernelLogList>(new KernelLogList());
}

KernelLogList::KernelLogList() {
    SetDescription(
        "List the current loglevels available in the Norlith. Optionally with the --module option "
        "list the loglevels for a given module.");
    SetMetaDataField("type", "fetcher");
    SetDefaultOutputFormatter("table");
    SetDefaultOutputParameter("fields:LogLevel", "Name,Current Level,Default Level");
}

KernelLogList::~KernelLogList() {}

InputSpecPtr KernelLogList::GetInputSpecInternal() {
    return MakeInputSpec({
        {"module", "m", CallSpec::ParameterTypeString, false,
         "List the log levels for a given Norlith module instead of the Norlith core loglevels."},
        {"level-name", "l", CallSpec::ParameterTypeString, false,
         "Limit the output of this command to a specific log level with the given name."},
    });
}

OutputSpecPtr KernelLogList::GetOutputSpecInternal() {
    return StructListOutputSpec(GetOutputStructure());
}

StructPtr KernelLogList::GetOutputStructure() {
    return MakeStructTemplate("LogLevel", {{"Name", FieldString},
                                           {"Current Level", FieldInt},
                                           {"Default Level", FieldInt}});
}

void KernelLogList::ExecuteInternal(const InputPtr& input, const OutputPtr& output) {
    OwnedLogLevels levels;
    std::unique_ptr<Ravel::System::Module> found;
    GuardHost(output, [&] {
        NorlithCtl::System::SystemInfoImpl systemInfo;
        boost::shared_ptr<MetaObj::MetaList> list =
            MetaObj::MetaList::New(MetaObj::MetaTypeStruct, GetOutputStructure());
        const bool filtered = input->HasValue("level-name");
        const std::string filter = filtered ? input->GetString("level-name") : std::string();
        if (input->HasValue("module")) {
            const std::string name = input->GetString("module");
            found.reset(systemInfo.GetModuleByName(name));
            NorlithCtl::System::ModuleImpl* module =
                dynamic_cast<NorlithCtl::System::ModuleImpl*>(found.get());
            if (!module) {
                output->SetError("Could not find module with the name '" + name + "'");
                return;
            }
            levels.Take(module->GetLogLevels());
        } else {
            levels.Take(systemInfo.GetAllLogLevels());
        }
        for (const Ravel::System::LogLevel* level : levels.Records()) {
            if (filtered && level->name != filter) continue;
            StructPtr row = GetOutputStructure();
            row->SetField("Name", level->name);
            row->SetField("Current Level", static_cast<long long>(level->currentLevel));
            row->SetField("Default Level", static_cast<long long>(level->defaultLevel));
            list->AddStruct(row);
        }
        levels.Release();
        SetResult(output, list);
    });
}

}  // namespace System
}  // namespace TarselCli
