// Fuzzes the reader of the SNMP agent's configuration file with arbitrary text: it either
// refuses the text with a host error (never another exception, never a crash) or gives a
// configuration that, written out and read again, is the same configuration.
#include "SnmpConfig.h"

#include <simhost/Error.h>

#include <cstddef>
#include <cstdint>
#include <cstdlib>
#include <string>

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
    const std::string text(reinterpret_cast<const char*>(data), size);
    norlithctl::snmp::AgentConfig config;
    try {
        config = norlithctl::snmp::FromXml(text);
    } catch (const simhost::HostError&) {
        return 0;
    }
    const std::string written = norlithctl::snmp::ToXml(config);
    norlithctl::snmp::AgentConfig again;
    try {
        again = norlithctl::snmp::FromXml(written);
    } catch (const simhost::HostError&) {
        std::abort();  // what was accepted and written must read back
    }
    if (norlithctl::snmp::ToXml(again) != written) std::abort();
    return 0;
}
