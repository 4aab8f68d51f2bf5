// NorlithCtl::System::SystemInfoImpl: the host's system-information object.
//
// Built per command on the stack; it holds no state of its own and reads or changes the host on
// every call. Construction and every operation may throw Ravel::Lib::RavelException (a fault set
// on the simulated host, or a host that cannot be opened).
#pragma once

#include <norlithctl/Export.h>

#include <norlithctl/Testing.h>

#include <string>

namespace NorlithCtl {
namespace System {

class NORLITHCTL_API SystemInfoImpl {
public:
    SystemInfoImpl();
    virtual ~SystemInfoImpl();

    // The system UUID in its canonical text form.
    virtual std::string GetSystemUuid();
    // The MAC address of the NIC the host booted from; "" when it did not boot from the network.
    virtual std::string GetBootNicMacAddress();
    // The UUID of the file system the host booted from; "" when none.
    virtual std::string GetBootFsUUID();
    // The MAC address of the stateless-boot NIC; "" when the host is not stateless.
    virtual std::string GetStatelessBootNicMacAddress();

    // ---- welcome message

    // ---- maintenance mode

    // ---- keyboard layouts

    // ---- modules and log levels

    // ---- read cache

    // Whether the content based read cache is active now.
    virtual bool GetCbrcRuntimeEnabled();
    // Whether it is enabled from the next boot on.
    virtual bool GetCbrcConfiguredEnabled();
    // Enables or disables it from the next boot on; a reboot makes that the running state.
    virtual void SetCbrcEnabled(bool enabled);

private:
    SystemInfoImpl(const SystemInfoImpl&);
    SystemInfoImpl& operator=(const SystemInfoImpl&);

    LiveObject live_;
};

}  // namespace System
}  // namespace NorlithCtl
