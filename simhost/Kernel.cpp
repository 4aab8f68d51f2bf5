#include <simhost/Kernel.h>

#include <simhost/domains/Coredump.h>

#include <simhost/RootFs.h>
#include <simhost/Time.h>
#include <simhost/domains/Clock.h>
#include <simhost/domains/Logs.h>
#include <simhost/domains/Mounts.h>
#include <simhost/Mirafs.h>

#include <cerrno>
#include <climits>
#include <csignal>
#include <cstring>

#include <fcntl.h>
#include <unistd.h>

namespace simhost {
namespace kernel {
namespace {

// A memory file system without options of its own: what it is given is kept as its options.
int MountTmpfs(Call&, MountRequest&) { return 0; }
int UmountAny(Call&, const std::string&) { return 0; }

const FilesystemType kFilesystems[] = {
    {"tmpfs", MountTmpfs, UmountAny, nullptr, nullptr, nullptr},
    {"mirafs", mirafs::CheckMount, mirafs::CheckUmount, mirafs::MountedAt, mirafs::AddMount,
     mirafs::RemoveMount},
};

// A refusal found inside a mount's or unmount's write transaction: it rolls the transaction
// back, so that nothing is stored or journaled.
struct Refused {
    int error;
};

// The type that keeps target as one of its own mount points, or nullptr.
const FilesystemType* OwnerOf(Db& db, const std::string& target) {
    for (const FilesystemType& type : kFilesystems)
        if (type.mounted_at && type.mounted_at(db, target)) return &type;
    return nullptr;
}

// Whether target is a mount point: in the mount table, or of a type that keeps its own.
bool IsMountPoint(Db& db, const std::string& target) {
    return Items<mounts::Mount>(db).Contains(target) || OwnerOf(db, target);
}

const FilesystemType* FindFilesystem(const std::string& name) {
    for (const FilesystemType& type : kFilesystems)
        if (name == type.name) return &type;
    return nullptr;
}

// The canonical host path of an existing directory inside root/, or an errno.
int CanonicalDirectory(const std::string& root, const std::string& path, std::string* canonical) {
    RootFs fs(root);
    int fd = -1;
    if (int error = fs.Open(path, O_PATH | O_DIRECTORY, 0, &fd)) return error;
    char resolved[PATH_MAX];
    std::string link = "/proc/self/fd/" + std::to_string(fd);
    ssize_t length = readlink(link.c_str(), resolved, sizeof resolved - 1);
    int error = length < 0 ? errno : 0;
    close(fd);
    if (error) return error;
    std::string real(resolved, static_cast<std::size_t>(length));
    char root_resolved[PATH_MAX];
    if (!realpath(root.c_str(), root_resolved)) return errno;
    std::string prefix = root_resolved;
    if (real == prefix) {
        *canonical = "/";
        return 0;
    }
    if (real.compare(0, prefix.size() + 1, prefix + "/") != 0) return EXDEV;
    *canonical = real.substr(prefix.size());
    return 0;
}

void AppendSyslog(Db& db, std::int64_t now_us, int priority, const std::string& text) {
    syslog::Entry entry;
    entry.time = FormatUtc(now_us, true);
    entry.priority = static_cast<std::uint32_t>(priority & 7);
    entry.message = text.size() > kLogMessageMax ? text.substr(0, kLogMessageMax) : text;
    if (!IsValidUtf8(entry.message) || entry.message.find('\0') != std::string::npos) {
        // The log keeps text; bytes that are not UTF-8 are shown as '?'.
        for (char& c : entry.message)
            if (static_cast<unsigned char>(c) >= 0x80 || c == '\0') c = '?';
    }
    Items<syslog::Entry>(db).Append(entry);
}

void Reboot(Db& db, std::int64_t now_us, int signal) {
    const char* kind = signal == SIGTERM ? "reboot" : "poweroff";
    AppendSyslog(db, now_us, 2, std::string("init: ") + kind + " requested by signal " +
                                    std::to_string(signal) + "; the host goes down");
    BootAllDomains(db);
    boot::Boot state = Load<boot::Boot>(db);
    state.last_request = kind;
    state.last_request_at = FormatUtc(now_us, false);
    state.booted_at = FormatUtc(MachineNowMicros(), false);
    ++state.boot_count;
    Save(db, state);
    AppendSyslog(db, now_us, 5, "kernel: the host booted (boot " + std::to_string(state.boot_count) + ")");
}

}  // namespace

std::int64_t HostNowMicros(Call& call) { return clock::HostNowMicros(call.Read<clock::Clock>()); }

int SetHostTime(Call& call, std::int64_t micros) {
    std::int64_t offset = micros - MachineNowMicros();
    if (offset < -clock::kMaxOffsetMicros || offset > clock::kMaxOffsetMicros) return EINVAL;
    call.Update<clock::Clock>([&](clock::Clock& clock) { clock.offset_us = offset; });
    return 0;
}

std::uint32_t SleepPercent(Call& call) { return call.Read<simulation::Simulation>().sleep_percent; }

int Unlink(Call& call, const std::string& path) {
    RootFs fs(call.Root());
    if (!IsHostPath(path)) return path.empty() ? ENOENT : EINVAL;
    struct stat info {};
    if (int error = fs.Stat(path, &info)) return error;
    if (S_ISDIR(info.st_mode)) return EISDIR;
    if (int error = fs.Unlink(path)) return error;
    // A dump file's space goes back to its datastore, and the host forgets the file.
    call.Change([&](Db& db) { coredump::FileRemoved(db, path); });
    return 0;
}

int Mount(Call& call, const std::string& source, const std::string& target,
          const std::string& type, unsigned long flags, const std::string& options) {
    const FilesystemType* filesystem = FindFilesystem(type);
    if (!filesystem) return ENODEV;
    if (target.empty()) return ENOENT;
    if (!IsHostPath(target)) return target[0] == '/' ? ENAMETOOLONG : ENOENT;
    MountRequest request;
    request.source = source;
    request.options = options;
    request.flags = flags;
    if (int error = CanonicalDirectory(call.Root(), target, &request.target)) return error;
    if (request.target == "/") return EBUSY;
    try {
        call.Change([&](Db& db) {
            if (IsMountPoint(db, request.target)) throw Refused{EBUSY};
            if (int error = filesystem->mount(call, request)) throw Refused{error};
            if (filesystem->add) return filesystem->add(db, request);
            mounts::Mount mount;
            mount.target = request.target;
            mount.type = type;
            mount.source = request.source;
            mount.options = request.options;
            mount.system = request.system;
            Items<mounts::Mount>(db).Put(mount);
        });
    } catch (const Refused& refused) {
        return refused.error;
    }
    return 0;
}

int Umount(Call& call, const std::string& target) {
    if (target.empty() || !IsHostPath(target)) return target.empty() ? ENOENT : EINVAL;
    std::string canonical;
    if (int error = CanonicalDirectory(call.Root(), target, &canonical)) {
        // A mount point whose directory root/ lacks (a ramdisk of a scenario that made no
        // directory for it) is still found by its normalised path.
        if (error != ENOENT || !mirafs::NormalisedMountPoint(target, &canonical) ||
            !OwnerOf(call.db(), canonical))
            return error;
    }
    try {
        call.Change([&](Db& db) {
            std::optional<mounts::Mount> mount = Items<mounts::Mount>(db).Find(canonical);
            const FilesystemType* filesystem = mount ? FindFilesystem(mount->type) : OwnerOf(db, canonical);
            if (!mount && !filesystem) throw Refused{EINVAL};
            if (filesystem)
                if (int error = filesystem->umount(call, canonical)) throw Refused{error};
            if (mount)
                Items<mounts::Mount>(db).Erase(canonical);
            else
                filesystem->remove(db, canonical);
        });
    } catch (const Refused& refused) {
        return refused.error;
    }
    return 0;
}

int Kill(Call& call, long pid, int signal) {
    if (signal < 0 || signal > 64) return EINVAL;
    if (pid != 1) return ESRCH;
    if (signal == 0) return 0;
    std::int64_t now = HostNowMicros(call);
    call.Change([&](Db& db) {
        if (signal == SIGTERM || signal == SIGUSR2)
            Reboot(db, now, signal);
        else
            AppendSyslog(db, now, 6, "init: ignored signal " + std::to_string(signal));
    });
    return 0;
}

void Syslog(Call& call, int priority, const std::string& text) {
    std::int64_t now = HostNowMicros(call);
    call.Change([&](Db& db) { AppendSyslog(db, now, priority, text); });
}

void LogToHost(int priority, const std::string& text) {
    Session session = Session::OpenCurrent();
    std::int64_t now = clock::HostNowMicros(Load<clock::Clock>(session.db()));
    WriteTxn txn(session.db());
    AppendSyslog(session.db(), now, priority, text);
    txn.Commit();
}

}  // namespace kernel
}  // namespace simhost
