#include <simhost/domains/Secpolicy.h>

#include <util/Text.h>

namespace simhost {
namespace secpolicy {

const std::vector<std::string>& Levels() {
    static const std::vector<std::string> levels = {"disabled", "audit", "enforcing"};
    return levels;
}

std::string LevelProblem(const std::string& level) {
    for (const std::string& known : Levels())
        if (level == known) return "";
    std::string message = "Unknown enforcement level " + quarn::util::Quote(level, 64);
    std::vector<std::string> near = quarn::util::NearestNames(level, Levels());
    if (!near.empty()) message += " (did you mean '" + near.front() + "'?)";
    message += "; the levels are";
    const char* separator = ": ";
    for (const std::string& known : Levels()) {
        message += separator + known;
        separator = ", ";
    }
    return message;
}

std::string UnknownDomainText(const std::string& name, const std::vector<std::string>& known) {
    std::string message = "Unknown security domain " + quarn::util::Quote(name, 64);
    std::vector<std::string> near = quarn::util::NearestNames(name, known);
    if (!near.empty()) message += " (did you mean '" + near.front() + "'?)";
    return message + "; 'system secpolicy domain list' shows the host's domains";
}

bool IsDomainName(const std::string& text) {
    if (text.empty() || text.size() > 64) return false;
    for (char c : text) {
        bool ok = (c >= 'a' && c <= 'z') || (c >= 'A' && c <= 'Z') || (c >= '0' && c <= '9') ||
                  c == '_' || c == '-';
        if (!ok) return false;
    }
    return true;
}

std::vector<SecurityDomain> SecurityDomain::Default() {
    // A dozen domains, most enforcing; the console, monitoring and dump collection only audit,
    // and the shell and third-party add-ons run unchecked, as on a lab host being set up.
    return {
        {"system", 1, "enforcing", ""},     {"hostagent", 2, "enforcing", ""},
        {"console", 3, "audit", ""},        {"network", 4, "enforcing", ""},
        {"storage", 5, "enforcing", ""},    {"monitor", 6, "audit", ""},
        {"shell", 7, "disabled", ""},       {"vmm", 8, "enforcing", ""},
        {"coredump", 9, "audit", ""},       {"timesync", 10, "enforcing", ""},
        {"logging", 11, "enforcing", ""},   {"thirdparty", 12, "disabled", ""},
    };
}

}  // namespace secpolicy
}  // namespace simhost
