// The mapping between the host's typed state and its scenario JSON, written once per type.
//
// A plain struct describes its members once, with the rules each value must follow:
//
//   template <class V> void Describe(V& v, Layout& layout) {
//       v("name", layout.name, Required(), Text(64, false));
//       v("keys", layout.keys, MaxItems(128), Each(Text(16)));
//   }
//
// From that one description Codec<T> reads a value from JSON (validating it, and failing with
// the JSON location of the first problem), writes it back (members in declaration order), and
// checks an in-memory value against the same rules (Verify). Codec also covers strings,
// booleans, integers (each within its type's range), std::vector, std::map keyed by string and
// std::optional of any of them.
//
// Reading is an overlay: a member absent from the JSON keeps the value the target already has,
// so a scenario section names only what differs from the domain's default, and a list element
// only what differs from its type's default (members marked Required() must be present).
//
// Location and ObjectReader are the validation helpers every reader uses. Everything here throws
// HostError with code kScenario ("scenario: PATH: WHAT"); Verify returns the problem instead.
#pragma once

#include <simhost/Error.h>
#include <simhost/Export.h>

#include <nlohmann/json.hpp>

#include <cstddef>
#include <cstdint>
#include <limits>
#include <map>
#include <optional>
#include <string>
#include <type_traits>
#include <utility>
#include <vector>

namespace simhost {

// ---- locations and object reading ---------------------------------------------------------------

// A position in a scenario document, e.g. "identity.product" or "faults[2].times".
class SIMHOST_API Location {
public:
    Location() = default;
    Location Member(const std::string& name) const;
    Location Index(std::size_t index) const;
    // Appends a relative path as Verify reports it (".name", "[3]" or "name").
    Location Append(const std::string& relative) const;
    const std::string& Path() const { return path_; }
    // Throws HostError (kScenario) "scenario: PATH: WHAT" ("scenario: WHAT" at the root).
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

// "" when the text is acceptable, else the reason ("expected a string of at most 31 bytes",
// "expected a non-empty string", "must not contain a NUL character", "expected UTF-8 text").
SIMHOST_API std::string CheckText(const std::string& value, std::size_t max_bytes,
                                  bool allow_empty = true);
SIMHOST_API bool IsValidUtf8(const std::string& value);

// ---- rules ---------------------------------------------------------------------------------------

// What a rule found wrong: a path relative to the value checked ("", ".name", "[3]") and why.
struct Problem {
    std::string path;
    std::string what;
    explicit operator bool() const { return !what.empty(); }
    Problem Under(const std::string& prefix) const { return {prefix + path, what}; }
};

// The member must be present when read (elsewhere absent members keep their current value).
struct Required {};

// Text of at most max bytes; empty only when allowed.
struct Text {
    explicit Text(std::size_t max_bytes, bool allow_empty_text = true)
        : max(max_bytes), allow_empty(allow_empty_text) {}
    std::size_t max;
    bool allow_empty;
};

// An integer within [min, max].
struct Range {
    Range(std::int64_t low, std::int64_t high) : min(low), max(high) {}
    std::int64_t min;
    std::int64_t max;
};

// Text for which ok() holds; expected says what it should look like.
struct Pattern {
    bool (*ok)(const std::string&);
    const char* expected;
};

// Text that is one of the listed values.
struct OneOf {
    explicit OneOf(std::vector<std::string> allowed) : values(std::move(allowed)) {}
    std::vector<std::string> values;
};

// A list of at most max elements.
struct MaxItems {
    explicit MaxItems(std::size_t most) : max(most) {}
    std::size_t max;
};

// The rule applies to every element of a list.
template <class R>
struct EachRule {
    R rule;
};
template <class R>
EachRule<R> Each(R rule) {
    return EachRule<R>{std::move(rule)};
}

SIMHOST_API std::string RangeText(std::int64_t min, std::int64_t max);

template <class T>
Problem Apply(const Required&, const T&) {
    return {};
}
inline Problem Apply(const Text& rule, const std::string& value) {
    return {"", CheckText(value, rule.max, rule.allow_empty)};
}
inline Problem Apply(const Pattern& rule, const std::string& value) {
    return rule.ok(value) ? Problem{} : Problem{"", rule.expected};
}
SIMHOST_API Problem Apply(const OneOf& rule, const std::string& value);
template <class I, class = std::enable_if_t<std::is_integral<I>::value>>
Problem Apply(const Range& rule, I value) {
    bool fits;
    if (std::is_unsigned<I>::value && static_cast<std::uint64_t>(value) > INT64_MAX)
        fits = false;  // above every bound a rule can name
    else
        fits = static_cast<std::int64_t>(value) >= rule.min &&
               static_cast<std::int64_t>(value) <= rule.max;
    return fits ? Problem{} : Problem{"", RangeText(rule.min, rule.max)};
}
template <class T>
Problem Apply(const MaxItems& rule, const std::vector<T>& value) {
    if (value.size() <= rule.max) return {};
    return {"", "expected at most " + std::to_string(rule.max) + " items"};
}
template <class R, class T>
Problem Apply(const EachRule<R>& rule, const std::vector<T>& value) {
    for (std::size_t i = 0; i < value.size(); ++i) {
        Problem problem = Apply(rule.rule, value[i]);
        if (problem) return problem.Under("[" + std::to_string(i) + "]");
    }
    return {};
}

template <class T>
Problem ApplyAll(const T&) {
    return {};
}
template <class T, class R, class... Rest>
Problem ApplyAll(const T& value, const R& rule, const Rest&... rest) {
    Problem problem = Apply(rule, value);
    if (problem) return problem;
    return ApplyAll(value, rest...);
}

// ---- codecs --------------------------------------------------------------------------------------

template <class T, class = void>
struct Codec;

namespace mapping_detail {

struct ProbeVisitor {
    template <class F, class... R>
    void operator()(const char*, F&, const R&...) {}
};

template <class T, class = void>
struct Described : std::false_type {};
template <class T>
struct Described<T, decltype(Describe(std::declval<ProbeVisitor&>(), std::declval<T&>()))>
    : std::true_type {};

// Whole-value check a type may add beside its members' rules: `std::string Check() const`.
template <class T, class = void>
struct HasCheck : std::false_type {};
template <class T>
struct HasCheck<T, decltype(void(std::declval<const T&>().Check()))> : std::true_type {};

class ReadVisitor {
public:
    ReadVisitor(const nlohmann::json& value, const Location& at) : reader_(value, at) {}

