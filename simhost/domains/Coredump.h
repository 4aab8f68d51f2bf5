// The core dump domains: where the host kernel writes its core dump. Three targets, each with a
// state for now and, for partitions and files, one for the next boot (docs/host/coredump.md):
//
// Scenario section "dump_partitions" (default: two disks, each with a diagnostic partition; the
// first one active and configured):
//   {"active": "" or the name of a diagnostic partition, "configured": "" or a partition name,
//    "disks": [{"name": device name (1..100 characters A-Z a-z 0-9 . _ -), "local": bool,
//               "partitions": [{"number": 1..128, "type": "diagnostic" | "qrfs" | "boot" |
//                               "scratch" | "other", "size_mb": 1..16777216}]}]}
// A partition's name is its disk's name, ":" and its number ("nvd.5000c5009a1e2f70:2"); its path
// is "/dev/disks/" followed by the name. "configured" may name a partition the host no longer has
// (a disk was pulled): the host then reports that it cannot find the configured partition. At a
// reboot the configured partition becomes the active one when it is a diagnostic partition of the
// host; otherwise the smart selection picks one (SmartPartition).
//
// Scenario section "dump_files" (default: two datastores, one dump file, active and configured):
//   {"datastores": [{"name": 1..64 bytes without "/", "..", or control characters,
//                    "mount": normalised host path, "capacity_mb": MB, "free_mb": MB}],
//    "files": [{"path": host path below its datastore's mount, "datastore": name,
//               "size_mb": MB}],
//    "active": "" or a host path, "configured": "" or a host path}
// "files" are the dump files the host knows, in its order; each is a real file under root/ that
// starts with the dump-file header (DumpFileHeader). "active" and "configured" may name files
// outside that list or files that have vanished; such a file is simply not valid. At a reboot
// the configured file becomes the active one.
//
// Scenario collection "network_interfaces" (default: hvn0 and hvn1 up, hvn2 down):
//   [{"name": 1..15 characters a-z 0-9 (key), "up": bool, "description": text}]
// Scenario section "network_dump" (default: switched off, hvn0 towards 192.0.2.40:6500):
//   {"enabled": bool, "interface": "" or an interface name, "server": "" or a dotted IPv4
//    address, "port": 0 (none) or 1..65535, "check_timeout_seconds": 1..60}
// check_timeout_seconds bounds how long RunNetDumperCheck waits for the server's answer.
#pragma once

#include <simhost/Db.h>
#include <simhost/Error.h>
#include <simhost/Export.h>
#include <simhost/Mapping.h>
#include <simhost/State.h>

#include <cstdint>
#include <optional>
#include <string>
#include <vector>

namespace simhost {
namespace coredump {

// ---- partitions -----------------------------------------------------------------------------

struct Partition {
    std::int32_t number = 1;
    std::string type = "other";
    std::int64_t size_mb = 1;
};

template <class V>
void Describe(V& v, Partition& p) {
    v("number", p.number, Required(), Range(1, 128));
    v("type", p.type, Required(), OneOf({"diagnostic", "qrfs", "boot", "scratch", "other"}));
    v("size_mb", p.size_mb, Range(1, 16777216));
}

SIMHOST_API bool IsDiskName(const std::string& text);

struct Disk {
    std::string name;
    bool local = true;
    std::vector<Partition> partitions;
};

template <class V>
void Describe(V& v, Disk& d) {
    v("name", d.name, Required(),
      Pattern{IsDiskName, "expected 1 to 100 characters A-Z a-z 0-9 . _ -"});
    v("local", d.local);
    v("partitions", d.partitions, MaxItems(128));
}

struct Partitions {
    static constexpr char kSection[] = "dump_partitions";
    static constexpr StateKind kKind = StateKind::kSingleton;

    std::vector<Disk> disks;
    std::string active;
    std::string configured;

    SIMHOST_API static Partitions Default();
    SIMHOST_API static void Boot(Partitions& state);
    SIMHOST_API std::string Check() const;
};

template <class V>
void Describe(V& v, Partitions& s) {
    // The names come first, so that a look-up of one partition knows its disk before the disks.
    v("active", s.active, Text(256));
    v("configured", s.configured, Text(256));
    v("disks", s.disks, MaxItems(100000));
}

// One partition as the library shows it.
struct PartitionView {
    std::string name;  // disk:number
    std::string path;  // /dev/disks/disk:number
    std::string type;
    std::int64_t size_mb = 0;
    bool local = true;
};

SIMHOST_API std::string PartitionName(const Disk& disk, const Partition& partition);
// The stored state with, of its disks, only those that the active and the configured partition
// are on: a look-up of either reads past the other disks without building them (a host may have
// 100,000 partitions). Throws HostError (kDamaged) when the state cannot be read.
SIMHOST_API Partitions LoadForLookUp(Db& db);
// The partition of that name, any type.
SIMHOST_API std::optional<PartitionView> FindPartition(const Partitions& state, const std::string& name);
// Every diagnostic partition, in disk order and partition order within a disk.
SIMHOST_API std::vector<PartitionView> DiagnosticPartitions(const Partitions& state);
// The smart selection: the configured partition when it is a diagnostic partition; else, of the
// diagnostic partitions, those on local disks before others, the largest first, the first in
// host order among equals. "" when the host has none.
SIMHOST_API std::string SmartPartition(const Partitions& state);

// ---- files ----------------------------------------------------------------------------------

// Name rules of datastores and dump file names: 1..64 bytes, no "/", no "..", no control
// characters. "" when acceptable, else what is wrong.
SIMHOST_API std::string CheckName(const std::string& what, const std::string& name);
SIMHOST_API bool IsDatastoreName(const std::string& text);

struct Datastore {
    std::string name;
    std::string mount;
    std::int64_t capacity_mb = 0;
    std::int64_t free_mb = 0;
};

SIMHOST_API bool IsNormalHostPath(const std::string& text);

template <class V>
void Describe(V& v, Datastore& d) {
    v("name", d.name, Required(), Pattern{IsDatastoreName, "expected 1 to 64 bytes without /, .. or control characters"});
    v("mount", d.mount, Required(), Pattern{IsNormalHostPath, "expected a normalised absolute host path"});
    v("capacity_mb", d.capacity_mb, Range(0, INT64_C(1) << 40));
    v("free_mb", d.free_mb, Range(0, INT64_C(1) << 40));
}

struct DumpFile {
    std::string path;
    std::string datastore;
    std::int64_t size_mb = 0;
};

template <class V>
void Describe(V& v, DumpFile& f) {
    v("path", f.path, Required(), Pattern{IsNormalHostPath, "expected a normalised absolute host path"});
    v("datastore", f.datastore, Required(), Text(64, false));
    v("size_mb", f.size_mb, Required(), Range(1, INT64_C(1) << 40));
}

struct Files {
    static constexpr char kSection[] = "dump_files";
    static constexpr StateKind kKind = StateKind::kSingleton;

