#include <simhost/domains/Modules.h>

#include <util/Text.h>

#include <cerrno>
#include <cstdlib>
#include <limits>
#include <set>

namespace simhost {
namespace modules {
namespace {

bool IsBlank(char c) { return c == ' ' || c == '\t'; }

// The words of an option string: the runs of characters between blanks.
std::vector<std::string> Words(const std::string& text) {
    std::vector<std::string> words;
    std::size_t at = 0;
    while (at < text.size()) {
        if (IsBlank(text[at])) {
            ++at;
            continue;
        }
        std::size_t end = at;
        while (end < text.size() && !IsBlank(text[end])) ++end;
        words.push_back(text.substr(at, end - at));
        at = end;
    }
    return words;
}

bool IsControl(unsigned char c) { return c < 0x20 || c == 0x7f; }

bool NameChars(const std::string& text, bool module) {
    if (text.empty() || text.size() > kMaxName) return false;
    for (char c : text) {
        bool ok = (c >= 'a' && c <= 'z') || (c >= 'A' && c <= 'Z') || (c >= '0' && c <= '9') ||
                  c == '_' || (module && (c == '-' || c == '.'));
        if (!ok) return false;
    }
    return true;
}

// Decimal digits, optionally after a sign, within [min, max].
bool IsInteger(const std::string& text, long long min, long long max) {
    std::size_t digits = (!text.empty() && (text[0] == '-' || text[0] == '+')) ? 1 : 0;
    if (text.size() == digits || text.size() > digits + 11) return false;
    for (std::size_t i = digits; i < text.size(); ++i)
        if (text[i] < '0' || text[i] > '9') return false;
    long long value = std::strtoll(text.c_str(), nullptr, 10);
    return value >= min && value <= max;
}

std::string CheckElement(const std::string& type, const std::string& value) {
    if (type == "int")
        return IsInteger(value, std::numeric_limits<std::int32_t>::min(),
                         std::numeric_limits<std::int32_t>::max())
                   ? ""
                   : "an integer from -2147483648 to 2147483647";
    if (type == "uint")
        return IsInteger(value, 0, std::numeric_limits<std::uint32_t>::max()) && value[0] != '-'
                   ? ""
                   : "an integer from 0 to 4294967295";
    if (type == "bool") {
        static const std::set<std::string> kBool = {"0", "1", "y", "n", "Y", "N", "true", "false"};
        return kBool.count(value) ? "" : "one of 0, 1, y, n, Y, N, true, false";
    }
    return "";  // string: the string rules are checked for every value
}

}  // namespace

std::string QuoteName(const std::string& name) { return quarn::util::Quote(name, 64); }

const std::vector<std::string>& ParameterTypes() {
    static const std::vector<std::string> types = {"int", "uint", "bool", "string", "int array",
                                                   "uint array"};
    return types;
}

bool IsModuleName(const std::string& text) { return NameChars(text, true); }
bool IsParameterName(const std::string& text) { return NameChars(text, false); }
bool IsModuleOrCore(const std::string& text) { return text.empty() || IsModuleName(text); }

bool IsParameterType(const std::string& text) {
    for (const std::string& type : ParameterTypes())
        if (text == type) return true;
    return false;
}

std::string ParseOptions(const std::string& text, Pairs& pairs) {
    pairs.clear();
    if (text.size() > kMaxOptionString)
        return "the option string is " + std::to_string(text.size()) + " bytes long; at most " +
               std::to_string(kMaxOptionString) + " are accepted";
    std::set<std::string> seen;
    for (const std::string& word : Words(text)) {
        for (unsigned char c : word)
            if (IsControl(c))
                return "the option string holds a control character in " + QuoteName(word) +
                       "; expected name=value pairs separated by blanks";
        const std::size_t equals = word.find('=');
        if (equals == std::string::npos || equals == 0 || equals + 1 == word.size())
            return "expected name=value pairs separated by blanks, found " + QuoteName(word);
        std::string name = word.substr(0, equals);
        std::string value = word.substr(equals + 1);
        if (!IsParameterName(name))
            return "parameter name " + QuoteName(name) +
                   " is not valid: expected 1 to 64 characters A-Z a-z 0-9 _";
        if (value.size() > kMaxValue)
            return "the value of parameter " + QuoteName(name) + " is " +
                   std::to_string(value.size()) + " bytes long; at most 255 are accepted";
        if (!quarn::util::IsValidUtf8(value))
            return "the value of parameter " + QuoteName(name) + " is not UTF-8 text";
        if (!seen.insert(name).second)
            return "parameter " + QuoteName(name) + " is given twice";
        pairs.emplace_back(std::move(name), std::move(value));
    }
    return "";
}

Pairs LenientPairs(const std::string& text) {
    Pairs pairs;
    for (const std::string& word : Words(text)) {
        const std::size_t equals = word.find('=');
        if (equals != std::string::npos && equals > 0) {
            std::string name = word.substr(0, equals);
            bool known = false;
            for (auto& pair : pairs)
                if (pair.first == name) {
                    pair.second = word.substr(equals + 1);  // the last one counts
                    known = true;
                }
            if (!known) pairs.emplace_back(name, word.substr(equals + 1));
        }
    }
    return pairs;
}

std::string CheckValue(const std::string& type, const std::string& value) {
    if (type == "int array" || type == "uint array") {
        const std::string element = type.substr(0, type.find(' '));
        std::size_t count = 0;
        std::size_t at = 0;
        while (true) {
            std::size_t comma = value.find(',', at);
            std::string item = value.substr(at, comma == std::string::npos ? std::string::npos : comma - at);
            if (!CheckElement(element, item).empty() || ++count > kMaxArray)
                return "1 to 32 comma-separated elements, each " + CheckElement(element, "x");
            if (comma == std::string::npos) break;
            at = comma + 1;
        }
        return "";
    }
    return CheckElement(type, value);
}

std::string Module::Check() const {
    std::set<std::string> names;
    for (const Parameter& parameter : parameters)
        if (!names.insert(parameter.name).second)
            return "parameter '" + parameter.name + "' is declared twice";
    return "";
}

const Parameter* Module::FindParameter(const std::string& wanted) const {
    for (const Parameter& parameter : parameters)
        if (parameter.name == wanted) return &parameter;
    return nullptr;
}

void CheckName(const std::string& name) {
    if (name.empty()) throw HostError("Module name cannot be empty");
    if (IsModuleName(name)) return;
    std::string why = "expected 1 to 64 characters A-Z a-z 0-9 _ - .";
    if (name.find('/') != std::string::npos)
        why = "a module name holds no '/'; give the name, not the module's file path";
    for (unsigned char c : name)
        if (IsControl(c)) why = "a module name holds no control characters";
    throw HostError("Module name " + QuoteName(name) + " is not valid: " + why);
}

HostError Unknown(Db& db, const std::string& name) {
    std::vector<std::string> names;
    Items<Module>(db).ForEach([&](const Module& module) { names.push_back(module.name); });
    std::string message = "Module " + QuoteName(name) + " is not known to the host";
    std::vector<std::string> near = quarn::util::NearestNames(name, names);
    if (!near.empty()) message += " (did you mean '" + near.front() + "'?)";
    return HostError(message + "; 'system module list' shows the host's modules");
}

void CheckOptionsSyntax(const std::string& name, const std::string& text) {
    Pairs pairs;
    std::string problem = ParseOptions(text, pairs);
    if (!problem.empty())
        throw HostError("Option string for module " + QuoteName(name) + " refused: " + problem);
}

void CheckOptionsFor(const Module& module, const std::string& text) {
    Pairs pairs;
    std::string problem = ParseOptions(text, pairs);
    if (problem.empty()) {
        for (const auto& pair : pairs) {
            const Parameter* parameter = module.FindParameter(pair.first);
            if (!parameter) {
                problem = "module " + QuoteName(module.name) + " declares no parameter " +
                          QuoteName(pair.first);
                std::vector<std::string> declared;
                for (const Parameter& p : module.parameters) declared.push_back(p.name);
                std::vector<std::string> near = quarn::util::NearestNames(pair.first, declared);
                if (!near.empty()) problem += " (did you mean '" + near.front() + "'?)";
                problem += "; 'system module parameters list' shows its parameters";
                break;
            }
            std::string expected = CheckValue(parameter->type, pair.second);
            if (!expected.empty()) {
                problem = "value " + QuoteName(pair.second) + " of parameter " + QuoteName(pair.first) +
                          " (" + parameter->type + ") is not " + expected;
                break;
            }
        }
    }
    if (!problem.empty())
        throw HostError("Option string for module " + QuoteName(module.name) + " refused: " + problem);
}

LogLevel FindLogLevel(Db& db, const std::string& module, const std::string& name) {
    LogLevel key;
    key.module = module;
    key.name = name;
    std::optional<LogLevel> found = Items<LogLevel>(db).Find(key.Key());
    if (found && IsParameterName(name)) return *found;
    std::vector<std::string> names;
    Items<LogLevel>(db).ForEachWithPrefix(module + ":", [&](const LogLevel& level) {
        if (level.module == module) names.push_back(level.name);
    });
    const std::string owner = module.empty() ? "the kernel core" : "module " + QuoteName(module);
    std::string message = "Unknown log level " + QuoteName(name) + " of " + owner;
    std::vector<std::string> near = quarn::util::NearestNames(name, names);
    if (!near.empty()) message += " (did you mean '" + near.front() + "'?)";
    if (names.empty())
        message += "; it has no log levels";
    else
        message += "; its log levels are listed by the kernel log list command";
    throw HostError(message);
}

void CheckLevel(const std::string& name, std::uint64_t level) {
    if (level > static_cast<std::uint64_t>(kMaxLogLevel))
        throw HostError("Log level " + std::to_string(level) + " for " + QuoteName(name) +
                        " is out of range: levels go from 0 to " + std::to_string(kMaxLogLevel));
}

}  // namespace modules
}  // namespace simhost
