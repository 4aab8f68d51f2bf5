// A domain of the simulated host: one self-contained part of its state (identity, observation
// log, and later kernel settings, modules, dump targets, SNMP agent, ...).
//
// A domain owns its tables (Schema), its scenario section (Parse validates it completely and
// throws ScenarioError with the JSON location; ToJson renders it back in the same form), and
// Read/Write between its tables and a Section. Its host operations live beside it in the same
// unit and go through Call (see Call.h), and OperationNames lists them for the fault registry.
// Adding a domain is one new unit plus one line in Domains().
//
// Sections are plain values owned by whoever parsed or read them.
#pragma once

#include <simhost/Export.h>

#include <simhost/Db.h>
#include <simhost/Scenario.h>

#include <nlohmann/json.hpp>

#include <memory>
#include <string>
#include <vector>

namespace simhost {

class SIMHOST_API Domain {
public:
    virtual ~Domain() = default;
    // The scenario member that holds this domain, e.g. "identity".
    virtual std::string Name() const = 0;
    // CREATE TABLE statements for the domain's tables.
    virtual std::string Schema() const = 0;
    // Fully qualified names of the host operations this domain serves.
    virtual std::vector<std::string> OperationNames() const = 0;
    // Parses and validates the domain's section. value is nullptr when the scenario lacks the
    // member: a domain either fails then or supplies its empty state.
    virtual std::unique_ptr<Section> Parse(const nlohmann::json* value, const Location& at) const = 0;
    // Reads the domain's current state.
    virtual std::unique_ptr<Section> Read(Db& db) const = 0;
};

// Every domain, in scenario order. Owned by the library; valid for the process's lifetime.
SIMHOST_API const std::vector<const Domain*>& Domains();

}  // namespace simhost
