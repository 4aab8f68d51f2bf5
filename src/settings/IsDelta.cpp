#include "settings/IsDelta.h"

#include <cctype>
#include <cerrno>
#include <cstdint>
#include <cstdlib>
#include <strings.h>

namespace TarselCli {
namespace System {
namespace {

bool IsTrue(const std::string& value) { return strncasecmp(value.c_str(), "TRUE", 4) == 0; }

// The value read as an unsigned number with automatic base, as the host's 32-bit strtoul reads
// it: where unsigned long is wider, "-n" comes back as 2^64 - n and a value beyond 32 bits as
// itself, so both are brought back to what 32 bits give (2^32 - n, or the largest value).
std::uint32_t Number(const std::string& value) {
    errno = 0;
    unsigned long number = std::strtoul(value.c_str(), nullptr, 0);
    if (number <= UINT32_MAX) return static_cast<std::uint32_t>(number);
    const char* text = value.c_str();
    while (std::isspace(static_cast<unsigned char>(*text))) ++text;
    if (*text == '-' && errno != ERANGE && 0UL - number <= UINT32_MAX)
        return static_cast<std::uint32_t>(number);
    return UINT32_MAX;
}

// Whether a and b are equal under the type's comparison; false for an unknown type.
bool Equal(int type, const std::string& a, const std::string& b) {
    switch (type) {
    case 0: return a == b;
    case 1: return IsTrue(a) == IsTrue(b);
    case 2:
    case 4: return Number(a) == Number(b);
    case 3: return (Number(a) & 0xFF) == (Number(b) & 0xFF);
    default: return false;
    }
}

}  // namespace

bool IsDelta(Ravel::System::KernelOption::OptionType type, std::string defaultValue,
             std::string configured, std::string runtime) {
    if (type < 0 || type > 4) return false;
    if (!Equal(type, defaultValue, configured)) return true;
    if (runtime.empty()) return false;
    return !Equal(type, runtime, defaultValue);
}

}  // namespace System
}  // namespace TarselCli
