#include "coredump/KernelDumpGetPartition.h"

#include <norlithctl/StorageInfoImpl.h>

#include <memory>
#include <string>

namespace TarselCli {
namespace System {

boost::shared_ptr<KernelDumpGetPartition> KernelDumpGetPartition::New() {
    return boost::shared_ptr<KernelDumpGetPartition>(new KernelDumpGetPartition());
}

KernelDumpGetPartition::KernelDumpGetPartition() {
    SetDescription(
        "Get one of the dump partition configured values. This command will print either the active "
        "dump partition or the configured dump partition depending on the flags passed.");
    SetMetaDataField("type", "fetcher");
    SetDefaultOutputFormatter("simple");
}

KernelDumpGetPartition::~KernelDumpGetPartition() {}

InputSpecPtr KernelDumpGetPartition::GetInputSpecInternal() { return MakeInputSpec(); }

OutputSpecPtr KernelDumpGetPartition::GetOutputSpecInternal() { return MakeOutputSpec(GetOutputStructure()); }

StructPtr KernelDumpGetPartition::GetOutputStructure() {
    return MakeStructTemplate("KernelDumpParition", {{"Active", FieldString}, {"Configured", FieldString}});
}

void KernelDumpGetPartition::ExecuteInternal(const InputPtr&, const OutputPtr& output) {
    GuardHost(output, [&] {
        NorlithCtl::Storage::StorageInfoImpl storage;
        std::unique_ptr<Ravel::Storage::DiagnosticPartition> active(storage.GetActiveDiagnosticPartition());
        std::unique_ptr<Ravel::Storage::DiagnosticPartition> configured(
            storage.GetConfiguredDiagnosticPartition());
        std::string activeName;
        std::string configuredName;
        if (active) activeName = active->GetName();
        if (configured) configuredName = configured->GetName();
        StructPtr result = GetOutputStructure();
        result->SetField("Active", activeName);
        result->SetField("Configured", configuredName);
        active.reset();
        configured.reset();
        SetResult(output, result);
    });
}

}  // namespace System
}  // namespace TarselCli
