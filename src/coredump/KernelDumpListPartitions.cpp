#include "coredump/KernelDumpListPartitions.h"

#include "settings/Owned.h"

#include <norlithctl/StorageInfoImpl.h>

#include <memory>
#include <string>

namespace TarselCli {
namespace System {

boost::shared_ptr<KernelDumpListPartitions> KernelDumpListPartitions::New() {
    return boost::shared_ptr<KernelDumpListPartitions>(new KernelDumpListPartitions());
}

KernelDumpListPartitions::KernelDumpListPartitions() {
    SetDescription(
        "List all of the partitions on the system that have a partition type matching the Tarsel Core "
        "partition type. Also indicate which partition, if any, is being used as the system's dump "
        "partition and which is configured to be used at next boot.");
    SetMetaDataField("type", "fetcher");
    SetDefaultOutputFormatter("table");
    SetDefaultOutputParameter("fields:DumpPartition", "Name,Path,Active,Configured");
}

KernelDumpListPartitions::~KernelDumpListPartitions() {}

InputSpecPtr KernelDumpListPartitions::GetInputSpecInternal() { return MakeInputSpec(); }

OutputSpecPtr KernelDumpListPartitions::GetOutputSpecInternal() {
    return StructListOutputSpec(GetOutputStructure());
}

StructPtr KernelDumpListPartitions::GetOutputStructure() {
    return MakeStructTemplate("DumpPartition", {{"Name", FieldString},
                                                {"Path", FieldString},
                                                {"Active", FieldBool},
                                                {"Configured", FieldBool}});
}

void KernelDumpListPartitions::ExecuteInternal(const InputPtr&, const OutputPtr& output) {
    boost::shared_ptr<MetaObj::MetaList> list =
        MetaObj::MetaList::New(MetaObj::MetaTypeStruct, GetOutputStructure());
    GuardHost(output, [&] {
        NorlithCtl::Storage::StorageInfoImpl storage;
        Owned<Ravel::Storage::DiagnosticPartition> partitions(storage.GetPotentialDiagnosticPartitions());
        std::unique_ptr<Ravel::Storage::DiagnosticPartition> configured;
        try {
            configured.reset(storage.GetConfiguredDiagnosticPartition());
        } catch (const Ravel::Lib::RavelException&) {
            // The host's own text is not shown; the list goes on without a configured partition.
            output->SetError("no configured dump partition found; skipping");
        }
        std::unique_ptr<Ravel::Storage::DiagnosticPartition> active(storage.GetActiveDiagnosticPartition());
        const std::string activeName = active ? active->GetName() : std::string();
        const std::string configuredName = configured ? configured->GetName() : std::string();
        for (Ravel::Storage::DiagnosticPartition* partition : partitions) {
            StructPtr row = GetOutputStructure();
            const std::string name = partition->GetName();
            const bool isActive = active && name == activeName;
            const bool isConfigured = configured && name == configuredName;
            row->SetField("Name", name);
            row->SetField("Path", partition->GetPath());
            row->SetField("Active", isActive);
            row->SetField("Configured", isConfigured);
            list->AddStruct(row);
        }
        partitions.Clear();
        SetResult(output, list);
    });
}

}  // namespace System
}  // namespace TarselCli
