#include "coredump/KernelDumpRemoveFile.h"

#include "coredump/LookUpDumpFilePath.h"
#include "settings/Owned.h"

#include <norlithctl/Env.h>
#include <norlithctl/StorageInfoImpl.h>

#include <cerrno>
#include <cstring>
#include <string>

namespace TarselCli {
namespace System {

namespace {

// Whether the host knows a dump file at path.
bool IsKnownDumpFile(NorlithCtl::Storage::StorageInfoImpl& storage, const std::string& path) {
    Owned<Ravel::Storage::DiagnosticFile> files(storage.GetPotentialDiagnosticFiles());
    for (Ravel::Storage::DiagnosticFile* file : files)
        if (file->GetPath() == path) return true;
    return false;
}

}  // namespace

boost::shared_ptr<KernelDumpRemoveFile> KernelDumpRemoveFile::New() {
    return boost::shared_ptr<KernelDumpRemoveFile>(new KernelDumpRemoveFile());
}

KernelDumpRemoveFile::KernelDumpRemoveFile() {
    SetDescription("Remove a Norlith Dump QRFS file from this system.");
    SetMetaDataField("type", "operation");
}

KernelDumpRemoveFile::~KernelDumpRemoveFile() {}

InputSpecPtr KernelDumpRemoveFile::GetInputSpecInternal() {
    return MakeInputSpec({
        {"force", "F", CallSpec::ParameterTypeFlag, false,
         "Deactivate and unconfigure the dump file being removed.  This option is required if the file is "
         "active."},
        {"file", "f", CallSpec::ParameterTypeString, false,
         "Specify the file name of the Dump File to be removed.  If not given, the configured dump file will "
         "be removed."},
    });
}

OutputSpecPtr KernelDumpRemoveFile::GetOutputSpecInternal() { return BoolOutputSpec(); }

void KernelDumpRemoveFile::ExecuteInternal(const InputPtr& input, const OutputPtr& output) {
    const bool force = input->HasValue("force");
    GuardHost(output, [&] {
        NorlithCtl::Storage::StorageInfoImpl storage;
        const std::string active = LookUpDumpFilePath([&] { return storage.GetActiveDiagnosticFile(); });
        const std::string configured =
            LookUpDumpFilePath([&] { return storage.GetConfiguredDiagnosticFile(); });
        std::string target;
        if (input->HasValue("file")) {
            target = input->GetString("file");
        } else if (configured.empty()) {
            output->SetError("No configured file to remove.");
            return;
        } else {
            target = configured;
        }
        // An absent ("") active or configured file is no file to match.
        const bool isActive = !active.empty() && target == active;
        const bool isConfigured = !configured.empty() && target == configured;
        // Only a dump file of the host may go: unlink would remove any file it is given.
        if (!isActive && !isConfigured && !IsKnownDumpFile(storage, target)) {
            output->SetError("Refusing to remove " + target +
                             ": it is not one of this host's dump files (known, active or configured).");
            return;
        }
        if (isActive) {
            if (!force) {
                output->SetError("Dump file " + target + " currently active, --force is required.");
                return;
            }
            storage.DeactivateDiagnosticFile();
        }
        if (isConfigured) storage.UnconfigureDiagnosticFile();
        if (NorlithCtl::Os::Env::Default()->Unlink(target.c_str()) != 0) {
            const int error = errno;
            output->SetError("Unlink of file " + target + " failed: " + std::strerror(error));
            return;
        }
        SetSuccess(output);
    });
}

}  // namespace System
}  // namespace TarselCli
