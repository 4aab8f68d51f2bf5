#include "coredump/KernelDumpSetFile.h"

#include <norlithctl/StorageInfoImpl.h>

namespace TarselCli {
namespace System {

boost::shared_ptr<KernelDumpSetFile> KernelDumpSetFile::New() {
    return boost::shared_ptr<KernelDumpSetFile>(new KernelDumpSetFile());
}

KernelDumpSetFile::KernelDumpSetFile() {
    SetDescription("Set the active and configured Norlith Dump QRFS file for this system.");
    SetMetaDataField("type", "operation");
}

KernelDumpSetFile::~KernelDumpSetFile() {}

InputSpecPtr KernelDumpSetFile::GetInputSpecInternal() {
    return MakeInputSpec({
        {"enable", "e", CallSpec::ParameterTypeBool, false,
         "Enable or disable the Norlith dump file. This option cannot be specified when unconfiguring the "
         "dump file."},
        {"smart", "s", CallSpec::ParameterTypeFlag, false,
         "This flag can be used only with --enable=true. It will cause the file to be selected using the "
         "smart selection algorithm."},
        {"path", "p", CallSpec::ParameterTypeString, false,
         "The path of the QRFS Dump File to use. This must be a pre-allocated file."},
        {"unconfigure", "u", CallSpec::ParameterTypeFlag, false, "Unconfigure the current QRFS Dump file."},
    });
}

OutputSpecPtr KernelDumpSetFile::GetOutputSpecInternal() { return BoolOutputSpec(); }

void KernelDumpSetFile::ExecuteInternal(const InputPtr& input, const OutputPtr& output) {
    const bool unconfigure = input->GetFlag("unconfigure");
    const bool smart = input->GetFlag("smart");
    const bool enable = input->HasValue("enable");
    const bool path = input->HasValue("path");
    const char* smartMessage = "--smart can be specified only with --enable=true.";
    if (enable && (path || unconfigure)) {
        output->SetError("--enable cannot be combined with --path or --unconfigure.");
        return;
    }
    if (!enable && smart) {
        output->SetError(smartMessage);
        return;
    }
    if (!unconfigure && !path && !enable) {
        output->SetError("Please specify an action. Run with --help for details.");
        return;
    }
    if (unconfigure && path) {
        output->SetError("--unconfigure cannot be combined with --path.");
        return;
    }
    // Disabling with --smart is refused before the host is touched.
    const bool enableValue = enable && input->GetBool("enable");
    if (enable && !enableValue && smart) {
        output->SetError(smartMessage);
        return;
    }
    GuardHost(output, [&] {
        NorlithCtl::Storage::StorageInfoImpl storage;
        if (enable) {
            if (enableValue) {
                if (smart)
                    storage.SmartActivateDiagnosticFile();
                else
                    storage.ActivateDiagnosticFile();
            } else {
                storage.DeactivateDiagnosticFile();
            }
        } else if (unconfigure) {
            storage.DeactivateDiagnosticFile();
            storage.UnconfigureDiagnosticFile();
        } else {
            storage.SetDiagnosticFile(input->GetString("path"), true);
        }
        SetSuccess(output);
    });
}

}  // namespace System
}  // namespace TarselCli
