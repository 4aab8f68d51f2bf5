// The security domains of the host kernel's access control: every domain has a numeric id
// (what a world's security domain id names), a name (its label), the enforcement level it
// boots with, and the level in force now when it differs.
//
// Levels: "disabled" (nothing is checked), "audit" (violations are logged and allowed),
// "enforcing" (violations are logged and denied).
//
// Scenario section "secpolicy" (default: the dozen domains of DefaultDomains()): an array of
//   {"name": 1 to 64 letters, digits, '_' and '-' (required, the key),
//    "id": 0..4294967295 (required; a world's label is the name of the first domain with its
//          id),
//    "boot_level": a level, the one the domain boots with (default "enforcing"),
//    "level": "" (at its boot level) or the level set since the last boot (default "")}.
// Levels set through the host layer are not persistent: at a reboot every domain returns to its
// boot level.
#pragma once

#include <simhost/Export.h>
#include <simhost/Mapping.h>
#include <simhost/State.h>

#include <cstdint>
#include <string>
#include <vector>

namespace simhost {
namespace secpolicy {

// The level texts, from the least to the most strict.
SIMHOST_API const std::vector<std::string>& Levels();
// "" when level is one of Levels(), else the refusal ("Unknown enforcement level ...").
SIMHOST_API std::string LevelProblem(const std::string& level);

SIMHOST_API bool IsDomainName(const std::string& text);
// The refusal of a domain name the host does not have, with the nearest of known.
SIMHOST_API std::string UnknownDomainText(const std::string& name, const std::vector<std::string>& known);

struct SecurityDomain {
    static constexpr char kSection[] = "secpolicy";
    static constexpr StateKind kKind = StateKind::kCollection;

    std::string name;
    std::uint32_t id = 0;
    std::string boot_level = "enforcing";
    std::string level;

    std::string Key() const { return name; }
    // The level in force now.
    const std::string& Current() const { return level.empty() ? boot_level : level; }
    static std::vector<SecurityDomain> Default();
    static bool Boot(SecurityDomain& domain) {
        domain.level.clear();
        return true;
    }
};

template <class V>
void Describe(V& v, SecurityDomain& s) {
    v("name", s.name, Required(),
      Pattern{IsDomainName, "expected 1 to 64 letters, digits, '_' and '-'"});
    v("id", s.id, Required());
    v("boot_level", s.boot_level, OneOf({"disabled", "audit", "enforcing"}));
    v("level", s.level, OneOf({"", "disabled", "audit", "enforcing"}));
}

}  // namespace secpolicy
}  // namespace simhost
