#include "SnmpModule.h"

#include <simhost/Error.h>

#include <climits>
#include <mutex>

#include <dlfcn.h>
#include <unistd.h>

namespace norlithctl {
namespace {

std::string ModulePath() {
    char exe[PATH_MAX];
    ssize_t size = readlink("/proc/self/exe", exe, sizeof exe - 1);
    if (size <= 0)
        throw simhost::HostError(
            "Cannot find the SNMP support module: the program's location (/proc/self/exe) cannot "
            "be read");
    std::string path(exe, static_cast<std::size_t>(size));
    return path.substr(0, path.rfind('/')) + "/../lib/quarncli/modules/libquarnsnmp.so";
}

const SnmpModuleApi* Load(std::string* error) {
    std::string path;
    try {
        path = ModulePath();
    } catch (const simhost::HostError& failure) {
        *error = failure.what();
        return nullptr;
    }
    // Kept loaded for the rest of the process: its functions may be called at any time.
    void* handle = dlopen(path.c_str(), RTLD_NOW | RTLD_LOCAL);
    if (!handle) {
        const char* why = dlerror();
        *error = "Cannot load the SNMP support module '" + path + "': " + (why ? why : "unknown error");
        return nullptr;
    }
    auto entry = reinterpret_cast<SnmpModuleEntry>(dlsym(handle, kSnmpModuleEntry));
    const SnmpModuleApi* api = entry ? entry() : nullptr;
    if (!api || api->version != kSnmpModuleVersion) {
        *error = "The SNMP support module '" + path + "' is not the one this program was built with";
        return nullptr;
    }
    return api;
}

}  // namespace

const SnmpModuleApi& SnmpModule() {
    static std::once_flag once;
    static const SnmpModuleApi* api = nullptr;
    static std::string error;
    std::call_once(once, [] { api = Load(&error); });
    if (!api) throw simhost::HostError(error);
    return *api;
}

namespace snmpnotify {

std::string SendWarmStart(const Destination& destination, unsigned long uptime_ticks) {
    return SnmpModule().send_warm_start(destination, uptime_ticks);
}

}  // namespace snmpnotify
}  // namespace norlithctl
