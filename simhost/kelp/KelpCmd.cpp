#include <simhost/kelp/KelpCmd.h>

#include <simhost/Call.h>
#include <simhost/Error.h>
#include <simhost/Journal.h>
#include <simhost/Kernel.h>
#include <simhost/domains/Maintenance.h>

#include <cerrno>
#include <climits>
#include <cstdint>
#include <cstring>
#include <optional>
#include <string>

#include <time.h>

namespace simhost {
namespace kelp {
namespace {

using maintenance::Maintenance;

constexpr std::int64_t kDefaultTimeout = 60;
constexpr int kFailed = 1;
constexpr int kUsage = 2;

// One maintenance-mode transition: where it goes, how it shows meanwhile, the time it takes.
struct Transition {
    Op op;                  // its name is the operation's (Registry.def)
    const char* target;     // "enabled" or "disabled"
    const char* moving;     // "entering" or "exiting"
    std::uint32_t Maintenance::*seconds;
    const char* doing;      // for messages
    const char* done;
};

const Transition kTransitions[] = {
    {Op::Kelp_MaintenanceModeEnter, maintenance::kEnabled,
     maintenance::kEntering, &Maintenance::enter_seconds,
     "entering maintenance mode", "The host is in maintenance mode."},
    {Op::Kelp_MaintenanceModeExit, maintenance::kDisabled,
     maintenance::kExiting, &Maintenance::exit_seconds,
     "leaving maintenance mode", "The host is out of maintenance mode."},
};

void Usage(std::ostream& out) {
    out << "Usage: kelp-cmd OPERATION [TIMEOUT]\n\n"
           "Operations:\n"
           "  hostsvc/maintenance_mode_enter [TIMEOUT]  put the host in maintenance mode\n"
           "  hostsvc/maintenance_mode_exit [TIMEOUT]   take the host out of maintenance mode\n\n"
           "TIMEOUT: the most seconds the operation may take (default 60; 0: no limit).\n";
}

// A timeout: decimal seconds, 0 or more; nothing for anything else.
std::optional<std::int64_t> ParseTimeout(const std::string& text) {
    if (text.empty() || text.size() > 19) return std::nullopt;
    std::int64_t value = 0;
    for (char c : text) {
        if (c < '0' || c > '9') return std::nullopt;
        if (value > (INT64_MAX - (c - '0')) / 10) return std::nullopt;
        value = value * 10 + (c - '0');
    }
    return value;
}

// Sleeps `seconds` of the host's time: the host's share of it really passes.
void SleepOnHost(std::uint64_t seconds, std::uint32_t percent) {
    const std::uint64_t kBillion = 1000000000;
    std::uint64_t nanos = seconds * kBillion / 100 * percent;
    timespec left{static_cast<time_t>(nanos / kBillion), static_cast<long>(nanos % kBillion)};
    while (nanosleep(&left, &left) != 0 && errno == EINTR) {
    }
}

// Sets the state to `to` when it is `from` now, in one journaled transaction; returns the state
// found.
std::string Move(Call& call, const std::string& from, const std::string& to, std::int64_t timeout) {
    WriteTxn txn(call.db());
    Maintenance state = Load<Maintenance>(call.db());
    if (state.state != from) return state.state;
    state.state = to;
    Save(call.db(), state);
    AppendJournal(call.db(), "change", call.OperationName(),
                  Args().Add("timeout", timeout).Add("state", to).Text());
    txn.Commit();
    return from;
}

int Run(const Transition& t, std::int64_t timeout, std::ostream& out, std::ostream& err) {
    Call call(t.op, Args().Add("timeout", timeout));
    Maintenance now = call.Read<Maintenance>();
    if (now.state == t.target) {
        out << t.done << '\n';
        return 0;
    }
    // A transition found under way (another run, or one that was killed) is taken over; if
    // this one gives up, the state is put back as it was found.
    const std::string before = now.state;
    if (Move(call, now.state, t.moving, timeout) != now.state) {
        err << OperationName(t.op) << ": the maintenance mode changed meanwhile; try again\n";
        return kFailed;
    }
    const std::uint32_t needed = now.*t.seconds;
    const bool in_time = timeout == 0 || timeout >= static_cast<std::int64_t>(needed);
    SleepOnHost(in_time ? needed : static_cast<std::uint64_t>(timeout), kernel::SleepPercent(call));
    if (!in_time) {
        Move(call, t.moving, before, timeout);
        err << OperationName(t.op) << ": timed out after " << timeout << " seconds; " << t.doing
            << " takes " << needed << " seconds on this host\n";
        return kFailed;
    }
    std::string found = Move(call, t.moving, t.target, timeout);
    if (found != t.moving && found != t.target) {
        err << OperationName(t.op)
            << ": overtaken by another maintenance mode operation (the state is now '" << found
            << "')\n";
        return kFailed;
    }
    out << t.done << '\n';
    return 0;
}

}  // namespace

int Main(int argc, char** argv, std::ostream& out, std::ostream& err) {
    if (argc < 2) {
        Usage(err);
        return kUsage;
    }
    const std::string operation = argv[1];
    if (operation == "--help" || operation == "-h" || operation == "help") {
        Usage(out);
        return 0;
    }
    const Transition* transition = nullptr;
    std::string known;
    for (const Transition& t : kTransitions) {
        if (operation == OperationName(t.op)) transition = &t;
        known += std::string(known.empty() ? "" : " and ") + OperationName(t.op);
    }
    if (!transition) {
        err << "kelp-cmd: unknown operation '" << operation << "'; the operations are " << known
            << '\n';
        return kUsage;
    }
    if (argc > 3) {
        err << "kelp-cmd: " << operation << " takes at most one argument, the timeout\n";
        return kUsage;
    }
    std::int64_t timeout = kDefaultTimeout;
    if (argc == 3) {
        std::optional<std::int64_t> parsed = ParseTimeout(argv[2]);
        if (!parsed) {
            err << "kelp-cmd: invalid timeout '" << argv[2]
                << "': expected a number of seconds from 0 (no limit) to 9223372036854775807\n";
            return kUsage;
        }
        timeout = *parsed;
    }
    try {
        return Run(*transition, timeout, out, err);
    } catch (const std::exception& error) {
        err << operation << ": " << error.what() << '\n';
        return kFailed;
    }
}

}  // namespace kelp
}  // namespace simhost
