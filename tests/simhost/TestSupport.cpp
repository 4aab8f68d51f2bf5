#include "TestSupport.h"

#include <simhost/Host.h>

namespace simtest {

std::string ScenarioFile(const std::string& name) { return std::string(SCENARIO_DIR) + "/" + name; }

std::string EditedDefault(const std::string& pointer, const nlohmann::json& value) {
    nlohmann::json document = nlohmann::json::parse(simhost::DefaultScenario());
    document[nlohmann::json::json_pointer(pointer)] = value;
    return document.dump();
}

namespace {
bool HoldsJson(const nlohmann::json& state, const nlohmann::json& wanted) {
    if (!wanted.is_object()) return state == wanted;
    if (!state.is_object()) return false;
    for (auto it = wanted.begin(); it != wanted.end(); ++it)
        if (!state.contains(it.key()) || !HoldsJson(state[it.key()], it.value())) return false;
    return true;
}
}  // namespace

bool Holds(const std::string& exported, const std::string& scenario) {
    return HoldsJson(nlohmann::json::parse(exported), nlohmann::json::parse(scenario));
}

testsupport::ProcessResult RunQuarnhost(
    const std::vector<std::string>& args,
    const std::map<std::string, std::optional<std::string>>& env) {
    return testsupport::RunProgram(QUARNHOST_PATH, args, env);
}

testsupport::ProcessResult RunQuarnhostWithInput(const std::vector<std::string>& args,
                                                 const std::string& input) {
    std::vector<std::string> shell{"-c", "exec \"$0\" \"$@\" < \"$QUARNHOST_INPUT\"", QUARNHOST_PATH};
    shell.insert(shell.end(), args.begin(), args.end());
    return testsupport::RunProgram("/bin/sh", shell, {{"QUARNHOST_INPUT", input}});
}

}  // namespace simtest
