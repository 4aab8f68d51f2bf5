// What the SNMP agent's command tests share: hosts whose agent configuration file is given,
// running a command with an input, and reading its structured result as plain values.
#pragma once

#include "Harness.h"

#include <kitbase/MetaObj.h>

#include <nlohmann/json.hpp>

#include <map>
#include <string>
#include <vector>

namespace snmptest {

const char kConfigPath[] = "/etc/tarsel/snmp.xml";

// An agent configuration file: the XML prologue and <snmpAgent> around body.
std::string AgentXml(const std::string& body);
// A scenario whose host holds the given configuration file text (and nothing else under root/).
std::string ScenarioWithConfig(const std::string& text);

// Parameter values by long name: a string, or for the flags and booleans listed, "" / "true".
struct Args {
    std::map<std::string, std::string> strings;
    std::map<std::string, bool> bools;
    std::map<std::string, long long> ints;
    std::vector<std::string> flags;
};
plugintest::Run Invoke(const std::string& path, const Args& args = Args());

// The result structure as JSON (lists as arrays, unset values as null); null when no result.
nlohmann::ordered_json ResultJson(const plugintest::Run& run);
std::vector<std::string> Errors(const plugintest::Run& run);

// The configuration file of the current host (QUARN_HOST_STATE), or "<missing>".
std::string ConfigText();

}  // namespace snmptest
