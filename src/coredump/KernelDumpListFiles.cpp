#include "coredump/KernelDumpListFiles.h"

#include "coredump/LookUpDumpFilePath.h"
#include "settings/Owned.h"

#include <norlithctl/StorageInfoImpl.h>

#include <memory>
#include <string>
#include <vector>

namespace TarselCli {
namespace System {

boost::shared_ptr<KernelDumpListFiles> KernelDumpListFiles::New() {
    return boost::shared_ptr<KernelDumpListFiles>(new KernelDumpListFiles());
}

KernelDumpListFiles::KernelDumpListFiles() {
    SetDescription("List the active and configured QRFS Diagnostic Files.");
    SetMetaDataField("type", "fetcher");
    SetDefaultOutputFormatter("table");
    SetDefaultOutputParameter("fields:DumpFile", "Path,Active,Configured,Size");
}

KernelDumpListFiles::~KernelDumpListFiles() {}

InputSpecPtr KernelDumpListFiles::GetInputSpecInternal() { return MakeInputSpec(); }

OutputSpecPtr KernelDumpListFiles::GetOutputSpecInternal() {
    return StructListOutputSpec(GetOutputStructure());
}

StructPtr KernelDumpListFiles::GetOutputStructure() {
    return MakeStructTemplate("DumpFile", {{"Path", FieldString},
                                           {"Active", FieldBool},
                                           {"Configured", FieldBool},
                                           {"Size", FieldInt}});
}

void KernelDumpListFiles::ExecuteInternal(const InputPtr&, const OutputPtr& output) {
    boost::shared_ptr<MetaObj::MetaList> list =
        MetaObj::MetaList::New(MetaObj::MetaTypeStruct, GetOutputStructure());
    GuardHost(output, [&] {
        NorlithCtl::Storage::StorageInfoImpl storage;
        const std::string configured =
            LookUpDumpFilePath([&] { return storage.GetConfiguredDiagnosticFile(); });
        const std::string active = LookUpDumpFilePath([&] { return storage.GetActiveDiagnosticFile(); });
        Owned<Ravel::Storage::DiagnosticFile> owned(storage.GetPotentialDiagnosticFiles());
        bool activeListed = false;
        bool configuredListed = false;
        for (Ravel::Storage::DiagnosticFile* file : owned) {
            const std::string path = file->GetPath();
            if (path == active) activeListed = true;
            if (path == configured) configuredListed = true;
        }
        // The active and the configured file are always listed, a file that is both once.
        std::vector<std::unique_ptr<Ravel::Storage::DiagnosticFile>> appended;
        if (!active.empty() && !activeListed)
            appended.emplace_back(new NorlithCtl::Storage::DiagnosticFileImpl(active));
        if (!configured.empty() && configured != active && !configuredListed)
            appended.emplace_back(new NorlithCtl::Storage::DiagnosticFileImpl(configured));
        std::vector<Ravel::Storage::DiagnosticFile*> files(owned.begin(), owned.end());
        for (const auto& file : appended) files.push_back(file.get());
        for (Ravel::Storage::DiagnosticFile* file : files) {
            if (!file->IsValid(false)) continue;
            const std::string path = file->GetPath();
            const long long size = file->GetSize();
            StructPtr row = GetOutputStructure();
            row->SetField("Path", path);
            row->SetField("Active", path == active);
            row->SetField("Configured", path == configured);
            row->SetField("Size", size);
            list->AddStruct(row);
        }
        appended.clear();
        owned.Clear();
        SetResult(output, list);
    });
}

}  // namespace System
}  // namespace TarselCli
