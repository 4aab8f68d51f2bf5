#include <simhost/Scenario.h>

#include <simhost/Events.h>
#include <simhost/Operations.h>

#include <algorithm>

namespace simhost {

using nlohmann::json;
using nlohmann::ordered_json;

namespace {

std::vector<Fault> ParseFaults(const json* value, const Location& at) {
    std::vector<Fault> faults;
    if (!value) return faults;
    if (!value->is_array()) at.Fail("expected an array");
    for (std::size_t i = 0; i < value->size(); ++i) {
        Location item = at.Index(i);
        ObjectReader reader((*value)[i], item);
        Fault fault;
        fault.operation = reader.Text("operation", 255, false);
        if (!IsKnownOperation(fault.operation))
            item.Member("operation").Fail(UnknownOperationText(fault.operation));
        fault.message = reader.Text("message", kMaxFaultMessage);
        if (reader.Member("times", false)) fault.remaining = reader.Integer("times", 1, kMaxFaultTimes);
        if (const nlohmann::json* event = reader.Member("event", false)) {
            ObjectReader fields(*event, item.Member("event"));
            fault.event.id = fields.Text("id", 255, false);
            if (const nlohmann::json* args = fields.Member("args", false))
                Codec<std::vector<std::string>>::Read(*args, item.Member("event").Member("args"),
                                                      fault.event.args);
            fields.Done();
            std::string problem = CheckEvent(fault.event);
            if (!problem.empty()) item.Member("event").Fail(problem);
        }
        reader.Done();
        for (const Fault& earlier : faults)
            if (earlier.operation == fault.operation)
                item.Member("operation").Fail("a fault on '" + fault.operation + "' is already set");
        faults.push_back(std::move(fault));
    }
    std::sort(faults.begin(), faults.end(),
              [](const Fault& a, const Fault& b) { return a.operation < b.operation; });
    return faults;
}

}  // namespace

Scenario ParseScenario(const std::string& text) {
    json document;
    // nlohmann keeps the last of duplicate members silently; a scenario must not say two things.
    std::vector<std::vector<std::string>> keys;
    std::string duplicate;
    auto watch = [&](int, json::parse_event_t event, json& parsed) {
        if (event == json::parse_event_t::object_start) {
            keys.emplace_back();
        } else if (event == json::parse_event_t::object_end) {
            if (!keys.empty()) keys.pop_back();
        } else if (event == json::parse_event_t::key && !keys.empty() && duplicate.empty()) {
            const std::string& key = parsed.get_ref<const std::string&>();
            auto& seen = keys.back();
            if (std::find(seen.begin(), seen.end(), key) != seen.end()) duplicate = key;
            seen.push_back(key);
        }
        return true;
    };
    try {
        document = json::parse(text, watch);
    } catch (const json::exception& error) {
        // A syntax error, or a number too large to represent. nlohmann's text reads
        // "[json.exception.parse_error.101] parse error at line 1, ...".
        std::string what = error.what();
        auto pos = what.find("] ");
        throw ScenarioError("scenario: not valid JSON: " +
                            (pos == std::string::npos ? what : what.substr(pos + 2)));
    }
    Location root;
    if (!duplicate.empty()) root.Fail("member '" + duplicate + "' appears twice in one object");
    ObjectReader reader(document, root);
    const json* format = reader.Member("format");
    if (!format->is_number_integer() || format->get<std::int64_t>() != kScenarioFormat)
        root.Member("format").Fail("expected " + std::to_string(kScenarioFormat));
    Scenario scenario;
    for (const Domain* domain : Domains()) {
        std::string name = domain->Name();
        scenario.sections.push_back(domain->Parse(reader.Member(name, false), root.Member(name)));
    }
    scenario.faults = ParseFaults(reader.Member("faults", false), root.Member("faults"));
    reader.Done();
    return scenario;
}

std::string ScenarioText(const Scenario& scenario) {
    ordered_json document = ordered_json::object();
    document["format"] = kScenarioFormat;
    const auto& domains = Domains();
    for (std::size_t i = 0; i < domains.size() && i < scenario.sections.size(); ++i)
        document[domains[i]->Name()] = scenario.sections[i]->ToJson();
    ordered_json faults = ordered_json::array();
    for (const Fault& fault : scenario.faults) {
        ordered_json item = ordered_json::object();
        item["operation"] = fault.operation;
        item["message"] = fault.message;
        if (fault.remaining) item["times"] = *fault.remaining;
        if (!fault.event.Empty()) item["event"] = {{"id", fault.event.id}, {"args", fault.event.args}};
        faults.push_back(std::move(item));
    }
    document["faults"] = std::move(faults);
    return document.dump(2) + "\n";
}

}  // namespace simhost
