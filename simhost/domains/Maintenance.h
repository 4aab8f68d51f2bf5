// The host's maintenance mode: whether the host is in maintenance mode (where it runs no
// workloads and may be rebooted or powered off), and how long entering and leaving it take.
//
// The host management tool (/bin/kelp-cmd, simhost/kelp/) changes the state: a transition first
// shows as "entering" or "exiting" and, once it has taken its time, becomes "enabled" or
// "disabled". "unknown" is a state the host service cannot tell (a scenario's device).
//
// Scenario section "maintenance" (every member optional):
//   state          "enabled", "disabled", "entering", "exiting" or "unknown"; default "disabled"
//   enter_seconds  0..86400, how long entering maintenance mode takes; default 3
//   exit_seconds   0..86400, how long leaving it takes; default 1
// Maintenance mode survives a reboot; a transition under way at a reboot is abandoned
// ("entering" boots as "disabled", "exiting" as "enabled").
#pragma once

#include <simhost/Mapping.h>
#include <simhost/State.h>

#include <cstdint>
#include <string>

namespace simhost {
namespace maintenance {

constexpr char kEnabled[] = "enabled";
constexpr char kDisabled[] = "disabled";
constexpr char kEntering[] = "entering";
constexpr char kExiting[] = "exiting";
constexpr char kUnknown[] = "unknown";
constexpr std::uint32_t kMaxTransitionSeconds = 86400;

// The state as NorlithCtl::System::SystemInfoImpl::GetMaintenanceModeState() gives it: 1 enabled,
// 2 disabled, 3 entering, 4 exiting, 0 unknown.
inline int StateCode(const std::string& state) {
    if (state == kEnabled) return 1;
    if (state == kDisabled) return 2;
    if (state == kEntering) return 3;
    if (state == kExiting) return 4;
    return 0;
}

struct Maintenance {
    static constexpr char kSection[] = "maintenance";
    static constexpr StateKind kKind = StateKind::kSingleton;

    std::string state = kDisabled;
    std::uint32_t enter_seconds = 3;
    std::uint32_t exit_seconds = 1;

    static Maintenance Default() { return {}; }
    // A transition does not outlive the boot it was started in.
    static void Boot(Maintenance& m) {
        if (m.state == kEntering) m.state = kDisabled;
        if (m.state == kExiting) m.state = kEnabled;
    }
};

template <class V>
void Describe(V& v, Maintenance& s) {
    v("state", s.state, OneOf({kEnabled, kDisabled, kEntering, kExiting, kUnknown}));
    v("enter_seconds", s.enter_seconds, Range(0, kMaxTransitionSeconds));
    v("exit_seconds", s.exit_seconds, Range(0, kMaxTransitionSeconds));
}

}  // namespace maintenance
}  // namespace simhost
