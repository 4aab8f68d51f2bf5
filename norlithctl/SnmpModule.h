// The SNMP support module: the parts of the SNMP agent's host class that need OpenSSL (the keys'
// digests) and Net-SNMP (sending test notifications), built as lib/quarncli/modules/
// libquarnsnmp.so and loaded on first use, so that the many programs that never make a key or
// send a notification start without loading either library.
//
// The module exports one C function, QuarnSnmpModule, returning its table of functions. It links
// no C++ runtime of its own: like a plug-in, it uses the one of the program that loads it.
// SnmpModule() loads it once per process (thread-safe) from beside the running program
// (<directory of /proc/self/exe>/../lib/quarncli/modules/) and throws simhost::HostError when it
// cannot. Internal to the host-control library.
#pragma once

#include "SnmpKeys.h"
#include "SnmpNotify.h"

#include <string>

namespace norlithctl {

struct SnmpModuleApi {
    // The version of this table; a module of another version is refused.
    int version;
    std::string (*localized_auth_key)(snmpkeys::Digest digest, const std::string& secret,
                                      const std::string& engine_id);
    std::string (*localized_aes128_key)(snmpkeys::Digest digest, const std::string& secret,
                                        const std::string& engine_id);
    std::string (*send_warm_start)(const snmpnotify::Destination& destination,
                                   unsigned long uptime_ticks);
};

constexpr int kSnmpModuleVersion = 1;
constexpr char kSnmpModuleEntry[] = "QuarnSnmpModule";
typedef const SnmpModuleApi* (*SnmpModuleEntry)();

// The loaded module's table.
const SnmpModuleApi& SnmpModule();

namespace snmpmodule {
// The module's implementations (norlithctl/snmp/).
std::string LocalizedAuthKey(snmpkeys::Digest digest, const std::string& secret,
                             const std::string& engine_id);
std::string LocalizedAes128Key(snmpkeys::Digest digest, const std::string& secret,
                               const std::string& engine_id);
std::string SendWarmStart(const snmpnotify::Destination& destination, unsigned long uptime_ticks);
}  // namespace snmpmodule

}  // namespace norlithctl
