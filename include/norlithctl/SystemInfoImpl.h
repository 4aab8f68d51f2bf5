// NorlithCtl::System::SystemInfoImpl: the host's system-information object.
//
// Built per command on the stack; it holds no state of its own and reads or changes the host on
// every call. Construction and every operation may throw Ravel::Lib::RavelException (a fault set
// on the simulated host, or a host that cannot be opened).
#pragma once

#include <norlithctl/Export.h>

#include <norlithctl/Module.h>
#include <norlithctl/Testing.h>

#include <cstdint>
#include <string>
#include <vector>

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
    // The direct console's welcome message, byte for byte ("" when there is none).
    virtual std::string GetWelcomeMessage();
    // Replaces it. Refused (nothing changes) when empty, longer than 4096 bytes, not UTF-8, or
    // holding a control character other than tab, line feed and carriage return.
    virtual void SetWelcomeMessage(std::string message);

    // ---- maintenance mode
    // The host's maintenance mode: 1 enabled, 2 disabled; any other value is a state the host
    // cannot call either (3 entering, 4 exiting: a transition under way; 0 unknown).
    virtual int GetMaintenanceModeState();

    // ---- keyboard layouts

    // The layout in use now ("" when the host offers none).
    virtual std::string GetKeyboardLayout();
    // The layouts the host offers, in its order.
    virtual std::vector<std::string> GetKeyboardLayouts();
    // Stores the layout the host uses from the next boot. Names match without regard to case;
    // a layout the host does not offer is refused.
    virtual void SetKeyboardLayout(const std::string& layout);
    // Applies a layout's key mappings now, for this boot only; "" applies the layout in use
    // again. A layout the host does not offer is refused.
    virtual void LoadKeyboardMappings(const std::string& layout);

    // ---- modules and log levels

    // Every kernel module the host knows, in the host's order, as NorlithCtl::System::ModuleImpl
    // objects; the caller deletes every element.
    virtual std::vector<Ravel::System::Module*> GetModules();
    // The module of that name, or null when the host knows none by it; the caller deletes it.
    virtual Ravel::System::Module* GetModuleByName(std::string name);
    // The kernel core's log levels, in the host's order; the caller deletes every record
    // (NorlithCtl::Util::DeleteVector).
    virtual std::vector<Ravel::System::LogLevel*> GetAllLogLevels();
    // Sets a kernel core log level until the next boot; refuses an unknown name or a level
    // outside the host's range (0 to 31).
    virtual void SetLogLevel(std::string name, std::uint32_t level);
    // Returns a kernel core log level to its default.
    virtual void SetDefaultLogLevel(std::string name);

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
