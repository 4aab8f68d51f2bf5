// Helpers only the simulated host's tests need: paths of the shipped scenarios, the default
// scenario with one value edited, and quarnhost run as a process. Temporary directories, files,
// environment overrides and child processes come from the shared testsupport library. Reading a
// scenario or the default throws when the file or the JSON pointer is unusable.
#pragma once

#include "support/Files.h"
#include "support/Process.h"

#include <nlohmann/json.hpp>

#include <map>
#include <optional>
#include <string>
#include <vector>

namespace simtest {

std::string ScenarioFile(const std::string& name);  // path under scenarios/

// The default scenario with one JSON pointer replaced (e.g. "/identity/product").
std::string EditedDefault(const std::string& pointer, const nlohmann::json& value);

// Whether an exported host holds what a scenario says: every member the scenario gives (at any
// depth of objects) has the same value in the export. What the scenario leaves out is the
// domains' defaults and is not compared.
bool Holds(const std::string& exported, const std::string& scenario);

// Runs quarnhost with the arguments; env entries are set in the child (a nullopt value unsets).
testsupport::ProcessResult RunQuarnhost(
    const std::vector<std::string>& args,
    const std::map<std::string, std::optional<std::string>>& env = {});

// Runs quarnhost with the arguments and standard input read from the file at input.
testsupport::ProcessResult RunQuarnhostWithInput(const std::vector<std::string>& args,
                                                 const std::string& input);

}  // namespace simtest
