// The system-information object's maintenance-mode operation. The state is changed by the host
// management tool (/bin/kelp-cmd, run through NorlithCtl_Exec), never by this object.
#include <norlithctl/SystemInfoImpl.h>

#include "HostCall.h"

#include <simhost/domains/Maintenance.h>

namespace NorlithCtl {
namespace System {

int SystemInfoImpl::GetMaintenanceModeState() {
    return norlithctl::HostCall([&] {
        simhost::Call call(simhost::Op::SystemInfoImpl_GetMaintenanceModeState);
        using simhost::maintenance::Maintenance;
        return simhost::maintenance::StateCode(call.Read<Maintenance>().state);
    });
}

}  // namespace System
}  // namespace NorlithCtl
