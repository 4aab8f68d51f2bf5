// Scenarios: JSON documents that describe a whole simulated host.
//
// A scenario is an object with "format": 1, one member per domain (see State.h and
// Registry.def) and an optional "faults" array. A missing domain member means that domain's
// default state, so a scenario names only what it needs. ParseScenario validates the whole
// document before anything is written and throws HostError (kScenario) naming the JSON location
// of the first problem; the Scenario it returns owns one Section per domain, in the order of
// Domains(). ScenarioText renders a scenario in the export format (two-space indentation, every
// domain, members in a fixed order, a final newline), so that parsing an export and exporting it
// again gives the same bytes.
#pragma once

#include <simhost/Export.h>

#include <simhost/Error.h>
#include <simhost/Faults.h>
#include <simhost/Mapping.h>
#include <simhost/State.h>

#include <memory>
#include <string>
#include <vector>

namespace simhost {

// The scenario format this build reads and writes.
constexpr int kScenarioFormat = 1;

struct Scenario {
    std::vector<std::unique_ptr<Section>> sections;  // one per domain, in Domains() order
    std::vector<Fault> faults;                       // sorted by operation
};

SIMHOST_API Scenario ParseScenario(const std::string& text);
SIMHOST_API std::string ScenarioText(const Scenario& scenario);

}  // namespace simhost
