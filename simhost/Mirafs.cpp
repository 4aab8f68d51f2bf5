#include <simhost/Mirafs.h>

#include <simhost/RootFs.h>
#include <simhost/domains/Mounts.h>

#include <norlithctl/Records.h>

#include <algorithm>
#include <cerrno>
#include <cstring>
#include <limits>

#include <dirent.h>
#include <fcntl.h>
#include <sys/stat.h>
#include <unistd.h>

namespace simhost {
namespace mirafs {
namespace {

namespace Records = NorlithCtl::Util::Records;
using Records::Field;

// The index of the ramdisks' mount points: mount point -> name, kept beside the domain's items
// (not a domain: it is rebuilt from the ramdisks whenever they are written).
constexpr char kMountPointIndex[] = "ramdisks:mount-points";

constexpr std::uint32_t kMax32 = std::numeric_limits<std::uint32_t>::max();

std::uint32_t Clamp32(std::uint64_t value) {
    return value > kMax32 ? kMax32 : static_cast<std::uint32_t>(value);
}

// ---- option parsing ----------------------------------------------------------------------------

std::vector<std::string> SplitFields(const std::string& text) {
    std::vector<std::string> fields;
    std::size_t start = 0;
    for (;;) {
        std::size_t comma = text.find(',', start);
        fields.push_back(text.substr(start, comma == std::string::npos ? std::string::npos : comma - start));
        if (comma == std::string::npos) return fields;
        start = comma + 1;
    }
}

// An unsigned decimal number of 32 bits: digits only, no sign.
bool ParseU32(const std::string& text, std::uint32_t* value) {
    if (text.empty() || text.size() > 10) return false;
    std::uint64_t number = 0;
    for (char c : text) {
        if (c < '0' || c > '9') return false;
        number = number * 10 + static_cast<std::uint64_t>(c - '0');
    }
    if (number > kMax32) return false;
    *value = static_cast<std::uint32_t>(number);
    return true;
}

// ---- usage -------------------------------------------------------------------------------------

// Whether path is a mount point of any kind (the mount table or a ramdisk).
bool IsAnyMountPoint(Db& db, const std::string& path) {
    return Items<mounts::Mount>(db).Contains(path) || MountedAt(db, path);
}

void Walk(Db& db, int dirfd, const std::string& path, Usage& usage) {
    int copy = dup(dirfd);
    if (copy < 0) return;
    DIR* dir = fdopendir(copy);
    if (!dir) {
        close(copy);
        return;
    }
    std::vector<std::string> subdirectories;
    while (dirent* item = readdir(dir)) {
        const char* name = item->d_name;
        if (std::strcmp(name, ".") == 0 || std::strcmp(name, "..") == 0) continue;
        struct stat info {};
        if (fstatat(dirfd, name, &info, AT_SYMLINK_NOFOLLOW) != 0) continue;  // gone meanwhile
        ++usage.inodes;
        if (S_ISREG(info.st_mode))
            usage.pages += (static_cast<std::uint64_t>(info.st_size) + 4095) / 4096;
        else if (S_ISDIR(info.st_mode))
            subdirectories.push_back(name);
    }
    closedir(dir);
    for (const std::string& name : subdirectories) {
        std::string child = path == "/" ? "/" + name : path + "/" + name;
        if (IsAnyMountPoint(db, child)) continue;  // its files are the deeper mount's
        int fd = openat(dirfd, name.c_str(), O_RDONLY | O_DIRECTORY | O_NOFOLLOW | O_CLOEXEC);
        if (fd < 0) continue;
        Walk(db, fd, child, usage);
        close(fd);
    }
}

// ---- records -----------------------------------------------------------------------------------

void Put32(std::vector<unsigned char>& record, const Field& field, std::uint32_t value) {
    for (std::size_t i = 0; i < 4; ++i) record[field.offset + i] = static_cast<unsigned char>(value >> (8 * i));
}

void PutByte(std::vector<unsigned char>& record, const Field& field, bool value) {
    record[field.offset] = value ? 1 : 0;
}

void PutText(std::vector<unsigned char>& record, const Field& field, const std::string& text) {
    std::memcpy(record.data() + field.offset, text.data(), std::min(text.size(), field.width - 1));
}

// The one instance an instance path names.
const std::string& Instance(int node, const std::vector<std::string>& instance, const char* what) {
    if (instance.size() != 1)
        throw HostError("Cannot read kernel information node " + std::to_string(node) + ": select one " +
                        what + " by its name first (AddInstancePath)");
    return instance.front();
}

std::vector<std::string> Keys(Db& db, const char* domain) {
    std::vector<std::string> keys;
    store::ForEachItem(db, domain, [&](const std::string& key, const std::string&) { keys.push_back(key); });
    return keys;
}

std::vector<unsigned char> CountRecord(const Field& field, std::size_t size, std::int64_t count) {
    std::vector<unsigned char> record(size, 0);
    Put32(record, field, Clamp32(static_cast<std::uint64_t>(count)));
    return record;
}

}  // namespace

int ParseMountOptions(const std::string& text, MountOptions* options) {
    std::vector<std::string> fields = SplitFields(text);
    if (fields.size() != 7) return EINVAL;
    MountOptions parsed;
    std::uint32_t coredump = 0;
    if (!ParseU32(fields[0], &parsed.minimum_mib) || !ParseU32(fields[1], &parsed.maximum_mib) ||
        !ParseU32(fields[2], &parsed.reserved_inodes) || !ParseU32(fields[3], &parsed.maximum_inodes) ||
        !ParseU32(fields[4], &coredump) || coredump > 1)
        return EINVAL;
    if (parsed.minimum_mib > parsed.maximum_mib) return EINVAL;
    if (parsed.maximum_inodes == 0) parsed.maximum_inodes = kDefaultMaximumInodes;
    if (parsed.reserved_inodes > parsed.maximum_inodes) return EINVAL;
    parsed.coredump = coredump == 1;
    if (!IsOctalMode(fields[5])) return EINVAL;
    parsed.permissions = std::string(4 - std::min<std::size_t>(4, fields[5].size()), '0') +
                         fields[5].substr(fields[5].size() > 4 ? 1 : 0);
    parsed.name = fields[6];
    if (parsed.name.size() > kNameMax) return ENAMETOOLONG;
    if (!IsInstanceName(parsed.name)) return EINVAL;
    *options = parsed;
    return 0;
}

std::optional<Ramdisk> FindRamdisk(Db& db, const std::string& name) {
    return Items<Ramdisk>(db).Find(name);
}

std::optional<Ramdisk> RamdiskAt(Db& db, const std::string& mount_point) {
    std::optional<std::string> name = store::FindItem(db, kMountPointIndex, mount_point);
    if (!name) return std::nullopt;
    return FindRamdisk(db, nlohmann::json::parse(*name).get<std::string>());
}

void PutRamdisk(Db& db, const Ramdisk& ramdisk) {
    Items<Ramdisk>(db).Put(ramdisk);
    store::PutItem(db, kMountPointIndex, ramdisk.mount_point, nlohmann::json(ramdisk.name).dump());
}

void EraseRamdisk(Db& db, const Ramdisk& ramdisk) {
    Items<Ramdisk>(db).Erase(ramdisk.name);
    store::EraseItem(db, kMountPointIndex, ramdisk.mount_point);
}

Usage UsageOf(Db& db, const std::string& root, const std::string& mount_point) {
    Usage usage;
    RootFs fs(root);
    int fd = -1;
    if (fs.Error() || fs.Open(mount_point, O_RDONLY | O_DIRECTORY | O_NOFOLLOW, 0, &fd) != 0) return usage;
    Walk(db, fd, mount_point, usage);
    close(fd);
    return usage;
}

// ---- the kernel's hooks ------------------------------------------------------------------------

int CheckMount(Call& call, kernel::MountRequest& request) {
    if (request.target.size() > kMountPointMax) return ENAMETOOLONG;
    MountOptions options;
    if (int error = ParseMountOptions(request.options, &options)) return error;
    Db& db = call.db();
    if (FindRamdisk(db, options.name)) return EEXIST;
    // Reserved inodes are set aside at once: the file system must have them. (This walks every
    // ramdisk, the one cost of a mount that grows with their number.)
    const Status status = call.Read<Status>();
    std::uint64_t reserved = status.reserved_inodes;
    Items<Ramdisk>(db).ForEach([&](const Ramdisk& ramdisk) { reserved += ramdisk.reserved_inodes; });
    if (reserved + options.reserved_inodes > status.total_inodes) return ENOSPC;
    request.system = false;
    return 0;
}

int CheckUmount(Call& call, const std::string& target) {
    std::optional<Ramdisk> ramdisk = RamdiskAt(call.db(), target);
    return ramdisk && ramdisk->system ? EBUSY : 0;
}

bool MountedAt(Db& db, const std::string& target) {
    return store::FindItem(db, kMountPointIndex, target).has_value();
}

void AddMount(Db& db, const kernel::MountRequest& request) {
    MountOptions options;
    if (ParseMountOptions(request.options, &options) != 0)
        throw HostError("mirafs: options '" + request.options + "' were not checked");
    Ramdisk ramdisk;
    ramdisk.name = options.name;
    ramdisk.mount_point = request.target;
    ramdisk.reserved_mib = options.minimum_mib;
    ramdisk.maximum_mib = options.maximum_mib;
    ramdisk.reserved_inodes = options.reserved_inodes;
    ramdisk.maximum_inodes = options.maximum_inodes;
    ramdisk.coredump = options.coredump;
    ramdisk.permissions = options.permissions;
    ramdisk.system = request.system;
    PutRamdisk(db, ramdisk);
}

void RemoveMount(Db& db, const std::string& target) {
    if (std::optional<Ramdisk> ramdisk = RamdiskAt(db, target)) EraseRamdisk(db, *ramdisk);
}

bool NormalisedMountPoint(const std::string& path, std::string* normalised) {
    if (path.empty() || path[0] != '/') return false;
    std::vector<std::string> parts;
    std::size_t start = 1;
    while (start <= path.size()) {
        std::size_t end = path.find('/', start);
        if (end == std::string::npos) end = path.size();
        std::string part = path.substr(start, end - start);
        if (part == "..") {
            if (!parts.empty()) parts.pop_back();
        } else if (!part.empty() && part != ".") {
            parts.push_back(part);
        }
        start = end + 1;
    }
    std::string result;
    for (const std::string& part : parts) result += "/" + part;
    if (result.empty()) result = "/";
    if (!IsMountPoint(result)) return false;
    *normalised = result;
    return true;
}

// ---- records -----------------------------------------------------------------------------------

StatusFigures FiguresOf(const Status& status, std::uint64_t ramdisk_used_inodes,
                        std::uint64_t ramdisk_reserved_inodes) {
    StatusFigures figures;
    figures.total = status.total_inodes;
    figures.used = Clamp32(status.used_inodes + ramdisk_used_inodes);
    figures.peak_used = std::max(status.peak_used_inodes, figures.used);
    figures.unlinked = status.unlinked_inodes;
    figures.peak_unlinked = std::max(status.peak_unlinked_inodes, figures.unlinked);
    figures.reserved = Clamp32(status.reserved_inodes + ramdisk_reserved_inodes);
    figures.peak_reserved = std::max(status.peak_reserved_inodes, figures.reserved);
    return figures;
}

std::vector<unsigned char> EncodeStatus(const StatusFigures& figures) {
    using Layout = Records::MirafsStatus;
    std::vector<unsigned char> record(Layout::kSize, 0);
    Put32(record, Layout::kTotalInodes, figures.total);
    Put32(record, Layout::kUsedInodes, figures.used);
    Put32(record, Layout::kPeakUsedInodes, figures.peak_used);
    Put32(record, Layout::kUnlinkedInodes, figures.unlinked);
    Put32(record, Layout::kPeakUnlinkedInodes, figures.peak_unlinked);
    Put32(record, Layout::kReservedInodes, figures.reserved);
    Put32(record, Layout::kPeakReservedInodes, figures.peak_reserved);
    return record;
}

std::vector<unsigned char> EncodeRamdisk(const Ramdisk& ramdisk, const Usage& usage) {
    using Layout = Records::MirafsRamdisk;
    std::vector<unsigned char> record(Layout::kSize, 0);
    const std::uint64_t peak_pages = std::max<std::uint64_t>(usage.pages, (ramdisk.peak_used_kib + 3) / 4);
    Put32(record, Layout::kReservedMib, ramdisk.reserved_mib);
    Put32(record, Layout::kMaximumMib, ramdisk.maximum_mib);
    Put32(record, Layout::kUsedPages, Clamp32(usage.pages));
    Put32(record, Layout::kPeakUsedPages, Clamp32(peak_pages));
    PutByte(record, Layout::kCoredump, ramdisk.coredump);
    PutByte(record, Layout::kSystem, ramdisk.system);
    PutText(record, Layout::kMountPoint, ramdisk.mount_point);
    Put32(record, Layout::kMaximumInodes, ramdisk.maximum_inodes);
    // Inodes are allocated as files are made, the reserved ones up front.
    Put32(record, Layout::kAllocatedInodes,
          Clamp32(std::max<std::uint64_t>(ramdisk.reserved_inodes, usage.inodes)));
    Put32(record, Layout::kUsedInodes, Clamp32(usage.inodes));
    return record;
}

std::vector<unsigned char> EncodeTardisk(const Tardisk& tardisk) {
    using Layout = Records::MirafsTardisk;
    std::vector<unsigned char> record(Layout::kSize, 0);
    Put32(record, Layout::kSizeBytes, tardisk.size);
    PutByte(record, Layout::kSystem, tardisk.system);
    return record;
}

std::vector<unsigned char> ReadStatus(Call& call, const std::vector<std::string>&) {
    std::uint64_t used = 0, reserved = 0;
    const std::string root = call.Root();
    for (const Ramdisk& ramdisk : Items<Ramdisk>(call.db()).All()) {
        used += UsageOf(call.db(), root, ramdisk.mount_point).inodes;
        reserved += ramdisk.reserved_inodes;
    }
    return EncodeStatus(FiguresOf(call.Read<Status>(), used, reserved));
}

std::vector<unsigned char> ReadRamdiskCount(Call& call, const std::vector<std::string>&) {
    return CountRecord(Records::MirafsRamdiskList::kCount, Records::MirafsRamdiskList::kSize,
                       Items<Ramdisk>(call.db()).Count());
}

std::vector<unsigned char> ReadRamdisk(Call& call, const std::vector<std::string>& instance) {
    const std::string& name = Instance(Records::MirafsRamdisk::kNode, instance, "ramdisk");
    std::optional<Ramdisk> ramdisk = FindRamdisk(call.db(), name);
    if (!ramdisk) throw HostError("There is no ramdisk named '" + name + "'");
    return EncodeRamdisk(*ramdisk, UsageOf(call.db(), call.Root(), ramdisk->mount_point));
}

std::vector<std::string> ListRamdisks(Call& call) { return Keys(call.db(), Ramdisk::kSection); }

std::vector<unsigned char> ReadTardiskCount(Call& call, const std::vector<std::string>&) {
    return CountRecord(Records::MirafsTardiskList::kCount, Records::MirafsTardiskList::kSize,
                       Items<Tardisk>(call.db()).Count());
}

std::vector<unsigned char> ReadTardisk(Call& call, const std::vector<std::string>& instance) {
    const std::string& name = Instance(Records::MirafsTardisk::kNode, instance, "tardisk");
    std::optional<Tardisk> tardisk = Items<Tardisk>(call.db()).Find(name);
    if (!tardisk) throw HostError("There is no tardisk named '" + name + "'");
    return EncodeTardisk(*tardisk);
}

std::vector<std::string> ListTardisks(Call& call) { return Keys(call.db(), Tardisk::kSection); }

}  // namespace mirafs
}  // namespace simhost