    template <class F, class... R>
    void operator()(const char* name, F& field, const R&... rules) {
        constexpr bool required = (std::is_same<R, Required>::value || ...);
        const nlohmann::json* value = reader_.Member(name, required);
        if (!value) return;
        Location at = reader_.At(name);
        Codec<F>::Read(*value, at, field);
        Problem problem = ApplyAll(field, rules...);
        if (problem) at.Append(problem.path).Fail(problem.what);
    }

    void Done() const { reader_.Done(); }

private:
    ObjectReader reader_;
};

class WriteVisitor {
public:
    template <class F, class... R>
    void operator()(const char* name, F& field, const R&...) {
        object_[name] = Codec<F>::Write(field);
    }
    nlohmann::ordered_json Take() { return std::move(object_); }

private:
    nlohmann::ordered_json object_ = nlohmann::ordered_json::object();
};

class CheckVisitor {
public:
    template <class F, class... R>
    void operator()(const char* name, F& field, const R&... rules) {
        if (problem_) return;
        Problem problem = Codec<F>::Check(field);
        if (!problem) problem = ApplyAll(field, rules...);
        if (problem) problem_ = problem.Under(std::string(".") + name);
    }
    Problem Take() { return std::move(problem_); }

private:
    Problem problem_;
};

// The structure of a type: its members' names and kinds, never values (for schema versions).
class ShapeVisitor {
public:
    explicit ShapeVisitor(std::string& out) : out_(out) { out_ += '{'; }
    template <class F, class... R>
    void operator()(const char* name, F&, const R&...) {
        out_ += name;
        out_ += ':';
        Codec<F>::Shape(out_);
        out_ += ',';
    }

private:
    std::string& out_;
};

template <class I>
std::string IntegerExpected() {
    return RangeText(static_cast<std::int64_t>(std::numeric_limits<I>::min()),
                     std::numeric_limits<I>::max() > static_cast<std::uint64_t>(INT64_MAX)
                         ? INT64_MAX
                         : static_cast<std::int64_t>(std::numeric_limits<I>::max()));
}

}  // namespace mapping_detail

template <>
struct Codec<std::string> {
    static void Read(const nlohmann::json& value, const Location& at, std::string& out) {
        if (!value.is_string()) at.Fail("expected a string");
        std::string problem = CheckText(value.get_ref<const std::string&>(), SIZE_MAX);
        if (!problem.empty()) at.Fail(problem);
        out = value.get<std::string>();
    }
    static nlohmann::ordered_json Write(const std::string& value) { return value; }
    static Problem Check(const std::string& value) { return {"", CheckText(value, SIZE_MAX)}; }
    static void Shape(std::string& out) { out += 's'; }
};

template <>
struct Codec<bool> {
    static void Read(const nlohmann::json& value, const Location& at, bool& out) {
        if (!value.is_boolean()) at.Fail("expected true or false");
        out = value.get<bool>();
    }
    static nlohmann::ordered_json Write(bool value) { return value; }
    static Problem Check(bool) { return {}; }
    static void Shape(std::string& out) { out += 'b'; }
};

template <class I>
struct Codec<I, std::enable_if_t<std::is_integral<I>::value && !std::is_same<I, bool>::value>> {
    static void Read(const nlohmann::json& value, const Location& at, I& out) {
        if (value.is_number_unsigned()) {
            std::uint64_t number = value.get<std::uint64_t>();
            if (number > static_cast<std::uint64_t>(std::numeric_limits<I>::max()))
                at.Fail(mapping_detail::IntegerExpected<I>());
            out = static_cast<I>(number);
        } else if (value.is_number_integer()) {
            std::int64_t number = value.get<std::int64_t>();
            if (number < static_cast<std::int64_t>(std::numeric_limits<I>::min()) ||
                (number > 0 && static_cast<std::uint64_t>(number) >
                                   static_cast<std::uint64_t>(std::numeric_limits<I>::max())))
                at.Fail(mapping_detail::IntegerExpected<I>());
            out = static_cast<I>(number);
        } else {
            at.Fail(mapping_detail::IntegerExpected<I>());
        }
    }
    static nlohmann::ordered_json Write(I value) { return value; }
    static Problem Check(I) { return {}; }
    static void Shape(std::string& out) { out += 'i'; }
};

template <class T>
struct Codec<std::vector<T>> {
    static void Read(const nlohmann::json& value, const Location& at, std::vector<T>& out) {
        if (!value.is_array()) at.Fail("expected an array");
        out.clear();
        out.reserve(value.size());
        for (std::size_t i = 0; i < value.size(); ++i) {
            T element{};
            Codec<T>::Read(value[i], at.Index(i), element);
            out.push_back(std::move(element));
        }
    }
    static nlohmann::ordered_json Write(const std::vector<T>& value) {
        nlohmann::ordered_json list = nlohmann::ordered_json::array();
        for (const T& element : value) list.push_back(Codec<T>::Write(element));
        return list;
    }
    static Problem Check(const std::vector<T>& value) {
        for (std::size_t i = 0; i < value.size(); ++i) {
            Problem problem = Codec<T>::Check(value[i]);
            if (problem) return problem.Under("[" + std::to_string(i) + "]");
        }
        return {};
    }
    static void Shape(std::string& out) {
        out += '[';
        Codec<T>::Shape(out);
        out += ']';
    }
};

template <class T>
struct Codec<std::map<std::string, T>> {
    static void Read(const nlohmann::json& value, const Location& at,
                     std::map<std::string, T>& out) {
        if (!value.is_object()) at.Fail("expected an object");
        out.clear();
        for (auto it = value.begin(); it != value.end(); ++it) {
            std::string problem = CheckText(it.key(), 4096, false);
            if (!problem.empty()) at.Fail("key '" + it.key() + "': " + problem);
            T element{};
            Codec<T>::Read(it.value(), at.Member(it.key()), element);
            out.emplace(it.key(), std::move(element));
        }
    }
    static nlohmann::ordered_json Write(const std::map<std::string, T>& value) {
        nlohmann::ordered_json object = nlohmann::ordered_json::object();
        for (const auto& [key, element] : value) object[key] = Codec<T>::Write(element);
        return object;
    }
    static Problem Check(const std::map<std::string, T>& value) {
        for (const auto& [key, element] : value) {
            Problem problem = Codec<T>::Check(element);
            if (problem) return problem.Under("." + key);
        }
        return {};
    }
    static void Shape(std::string& out) {
        out += "{*:";
        Codec<T>::Shape(out);
        out += '}';
    }
};

template <class T>
struct Codec<std::optional<T>> {
    static void Read(const nlohmann::json& value, const Location& at, std::optional<T>& out) {
        if (value.is_null()) {
            out.reset();
            return;
        }
        if (!out) out.emplace();
        Codec<T>::Read(value, at, *out);
    }
    static nlohmann::ordered_json Write(const std::optional<T>& value) {
        return value ? Codec<T>::Write(*value) : nlohmann::ordered_json(nullptr);
    }
    static Problem Check(const std::optional<T>& value) {
        return value ? Codec<T>::Check(*value) : Problem{};
    }
    static void Shape(std::string& out) {
        out += '?';
        Codec<T>::Shape(out);
    }
};

// Structures that describe themselves with Describe(visitor, value).
template <class T>
struct Codec<T, std::enable_if_t<mapping_detail::Described<T>::value>> {
    static void Read(const nlohmann::json& value, const Location& at, T& out) {
        mapping_detail::ReadVisitor visitor(value, at);
        Describe(visitor, out);
        visitor.Done();
        if constexpr (mapping_detail::HasCheck<T>::value) {
            std::string problem = out.Check();
            if (!problem.empty()) at.Fail(problem);
        }
    }
    static nlohmann::ordered_json Write(const T& value) {
        mapping_detail::WriteVisitor visitor;
        Describe(visitor, const_cast<T&>(value));  // the visitor only reads
        return visitor.Take();
    }
    static Problem Check(const T& value) {
        mapping_detail::CheckVisitor visitor;
        Describe(visitor, const_cast<T&>(value));  // the visitor only reads
        Problem problem = visitor.Take();
        if constexpr (mapping_detail::HasCheck<T>::value) {
            if (!problem) problem = Problem{"", value.Check()};
        }
        return problem;
    }
    static void Shape(std::string& out) {
        mapping_detail::ShapeVisitor visitor(out);
        T sample{};
        Describe(visitor, sample);
        out += '}';
    }
};

// The problem with a value as one line ("name[2]: expected ..."), or "" when it follows its
// rules. Host operations call it on a changed state before storing it.
template <class T>
std::string Verify(const T& value) {
    Problem problem = Codec<T>::Check(value);
    if (!problem) return "";
    std::string path = problem.path;
    if (!path.empty() && path[0] == '.') path.erase(0, 1);
    return path.empty() ? problem.what : path + ": " + problem.what;
}

// Reads a value from JSON text that the host wrote itself (its stored state); a value that does
// not parse means the store is damaged: HostError kDamaged naming what.
template <class T>
T FromStoredJson(const std::string& text, T base, const std::string& what) {
    try {
        Codec<T>::Read(nlohmann::json::parse(text), Location(), base);
    } catch (const std::exception& error) {
        throw HostError("The simulated host's state is damaged: " + what + " cannot be read (" +
                            error.what() + "); recreate the host with 'quarnhost init --force'",
                        HostError::Code::kDamaged);
    }
    return base;
}

// The compact JSON text the host stores for a value.
template <class T>
std::string ToStoredJson(const T& value) {
    return Codec<T>::Write(value).dump(-1, ' ', false,
                                       nlohmann::ordered_json::error_handler_t::strict);
}

}  // namespace simhost
