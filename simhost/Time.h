// Times as the simulated host writes them: UTC texts of the forms "YYYY-MM-DDTHH:MM:SSZ" and
// "YYYY-MM-DDTHH:MM:SS.mmmZ", read back with a real check of the date (month 13, February 30 and
// hour 24 are refused), and microsecond counts since the epoch. Pure functions.
#pragma once

#include <simhost/Export.h>

#include <cstdint>
#include <optional>
#include <string>

namespace simhost {

// Microseconds since the epoch on the machine's real-time clock.
SIMHOST_API std::int64_t MachineNowMicros();

// "YYYY-MM-DDTHH:MM:SS.mmmZ" (with_millis) or "YYYY-MM-DDTHH:MM:SSZ".
SIMHOST_API std::string FormatUtc(std::int64_t micros, bool with_millis);
// The time of such a text (either form), or nothing when it is not one or names no real date.
SIMHOST_API std::optional<std::int64_t> ParseUtc(const std::string& text);

// The current machine time in the journal's form ("...mmmZ").
SIMHOST_API std::string UtcNow();

// Rules for Describe: a UTC time with milliseconds, or without.
SIMHOST_API bool IsUtcMillis(const std::string& text);
SIMHOST_API bool IsUtcSeconds(const std::string& text);

}  // namespace simhost
