// The operating-system binding of the simulated host: each call is a host operation (traced,
// faultable, journaled when it changes the host) carried out by the simulated kernel
// (simhost/Kernel.h). A fault set on one of these operations makes the call fail as a system
// call does: -1 with errno set to the errno its message names first ("EACCES", or
// "EACCES: ..."), else EIO.
#include <norlithctl/Env.h>

#include "HostCall.h"

#include <simhost/Kernel.h>

#include <algorithm>
#include <cerrno>
#include <cstdint>
#include <cstring>
#include <string>

namespace NorlithCtl {
namespace Os {
namespace {

using simhost::Args;
using simhost::Call;
using simhost::Op;

// The errno a fault's message names, else EIO.
int ErrnoOf(const std::string& message) {
    std::string name = message.substr(0, message.find_first_of(": "));
    for (int error = 1; error < 134; ++error) {
        const char* known = strerrorname_np(error);
        if (known && name == known) return error;
    }
    return EIO;
}

// Runs body(call) as the operation; a failure becomes -1 with errno, as from a system call.
template <class Body>
int Run(Op operation, Args args, Body body) {
    try {
        Call call(operation, std::move(args));
        int error = body(call);
        if (error == 0) return 0;
        errno = error;
    } catch (const simhost::HostError& failure) {
        errno = failure.code() == simhost::HostError::Code::kFailed ? ErrnoOf(failure.what()) : EIO;
    }
    return -1;
}

class Simulated : public Env {
public:
    time_t Time(time_t* result) override {
        std::int64_t now = 0;
        if (Run(Op::Os_Time, Args(), [&](Call& call) {
                now = simhost::kernel::HostNowMicros(call);
                return 0;
            }) != 0)
            return static_cast<time_t>(-1);
        time_t seconds = static_cast<time_t>(now / 1000000);
        if (result) *result = seconds;
        return seconds;
    }

    int SetTimeOfDay(const struct timeval* tv, const struct timezone*) override {
        if (!tv) return 0;
        // Seconds whose microseconds do not fit 64 bits are out of the host clock's range too.
        const std::int64_t kMaxSeconds = INT64_MAX / 1000000 - 1;
        if (tv->tv_usec < 0 || tv->tv_usec >= 1000000 || tv->tv_sec > kMaxSeconds ||
            tv->tv_sec < -kMaxSeconds) {
            errno = EINVAL;
            return -1;
        }
        std::int64_t micros = static_cast<std::int64_t>(tv->tv_sec) * 1000000 + tv->tv_usec;
        return Run(Op::Os_SetTimeOfDay,
                   Args().Add("seconds", static_cast<std::int64_t>(tv->tv_sec))
                       .Add("microseconds", static_cast<std::int64_t>(tv->tv_usec)),
                   [&](Call& call) { return simhost::kernel::SetHostTime(call, micros); });
    }

    // The host's zone is UTC.
    struct tm* LocalTime(const time_t* time, struct tm* result) override {
        return gmtime_r(time, result);
    }
    time_t MakeTime(struct tm* parts) override { return timegm(parts); }

    int NanoSleep(const struct timespec* request, struct timespec* remaining) override {
        if (!request || request->tv_nsec < 0 || request->tv_nsec >= 1000000000 || request->tv_sec < 0) {
            errno = EINVAL;
            return -1;
        }
        std::uint32_t percent = 100;
        if (Run(Op::Os_NanoSleep,
                Args().Add("seconds", static_cast<std::int64_t>(request->tv_sec))
                    .Add("nanoseconds", static_cast<std::int64_t>(request->tv_nsec)),
                [&](Call& call) {
                    percent = simhost::kernel::SleepPercent(call);
                    return 0;
                }) != 0)
            return -1;
        // The host is not held while sleeping: other threads and processes go on using it.
        const std::int64_t kBillion = 1000000000;
        std::int64_t seconds = std::min<std::int64_t>(request->tv_sec, INT64_MAX / kBillion - 1);
        std::int64_t wanted = seconds * kBillion + request->tv_nsec;
        std::int64_t real = wanted / 100 * percent + wanted % 100 * percent / 100;
        timespec scaled{static_cast<time_t>(real / kBillion), static_cast<long>(real % kBillion)};
        timespec left{};
        if (nanosleep(&scaled, &left) == 0) return 0;
        int error = errno;
        if (remaining) {
            // What is left of the host's sleep, in the host's time.
            std::int64_t rest = left.tv_sec * kBillion + left.tv_nsec;
            rest = percent ? rest / percent * 100 + rest % percent * 100 / percent : 0;
            remaining->tv_sec = static_cast<time_t>(rest / kBillion);
            remaining->tv_nsec = static_cast<long>(rest % kBillion);
        }
        errno = error;
        return -1;
    }

    int Unlink(const char* path) override {
        if (!path) {
            errno = EFAULT;
            return -1;
        }
        return Run(Op::Os_Unlink, Args().Add("path", path),
                   [&](Call& call) { return simhost::kernel::Unlink(call, path); });
    }

    int Mount(const char* source, const char* target, const char* type, unsigned long flags,
              const void* data) override {
        if (!target || !type) {
            errno = EFAULT;
            return -1;
        }
        std::string options = data ? static_cast<const char*>(data) : "";
        std::string from = source ? source : "";
        return Run(Op::Os_Mount,
                   Args().Add("source", from).Add("target", target).Add("type", type)
                       .Add("flags", static_cast<std::uint64_t>(flags)).Add("options", options),
                   [&](Call& call) {
                       return simhost::kernel::Mount(call, from, target, type, flags, options);
                   });
    }

    int Umount(const char* target) override {
        if (!target) {
            errno = EFAULT;
            return -1;
        }
        return Run(Op::Os_Umount, Args().Add("target", target),
                   [&](Call& call) { return simhost::kernel::Umount(call, target); });
    }

    int Kill(pid_t pid, int signal) override {
        return Run(Op::Os_Kill, Args().Add("pid", static_cast<std::int64_t>(pid)).Add("signal", signal),
                   [&](Call& call) { return simhost::kernel::Kill(call, pid, signal); });
    }

    void Syslog(int priority, const char* text) override {
        std::string message = text ? text : "";
        int saved = errno;  // syslog(3) leaves errno alone
        Run(Op::Os_Syslog, Args().Add("priority", priority).Add("message", message),
            [&](Call& call) {
                simhost::kernel::Syslog(call, priority, message);
                return 0;
            });
        errno = saved;
    }
};

}  // namespace

Env* SimulatedEnv() {
    static Simulated simulated;
    return &simulated;
}

}  // namespace Os
}  // namespace NorlithCtl
