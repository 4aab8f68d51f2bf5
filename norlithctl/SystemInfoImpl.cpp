#include <norlithctl/SystemInfoImpl.h>

#include "HostCall.h"

#include <simhost/domains/Identity.h>

namespace NorlithCtl {
namespace System {
namespace {

using simhost::Op;
using simhost::identity::Identity;

// Reads one identity field under the named operation.
std::string IdentityField(Op operation, std::string Identity::*field) {
    return norlithctl::HostCall([&] {
        simhost::Call call(operation);
        return call.Read<Identity>().*field;
    });
}

}  // namespace

SystemInfoImpl::SystemInfoImpl() {
    // The object keeps no state; constructing it opens the host (and may fault).
    norlithctl::HostCall([] { simhost::Call call(Op::SystemInfoImpl_New); });
}

SystemInfoImpl::~SystemInfoImpl() {}

std::string SystemInfoImpl::GetSystemUuid() {
    return IdentityField(Op::SystemInfoImpl_GetSystemUuid, &Identity::system_uuid);
}

std::string SystemInfoImpl::GetBootNicMacAddress() {
    return IdentityField(Op::SystemInfoImpl_GetBootNicMacAddress, &Identity::boot_nic_mac);
}

std::string SystemInfoImpl::GetBootFsUUID() {
    return IdentityField(Op::SystemInfoImpl_GetBootFsUUID, &Identity::boot_fs_uuid);
}

std::string SystemInfoImpl::GetStatelessBootNicMacAddress() {
    return IdentityField(Op::SystemInfoImpl_GetStatelessBootNicMacAddress,
                         &Identity::stateless_boot_nic_mac);
}

}  // namespace System
}  // namespace NorlithCtl
