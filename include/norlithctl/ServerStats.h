// Ravel::AdvStats::ServerStats: the host's server statistics, read together by FetchAllStats():
// the load averages with their scale, the number of running processes, and the uptime.
//
// Heap-allocated or on the stack; the caller owns it (nothing else is handed out: the CPU and
// load sub-objects are parts of it, valid while it lives). Before the first FetchAllStats()
// every value is 0. The constructor and FetchAllStats() may throw Ravel::Lib::RavelException (a
// host that cannot be opened, a fault set on the operation); when FetchAllStats() throws, the
// values of the previous fetch remain. The getters never throw.
#pragma once

#include <norlithctl/Export.h>
#include <norlithctl/Testing.h>

#include <cstdint>

namespace Ravel {
namespace AdvStats {

// The physical CPUs the raw load values are summed over.
class NORLITHCTL_API CpuStats {
public:
    // N, the scale of the raw load values: the number of physical CPUs; 0 while the host has
    // not counted them yet (just after a boot), when the raw values are meaningless.
    std::int32_t GetPcpuCount() const { return pcpus_; }

private:
    friend class ServerStats;
    std::int32_t pcpus_ = 0;
};

// The raw load averages: 100 x N x the average number of runnable worlds per CPU over the last
// 1, 5 and 15 minutes (a raw value of 150 with N = 1 is a load of 1.50).
class NORLITHCTL_API LoadStats {
public:
    std::uint32_t GetOneMinute() const { return one_; }
    std::uint32_t GetFiveMinutes() const { return five_; }
    std::uint32_t GetFifteenMinutes() const { return fifteen_; }

private:
    friend class ServerStats;
    std::uint32_t one_ = 0;
    std::uint32_t five_ = 0;
    std::uint32_t fifteen_ = 0;
};

class NORLITHCTL_API ServerStats {
public:
    ServerStats();
    virtual ~ServerStats();

    // Reads every statistic below from the host at once.
    virtual void FetchAllStats();

    // The number of worlds in the state "running".
    std::int32_t GetRunningProcesses() const { return running_; }
    const CpuStats& GetCpuStats() const { return cpu_; }
    const LoadStats& GetLoadStats() const { return load_; }
    // Microseconds since the host last booted, counted on the machine's clock from the boot
    // record (setting the host's time does not change it); never negative.
    std::int64_t GetUptimeMicros() const { return uptime_us_; }

private:
    ServerStats(const ServerStats&);
    ServerStats& operator=(const ServerStats&);

    std::int32_t running_ = 0;
    CpuStats cpu_;
    LoadStats load_;
    std::int64_t uptime_us_ = 0;
    NorlithCtl::LiveObject live_;
};

}  // namespace AdvStats
}  // namespace Ravel
