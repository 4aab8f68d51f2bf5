// system maintenanceMode set: puts the host in maintenance mode or takes it out, by running the
// host management tool (/bin/kelp-cmd hostsvc/maintenance_mode_enter or _exit, with the timeout,
// 60 seconds unless given) through the host's command executor. Asking for the state the host
// is in already is refused before anything runs; a tool that fails (timed out, missing, faulted)
// gives "Failed to perform requested operation.". Every host failure, the construction of the
// system-information object included, becomes the error in its event form (GetMessage(1)).
#pragma once

#include "frame/CommandModel.h"

namespace TarselCli {
namespace System {

class MaintenanceModeSet : public virtual AutoCli::Command {
public:
    static boost::shared_ptr<MaintenanceModeSet> New();
    virtual ~MaintenanceModeSet();

    InputSpecPtr GetInputSpecInternal() override;
    OutputSpecPtr GetOutputSpecInternal() override;
    void ExecuteInternal(const InputPtr& input, const OutputPtr& output) override;

protected:
    MaintenanceModeSet();
};

}  // namespace System
}  // namespace TarselCli
