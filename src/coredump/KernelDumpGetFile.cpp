#include "coredump/KernelDumpGetFile.h"

#include "coredump/LookUpDumpFilePath.h"

#include <norlithctl/StorageInfoImpl.h>

#include <string>

namespace TarselCli {
namespace System {

boost::shared_ptr<KernelDumpGetFile> KernelDumpGetFile::New() {
    return boost::shared_ptr<KernelDumpGetFile>(new KernelDumpGetFile());
}

KernelDumpGetFile::KernelDumpGetFile() {
    SetDescription("Get the dump file path. Display path to the active and/or configured QRFS Dump File.");
    SetMetaDataField("type", "fetcher");
    SetDefaultOutputFormatter("simple");
}

KernelDumpGetFile::~KernelDumpGetFile() {}

InputSpecPtr KernelDumpGetFile::GetInputSpecInternal() { return MakeInputSpec(); }

OutputSpecPtr KernelDumpGetFile::GetOutputSpecInternal() { return MakeOutputSpec(GetOutputStructure()); }

StructPtr KernelDumpGetFile::GetOutputStructure() {
    return MakeStructTemplate("KernelDumpFile", {{"Active", FieldString}, {"Configured", FieldString}});
}

void KernelDumpGetFile::ExecuteInternal(const InputPtr&, const OutputPtr& output) {
    GuardHost(output, [&] {
        NorlithCtl::Storage::StorageInfoImpl storage;
        const std::string active = LookUpDumpFilePath([&] { return storage.GetActiveDiagnosticFile(); });
        const std::string configured =
            LookUpDumpFilePath([&] { return storage.GetConfiguredDiagnosticFile(); });
        StructPtr result = GetOutputStructure();
        result->SetField("Active", active);
        result->SetField("Configured", configured);
        SetResult(output, result);
    });
}

}  // namespace System
}  // namespace TarselCli
