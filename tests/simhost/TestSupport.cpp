#include "TestSupport.h"

#include <simhost/Host.h>

namespace simtest {

std::string ScenarioFile(const std::string& name) { return std::string(SCENARIO_DIR) + "/" + name; }

std::string EditedDefault(const std::string& pointer, const nlohmann::json& value) {
    nlohmann::json document = nlohmann::json::parse(simhost::DefaultScenario());
    document[nlohmann::json::json_pointer(pointer)] = value;
    return document.dump();
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
