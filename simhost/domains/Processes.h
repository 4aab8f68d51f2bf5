// The host's user-level processes ("worlds") and its load figures.
//
// A world belongs to a cartel (a process: its worlds share an address space; the cartel's id is
// the id of its first world), which has a parent cartel, belongs to a cartel group and to a
// session. Worlds are listed in the host's order: the order of the scenario (or of their
// creation), which need not follow their ids.
//
// Scenario section "worlds" (default: about sixty worlds of a lab host, DefaultWorlds()): an
// array of
//   {"id": 1..2^63-1 (required, the key), "cartel_id", "parent_cartel_id", "world_group_id",
//    "cartel_group_id", "session_id": 0..2^63-1, "flags": 0..2^63-1 (a bit set, see kFlag...),
//    "name": 1 to 64 bytes (required), "command_line": at most 4096 bytes,
//    "type": "main" (the cartel's first world) or "helper", "state": one of kStates,
//    "security_domain_id": 0..4294967295, the id of a security domain (secpolicy)}.
// The running-process count is the number of worlds in the state "running".
//
// Scenario section "load" (optional): the raw load averages and their scale N.
//   scale     0..4096: the number of physical CPUs the raw values are summed over; 0 while the
//             host has not counted them yet (just after a boot); default 8
//   one_minute, five_minutes, fifteen_minutes   0..4294967295: 100 x N x the load average per
//             CPU over that time; defaults 184, 152, 136 (0.23, 0.19 and 0.17 with N = 8)
#pragma once

#include <simhost/Export.h>
#include <simhost/Mapping.h>
#include <simhost/State.h>

#include <cstdint>
#include <limits>
#include <string>
#include <vector>

namespace simhost {
namespace processes {

// World flags.
constexpr std::int64_t kFlagSystem = 0x1;      // started by the host itself at boot
constexpr std::int64_t kFlagRestart = 0x2;     // restarted by its supervisor when it exits
constexpr std::int64_t kFlagInteractive = 0x4; // attached to a terminal or console
constexpr std::int64_t kFlagLocked = 0x8;      // its memory is locked (not swapped)

constexpr char kRunning[] = "running";
SIMHOST_API const std::vector<std::string>& States();

struct World {
    static constexpr char kSection[] = "worlds";
    static constexpr StateKind kKind = StateKind::kCollection;

    std::int64_t id = 0;
    std::int64_t cartel_id = 0;
    std::int64_t parent_cartel_id = 0;
    std::string name;
    std::string command_line;
    std::int64_t world_group_id = 0;
    std::int64_t cartel_group_id = 0;
    std::int64_t session_id = 0;
    std::int64_t flags = 0;
    std::string type = "main";
    std::string state = "sleeping";
    std::uint32_t security_domain_id = 0;

    std::string Key() const { return std::to_string(id); }
    static std::vector<World> Default();
};

template <class V>
void Describe(V& v, World& s) {
    const Range id(0, std::numeric_limits<std::int64_t>::max());
    v("id", s.id, Required(), Range(1, std::numeric_limits<std::int64_t>::max()));
    v("cartel_id", s.cartel_id, id);
    v("parent_cartel_id", s.parent_cartel_id, id);
    v("name", s.name, Required(), Text(64, false));
    v("command_line", s.command_line, Text(4096));
    v("world_group_id", s.world_group_id, id);
    v("cartel_group_id", s.cartel_group_id, id);
    v("session_id", s.session_id, id);
    v("flags", s.flags, id);
    v("type", s.type, OneOf({"main", "helper"}));
    v("state", s.state, OneOf(States()));
    v("security_domain_id", s.security_domain_id);
}

struct Load {
    static constexpr char kSection[] = "load";
    static constexpr StateKind kKind = StateKind::kSingleton;

    std::uint32_t scale = 8;
    std::uint32_t one_minute = 184;
    std::uint32_t five_minutes = 152;
    std::uint32_t fifteen_minutes = 136;

    static Load Default() { return {}; }
};

template <class V>
void Describe(V& v, Load& s) {
    v("scale", s.scale, Range(0, 4096));
    v("one_minute", s.one_minute);
    v("five_minutes", s.five_minutes);
    v("fifteen_minutes", s.fifteen_minutes);
}

}  // namespace processes
}  // namespace simhost
