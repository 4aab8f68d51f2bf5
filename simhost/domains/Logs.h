// The host's two logs: the observation log, where the event library (QuillUserLib_AddQuill)
// posts one entry per call, and the system log, where programs write with syslog. Entries are
// appended in order and stamped with the host's clock.
//
// Scenario section "observations" (default []): an array of
//   {"time": "YYYY-MM-DDTHH:MM:SS.mmmZ", "message": text of 1..4096 bytes}, oldest first.
// Scenario section "syslog" (default []): an array of
//   {"time": "YYYY-MM-DDTHH:MM:SS.mmmZ", "priority": 0..7, "message": text of 0..4096 bytes},
//   oldest first; priority is the syslog severity (0 emergency ... 2 critical ... 7 debug).
#pragma once

#include <simhost/Mapping.h>
#include <simhost/State.h>
#include <simhost/Time.h>

#include <cstdint>
#include <string>
#include <vector>

namespace simhost {

constexpr std::size_t kLogMessageMax = 4096;

namespace observations {

struct Entry {
    static constexpr char kSection[] = "observations";
    static constexpr StateKind kKind = StateKind::kLog;

    std::string time;
    std::string message;

    static std::vector<Entry> Default() {
        return {{"2024-03-18T09:12:44.000Z", "Host booted: Quarn 8.0.2 build 22380479"}};
    }
};

template <class V>
void Describe(V& v, Entry& s) {
    v("time", s.time, Required(),
      Pattern{IsUtcMillis, "expected a UTC time of the form YYYY-MM-DDTHH:MM:SS.mmmZ"});
    v("message", s.message, Required(), Text(kLogMessageMax, false));
}

}  // namespace observations

namespace syslog {

struct Entry {
    static constexpr char kSection[] = "syslog";
    static constexpr StateKind kKind = StateKind::kLog;

    std::string time;
    std::uint32_t priority = 6;
    std::string message;

    static std::vector<Entry> Default() { return {}; }
};

template <class V>
void Describe(V& v, Entry& s) {
    v("time", s.time, Required(),
      Pattern{IsUtcMillis, "expected a UTC time of the form YYYY-MM-DDTHH:MM:SS.mmmZ"});
    v("priority", s.priority, Range(0, 7));
    v("message", s.message, Required(), Text(kLogMessageMax));
}

}  // namespace syslog
}  // namespace simhost
