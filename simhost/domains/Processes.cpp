// The default host's worlds, generated from a compact description of its cartels: each row is
// one cartel (its main world) with its helper worlds. Ids, sessions and groups follow from the
// table, so the description stays short and the worlds stay consistent with each other.
#include <simhost/domains/Processes.h>

namespace simhost {
namespace processes {

const std::vector<std::string>& States() {
    static const std::vector<std::string> states = {"running", "ready",   "sleeping",
                                                    "waiting", "stopped", "exiting"};
    return states;
}

namespace {

// One cartel of the default host.
struct CartelRow {
    const char* name;
    const char* command_line;
    int parent;             // row of the parent cartel; -1 for none
    bool session_leader;    // starts its own session (a daemon, a login)
    std::int64_t world_group;
    std::uint32_t security_domain;
    std::int64_t flags;
    const char* state;
    std::vector<std::pair<const char*, const char*>> helpers;  // name, state
};

constexpr std::int64_t S = kFlagSystem, R = kFlagRestart, I = kFlagInteractive, L = kFlagLocked;

const std::vector<CartelRow>& Cartels() {
    // World groups: 4 the host's own services, 9 management, 12 monitoring, 15 sessions,
    // 21 third-party add-ons, 27 virtual machines.
    static const std::vector<CartelRow> rows = {
        {"init", "/sbin/init", -1, true, 4, 1, S | L, "sleeping", {}},
        {"keepalive", "/sbin/keepalive --watch /etc/keepalive.d", 0, false, 4, 1, S | L, "sleeping",
         {{"keepalive-timer", "waiting"}}},
        {"logrelay", "/usr/lib/quarn/logrelay -c /etc/logrelay.conf", 1, true, 4, 11, S | R,
         "sleeping", {{"logrelay-sender", "waiting"}, {"logrelay-rotate", "sleeping"}}},
        {"timekeeper", "/usr/sbin/timekeeper --drift /var/lib/timekeeper/drift", 1, true, 4, 10,
         S | R | L, "sleeping", {}},
        {"resolvd", "/usr/lib/quarn/resolvd --stack defaultTcpipStack", 1, true, 4, 4, S | R,
         "sleeping", {{"resolvd-cache", "sleeping"}}},
        {"netlinkd", "/usr/lib/quarn/netlinkd --stack defaultTcpipStack", 1, true, 4, 4, S | R,
         "waiting", {{"netlinkd-poll", "ready"}, {"netlinkd-arp", "sleeping"}}},
        {"hostagent", "/usr/lib/quarn/hostagent -c /etc/tarsel/hostagent.xml", 1, true, 9, 2,
         S | R, "sleeping",
         {{"hostagent-io", "waiting"},
          {"hostagent-events", "waiting"},
          {"hostagent-tasks", "sleeping"},
          {"hostagent-worker-1", "running"},
          {"hostagent-worker-2", "running"},
          {"hostagent-worker-3", "sleeping"},
          {"hostagent-worker-4", "sleeping"},
          {"hostagent-worker-5", "sleeping"},
          {"hostagent-worker-6", "sleeping"}}},
        {"webui", "/usr/lib/quarn/webui --listen 443 --root /usr/share/webui", 6, false, 9, 2, S | R,
         "sleeping",
         {{"webui-tls", "waiting"}, {"webui-worker-1", "ready"}, {"webui-worker-2", "sleeping"}}},
        {"quarn-snmp", "/usr/lib/quarn/quarn-snmp --config /etc/tarsel/snmp.xml", 1, true, 9, 6,
         S | R, "sleeping", {{"quarn-snmp-trap", "waiting"}}},
        {"tolmar", "/bin/tolmar --tty tty2", 0, true, 15, 3, S | R | I, "waiting",
         {{"tolmar-input", "waiting"}}},
        {"dumpcollector", "/usr/lib/quarn/dumpcollector --port 6500 --dir /var/core", 1, true, 4, 9,
         S | R, "sleeping", {}},
        {"storagemon", "/usr/lib/quarn/storagemon --interval 60", 1, true, 12, 5, S | R, "sleeping",
         {{"storagemon-scan", "running"}, {"storagemon-health", "sleeping"}}},
        {"pathwatch", "/usr/lib/quarn/pathwatch --all-paths", 1, true, 12, 5, S | R, "sleeping", {}},
        {"vitals", "/usr/lib/quarn/vitals --sample 20", 1, true, 12, 6, S | R, "sleeping",
         {{"vitals-collector", "running"}, {"vitals-export", "sleeping"}}},
        {"sensord", "/usr/lib/quarn/sensord --bmc", 1, true, 12, 6, S | R, "sleeping", {}},
        {"periodicd", "/usr/sbin/periodicd -f /etc/periodic.tab", 1, true, 4, 1, S | R, "sleeping", {}},
        {"secshelld", "/usr/sbin/secshelld -p 22", 1, true, 15, 7, S | R, "sleeping", {}},
        {"secshelld", "secshelld: admin@10.40.2.17", 16, true, 15, 7, I, "waiting", {}},
        {"ash", "-ash", 17, false, 15, 7, I, "waiting", {}},
        {"kelp-cmd", "/bin/kelp-cmd hostsvc status --verbose", 18, false, 15, 7, I, "ready", {}},
        {"fanctl-agent", "/opt/corvane/bin/fanctl-agent --zone all", 1, true, 21, 12, R, "sleeping",
         {{"fanctl-poll", "sleeping"}}},
        {"snapkeeper", "/opt/corvane/bin/snapkeeper --daemon --keep 14", 1, true, 21, 12, R,
         "sleeping", {{"snapkeeper-upload", "stopped"}}},
        {"inventory", "/usr/lib/quarn/inventory --refresh 3600", 6, false, 9, 2, S, "exiting", {}},
        {"vmshell", "/bin/vmshell /pools/ssd-a/build-runner-02/build-runner-02.qcf", 6, true, 27, 8,
         L, "waiting",
         {{"vcpu-0", "running"},
          {"vcpu-1", "ready"},
          {"vcpu-2", "sleeping"},
          {"vcpu-3", "sleeping"},
          {"vm-display", "sleeping"},
          {"vm-io", "waiting"}}},
        {"vmshell", "/bin/vmshell /pools/ssd-a/dns-lab-01/dns-lab-01.qcf", 6, true, 27, 8, L,
         "waiting", {{"vcpu-0", "sleeping"}, {"vcpu-1", "sleeping"}, {"vm-io", "waiting"}}},
    };
    return rows;
}

}  // namespace

std::vector<World> World::Default() {
    std::vector<World> worlds;
    std::vector<std::int64_t> cartel_ids;
    std::vector<std::int64_t> sessions;
    std::int64_t next = 262144;
    // Ids grow with gaps, as when short-lived worlds came and went between these.
    auto NextId = [&]() {
        next += 1 + static_cast<std::int64_t>((worlds.size() * 37) % 29);
        return next;
    };
    for (const CartelRow& row : Cartels()) {
        World main;
        main.id = row.parent < 0 ? 1 : NextId();
        main.cartel_id = main.id;
        main.parent_cartel_id = row.parent < 0 ? 0 : cartel_ids[row.parent];
        main.session_id = row.session_leader || row.parent < 0 ? main.id : sessions[row.parent];
        main.cartel_group_id = main.session_id;
        main.world_group_id = row.world_group;
        main.name = row.name;
        main.command_line = row.command_line;
        main.flags = row.flags;
        main.type = "main";
        main.state = row.state;
        main.security_domain_id = row.security_domain;
        cartel_ids.push_back(main.id);
        sessions.push_back(main.session_id);
        worlds.push_back(main);
        for (const auto& [name, state] : row.helpers) {
            World helper = main;
            helper.id = NextId();
            helper.name = name;
            helper.type = "helper";
            helper.state = state;
            worlds.push_back(helper);
        }
    }
    return worlds;
}

}  // namespace processes
}  // namespace simhost
