#include <simhost/domains/Coredump.h>

#include <simhost/RootFs.h>
#include <simhost/domains/Files.h>

#include "util/Text.h"

#include <fcntl.h>
#include <sys/stat.h>
#include <unistd.h>

#include <algorithm>
#include <cerrno>
#include <cstring>
#include <unordered_map>
#include <unordered_set>

namespace simhost {
namespace coredump {
namespace {

Partition MakePartition(std::int32_t number, const char* type, std::int64_t size_mb) {
    Partition partition;
    partition.number = number;
    partition.type = type;
    partition.size_mb = size_mb;
    return partition;
}

// Names the candidates nearest to name, or lists them all when none is near.
std::string Nearest(const std::string& name, const std::vector<std::string>& candidates,
                    const std::string& none) {
    if (candidates.empty()) return "; " + none;
    std::vector<std::string> nearest = quarn::util::NearestNames(name, candidates);
    const std::vector<std::string>& shown = nearest.empty() ? candidates : nearest;
    std::string text = nearest.empty() ? "; this host has: " : " (nearest: ";
    const std::size_t kShown = 10;
    for (std::size_t i = 0; i < shown.size() && i < kShown; ++i) text += (i ? ", " : "") + shown[i];
    if (shown.size() > kShown) text += ", ...";
    return nearest.empty() ? text : text + ")";
}

std::string DumpPath(const Datastore& datastore, const std::string& name) {
    std::string file = name;
    const std::size_t suffix = std::strlen(kDumpSuffix);
    if (file.size() < suffix || file.compare(file.size() - suffix, suffix, kDumpSuffix) != 0)
        file += kDumpSuffix;
    return datastore.mount + "/" + kDumpDirectory + "/" + file;
}

// Writes the header and sets the file's length; the file is new (O_EXCL), so a refusal of the
// kernel leaves nothing behind but what the caller removes.
int WriteDumpFile(const RootFs& fs, const std::string& path, std::int64_t size_mb) {
    int fd = -1;
    if (int error = fs.Open(path, O_WRONLY | O_CREAT | O_EXCL | O_NOFOLLOW | O_CLOEXEC, 0600, &fd))
        return error;
    const std::string header = DumpFileHeader(size_mb);
    int error = 0;
    if (write(fd, header.data(), header.size()) != static_cast<ssize_t>(header.size()))
        error = errno ? errno : EIO;
    // Pre-allocated in length, sparse on the disk: the dump's blocks come when it is written.
    if (!error && ftruncate(fd, static_cast<off_t>(size_mb * kMiB)) != 0) error = errno;
    if (close(fd) != 0 && !error) error = errno;
    if (error) fs.Unlink(path);
    return error;
}

}  // namespace

// ---- partitions -----------------------------------------------------------------------------

bool IsDiskName(const std::string& text) {
    if (text.empty() || text.size() > 100) return false;
    for (char c : text)
        if (!((c >= 'A' && c <= 'Z') || (c >= 'a' && c <= 'z') || (c >= '0' && c <= '9') || c == '.' ||
              c == '_' || c == '-'))
            return false;
    return true;
}

std::string PartitionName(const Disk& disk, const Partition& partition) {
    return disk.name + ":" + std::to_string(partition.number);
}

Partitions Partitions::Default() {
    Partitions state;
    Disk first;
    first.name = "nvd.5000c5009a1e2f70";
    first.partitions = {MakePartition(1, "boot", 100), MakePartition(2, "diagnostic", 110),
                        MakePartition(3, "scratch", 4096), MakePartition(4, "qrfs", 476000)};
    Disk second;
    second.name = "nvd.5000c5009b3d4c81";
    second.partitions = {MakePartition(1, "diagnostic", 2560), MakePartition(2, "qrfs", 953000)};
    state.disks = {first, second};
    state.active = "nvd.5000c5009a1e2f70:2";
    state.configured = "nvd.5000c5009a1e2f70:2";
    return state;
}

void Partitions::Boot(Partitions& state) {
    std::optional<PartitionView> configured = FindPartition(state, state.configured);
    state.active = configured && configured->type == "diagnostic" ? configured->name : SmartPartition(state);
}

std::string Partitions::Check() const {
    std::unordered_set<std::string> names;
    names.reserve(disks.size());
    for (std::size_t i = 0; i < disks.size(); ++i) {
        if (!names.insert(disks[i].name).second)
            return "disks[" + std::to_string(i) + "]: '" + disks[i].name + "' appears twice";
        std::unordered_set<std::int32_t> numbers;
        for (std::size_t j = 0; j < disks[i].partitions.size(); ++j)
            if (!numbers.insert(disks[i].partitions[j].number).second)
                return "disks[" + std::to_string(i) + "].partitions[" + std::to_string(j) +
                       "]: partition " + std::to_string(disks[i].partitions[j].number) + " appears twice";
    }
    if (!active.empty()) {
        std::optional<PartitionView> partition = FindPartition(*this, active);
        if (!partition) return "active: '" + active + "' is not a partition of the host";
        if (partition->type != "diagnostic") return "active: '" + active + "' is not a diagnostic partition";
    }
    return "";
}

Partitions LoadForLookUp(Db& db) {
    std::optional<std::string> text = store::LoadState(db, Partitions::kSection);
    if (!text) return Load<Partitions>(db);  // reports the missing state
    typedef nlohmann::json::parse_event_t Event;
    std::string key;
    std::vector<std::string> disks;  // of the active and the configured name, read before "disks"
    bool names_read = false;         // a state stored in another order keeps every disk
    Partitions state;
    try {
        nlohmann::json kept = nlohmann::json::parse(*text, [&](int depth, Event event, nlohmann::json& parsed) {
            if (depth == 1 && event == Event::key) key = parsed.get<std::string>();
            if (depth == 1 && event == Event::value && (key == "active" || key == "configured") &&
                parsed.is_string()) {
                const std::string& name = parsed.get_ref<const std::string&>();
                const std::string::size_type colon = name.rfind(':');
                if (colon != std::string::npos) disks.push_back(name.substr(0, colon));
                if (key == "configured") names_read = true;
            }
            // A disk (an object of the disks array) is kept only when one of the names is on it.
            if (depth == 2 && event == Event::object_end) {
                auto found = parsed.find("name");
                if (!names_read || found == parsed.end() || !found->is_string()) return true;
                for (const std::string& disk : disks)
                    if (found->get_ref<const std::string&>() == disk) return true;
                return false;
            }
            return true;
        });
        Codec<Partitions>::Read(kept, Location(), state);
    } catch (const std::exception& error) {
        throw HostError(std::string("The simulated host's state is damaged: the dump_partitions state cannot "
                                    "be read (") + error.what() + "); recreate the host with 'quarnhost init --force'",
                        HostError::Code::kDamaged);
    }
    return state;
}

std::optional<PartitionView> FindPartition(const Partitions& state, const std::string& name) {
    const std::string::size_type colon = name.rfind(':');
    if (colon == std::string::npos) return std::nullopt;
    const std::string disk_name = name.substr(0, colon);
    for (const Disk& disk : state.disks) {
        if (disk.name != disk_name) continue;
        for (const Partition& partition : disk.partitions) {
            if (PartitionName(disk, partition) != name) continue;
            PartitionView view;
            view.name = name;
            view.path = "/dev/disks/" + name;
            view.type = partition.type;
            view.size_mb = partition.size_mb;
            view.local = disk.local;
            return view;
        }
    }
    return std::nullopt;
}

std::vector<PartitionView> DiagnosticPartitions(const Partitions& state) {
    std::vector<PartitionView> views;
    for (const Disk& disk : state.disks)
        for (const Partition& partition : disk.partitions) {
            if (partition.type != "diagnostic") continue;
            PartitionView view;
            view.name = PartitionName(disk, partition);
            view.path = "/dev/disks/" + view.name;
            view.type = partition.type;
            view.size_mb = partition.size_mb;
            view.local = disk.local;
            views.push_back(std::move(view));
        }
    return views;
}

std::string SmartPartition(const Partitions& state) {
    std::optional<PartitionView> configured = FindPartition(state, state.configured);
    if (configured && configured->type == "diagnostic") return configured->name;
    const PartitionView* best = nullptr;
    std::vector<PartitionView> candidates = DiagnosticPartitions(state);
    for (const PartitionView& candidate : candidates)
        if (!best || (candidate.local && !best->local) ||
            (candidate.local == best->local && candidate.size_mb > best->size_mb))
            best = &candidate;
    return best ? best->name : "";
}

// ---- files ----------------------------------------------------------------------------------

std::string CheckName(const std::string& what, const std::string& name) {
    if (name.empty()) return what + " name is empty";
    if (name.size() > 64)
        return what + " name " + quarn::util::Quote(name, 40) + " is " + std::to_string(name.size()) +
               " bytes long: at most 64 bytes";
    if (name.find('/') != std::string::npos)
        return what + " name " + quarn::util::Quote(name) + " holds '/': a name is not a path";
    if (name.find("..") != std::string::npos)
        return what + " name " + quarn::util::Quote(name) + " holds '..'";
    for (unsigned char c : name)
        if (c < 0x20 || c == 0x7f)
            return what + " name " + quarn::util::Quote(name) + " holds a control character";
    return "";
}

bool IsDatastoreName(const std::string& text) { return CheckName("", text).empty(); }

bool IsNormalHostPath(const std::string& text) { return files::IsNormalPath(text); }

std::string DumpFileHeader(std::int64_t size_mb) {
    return std::string(kHeaderMagic) + "version: 1\nsize-mb: " + std::to_string(size_mb) + "\n";
}

Files Files::Default() {
    Files state;
    Datastore first;
    first.name = "cedar-local-01";
    first.mount = "/qrfs/volumes/cedar-local-01";
    first.capacity_mb = 476000;
    first.free_mb = 301544;
    Datastore second;
    second.name = "cedar-local-02";
    second.mount = "/qrfs/volumes/cedar-local-02";
    second.capacity_mb = 953000;
    second.free_mb = 812330;
    state.datastores = {first, second};
    DumpFile file;
    file.path = "/qrfs/volumes/cedar-local-01/norlithdump/dumpfile-1.dumpfile";
    file.datastore = first.name;
    file.size_mb = kDefaultFileMb;
    state.files = {file};
    state.active = file.path;
    state.configured = file.path;
    return state;
}

std::string Files::Check() const {
    std::unordered_map<std::string, const Datastore*> names;
    for (std::size_t i = 0; i < datastores.size(); ++i) {
        const Datastore& datastore = datastores[i];
        const std::string at = "datastores[" + std::to_string(i) + "]";
        if (!names.emplace(datastore.name, &datastore).second) return at + ": '" + datastore.name + "' appears twice";
        if (datastore.free_mb > datastore.capacity_mb) return at + ".free_mb: exceeds capacity_mb";
    }
    std::unordered_set<std::string> paths;
    paths.reserve(files.size());
    for (std::size_t i = 0; i < files.size(); ++i) {
        const DumpFile& file = files[i];
        const std::string at = "files[" + std::to_string(i) + "]";
        if (!paths.insert(file.path).second) return at + ": '" + file.path + "' appears twice";
        auto found = names.find(file.datastore);
        const Datastore* datastore = found == names.end() ? nullptr : found->second;
        if (!datastore) return at + ".datastore: '" + file.datastore + "' is not a datastore of the host";
        if (file.path.compare(0, datastore->mount.size() + 1, datastore->mount + "/") != 0)
            return at + ".path: not below the mount of datastore '" + datastore->name + "'";
    }
    if (!active.empty() && !files::IsNormalPath(active)) return "active: expected \"\" or a host path";
    if (!configured.empty() && !files::IsNormalPath(configured))
        return "configured: expected \"\" or a host path";
    return "";
}

FileCheck ExamineFile(const std::string& root, const std::string& path) {
    FileCheck check;
    if (!IsHostPath(path)) return check;
    RootFs fs(root);
    int fd = -1;
    if (fs.Error() || fs.Open(path, O_RDONLY | O_NOFOLLOW | O_CLOEXEC | O_NONBLOCK, 0, &fd)) return check;
    struct stat info {};
    if (fstat(fd, &info) == 0 && S_ISREG(info.st_mode)) {
        check.exists = true;
        check.length = static_cast<std::int64_t>(info.st_size);
        char head[64];
        ssize_t got = pread(fd, head, sizeof head, 0);
        std::string text(head, got > 0 ? static_cast<std::size_t>(got) : 0);
        const std::string prefix = std::string(kHeaderMagic) + "version: 1\nsize-mb: ";
        if (text.compare(0, prefix.size(), prefix) == 0) {
            std::int64_t mb = 0;
            std::size_t at = prefix.size();
            std::size_t digits = 0;
            while (at < text.size() && text[at] >= '0' && text[at] <= '9' && digits < 12) {
                mb = mb * 10 + (text[at] - '0');
                ++at;
                ++digits;
            }
            if (digits > 0 && at < text.size() && text[at] == '\n') {
                check.header = true;
                check.header_mb = mb;
            }
        }
    }
    close(fd);
    return check;
}

const Datastore* FindDatastore(const Files& state, const std::string& name) {
    for (const Datastore& datastore : state.datastores)
        if (datastore.name == name) return &datastore;
    return nullptr;
}

const DumpFile* FindFile(const Files& state, const std::string& path) {
    for (const DumpFile& file : state.files)
        if (file.path == path) return &file;
    return nullptr;
}

std::string CreateFile(Files& state, const std::string& root, std::uint64_t size_mb,
                       const std::string& datastore_name, const std::string& name) {
    if (size_mb > static_cast<std::uint64_t>(INT64_MAX))
        throw HostError("Dump file size " + std::to_string(static_cast<std::int64_t>(size_mb)) +
                        " MB is negative: give a size in MB from " + std::to_string(kMinFileMb) +
                        " to " + std::to_string(kMaxFileMb) + ", or 0 for the default");
    const std::int64_t size = size_mb == 0 ? kDefaultFileMb : static_cast<std::int64_t>(size_mb);
    if (size < kMinFileMb || size > kMaxFileMb)
        throw HostError("Dump file size " + std::to_string(size) + " MB is out of range: give a size in MB from " +
                        std::to_string(kMinFileMb) + " to " + std::to_string(kMaxFileMb) + ", or 0 for the default");
    if (!datastore_name.empty()) {
        std::string problem = CheckName("Datastore", datastore_name);
        if (!problem.empty()) throw HostError(problem);
    }
    if (!name.empty()) {
        std::string problem = CheckName("Dump file", name);
        if (!problem.empty()) throw HostError(problem);
    }

    Datastore* datastore = nullptr;
    if (!datastore_name.empty()) {
        for (Datastore& candidate : state.datastores)
            if (candidate.name == datastore_name) datastore = &candidate;
        if (!datastore) {
            std::vector<std::string> names;
            for (const Datastore& candidate : state.datastores) names.push_back(candidate.name);
            throw HostError("Unknown datastore " + quarn::util::Quote(datastore_name) +
                            Nearest(datastore_name, names, "this host has no datastores"));
        }
        if (datastore->free_mb < size)
            throw HostError("Datastore " + datastore->name + " has " + std::to_string(datastore->free_mb) +
                            " MB free: a dump file of " + std::to_string(size) + " MB does not fit");
    } else {
        // The datastore with the most free space, the first among equals.
        for (Datastore& candidate : state.datastores)
            if (candidate.free_mb >= size && (!datastore || candidate.free_mb > datastore->free_mb))
                datastore = &candidate;
        if (!datastore)
            throw HostError(state.datastores.empty()
                                ? std::string("This host has no datastore to hold a dump file")
                                : "No datastore has " + std::to_string(size) + " MB free for a dump file");
    }

    std::string path;
    RootFs fs(root);
    if (fs.Error()) throw HostError(std::string("The host's file system cannot be opened: ") + std::strerror(fs.Error()));
    if (!name.empty()) {
        path = DumpPath(*datastore, name);
        struct stat info {};
        if (FindFile(state, path) || fs.Stat(path, &info) == 0)
            throw HostError("Dump file " + path + " already exists");
    } else {
        for (int k = 1;; ++k) {
            path = DumpPath(*datastore, "dumpfile-" + std::to_string(k));
            struct stat info {};
            if (!FindFile(state, path) && fs.Stat(path, &info) == ENOENT) break;
        }
    }
    if (!IsHostPath(path) || !files::IsNormalPath(path))
        throw HostError("Dump file path " + quarn::util::Quote(path) + " is not a usable host path");
    const std::string directory = path.substr(0, path.rfind('/'));
    int error = fs.MakeDirectories(directory, 0755);
    if (!error) error = WriteDumpFile(fs, path, size);
    if (error)
        throw HostError("Cannot create dump file " + path + ": " + std::strerror(error));
    datastore->free_mb -= size;
    DumpFile file;
    file.path = path;
    file.datastore = datastore->name;
    file.size_mb = size;
    state.files.push_back(file);
    return path;
}

void FileRemoved(Db& db, const std::string& path) {
    Files state = Load<Files>(db);
    for (std::size_t i = 0; i < state.files.size(); ++i) {
        if (state.files[i].path != path) continue;
        for (Datastore& datastore : state.datastores)
            if (datastore.name == state.files[i].datastore)
                datastore.free_mb = std::min(datastore.capacity_mb, datastore.free_mb + state.files[i].size_mb);
        state.files.erase(state.files.begin() + static_cast<std::ptrdiff_t>(i));
        Save(db, state);
        return;
    }
}

// ---- network --------------------------------------------------------------------------------

bool IsInterfaceName(const std::string& text) {
    if (text.empty() || text.size() > 15) return false;
    for (char c : text)
        if (!((c >= 'a' && c <= 'z') || (c >= '0' && c <= '9'))) return false;
    return true;
}

bool IsIpv4(const std::string& text) {
    std::size_t at = 0;
    for (int part = 0; part < 4; ++part) {
        if (part > 0) {
            if (at >= text.size() || text[at] != '.') return false;
            ++at;
        }
        std::size_t start = at;
        int value = 0;
        while (at < text.size() && text[at] >= '0' && text[at] <= '9' && at - start < 3) {
            value = value * 10 + (text[at] - '0');
            ++at;
        }
        if (at == start || value > 255 || (at - start > 1 && text[start] == '0')) return false;
    }
    return at == text.size();
}

std::vector<Interface> Interface::Default() {
    Interface management{"hvn0", true, "management network"};
    Interface storage{"hvn1", true, "storage network"};
    Interface spare{"hvn2", false, "spare uplink, not connected"};
    return {management, storage, spare};
}

NetDump NetDump::Default() {
    NetDump state;
    state.enabled = false;
    state.interface = "hvn0";
    state.server = "192.0.2.40";
    state.port = 6500;
    state.check_timeout_seconds = 5;
    return state;
}

std::string NetDump::Check() const {
    if (!interface.empty() && !IsInterfaceName(interface)) return "interface: expected \"\" or 1 to 15 characters a-z 0-9";
    if (!server.empty() && !IsIpv4(server)) return "server: expected \"\" or a dotted IPv4 address";
    return "";
}

HostError UnknownInterface(Db& db, const std::string& name) {
    std::vector<std::string> names;
    Items<Interface>(db).ForEach([&](Interface item) { names.push_back(item.name); });
    return HostError("Unknown network interface " + quarn::util::Quote(name) +
                     Nearest(name, names, "this host has no network interfaces"));
}

}  // namespace coredump
}  // namespace simhost
