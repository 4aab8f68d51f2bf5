#include <norlithctl/Env.h>

#include <atomic>
#include <cerrno>
#include <syslog.h>

#include <sys/mount.h>
#include <signal.h>
#include <unistd.h>

namespace NorlithCtl {
namespace Os {
namespace {

std::atomic<Env*> g_default{nullptr};

// The real system calls, unchanged.
class Live : public Env {
public:
    time_t Time(time_t* result) override { return ::time(result); }
    int SetTimeOfDay(const struct timeval* tv, const struct timezone* tz) override {
        return ::settimeofday(tv, tz);
    }
    struct tm* LocalTime(const time_t* time, struct tm* result) override {
        return ::localtime_r(time, result);
    }
    time_t MakeTime(struct tm* parts) override { return ::mktime(parts); }
    int NanoSleep(const struct timespec* request, struct timespec* remaining) override {
        return ::nanosleep(request, remaining);
    }
    int Unlink(const char* path) override { return ::unlink(path); }
    int Mount(const char* source, const char* target, const char* type, unsigned long flags,
              const void* data) override {
        return ::mount(source, target, type, flags, data);
    }
    int Umount(const char* target) override { return ::umount(target); }
    int Kill(pid_t pid, int signal) override { return ::kill(pid, signal); }
    void Syslog(int priority, const char* text) override { ::syslog(priority, "%s", text); }
};

}  // namespace

Env::~Env() {}

Env* Env::Default() {
    Env* env = g_default.load();
    return env ? env : SimulatedEnv();
}

Env* Env::SetDefault(Env* env) {
    Env* previous = g_default.exchange(env);
    return previous ? previous : SimulatedEnv();
}

Env* LiveEnv() {
    static Live live;
    return &live;
}

time_t EnvWrapper::Time(time_t* result) { return target_->Time(result); }
int EnvWrapper::SetTimeOfDay(const struct timeval* tv, const struct timezone* tz) {
    return target_->SetTimeOfDay(tv, tz);
}
struct tm* EnvWrapper::LocalTime(const time_t* time, struct tm* result) {
    return target_->LocalTime(time, result);
}
time_t EnvWrapper::MakeTime(struct tm* parts) { return target_->MakeTime(parts); }
int EnvWrapper::NanoSleep(const struct timespec* request, struct timespec* remaining) {
    return target_->NanoSleep(request, remaining);
}
int EnvWrapper::Unlink(const char* path) { return target_->Unlink(path); }
int EnvWrapper::Mount(const char* source, const char* target, const char* type,
                      unsigned long flags, const void* data) {
    return target_->Mount(source, target, type, flags, data);
}
int EnvWrapper::Umount(const char* target) { return target_->Umount(target); }
int EnvWrapper::Kill(pid_t pid, int signal) { return target_->Kill(pid, signal); }
void EnvWrapper::Syslog(int priority, const char* text) { target_->Syslog(priority, text); }

}  // namespace Os
}  // namespace NorlithCtl
