// The host's in-memory file system: its inode accounting, its ramdisks and its tardisks.
//
// Scenario section "mirafs": the root file system's own inode figures (ramdisks add theirs to
// them when the status record is read); every member 0..4294967295:
//   total_inodes, used_inodes, unlinked_inodes, reserved_inodes,
//   peak_used_inodes, peak_unlinked_inodes, peak_reserved_inodes
// Scenario section "ramdisks" (default: the host's system ramdisks): an array, in mount order, of
//   {"name": 1..31 visible ASCII characters, no '/' or ',' (required, the key),
//    "mount_point": normalised absolute path of at most 131 bytes (required, unique),
//    "reserved_mib", "maximum_mib": 0..4294967295, reserved not above maximum,
//    "reserved_inodes": 0..4294967295, "maximum_inodes": 1..4294967295 (default 8192),
//    reserved not above maximum, "coredump": bool, "permissions": octal mode (default "0755"),
//    "system": bool (a system ramdisk: mounted at every boot, cannot be removed),
//    "peak_used_kib": the most it has held, 0..17179869180}
// Scenario section "tardisks" (default: a dozen): an array, in load order, of
//   {"name": as a ramdisk name (required, the key), "size": bytes 0..4294967295, "system": bool}
// At a reboot the ramdisks that are not system ramdisks are gone. simhost/Mirafs.h has the
// file system's rules (mounting, usage, records); docs/host/memfs.md describes them.
#pragma once

#include <simhost/Mapping.h>
#include <simhost/State.h>

#include <cstdint>
#include <string>
#include <vector>

namespace simhost {
namespace mirafs {

constexpr std::size_t kNameMax = 31;
constexpr std::size_t kMountPointMax = 131;  // the record's 132 bytes hold it and its NUL
constexpr std::uint32_t kDefaultMaximumInodes = 8192;
constexpr std::uint64_t kPeakUsedMaxKib = std::uint64_t(0xFFFFFFFF) * 4;

// 1..31 visible ASCII characters without '/' or ',' (a ',' would split the mount option
// string), and neither "." nor "..".
bool IsInstanceName(const std::string& text);
// An octal mode: one to four octal digits, optionally after one more leading '0' ("755",
// "0755", "1777", "01777").
bool IsOctalMode(const std::string& text);
// A normalised absolute path ("/", or no '.', '..', '//' or trailing '/') of at most 131 bytes.
bool IsMountPoint(const std::string& text);

struct Status {
    static constexpr char kSection[] = "mirafs";
    static constexpr StateKind kKind = StateKind::kSingleton;

    std::uint32_t total_inodes = 0;
    std::uint32_t used_inodes = 0;
    std::uint32_t unlinked_inodes = 0;
    std::uint32_t reserved_inodes = 0;
    std::uint32_t peak_used_inodes = 0;
    std::uint32_t peak_unlinked_inodes = 0;
    std::uint32_t peak_reserved_inodes = 0;

    // A host that has run for a while: its peaks lie above what it uses now.
    static Status Default() { return {524288, 6127, 3, 1024, 9482, 41, 5120}; }
};

template <class V>
void Describe(V& v, Status& s) {
    v("total_inodes", s.total_inodes);
    v("used_inodes", s.used_inodes);
    v("unlinked_inodes", s.unlinked_inodes);
    v("reserved_inodes", s.reserved_inodes);
    v("peak_used_inodes", s.peak_used_inodes);
    v("peak_unlinked_inodes", s.peak_unlinked_inodes);
    v("peak_reserved_inodes", s.peak_reserved_inodes);
}

struct Ramdisk {
    static constexpr char kSection[] = "ramdisks";
    static constexpr StateKind kKind = StateKind::kCollection;

    std::string name;
    std::string mount_point;
    std::uint32_t reserved_mib = 0;
    std::uint32_t maximum_mib = 0;
    std::uint32_t reserved_inodes = 0;
    std::uint32_t maximum_inodes = kDefaultMaximumInodes;
    bool coredump = false;
    std::string permissions = "0755";
    bool system = false;
    std::uint64_t peak_used_kib = 0;