    std::vector<Datastore> datastores;
    std::vector<DumpFile> files;
    std::string active;
    std::string configured;

    SIMHOST_API static Files Default();
    static void Boot(Files& state) { state.active = state.configured; }
    SIMHOST_API std::string Check() const;
};

template <class V>
void Describe(V& v, Files& s) {
    v("datastores", s.datastores, MaxItems(1000));
    v("files", s.files, MaxItems(100000));
    v("active", s.active, Text(4095));
    v("configured", s.configured, Text(4095));
}

// Sizes of dump files, in MB (1 MB = 1,048,576 bytes).
constexpr std::int64_t kMinFileMb = 100;
constexpr std::int64_t kMaxFileMb = 32768;
constexpr std::int64_t kDefaultFileMb = 2560;
constexpr std::int64_t kMiB = 1048576;
// The directory of a datastore that holds its dump files, and a dump file's suffix.
constexpr char kDumpDirectory[] = "norlithdump";
constexpr char kDumpSuffix[] = ".dumpfile";
// The header every dump file starts with (the rest of the file is zeros until a dump is
// written): the magic line, then "version: 1" and "size-mb: N", each ending with a newline.
constexpr char kHeaderMagic[] = "NORLITHDUMPFILE\n";
SIMHOST_API std::string DumpFileHeader(std::int64_t size_mb);

// What a dump file on the host's root/ holds.
struct FileCheck {
    bool exists = false;        // a regular file (not a link, not a directory)
    bool header = false;        // starts with a well-formed header
    std::int64_t length = 0;    // bytes
    std::int64_t header_mb = 0; // the size the header names
    bool Valid() const { return exists && header && header_mb * kMiB == length; }
};
// Examines path under root (confined to it; never follows a link out).
SIMHOST_API FileCheck ExamineFile(const std::string& root, const std::string& path);

// The datastore of that name, if any.
SIMHOST_API const Datastore* FindDatastore(const Files& state, const std::string& name);
// The known dump file at that path, if any.
SIMHOST_API const DumpFile* FindFile(const Files& state, const std::string& path);

// Creates a dump file on the host (the state and the file under root/): size_mb 0 picks the
// default size, an empty datastore the first with room for it, an empty name a unique one.
// Throws HostError with a clear message on a refusal; nothing changes then. Returns its path.
SIMHOST_API std::string CreateFile(Files& state, const std::string& root, std::uint64_t size_mb,
                                   const std::string& datastore, const std::string& name);

// The host removed a file (unlink through the operating-system seam): a known dump file at that
// path is forgotten and its size returned to its datastore's free space.
SIMHOST_API void FileRemoved(Db& db, const std::string& path);

// ---- network --------------------------------------------------------------------------------

SIMHOST_API bool IsInterfaceName(const std::string& text);
// A dotted IPv4 address: four decimal numbers 0..255 without leading zeros or blanks.
SIMHOST_API bool IsIpv4(const std::string& text);

struct Interface {
    static constexpr char kSection[] = "network_interfaces";
    static constexpr StateKind kKind = StateKind::kCollection;

    std::string name;
    bool up = true;
    std::string description;

    std::string Key() const { return name; }
    SIMHOST_API static std::vector<Interface> Default();
};

template <class V>
void Describe(V& v, Interface& i) {
    v("name", i.name, Required(), Pattern{IsInterfaceName, "expected 1 to 15 characters a-z 0-9"});
    v("up", i.up);
    v("description", i.description, Text(256));
}

struct NetDump {
    static constexpr char kSection[] = "network_dump";
    static constexpr StateKind kKind = StateKind::kSingleton;

    bool enabled = false;
    std::string interface;
    std::string server;
    std::int32_t port = 0;
    std::int32_t check_timeout_seconds = 5;

    SIMHOST_API static NetDump Default();
    SIMHOST_API std::string Check() const;
};

template <class V>
void Describe(V& v, NetDump& s) {
    v("enabled", s.enabled);
    v("interface", s.interface, Text(15));
    v("server", s.server, Text(15));
    v("port", s.port, Range(0, 65535));
    v("check_timeout_seconds", s.check_timeout_seconds, Range(1, 60));
}

// The error for an interface the host does not have, naming the ones it has.
SIMHOST_API HostError UnknownInterface(Db& db, const std::string& name);

}  // namespace coredump
}  // namespace simhost
