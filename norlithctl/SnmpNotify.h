// Sending the agent's test notification (warmStart) to one destination over UDP with Net-SNMP's
// library: an SNMPv1 trap with a community, or an SNMPv3 trap or inform with a user's localized
// keys.
//
// A trap counts as delivered once its datagram has left; an inform once the receiver has
// acknowledged it, waiting at most kInformTimeoutSeconds in all (a few tries). Nothing here
// blocks longer. The library is set up once per process without reading any configuration file
// or MIB and without writing persistent state. Keys are taken as given and never logged. The
// sending is done by the SNMP support module (SnmpModule.h), loaded on first use. Internal to the
// host-control library.
#pragma once

#include <string>

namespace norlithctl {
namespace snmpnotify {

constexpr int kInformTimeoutSeconds = 3;

struct Destination {
    std::string host;
    unsigned port = 162;
    // Version 1: the community. Version 3: everything below.
    bool v3 = false;
    std::string community;
    bool inform = false;
    std::string user;
    std::string level;          // "none", "auth" or "priv"
    std::string auth_protocol;  // "MD5" or "SHA1" (when level is not "none")
    std::string auth_key;       // localized key bytes
    std::string priv_key;       // localized AES-128 key bytes (level "priv")
    std::string engine_id;      // bytes: the authoritative engine of the exchange
};

// Sends warmStart with the host's uptime (hundredths of a second) to the destination. Returns ""
// when it was delivered, else why not (for a message; never holds a key or a community).
std::string SendWarmStart(const Destination& destination, unsigned long uptime_ticks);

}  // namespace snmpnotify
}  // namespace norlithctl
