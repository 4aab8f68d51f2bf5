#include "power/MaintenanceModeSet.h"

#include <norlithctl/SystemInfoImpl.h>
#include <norlithctl/Util.h>

#include <string>

namespace TarselCli {
namespace System {

boost::shared_ptr<MaintenanceModeSet> MaintenanceModeSet::New() {
    return boost::shared_ptr<MaintenanceModeSet>(new MaintenanceModeSet());
}

MaintenanceModeSet::MaintenanceModeSet() {
    SetDescription("Enable or disable the maintenance mode of the system.");
    SetMetaDataField("type", "operation");
}

MaintenanceModeSet::~MaintenanceModeSet() {}

InputSpecPtr MaintenanceModeSet::GetInputSpecInternal() {
    return MakeInputSpec({
        {"enable", "e", CallSpec::ParameterTypeBool, true, "enable maintenance mode"},
        {"timeout", "t", CallSpec::ParameterTypeInt, false,
         "Time to perform operation in seconds (default 60 seconds)"},
    });
}

OutputSpecPtr MaintenanceModeSet::GetOutputSpecInternal() { return BoolOutputSpec(); }

void MaintenanceModeSet::ExecuteInternal(const InputPtr& input, const OutputPtr& output) {
    GuardHost(
        output,
        [&] {
            NorlithCtl::System::SystemInfoImpl systemInfo;
            const int state = systemInfo.GetMaintenanceModeState();
            const bool enable = input->GetBool("enable");
            if (enable && state == 1) {
                output->SetError("Maintenance mode is already enabled.");
                return;
            }
            if (!enable && state == 2) {
                output->SetError("Maintenance mode is already disabled.");
                return;
            }
            const long long timeout = input->HasValue("timeout") ? input->GetInt("timeout") : 60;
            const std::string command = std::string("/bin/kelp-cmd hostsvc/maintenance_mode_") +
                                        (enable ? "enter" : "exit") + " " + std::to_string(timeout);
            if (NorlithCtl::Util::NorlithCtl_Exec(command, false, true, false) != 0) {
                output->SetError("Failed to perform requested operation.");
                return;
            }
            SetSuccess(output);
        },
        1);
}

}  // namespace System
}  // namespace TarselCli
