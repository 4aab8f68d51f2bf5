#include "coredump/KernelDumpSetPartition.h"

#include <norlithctl/StorageInfoImpl.h>

#include <string>

namespace TarselCli {
namespace System {

boost::shared_ptr<KernelDumpSetPartition> KernelDumpSetPartition::New() {
    return boost::shared_ptr<KernelDumpSetPartition>(new KernelDumpSetPartition());
}

KernelDumpSetPartition::KernelDumpSetPartition() {
    SetDescription(
        "Set the specific Norlith dump partition for this system. This will configure the dump partition "
        "for the next boot. This command will change the active dump partition to the partition "
        "specified.");
    SetMetaDataField("type", "operation");
}

KernelDumpSetPartition::~KernelDumpSetPartition() {}

InputSpecPtr KernelDumpSetPartition::GetInputSpecInternal() {
    return MakeInputSpec({
        {"enable", "e", CallSpec::ParameterTypeBool, false,
         "Enable or disable the Norlith dump partition. This option cannot be specified when setting or "
         "unconfiguring the dump partition."},
        {"smart", "s", CallSpec::ParameterTypeFlag, false,
         "This flag can be used only with --enable=true. It will cause the best available partition to be "
         "selected using the smart selection algorithm."},
        {"partition", "p", CallSpec::ParameterTypeString, false,
         "The name of the partition to use. This should be a device name with a partition number at the "
         "end. Example: naa.xxxxx:1"},
        {"unconfigure", "u", CallSpec::ParameterTypeFlag, false,
         "Set the dump partition into an unconfigured state. This will remove the current configured dump "
         "partition for the next boot. This will result in the smart activate algorithm being used at the "
         "next boot."},
    });
}

OutputSpecPtr KernelDumpSetPartition::GetOutputSpecInternal() { return BoolOutputSpec(); }

void KernelDumpSetPartition::ExecuteInternal(const InputPtr& input, const OutputPtr& output) {
    const bool unconfigure = input->GetFlag("unconfigure");
    const bool smart = input->GetFlag("smart");
    const bool enable = input->HasValue("enable");
    const bool partition = input->HasValue("partition");
    const char* smartMessage = "--smart can be specified only with --enable=true.";
    if (enable && (partition || unconfigure)) {
        output->SetError("--enable cannot be combined with --partition or --unconfigure.");
        return;
    }
    if (!enable && smart) {
        output->SetError(smartMessage);
        return;
    }
    if (partition && unconfigure) {
        output->SetError("--partition and --unconfigure may not be specified simultaneously.");
        return;
    }
    if (!unconfigure && !partition && !enable) {
        output->SetError("Please specify an action. Run with --help for details.");
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
                    storage.SmartActivateDiagnosticPartition();
                else
                    storage.ActivateDiagnosticPartition();
            } else {
                storage.DeactivateDiagnosticPartition();
            }
        } else if (unconfigure) {
            storage.DeactivateDiagnosticPartition();
            storage.UnconfigureDiagnosticPartition();
        } else {
            storage.SetDiagnosticPartition(input->GetString("partition"), true);
        }
        SetSuccess(output);
    });
}

}  // namespace System
}  // namespace TarselCli
