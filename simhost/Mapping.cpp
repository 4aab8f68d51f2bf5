#include <simhost/Mapping.h>

#include <util/Text.h>

#include <algorithm>

namespace simhost {

using nlohmann::json;

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

bool IsValidUtf8(const std::string& value) { return quarn::util::IsValidUtf8(value); }

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

Location Location::Append(const std::string& relative) const {
    if (relative.empty()) return *this;
    Location next;
    if (relative[0] == '[')
        next.path_ = path_ + relative;
    else if (relative[0] == '.')
        next.path_ = path_.empty() ? relative.substr(1) : path_ + relative;
    else
        next.path_ = path_.empty() ? relative : path_ + "." + relative;
    return next;
}

std::string RangeText(std::int64_t min, std::int64_t max) {
    return "expected an integer from " + std::to_string(min) + " to " + std::to_string(max);
}

Problem Apply(const OneOf& rule, const std::string& value) {
    if (std::find(rule.values.begin(), rule.values.end(), value) != rule.values.end()) return {};
    std::string list;
    for (std::size_t i = 0; i < rule.values.size(); ++i) {
        if (i) list += i + 1 == rule.values.size() ? " or " : ", ";
        list += "\"" + rule.values[i] + "\"";
    }
    return {"", "expected " + list};
}

}  // namespace simhost
