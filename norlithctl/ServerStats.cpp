#include <norlithctl/ServerStats.h>

#include "HostCall.h"

#include <simhost/Time.h>
#include <simhost/domains/Clock.h>
#include <simhost/domains/Processes.h>

#include <algorithm>
#include <limits>

namespace Ravel {
namespace AdvStats {

using simhost::Call;
using simhost::Op;

ServerStats::ServerStats() {
    norlithctl::HostCall([] { Call call(Op::ServerStats_New); });
}

ServerStats::~ServerStats() {}

void ServerStats::FetchAllStats() {
    norlithctl::HostCall([&] {
        Call call(Op::ServerStats_FetchAllStats);
        const simhost::processes::Load load = call.Read<simhost::processes::Load>();
        // Counted by the store: decoding every world only to read its state cost most of the
        // command on a host of a few dozen worlds.
        const std::int64_t running = call.Items<simhost::processes::World>().CountWhere(
            "state", simhost::processes::kRunning);
        const simhost::boot::Boot boot = call.Read<simhost::boot::Boot>();
        std::optional<std::int64_t> booted = simhost::ParseUtc(boot.booted_at);
        if (!booted)
            throw simhost::HostError("The host's boot record has no valid boot time ('" +
                                     boot.booted_at + "')");
        // Everything read: only now replace the previous values.
        cpu_.pcpus_ = static_cast<std::int32_t>(load.scale);
        load_.one_ = load.one_minute;
        load_.five_ = load.five_minutes;
        load_.fifteen_ = load.fifteen_minutes;
        running_ = static_cast<std::int32_t>(
            std::min<std::int64_t>(running, std::numeric_limits<std::int32_t>::max()));
        // A boot time ahead of the machine's clock (a scenario from the future) is no uptime.
        uptime_us_ = std::max<std::int64_t>(0, simhost::MachineNowMicros() - *booted);
    });
}

}  // namespace AdvStats
}  // namespace Ravel
