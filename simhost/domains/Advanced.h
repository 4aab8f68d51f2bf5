// The advanced options domain: the host kernel's tree of advanced options, as branches and
// options addressed by paths ("/Net/TcpMss"), with each option's kind, description, default,
// bounds (integers), valid characters (strings) and current value.
//
// Scenario section "advanced" (default: the generated tree of AdvancedOptions.def):
//   {"branches": ["/Net", "/Net/Tcp", ...],
//    "options": [
//      {"path": "/Net/TcpMss", "type": "integer", "description": "...",
//       "value": 1460, "default": 1460, "min": 536, "max": 9000},
//      {"path": "/Misc/HostName", "type": "string", "description": "...",
//       "value": "qh-07", "default": "localhost", "valid_characters": "abc..."},
//      {"path": "/Misc/CpuTopologyMap", "type": 2, "description": "...", "value": "..."}]}
// A path is "/" and 1 to 8 components joined by "/", each 1..63 of the characters A-Z a-z 0-9 _ .
// and -. Every branch but a top-level one, and every option, lives in a branch the list names
// (top-level options live in the root); no path appears twice, and no option shares a branch's
// path. Lists keep their order: it is the order in which the library hands options and
// branches out. Option members:
//   type              "integer" (kind 0), "string" (kind 1) or a kind from 2 to 255, which the
//                     library exposes through no typed interface (its "value" is kept as text)
//   description       text of at most 1024 bytes (default "")
//   value, default    integer: 0..4294967295 within min..max (default 0; value defaults to
//                     default); string: at most 1023 bytes of valid characters
//   min, max          integer options: 0..4294967295, min <= max (default 0 and 4294967295)
//   valid_characters  string options: the characters a value may hold; "" accepts any
//                     printable character (no control characters)
//   user              a user-defined variable, served by the user option classes (default false)
//   typed             false: served through no typed interface whatever its kind (default true)
//   read_error        when not "", reading the option's value fails with this text (default "")
//
// Stored as two keyed collections ("advanced.branches", "advanced.options", keyed by path, in
// list order), so one option or branch is one indexed look-up whatever the tree's size, and a
// branch's children are one range of keys. Everything throws HostError.
#pragma once

#include <simhost/Db.h>
#include <simhost/Export.h>
#include <simhost/Mapping.h>
#include <simhost/State.h>

#include <cstdint>
#include <functional>
#include <optional>
#include <string>
#include <vector>

namespace simhost {
namespace advanced {

constexpr int kInteger = 0;
constexpr int kString = 1;
constexpr int kMaxKind = 255;
constexpr std::size_t kMaxStringValue = 1023;
constexpr std::size_t kMaxDescription = 1024;

struct Option {
    std::string path;
    int kind = kInteger;
    std::string description;
    // kind 0
    std::uint32_t value = 0;
    std::uint32_t default_value = 0;
    std::uint32_t min = 0;
    std::uint32_t max = UINT32_MAX;
    // kind 1 (and the opaque value text of other kinds)
    std::string text;
    std::string text_default;
    std::string valid_characters;

    bool user = false;
    bool typed = true;
    std::string read_error;

    // The last component of the path.
    std::string Name() const { return path.substr(path.rfind('/') + 1); }
};

// Whether text is a path as the section requires.
SIMHOST_API bool IsOptionPath(const std::string& text);
// The path of the branch holding path: "" (the root) for a top-level one.
SIMHOST_API std::string ParentOf(const std::string& path);

// An option as a scenario gives it (validated: every member rule and CheckOption) and back.
SIMHOST_API Option ParseOption(const nlohmann::json& value, const Location& at);
SIMHOST_API nlohmann::ordered_json OptionJson(const Option& option);
// "" when the option follows its own rules (bounds, characters, lengths), else the problem.
SIMHOST_API std::string CheckOption(const Option& option);

// The refusals of a new value, as the host-control library raises them: HostError with an
// event record whose text is the same message. Nothing is thrown when the value is accepted.
SIMHOST_API void CheckIntegerValue(const Option& option, std::uint64_t value);
SIMHOST_API void CheckStringValue(const Option& option, const std::string& value);
// The error of reading an option whose read_error is set.
SIMHOST_API HostError ReadError(const Option& option);
// The error of committing a change to an option that is no longer on the host.
SIMHOST_API HostError OptionGone(const std::string& path);

// ---- the stored tree -------------------------------------------------------------------------

SIMHOST_API std::optional<Option> FindOption(Db& db, const std::string& path);
SIMHOST_API bool BranchExists(Db& db, const std::string& path);
// The options directly in a branch ("" the root), in order.
SIMHOST_API void ForEachOptionIn(Db& db, const std::string& branch,
                                 const std::function<void(Option&&)>& fn);
// The paths of the branches directly below a branch ("" the root), in order.
SIMHOST_API void ForEachBranchIn(Db& db, const std::string& branch,
                                 const std::function<void(const std::string&)>& fn);
// Replaces a stored option (its path names it); refuses one that breaks its rules.
SIMHOST_API void PutOption(Db& db, const Option& option);

// The default tree, expanded from AdvancedOptions.def.
struct DefaultTree {
    std::vector<std::string> branches;
    std::vector<Option> options;
};
SIMHOST_API const DefaultTree& Defaults();

// Marks the custom domain in Registry.def.
struct Tree {
    static constexpr char kSection[] = "advanced";
    static constexpr StateKind kKind = StateKind::kCustom;
    static const Domain& TheDomain();
};

}  // namespace advanced
}  // namespace simhost
