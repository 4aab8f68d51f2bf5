// The memory file system "mirafs" of the simulated kernel: its mount options, its ramdisks'
// usage, and the kernel information records of its status, ramdisks and tardisks.
//
// A ramdisk is a mirafs instance mounted at a directory of the host's root/; the files under
// that directory (less those under a deeper mount point) are its files. Its used size is the
// sum of their sizes, each rounded up to 4 KiB, and each file, folder or link there is one used
// inode. The ramdisks live in the domain "ramdisks" (domains/Memfs.h), with an index of their
// mount points beside it, not in the mount table; the kernel (Kernel.cpp) asks MountedAt
// whether a target is one of them.
//
// Mounting (mount(2) with type "mirafs") takes a data string of seven comma-separated fields:
//   minimum MiB, maximum MiB, reserved inodes, maximum inodes (0: 8192), core dump (0 or 1),
//   mode (octal), name
// and refuses, as errno: EINVAL (a field missing, extra, not a number, above 32 bits, minimum
// above maximum, reserved inodes above the maximum, a mode that is not octal, a bad name),
// ENAMETOOLONG (a name of more than 31 bytes, a mount point of more than 131), EEXIST (a name in
// use), ENOSPC (more reserved inodes than the file system has). Unmounting a system ramdisk is
// EBUSY.
//
// Functions here return errno values or records; HostError only when the host cannot be read.
#pragma once

#include <simhost/Call.h>
#include <simhost/Export.h>
#include <simhost/Kernel.h>
#include <simhost/domains/Memfs.h>

#include <cstdint>
#include <optional>
#include <string>
#include <vector>

namespace simhost {
namespace mirafs {

// The fields of a mount's option string.
struct MountOptions {
    std::uint32_t minimum_mib = 0;
    std::uint32_t maximum_mib = 0;
    std::uint32_t reserved_inodes = 0;
    std::uint32_t maximum_inodes = 0;  // 0 in the string: kDefaultMaximumInodes
    bool coredump = false;
    std::string permissions;  // four octal digits
    std::string name;
};

// Parses and checks an option string: 0, EINVAL or ENAMETOOLONG.
SIMHOST_API int ParseMountOptions(const std::string& text, MountOptions* options);

// The ramdisk of that name, or of that mount point.
SIMHOST_API std::optional<Ramdisk> FindRamdisk(Db& db, const std::string& name);
SIMHOST_API std::optional<Ramdisk> RamdiskAt(Db& db, const std::string& mount_point);
// Stores a ramdisk (after the last one) with its mount point in the index; removes one. Inside
// the caller's write transaction.
SIMHOST_API void PutRamdisk(Db& db, const Ramdisk& ramdisk);
SIMHOST_API void EraseRamdisk(Db& db, const Ramdisk& ramdisk);

// What the files under a ramdisk's mount point take: 4 KiB pages and inodes.
struct Usage {
    std::uint64_t pages = 0;
    std::uint64_t inodes = 0;
};
// Walks root/ at mount_point, leaving out deeper mount points' files; a mount point without a
// directory under root/ holds nothing. Symbolic links are counted, never followed.
SIMHOST_API Usage UsageOf(Db& db, const std::string& root, const std::string& mount_point);

// ---- the kernel's hooks (Kernel.cpp's table of file system types) ------------------------------

int CheckMount(Call& call, kernel::MountRequest& request);
int CheckUmount(Call& call, const std::string& target);
bool MountedAt(Db& db, const std::string& target);
void AddMount(Db& db, const kernel::MountRequest& request);
void RemoveMount(Db& db, const std::string& target);
// path with '.', '..' and doubled or trailing '/' resolved by name alone, as a mount point;
// false when the result is no mount point (too long, not absolute).
bool NormalisedMountPoint(const std::string& path, std::string* normalised);

// ---- records -------------------------------------------------------------------------------

// The counters of the status record (node 1579): the root file system's own figures with every
// ramdisk's used and reserved inodes added, each peak at least the current figure, all held
// within 32 bits.
struct StatusFigures {
    std::uint32_t total = 0;
    std::uint32_t used = 0;
    std::uint32_t peak_used = 0;
    std::uint32_t unlinked = 0;
    std::uint32_t peak_unlinked = 0;
    std::uint32_t reserved = 0;
    std::uint32_t peak_reserved = 0;
};
SIMHOST_API StatusFigures FiguresOf(const Status& status, std::uint64_t ramdisk_used_inodes,
                                    std::uint64_t ramdisk_reserved_inodes);

// Pure encoders of the records, from the layouts of <norlithctl/Records.h>.
SIMHOST_API std::vector<unsigned char> EncodeStatus(const StatusFigures& figures);
SIMHOST_API std::vector<unsigned char> EncodeRamdisk(const Ramdisk& ramdisk, const Usage& usage);
SIMHOST_API std::vector<unsigned char> EncodeTardisk(const Tardisk& tardisk);

// The node readers of Records.cpp's table.
std::vector<unsigned char> ReadStatus(Call& call, const std::vector<std::string>& instance);
std::vector<unsigned char> ReadRamdiskCount(Call& call, const std::vector<std::string>& instance);
std::vector<unsigned char> ReadRamdisk(Call& call, const std::vector<std::string>& instance);
std::vector<std::string> ListRamdisks(Call& call);
std::vector<unsigned char> ReadTardiskCount(Call& call, const std::vector<std::string>& instance);
std::vector<unsigned char> ReadTardisk(Call& call, const std::vector<std::string>& instance);
std::vector<std::string> ListTardisks(Call& call);

}  // namespace mirafs
}  // namespace simhost
