#include "SnmpTestSupport.h"

#include <simhost/Host.h>

#include <fstream>
#include <sstream>

namespace snmptest {

using Kitbase::MetaObj::MetaBool;
using Kitbase::MetaObj::MetaInt;
using Kitbase::MetaObj::MetaList;
using Kitbase::MetaObj::MetaObject;
using Kitbase::MetaObj::MetaString;
using Kitbase::MetaObj::MetaStruct;

std::string AgentXml(const std::string& body) {
    return "<?xml version=\"1.0\" encoding=\"UTF-8\"?>\n<snmpAgent>\n" + body + "\n</snmpAgent>\n";
}

std::string ScenarioWithConfig(const std::string& text) {
    nlohmann::json scenario = {{"format", 1}};
    scenario["files"] = nlohmann::json::array({{{"path", kConfigPath}, {"text", text}}});
    return scenario.dump();
}

plugintest::Run Invoke(const std::string& path, const Args& args) {
    plugintest::InputPtr input = Kitbase::CallSpec::Input::New();
    for (const auto& [name, value] : args.strings) input->SetString(name, value);
    for (const auto& [name, value] : args.bools) input->SetBool(name, value);
    for (const auto& [name, value] : args.ints) input->SetInt(name, value);
    for (const std::string& name : args.flags) input->SetFlag(name);
    return plugintest::Execute(plugintest::FindCommand(path), input);
}

namespace {

nlohmann::ordered_json ToJson(const boost::shared_ptr<MetaObject>& value) {
    if (auto text = boost::dynamic_pointer_cast<MetaString>(value))
        return text->HasValue() ? nlohmann::ordered_json(text->GetValue()) : nlohmann::ordered_json();
    if (auto number = boost::dynamic_pointer_cast<MetaInt>(value))
        return number->HasValue() ? nlohmann::ordered_json(number->GetValue()) : nlohmann::ordered_json();
    if (auto flag = boost::dynamic_pointer_cast<MetaBool>(value))
        return flag->HasValue() ? nlohmann::ordered_json(flag->GetValue()) : nlohmann::ordered_json();
    if (auto list = boost::dynamic_pointer_cast<MetaList>(value)) {
        nlohmann::ordered_json items = nlohmann::ordered_json::array();
        for (const auto& element : list->GetElements()) items.push_back(ToJson(element));
        return items;
    }
    if (auto structure = boost::dynamic_pointer_cast<MetaStruct>(value)) {
        nlohmann::ordered_json object = nlohmann::ordered_json::object();
        for (const MetaStruct::Field& field : structure->GetFields()) object[field.first] = ToJson(field.second);
        return object;
    }
    return nullptr;
}

}  // namespace

nlohmann::ordered_json ResultJson(const plugintest::Run& run) { return ToJson(run.output->GetResult()); }

std::vector<std::string> Errors(const plugintest::Run& run) { return run.output->GetErrors(); }

std::string ConfigText() {
    std::ifstream file(simhost::Host::FromEnvironment().Root() + kConfigPath, std::ios::binary);
    if (!file) return "<missing>";
    std::ostringstream text;
    text << file.rdbuf();
    return text.str();
}

}  // namespace snmptest