    std::string Key() const { return name; }
    std::string Check() const {
        if (reserved_mib > maximum_mib) return "reserved_mib is above maximum_mib";
        if (reserved_inodes > maximum_inodes) return "reserved_inodes is above maximum_inodes";
        return "";
    }
    static std::vector<Ramdisk> Default();
    static bool Boot(Ramdisk& ramdisk) { return ramdisk.system; }
};

template <class V>
void Describe(V& v, Ramdisk& s) {
    v("name", s.name, Required(),
      Pattern{IsInstanceName, "expected 1 to 31 visible ASCII characters other than '/' and ','"});
    v("mount_point", s.mount_point, Required(),
      Pattern{IsMountPoint, "expected a normalised absolute path of at most 131 bytes"});
    v("reserved_mib", s.reserved_mib);
    v("maximum_mib", s.maximum_mib);
    v("reserved_inodes", s.reserved_inodes);
    v("maximum_inodes", s.maximum_inodes, Range(1, 0xFFFFFFFF));
    v("coredump", s.coredump);
    v("permissions", s.permissions,
      Pattern{IsOctalMode, "expected an octal mode of one to four digits, e.g. \"0755\""});
    v("system", s.system);
    v("peak_used_kib", s.peak_used_kib, Range(0, static_cast<std::int64_t>(kPeakUsedMaxKib)));
}

// Marks the ramdisks in Registry.def: a collection of Ramdisk with an index of mount points
// kept beside it (simhost/Mirafs.cpp), so that a ramdisk is found by its name and by its mount
// point alike.
struct RamdiskTable {
    static constexpr char kSection[] = "ramdisks";
    static constexpr StateKind kKind = StateKind::kCustom;
    static const Domain& TheDomain();
};

struct Tardisk {
    static constexpr char kSection[] = "tardisks";
    static constexpr StateKind kKind = StateKind::kCollection;

    std::string name;
    std::uint32_t size = 0;
    bool system = true;

    std::string Key() const { return name; }
    static std::vector<Tardisk> Default();
};

template <class V>
void Describe(V& v, Tardisk& s) {
    v("name", s.name, Required(),
      Pattern{IsInstanceName, "expected 1 to 31 visible ASCII characters other than '/' and ','"});
    v("size", s.size);
    v("system", s.system);
}

inline bool IsInstanceName(const std::string& text) {
    if (text.empty() || text.size() > kNameMax || text == "." || text == "..") return false;
    for (char c : text)
        if (c <= ' ' || c > '~' || c == '/' || c == ',') return false;
    return true;
}

inline bool IsOctalMode(const std::string& text) {
    std::size_t digits = text.size();
    if (digits == 5 && text[0] == '0') --digits;
    if (digits < 1 || digits > 4) return false;
    for (char c : text)
        if (c < '0' || c > '7') return false;
    return true;
}

inline bool IsMountPoint(const std::string& text) {
    if (text.empty() || text[0] != '/' || text.size() > kMountPointMax) return false;
    if (text == "/") return true;
    if (text.back() == '/') return false;
    std::size_t start = 1;
    while (start <= text.size()) {
        std::size_t end = text.find('/', start);
        if (end == std::string::npos) end = text.size();
        std::string component = text.substr(start, end - start);
        if (component.empty() || component == "." || component == "..") return false;
        for (char c : component)
            if (c == '\0') return false;
        start = end + 1;
    }
    return true;
}

}  // namespace mirafs

namespace readcache {

// The content based read cache: whether it is active now, and whether it is enabled from the
// next boot on; a reboot makes the configured state the running one.
//
// Scenario section "readcache": {"runtime_enabled": bool, "configured_enabled": bool}, both
// false by default (the cache is off).
struct ReadCache {
    static constexpr char kSection[] = "readcache";
    static constexpr StateKind kKind = StateKind::kSingleton;

    bool runtime_enabled = false;
    bool configured_enabled = false;

    static ReadCache Default() { return {}; }
    static void Boot(ReadCache& cache) { cache.runtime_enabled = cache.configured_enabled; }
};

template <class V>
void Describe(V& v, ReadCache& s) {
    v("runtime_enabled", s.runtime_enabled);
    v("configured_enabled", s.configured_enabled);
}

}  // namespace readcache
}  // namespace simhost
