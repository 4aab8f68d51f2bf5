// What a NorlithCtl::System::SnmpAgentConfigImpl has staged but not saved. Internal to the
// host-control library; shared by the units that implement the class.
#pragma once

#include <norlithctl/SnmpAgentConfigImpl.h>

#include "SnmpConfig.h"

#include <functional>
#include <string>
#include <vector>

namespace NorlithCtl {
namespace System {

// The changes staged since construction (or since the last SaveConfig), applied in order to the
// stored configuration, or to the factory one once Reset() is staged. The configuration lives
// in a file, not in the host's database, so the changes apply to a value rather than through
// simhost::Stage; they are journaled the same way, one entry for SaveConfig.
struct SnmpAgentConfigImpl::Pending {
    struct Change {
        std::string name;
        nlohmann::ordered_json shown;  // as journaled: secrets masked
        std::function<void(norlithctl::snmp::AgentConfig&)> apply;
    };

    bool reset = false;
    std::vector<Change> changes;

    norlithctl::snmp::AgentConfig View(const std::string& root) const {
        norlithctl::snmp::AgentConfig config = reset ? norlithctl::snmp::FactoryConfig() : norlithctl::snmp::LoadConfig(root);
        for (const Change& change : changes) change.apply(config);
        return config;
    }
};

}  // namespace System
}  // namespace NorlithCtl
