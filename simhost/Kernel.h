// The simulated kernel: what the operating-system binding (NorlithCtl::Os::Env) does on the
// simulated host. Each function runs inside the Call of its operation and answers as the system
// call would: 0 or an errno value (never an exception for a refusal; HostError only when the
// host itself cannot be used).
//
// - The clock is the machine's real-time clock plus the host's offset (domain "clock"), in UTC.
// - Sleeps last sleep_percent of their time (domain "simulation").
// - Files are the host's, under its root/ (RootFs.h).
// - Mounts go to the mount table (domain "mounts") after the checks a kernel makes; each file
//   system type parses and checks its own options (the table in Kernel.cpp). The memory file
//   system "mirafs" keeps its mounts, the ramdisks, in a domain of its own (simhost/Mirafs.h).
// - A signal to process 1: 15 (SIGTERM) reboots the host, 12 (SIGUSR2) powers it off; either
//   way the request is recorded (domain "boot"), every domain's next-boot configuration becomes
//   current, the host's uptime starts again, and the host is up for the next command. Other
//   signals to process 1 are logged and ignored; other processes do not exist (ESRCH).
// - The system log is the host's (domain "syslog"), stamped with the host's clock.
#pragma once

#include <simhost/Call.h>
#include <simhost/Export.h>

#include <cstdint>
#include <string>

namespace simhost {
namespace kernel {

SIMHOST_API std::int64_t HostNowMicros(Call& call);
SIMHOST_API int SetHostTime(Call& call, std::int64_t micros);
// The share of a sleep that really passes, 0..100.
SIMHOST_API std::uint32_t SleepPercent(Call& call);
SIMHOST_API int Unlink(Call& call, const std::string& path);
SIMHOST_API int Mount(Call& call, const std::string& source, const std::string& target,
                      const std::string& type, unsigned long flags, const std::string& options);
SIMHOST_API int Umount(Call& call, const std::string& target);
SIMHOST_API int Kill(Call& call, long pid, int signal);
SIMHOST_API void Syslog(Call& call, int priority, const std::string& text);

// Appends to the host's system log outside any host operation (no fault, no trace): for the
// libraries' own records, such as a program's error output.
SIMHOST_API void LogToHost(int priority, const std::string& text);

// A file system type the simulated kernel mounts. Every hook runs inside the write transaction
// of the mount or unmount, after the kernel's own checks (the target exists and is a directory,
// and is or is not a mount point); nothing is stored when a hook refuses.
//
// mount checks the request's options (the data argument) and returns 0 or an errno; it may
// rewrite the request (options as stored, system flag). umount may refuse with an errno
// (EBUSY). A type whose mounts live in a domain of its own rather than in the mount table
// (domain "mounts") also has mounted_at, add and remove; the kernel then asks it whether a
// target is one of its mount points and leaves storing and forgetting its mounts to it.
struct MountRequest;
struct FilesystemType {
    const char* name;
    int (*mount)(Call& call, MountRequest& request);
    int (*umount)(Call& call, const std::string& target);
    bool (*mounted_at)(Db& db, const std::string& target);
    void (*add)(Db& db, const MountRequest& request);
    void (*remove)(Db& db, const std::string& target);
};

struct MountRequest {
    std::string source;
    std::string target;   // canonical host path of an existing directory
    std::string options;  // as given; the type may rewrite what is stored
    unsigned long flags = 0;
    bool system = false;
};

}  // namespace kernel
}  // namespace simhost
