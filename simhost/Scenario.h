// Scenarios: JSON documents that describe a whole simulated host.
//
// A scenario is an object with "format": 1, one member per domain (see Domain.h) and an optional
// "faults" array. ParseScenario validates the whole document before anything is written and
// throws ScenarioError naming the JSON location of the first problem; the Scenario it returns
// owns one Section per domain, in the order of Domains(). ScenarioText renders a scenario in the
// export format (two-space indentation, members in a fixed order, a final newline), so that
// parsing an export and exporting it again gives the same bytes.
//
// Location and ObjectReader are the validation helpers every domain uses for its own section.
#pragma once

#include <simhost/Export.h>

#include <simhost/Error.h>
#include <simhost/Faults.h>

#include <nlohmann/json.hpp>

#include <cstddef>
#include <memory>
#include <string>
#include <vector>

namespace simhost {

class Db;

// One domain's part of a scenario, as a plain value (see Domain.h).
class SIMHOST_API Section {
public:
    virtual ~Section() = default;
    // The section as it appears in a scenario (members in a fixed order).
    virtual nlohmann::ordered_json ToJson() const = 0;
    // Stores the section into the domain's tables, which are empty; runs inside the caller's
    // write transaction.
    virtual void Write(Db& db) const = 0;
};

// The scenario format this build reads and writes.
constexpr int kScenarioFormat = 1;

struct Scenario {
    std::vector<std::unique_ptr<Section>> sections;  // one per domain, in Domains() order
    std::vector<Fault> faults;                       // sorted by operation
};

SIMHOST_API Scenario ParseScenario(const std::string& text);
SIMHOST_API std::string ScenarioText(const Scenario& scenario);

// A position in a scenario document, e.g. "identity.product" or "faults[2].times".
class SIMHOST_API Location {
public:
    Location() = default;
    Location Member(const std::string& name) const;
    Location Index(std::size_t index) const;
    const std::string& Path() const { return path_; }
    // Throws ScenarioError "scenario: PATH: WHAT" ("scenario: WHAT" at the document's root).
    [[noreturn]] void Fail(const std::string& what) const;

private:
    std::string path_;
};

// Reads one JSON object member by member and refuses members it was not asked for.
class SIMHOST_API ObjectReader {
public:
    // Fails unless value is an object.
    ObjectReader(const nlohmann::json& value, Location at);

    // The member's value, or nullptr when absent and optional; fails when absent and required.
    const nlohmann::json* Member(const std::string& name, bool required = true);
    // A text member of at most max_bytes bytes (UTF-8) without NUL characters.
    std::string Text(const std::string& name, std::size_t max_bytes, bool allow_empty = true);
    // An integer member within [min, max].
    std::int64_t Integer(const std::string& name, std::int64_t min, std::int64_t max);
    // Fails on the first member that was never asked for.
    void Done() const;

    Location At(const std::string& name) const { return at_.Member(name); }

private:
    const nlohmann::json& value_;
    Location at_;
    std::vector<std::string> seen_;
};

// Checks shared by scenario validation and host operations. Each returns "" when the value is
// acceptable, else the reason (e.g. "expected a string of at most 31 bytes").
SIMHOST_API std::string CheckText(const std::string& value, std::size_t max_bytes, bool allow_empty = true);
SIMHOST_API bool IsValidUtf8(const std::string& value);

}  // namespace simhost
