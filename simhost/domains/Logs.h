// The host's two logs: the observation log, where the event library (QuillUserLib_AddQuill)
// posts one entry per call, and the system log, where programs write with syslog. Entries are
// appended in order and stamped with the host's clock.
//
// Scenario section "observations" (default []): an array of
//   {"time": "YYYY-MM-DDTHH:MM:SS.mmmZ", "event": "" or an event id, "message": text of
//    1..4096 bytes}, oldest first. The event id (at most 255 letters, digits, '.', '_' and '-')
//   is the one the poster's format named ("@&!*@*@(ID)..."), "" when it named none.
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

constexpr std::size_t kEventIdMax = 255;

inline bool IsEventIdOrEmpty(const std::string& text) {
    if (text.size() > kEventIdMax) return false;
    for (char c : text)
        if (!((c >= 'a' && c <= 'z') || (c >= 'A' && c <= 'Z') || (c >= '0' && c <= '9') ||
              c == '.' || c == '_' || c == '-'))
            return false;
    return true;
}

struct Entry {
    static constexpr char kSection[] = "observations";
    static constexpr StateKind kKind = StateKind::kLog;

    std::string time;
    std::string event;
    std::string message;

    static std::vector<Entry> Default() {
        return {{"2024-03-18T09:12:44.000Z", "quill.host.booted",
                 "Host booted: Quarn 8.0.2 build 22380479"}};
    }
};

template <class V>
void Describe(V& v, Entry& s) {
    v("time", s.time, Required(),
      Pattern{IsUtcMillis, "expected a UTC time of the form YYYY-MM-DDTHH:MM:SS.mmmZ"});
    v("event", s.event,
      Pattern{IsEventIdOrEmpty, "expected \"\" or an event id of at most 255 letters, digits, "
                                "'.', '_' and '-'"});
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
