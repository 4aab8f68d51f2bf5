// system maintenanceMode get: the host's maintenance mode as "Enabled", "Disabled" or
// "Unknown" (a state that is neither, such as a transition under way). Every host failure, the
// construction of the system-information object included, becomes the error in its event form
// (GetMessage(1)).
#pragma once

#include "frame/CommandModel.h"

namespace TarselCli {
namespace System {

class MaintenanceModeGet : public virtual AutoCli::Command {
public:
    static boost::shared_ptr<MaintenanceModeGet> New();
    virtual ~MaintenanceModeGet();

    InputSpecPtr GetInputSpecInternal() override;
    OutputSpecPtr GetOutputSpecInternal() override;
    void ExecuteInternal(const InputPtr& input, const OutputPtr& output) override;

protected:
    MaintenanceModeGet();
};

}  // namespace System
}  // namespace TarselCli
