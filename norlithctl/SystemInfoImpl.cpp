#include <norlithctl/SystemInfoImpl.h>

#include "HostCall.h"

#include <simhost/domains/Identity.h>

namespace NorlithCtl {
namespace System {
namespace {

const std::string kPrefix = "NorlithCtl::System::SystemInfoImpl::";

// Reads one identity field under the named operation.
std::string IdentityField(const char* operation, std::string simhost::identity::Identity::*field) {
    return norlithctl::HostCall([&] {
        simhost::Call call(kPrefix + operation);
        return simhost::identity::Read(call.db()).*field;
    });
}

}  // namespace

SystemInfoImpl::SystemInfoImpl() {
    // The object keeps no state; constructing it opens the host (and may fault).
    norlithctl::HostCall([] { simhost::Call call(kPrefix + "SystemInfoImpl"); });
}

SystemInfoImpl::~SystemInfoImpl() {}

std::string SystemInfoImpl::GetSystemUuid() {
    return IdentityField("GetSystemUuid", &simhost::identity::Identity::system_uuid);
}

std::string SystemInfoImpl::GetBootNicMacAddress() {
    return IdentityField("GetBootNicMacAddress", &simhost::identity::Identity::boot_nic_mac);
}

std::string SystemInfoImpl::GetBootFsUUID() {
    return IdentityField("GetBootFsUUID", &simhost::identity::Identity::boot_fs_uuid);
}

std::string SystemInfoImpl::GetStatelessBootNicMacAddress() {
    return IdentityField("GetStatelessBootNicMacAddress",
                         &simhost::identity::Identity::stateless_boot_nic_mac);
}

}  // namespace System
}  // namespace NorlithCtl
