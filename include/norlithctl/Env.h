// NorlithCtl::Os::Env: everything the plug-in asks of the operating system, in one small
// interface: the clock, sleeping, removing a host file, mounting and unmounting, signalling a
// process, and the system log.
//
// Each operation mirrors its system call: same arguments, same results, errno set on failure;
// nothing throws. Env::Default() is the binding the plug-in uses: the simulated host's (paths are
// the host's, under its root/; the clock is the host's, in UTC; a signal to process 1 reboots or
// powers off the host), unless a caller installed another with SetDefault. LiveEnv() calls the
// real system calls. EnvWrapper forwards every call to another Env, so a test that needs one
// different call (a sleep that returns at once, an unlink that fails) overrides just that one.
//
// Env objects are owned by whoever made them; Default() and LiveEnv() return objects that live
// for the whole process. Env calls may come from any thread.
#pragma once

#include <norlithctl/Export.h>

#include <sys/time.h>
#include <sys/types.h>
#include <time.h>

namespace NorlithCtl {
namespace Os {

class NORLITHCTL_API Env {
public:
    virtual ~Env();

    // The binding in use: the simulated host's unless SetDefault installed another.
    static Env* Default();
    // Installs env as the default (null restores the simulated host's); returns the previous
    // one. The caller keeps ownership and keeps env alive while it is installed.
    static Env* SetDefault(Env* env);

    // time(2): the current time in seconds since the epoch.
    virtual time_t Time(time_t* result) = 0;
    // settimeofday(2).
    virtual int SetTimeOfDay(const struct timeval* tv, const struct timezone* tz) = 0;
    // localtime_r(3) and mktime(3) in the zone of the host.
    virtual struct tm* LocalTime(const time_t* time, struct tm* result) = 0;
    virtual time_t MakeTime(struct tm* parts) = 0;
    // nanosleep(2).
    virtual int NanoSleep(const struct timespec* request, struct timespec* remaining) = 0;
    // unlink(2).
    virtual int Unlink(const char* path) = 0;
    // mount(2) and umount(2).
    virtual int Mount(const char* source, const char* target, const char* type,
                      unsigned long flags, const void* data) = 0;
    virtual int Umount(const char* target) = 0;
    // kill(2).
    virtual int Kill(pid_t pid, int signal) = 0;
    // syslog(3) of text as data (never as a format) at priority (severity and facility bits).
    virtual void Syslog(int priority, const char* text) = 0;
};

// Forwards every call to a target Env, which it does not own.
class NORLITHCTL_API EnvWrapper : public Env {
public:
    explicit EnvWrapper(Env* target) : target_(target) {}
    Env* Target() const { return target_; }

    time_t Time(time_t* result) override;
    int SetTimeOfDay(const struct timeval* tv, const struct timezone* tz) override;
    struct tm* LocalTime(const time_t* time, struct tm* result) override;
    time_t MakeTime(struct tm* parts) override;
    int NanoSleep(const struct timespec* request, struct timespec* remaining) override;
    int Unlink(const char* path) override;
    int Mount(const char* source, const char* target, const char* type, unsigned long flags,
              const void* data) override;
    int Umount(const char* target) override;
    int Kill(pid_t pid, int signal) override;
    void Syslog(int priority, const char* text) override;

private:
    Env* target_;
};

// The simulated host's binding (the default) and the real system's.
NORLITHCTL_API Env* SimulatedEnv();
NORLITHCTL_API Env* LiveEnv();

}  // namespace Os
}  // namespace NorlithCtl
