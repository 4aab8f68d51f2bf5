#include <simhost/Scenario.h>

#include <simhost/Domain.h>
#include <simhost/Operations.h>

#include <algorithm>

namespace simhost {

using nlohmann::json;
using nlohmann::ordered_json;

Location Location::Member(const std::string& name) const {
    Location next;
    next.path_ = path_.empty() ? name : path_ + "." + name;
    return next;
}

Location Location::Index(std::size_t index) const {
    Location next;
    next.path_ = path_ + "[" + std::to_string(index) + "]";
    return next;
}

void Location::Fail(const std::string& what) const {
    throw ScenarioError(path_.empty() ? "scenario: " + what : "scenario: " + path_ + ": " + what);
}

bool IsValidUtf8(const std::string& value) {
    const auto* s = reinterpret_cast<const unsigned char*>(value.data());
    std::size_t n = value.size();
    for (std::size_t i = 0; i < n;) {
        unsigned char c = s[i];
        std::size_t len;
        std::uint32_t cp;
        if (c < 0x80) {
            ++i;
            continue;
        } else if ((c & 0xE0) == 0xC0) {
            len = 2;
            cp = c & 0x1F;
        } else if ((c & 0xF0) == 0xE0) {
            len = 3;
            cp = c & 0x0F;
        } else if ((c & 0xF8) == 0xF0) {
            len = 4;
            cp = c & 0x07;
        } else {
            return false;
        }
        if (i + len > n) return false;
        for (std::size_t k = 1; k < len; ++k) {
            if ((s[i + k] & 0xC0) != 0x80) return false;
            cp = (cp << 6) | (s[i + k] & 0x3F);
        }
        // Overlong forms, surrogates and values past U+10FFFF are not UTF-8.
        if ((len == 2 && cp < 0x80) || (len == 3 && cp < 0x800) || (len == 4 && cp < 0x10000) ||
            (cp >= 0xD800 && cp <= 0xDFFF) || cp > 0x10FFFF)
            return false;
        i += len;
    }
    return true;
}

std::string CheckText(const std::string& value, std::size_t max_bytes, bool allow_empty) {
    if (value.size() > max_bytes)
        return "expected a string of at most " + std::to_string(max_bytes) + " bytes";
    if (!allow_empty && value.empty()) return "expected a non-empty string";
    if (value.find('\0') != std::string::npos) return "must not contain a NUL character";
    if (!IsValidUtf8(value)) return "expected UTF-8 text";
    return "";
}

ObjectReader::ObjectReader(const json& value, Location at) : value_(value), at_(std::move(at)) {
    if (!value_.is_object()) at_.Fail("expected an object");
}

const json* ObjectReader::Member(const std::string& name, bool required) {
    seen_.push_back(name);
    auto it = value_.find(name);
    if (it == value_.end()) {
        if (required) at_.Fail("missing member '" + name + "'");
        return nullptr;
    }
    return &*it;
}

std::string ObjectReader::Text(const std::string& name, std::size_t max_bytes, bool allow_empty) {
    const json* value = Member(name);
    if (!value->is_string())
        At(name).Fail("expected a string of at most " + std::to_string(max_bytes) + " bytes");
    const std::string& text = value->get_ref<const std::string&>();
    std::string problem = CheckText(text, max_bytes, allow_empty);
    if (!problem.empty()) At(name).Fail(problem);
    return text;
}

std::int64_t ObjectReader::Integer(const std::string& name, std::int64_t min, std::int64_t max) {
    const json* value = Member(name);
    std::string expected =
        "expected an integer from " + std::to_string(min) + " to " + std::to_string(max);
    if (value->is_number_unsigned()) {
        if (value->get<std::uint64_t>() > static_cast<std::uint64_t>(max)) At(name).Fail(expected);
    } else if (!value->is_number_integer()) {
        At(name).Fail(expected);
    }
    std::int64_t number = value->get<std::int64_t>();
    if (number < min || number > max) At(name).Fail(expected);
    return number;
}

void ObjectReader::Done() const {
    for (auto it = value_.begin(); it != value_.end(); ++it) {
        if (std::find(seen_.begin(), seen_.end(), it.key()) == seen_.end())
            at_.Fail("unknown member '" + it.key() + "'");
    }
}

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
        if (!IsKnownOperation(fault.operation)) {
            std::string hint;
            for (const std::string& near : NearestOperations(fault.operation))
                hint += (hint.empty() ? "" : ", ") + near;
            item.Member("operation").Fail("unknown operation '" + fault.operation + "'" +
                                          (hint.empty() ? "" : " (nearest: " + hint + ")"));
        }
        fault.message = reader.Text("message", kMaxFaultMessage);
        if (reader.Member("times", false)) fault.remaining = reader.Integer("times", 1, kMaxFaultTimes);
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
        faults.push_back(std::move(item));
    }
    document["faults"] = std::move(faults);
    return document.dump(2) + "\n";
}

}  // namespace simhost
