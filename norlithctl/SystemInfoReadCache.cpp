// The read cache operations of NorlithCtl::System::SystemInfoImpl: the running state and the
// next-boot state of the content based read cache (domain "readcache"), kept apart.
#include <norlithctl/SystemInfoImpl.h>

#include "HostCall.h"

#include <simhost/domains/Memfs.h>

namespace NorlithCtl {
namespace System {

using simhost::Op;
using simhost::readcache::ReadCache;

bool SystemInfoImpl::GetCbrcRuntimeEnabled() {
    return norlithctl::HostCall([] {
        simhost::Call call(Op::SystemInfoImpl_GetCbrcRuntimeEnabled);
        return call.Read<ReadCache>().runtime_enabled;
    });
}

bool SystemInfoImpl::GetCbrcConfiguredEnabled() {
    return norlithctl::HostCall([] {
        simhost::Call call(Op::SystemInfoImpl_GetCbrcConfiguredEnabled);
        return call.Read<ReadCache>().configured_enabled;
    });
}

void SystemInfoImpl::SetCbrcEnabled(bool enabled) {
    norlithctl::HostCall([&] {
        simhost::Call call(Op::SystemInfoImpl_SetCbrcEnabled, simhost::Args().Add("enabled", enabled));
        call.Update<ReadCache>([&](ReadCache& cache) { cache.configured_enabled = enabled; });
    });
}

}  // namespace System
}  // namespace NorlithCtl
