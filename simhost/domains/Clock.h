// The host clock and its boot record.
//
// The host's clock runs with the machine's real-time clock, shifted by an offset that setting
// the host's time changes (the machine's clock is never touched). Its zone is UTC. The boot
// record tells when the host last booted, on the machine's clock (so setting the host's time
// does not change its uptime), how often it has booted, and the last reboot or power-off asked
// of it.
//
// Scenario section "clock": offset_us, microseconds the host clock runs ahead of the machine
// (negative: behind), from -10^17 to 10^17; default 0.
// Scenario section "boot" (every member optional):
//   booted_at      UTC time "YYYY-MM-DDTHH:MM:SSZ"; default: 2 days, 3 hours and 17 minutes
//                  before the host is created
//   boot_count     0..4294967295; default 1
//   last_request   "", "reboot" or "poweroff"; default ""
//   last_request_at  "" or a UTC time "YYYY-MM-DDTHH:MM:SSZ"; default ""
#pragma once

#include <simhost/Mapping.h>
#include <simhost/State.h>
#include <simhost/Time.h>

#include <cstdint>
#include <string>

namespace simhost {
namespace clock {

constexpr std::int64_t kMaxOffsetMicros = 100000000000000000;

struct Clock {
    static constexpr char kSection[] = "clock";
    static constexpr StateKind kKind = StateKind::kSingleton;

    std::int64_t offset_us = 0;

    static Clock Default() { return {}; }
};

template <class V>
void Describe(V& v, Clock& s) {
    v("offset_us", s.offset_us, Range(-kMaxOffsetMicros, kMaxOffsetMicros));
}

// The host's time now, in microseconds since the epoch.
inline std::int64_t HostNowMicros(const Clock& clock) { return MachineNowMicros() + clock.offset_us; }

}  // namespace clock

namespace boot {

inline bool IsTimeOrEmpty(const std::string& text) { return text.empty() || IsUtcSeconds(text); }

struct Boot {
    static constexpr char kSection[] = "boot";
    static constexpr StateKind kKind = StateKind::kSingleton;

    std::string booted_at;
    std::uint32_t boot_count = 1;
    std::string last_request;
    std::string last_request_at;

    static Boot Default() {
        // A host that has been up for a while, as a real one would be.
        const std::int64_t uptime = ((2 * 24 + 3) * 60 + 17) * 60 * std::int64_t(1000000);
        Boot boot;
        boot.booted_at = FormatUtc(MachineNowMicros() - uptime, false);
        return boot;
    }
};

template <class V>
void Describe(V& v, Boot& s) {
    v("booted_at", s.booted_at, Pattern{IsUtcSeconds, "expected a UTC time YYYY-MM-DDTHH:MM:SSZ"});
    v("boot_count", s.boot_count);
    v("last_request", s.last_request, OneOf({"", "reboot", "poweroff"}));
    v("last_request_at", s.last_request_at,
      Pattern{IsTimeOrEmpty, "expected \"\" or a UTC time YYYY-MM-DDTHH:MM:SSZ"});
}

}  // namespace boot

namespace simulation {

// Knobs of the simulation itself, for tests and demonstrations.
//
// Scenario section "simulation": sleep_percent, 0..100, the share of every sleep on the host
// that really passes (0: sleeps return at once); default 100.
struct Simulation {
    static constexpr char kSection[] = "simulation";
    static constexpr StateKind kKind = StateKind::kSingleton;

    std::uint32_t sleep_percent = 100;

    static Simulation Default() { return {}; }
};

template <class V>
void Describe(V& v, Simulation& s) {
    v("sleep_percent", s.sleep_percent, Range(0, 100));
}

}  // namespace simulation
}  // namespace simhost
