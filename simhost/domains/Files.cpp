#include <simhost/domains/Files.h>

#include <simhost/Image.h>
#include <simhost/RootFs.h>

#include <algorithm>
#include <cerrno>
#include <cstring>
#include <optional>
#include <unordered_map>

#include <dirent.h>
#include <fcntl.h>
#include <unistd.h>

namespace simhost {
namespace files {
namespace {

constexpr std::uint64_t kMaxFileSize = std::uint64_t(1) << 40;  // 1 TiB, sparse at most

struct Entry {
    std::string path;
    std::string type = "file";  // "file", "directory" or "symlink"
    std::string content;        // file bytes, up to the last nonzero one
    std::uint64_t size = 0;     // file length (>= content.size())
    mode_t mode = 0;
    std::string target;         // symlink target
};

// ---- base64 -------------------------------------------------------------------------------------

const char kAlphabet[] = "ABCDEFGHIJKLMNOPQRSTUVWXYZabcdefghijklmnopqrstuvwxyz0123456789+/";

std::string EncodeBase64(const std::string& bytes) {
    std::string text;
    text.reserve((bytes.size() + 2) / 3 * 4);
    std::size_t i = 0;
    for (; i + 2 < bytes.size(); i += 3) {
        unsigned n = (static_cast<unsigned char>(bytes[i]) << 16) |
                     (static_cast<unsigned char>(bytes[i + 1]) << 8) |
                     static_cast<unsigned char>(bytes[i + 2]);
        for (int shift = 18; shift >= 0; shift -= 6) text += kAlphabet[(n >> shift) & 63];
    }
    if (i < bytes.size()) {
        unsigned n = static_cast<unsigned char>(bytes[i]) << 16;
        if (i + 1 < bytes.size()) n |= static_cast<unsigned char>(bytes[i + 1]) << 8;
        text += kAlphabet[(n >> 18) & 63];
        text += kAlphabet[(n >> 12) & 63];
        text += i + 1 < bytes.size() ? kAlphabet[(n >> 6) & 63] : '=';
        text += '=';
    }
    return text;
}

std::optional<std::string> DecodeBase64(const std::string& text) {
    if (text.size() % 4 != 0) return std::nullopt;
    std::string bytes;
    bytes.reserve(text.size() / 4 * 3);
    for (std::size_t i = 0; i < text.size(); i += 4) {
        unsigned n = 0;
        int padding = 0;
        for (std::size_t k = 0; k < 4; ++k) {
            char c = text[i + k];
            const char* at = c ? std::strchr(kAlphabet, c) : nullptr;
            if (c == '=' && i + 4 == text.size() && k >= 2) {
                ++padding;
                n <<= 6;
                continue;
            }
            if (!at || padding) return std::nullopt;
            n = (n << 6) | static_cast<unsigned>(at - kAlphabet);
        }
        bytes += static_cast<char>((n >> 16) & 0xFF);
        if (padding < 2) bytes += static_cast<char>((n >> 8) & 0xFF);
        if (padding < 1) bytes += static_cast<char>(n & 0xFF);
    }
    return bytes;
}

// ---- parsing ------------------------------------------------------------------------------------

std::optional<mode_t> ParseMode(const std::string& text) {
    if (text.empty() || text.size() > 4) return std::nullopt;
    mode_t mode = 0;
    for (char c : text) {
        if (c < '0' || c > '7') return std::nullopt;
        mode = mode * 8 + static_cast<mode_t>(c - '0');
    }
    return mode;
}

std::string ModeText(mode_t mode) {
    char text[8];
    std::snprintf(text, sizeof text, "%04o", static_cast<unsigned>(mode & 07777));
    return text;
}

mode_t DefaultMode(const std::string& type) { return type == "directory" ? 0755 : 0644; }

Entry ParseEntry(const nlohmann::json& value, const Location& at) {
    ObjectReader reader(value, at);
    Entry entry;
    entry.path = reader.Text("path", 4095, false);
    if (!IsNormalPath(entry.path))
        reader.At("path").Fail("expected a normalised absolute path (no '.', '..', '//' or trailing '/')");
    if (const nlohmann::json* type = reader.Member("type", false)) {
        if (!type->is_string() || (*type != "file" && *type != "directory" && *type != "symlink"))
            reader.At("type").Fail("expected \"file\", \"directory\" or \"symlink\"");
        entry.type = type->get<std::string>();
    }
    entry.mode = DefaultMode(entry.type);
    if (reader.Member("mode", false)) {
        std::optional<mode_t> mode = ParseMode(reader.Text("mode", 4, false));
        if (!mode) reader.At("mode").Fail("expected an octal mode of at most 4 digits, e.g. \"0644\"");
        entry.mode = *mode;
    }
    if (entry.type == "symlink") {
        entry.target = reader.Text("target", 4095, false);
    } else if (entry.type == "file") {
        bool text = reader.Member("text", false) != nullptr;
        bool base64 = reader.Member("base64", false) != nullptr;
        if (text && base64) at.Fail("give \"text\" or \"base64\", not both");
        if (text) {
            entry.content = reader.Text("text", SIZE_MAX);
        } else if (base64) {
            const nlohmann::json* encoded = reader.Member("base64");
            std::optional<std::string> bytes;
            if (encoded->is_string()) bytes = DecodeBase64(encoded->get<std::string>());
            if (!bytes) reader.At("base64").Fail("expected base64 text");
            entry.content = *bytes;
        }
        entry.size = entry.content.size();
        if (reader.Member("size", false)) {
            std::int64_t size = reader.Integer("size", 0, static_cast<std::int64_t>(kMaxFileSize));
            if (static_cast<std::uint64_t>(size) < entry.content.size())
                reader.At("size").Fail("is smaller than the file's content (" +
                                       std::to_string(entry.content.size()) + " bytes)");
            entry.size = static_cast<std::uint64_t>(size);
        }
    }
    reader.Done();
    return entry;
}

nlohmann::ordered_json EntryJson(const Entry& entry) {
    nlohmann::ordered_json json = nlohmann::ordered_json::object();
    json["path"] = entry.path;
    if (entry.type != "file") json["type"] = entry.type;
    // A symbolic link has no mode of its own.
    if (entry.type != "symlink" && entry.mode != DefaultMode(entry.type)) json["mode"] = ModeText(entry.mode);
    if (entry.type == "symlink") {
        json["target"] = entry.target;
    } else if (entry.type == "file") {
        if (entry.content.find('\0') == std::string::npos && IsValidUtf8(entry.content))
            json["text"] = entry.content;
        else
            json["base64"] = EncodeBase64(entry.content);
        if (entry.size != entry.content.size()) json["size"] = entry.size;
    }
    return json;
}

// ---- writing ------------------------------------------------------------------------------------

[[noreturn]] void CannotWrite(const Entry& entry, int error) {
    throw HostError("Cannot create the host file '" + entry.path + "': " + std::strerror(error));
}

void WriteEntry(const RootFs& fs, const Entry& entry) {
    std::string parent = entry.path.substr(0, entry.path.rfind('/'));
    if (!parent.empty())
        if (int error = fs.MakeDirectories(parent, 0755)) CannotWrite(entry, error);
    if (entry.type == "directory") {
        int error = fs.MakeDirectories(entry.path, entry.mode);
        if (error) CannotWrite(entry, error);
        int fd = -1;
        if ((error = fs.Open(entry.path, O_RDONLY | O_DIRECTORY | O_NOFOLLOW, 0, &fd))) CannotWrite(entry, error);
        int changed = fchmod(fd, entry.mode);
        close(fd);
        if (changed != 0) CannotWrite(entry, errno);
        return;
    }
    if (entry.type == "symlink") {
        if (int error = fs.Symlink(entry.target, entry.path)) CannotWrite(entry, error);
        return;
    }
    int fd = -1;
    if (int error = fs.Open(entry.path, O_WRONLY | O_CREAT | O_EXCL | O_NOFOLLOW, entry.mode, &fd))
        CannotWrite(entry, error);
    int error = 0;
    std::size_t done = 0;
    while (done < entry.content.size() && !error) {
        ssize_t wrote = write(fd, entry.content.data() + done, entry.content.size() - done);
        if (wrote < 0 && errno != EINTR) error = errno;
        if (wrote > 0) done += static_cast<std::size_t>(wrote);
    }
    if (!error && ftruncate(fd, static_cast<off_t>(entry.size)) != 0) error = errno;
    if (!error && fchmod(fd, entry.mode) != 0) error = errno;
    close(fd);
    if (error) CannotWrite(entry, error);
}

// ---- reading ------------------------------------------------------------------------------------

[[noreturn]] void CannotRead(const std::string& path, int error) {
    throw HostError("Cannot read the host file '" + path + "': " + std::strerror(error));
}

// A regular file's bytes up to its last nonzero one; holes are skipped, not read.
std::string FileContent(int fd, off_t size, const std::string& path) {
    off_t data_end = 0;  // the end of the last region that holds data
    for (off_t at = 0; at < size;) {
        off_t data = lseek(fd, at, SEEK_DATA);
        if (data < 0) break;  // only a hole is left
        off_t hole = lseek(fd, data, SEEK_HOLE);
        if (hole < 0) hole = size;
        data_end = hole;
        at = hole;
    }
    std::string content(static_cast<std::size_t>(data_end), '\0');
    std::size_t done = 0;
    while (done < content.size()) {
        ssize_t got = pread(fd, &content[done], content.size() - done, static_cast<off_t>(done));
        if (got < 0 && errno == EINTR) continue;
        if (got < 0) CannotRead(path, errno);
        if (got == 0) break;
        done += static_cast<std::size_t>(got);
    }
    content.resize(done);
    while (!content.empty() && content.back() == '\0') content.pop_back();
    return content;
}

void Walk(int dirfd, const std::string& path, std::vector<Entry>& entries) {
    int copy = dup(dirfd);
    if (copy < 0) CannotRead(path.empty() ? "/" : path, errno);
    DIR* dir = fdopendir(copy);
    if (!dir) {
        close(copy);
        CannotRead(path.empty() ? "/" : path, errno);
    }
    std::vector<std::string> names;
    while (dirent* item = readdir(dir)) {
        std::string name = item->d_name;
        if (name != "." && name != "..") names.push_back(name);
    }
    closedir(dir);
    std::sort(names.begin(), names.end());
    if (names.empty() && !path.empty()) {
        struct stat info {};
        fstat(dirfd, &info);
        Entry entry;
        entry.path = path;
        entry.type = "directory";
        entry.mode = info.st_mode & 07777;
        entries.push_back(entry);
    }
    for (const std::string& name : names) {
        std::string child = path + "/" + name;
        struct stat info {};
        if (fstatat(dirfd, name.c_str(), &info, AT_SYMLINK_NOFOLLOW) != 0) CannotRead(child, errno);
        Entry entry;
        entry.path = child;
        entry.mode = info.st_mode & 07777;
        if (S_ISDIR(info.st_mode)) {
            int fd = openat(dirfd, name.c_str(), O_RDONLY | O_DIRECTORY | O_NOFOLLOW | O_CLOEXEC);
            if (fd < 0) CannotRead(child, errno);
            try {
                Walk(fd, child, entries);
            } catch (...) {
                close(fd);
                throw;
            }
            close(fd);
        } else if (S_ISLNK(info.st_mode)) {
            std::vector<char> target(static_cast<std::size_t>(info.st_size) + 1);
            ssize_t length = readlinkat(dirfd, name.c_str(), target.data(), target.size());
            if (length < 0) CannotRead(child, errno);
            entry.type = "symlink";
            entry.target.assign(target.data(), static_cast<std::size_t>(length));
            entries.push_back(entry);
        } else if (S_ISREG(info.st_mode)) {
            int fd = openat(dirfd, name.c_str(), O_RDONLY | O_NOFOLLOW | O_CLOEXEC);
            if (fd < 0) CannotRead(child, errno);
            // The programs the build puts on every host are not the host's state (and are
            // megabytes): told apart by their first bytes, never read whole.
            char head[4] = {};
            ssize_t got = pread(fd, head, sizeof head, 0);
            if (image::IsImageFile(child, std::string(head, got > 0 ? static_cast<std::size_t>(got) : 0))) {
                close(fd);
                continue;
            }
            try {
                entry.content = FileContent(fd, info.st_size, child);
            } catch (...) {
                close(fd);
                throw;
            }
            close(fd);
            entry.size = static_cast<std::uint64_t>(info.st_size);
            entries.push_back(entry);
        }
        // Sockets, pipes and devices are not part of a host's files.
    }
}

class FilesSection : public Section {
public:
    explicit FilesSection(std::vector<Entry> entries) : entries_(std::move(entries)) {}

    nlohmann::ordered_json ToJson() const override {
        nlohmann::ordered_json list = nlohmann::ordered_json::array();
        for (const Entry& entry : entries_) list.push_back(EntryJson(entry));
        return list;
    }

    void Write(WriteContext& context) const override {
        RootFs fs(context.root);
        if (fs.Error())
            throw HostError("Cannot open the host's files at '" + context.root +
                            "': " + std::strerror(fs.Error()));
        for (const Entry& entry : entries_) WriteEntry(fs, entry);
        if (int error = image::InstallImage(fs))
            throw HostError("Cannot install the host's programs under '" + context.root +
                            "': " + std::strerror(error));
    }

private:
    std::vector<Entry> entries_;
};

class FilesDomain : public Domain {
public:
    const char* Name() const override { return Tree::kSection; }
    std::string Shape() const override { return "files:1"; }

    std::unique_ptr<Section> Parse(const nlohmann::json* value, const Location& at) const override {
        std::vector<Entry> entries;
        if (!value) {
            for (std::size_t i = 0; i < kDefaultFileCount; ++i) {
                Entry entry;
                entry.path = kDefaultFiles[i].path;
                entry.content.assign(reinterpret_cast<const char*>(kDefaultFiles[i].bytes), kDefaultFiles[i].size);
                entry.size = kDefaultFiles[i].length;
                entry.mode = static_cast<mode_t>(kDefaultFiles[i].mode);
                entries.push_back(std::move(entry));
            }
        } else {
            if (!value->is_array()) at.Fail("expected an array");
            // Linear in the entries (a generated host may hold 100,000 files): every path seen, and
            // for every directory above a path seen, the first path below it.
            std::unordered_map<std::string, std::string> types;
            std::unordered_map<std::string, std::string> first_below;
            for (std::size_t i = 0; i < value->size(); ++i) {
                Entry entry = ParseEntry((*value)[i], at.Index(i));
                const Location where = at.Index(i).Member("path");
                if (types.count(entry.path)) where.Fail("'" + entry.path + "' appears twice");
                for (std::size_t slash = entry.path.find('/', 1); slash != std::string::npos;
                     slash = entry.path.find('/', slash + 1)) {
                    auto above = types.find(entry.path.substr(0, slash));
                    if (above != types.end() && above->second != "directory")
                        where.Fail("'" + entry.path + "' lies under '" + above->first + "', which is not a directory");
                }
                auto below = first_below.find(entry.path);
                if (entry.type != "directory" && below != first_below.end())
                    where.Fail("'" + below->second + "' lies under '" + entry.path + "', which is not a directory");
                for (std::size_t slash = entry.path.find('/', 1); slash != std::string::npos;
                     slash = entry.path.find('/', slash + 1))
                    first_below.emplace(entry.path.substr(0, slash), entry.path);
                types.emplace(entry.path, entry.type);
                entries.push_back(std::move(entry));
            }
        }
        return std::make_unique<FilesSection>(std::move(entries));
    }

    std::unique_ptr<Section> Read(Db&, const std::string& root) const override {
        int fd = open(root.c_str(), O_RDONLY | O_DIRECTORY | O_NOFOLLOW | O_CLOEXEC);
        if (fd < 0) CannotRead("/", errno);
        std::vector<Entry> entries;
        try {
            Walk(fd, "", entries);
        } catch (...) {
            close(fd);
            throw;
        }
        close(fd);
        return std::make_unique<FilesSection>(std::move(entries));
    }
};

}  // namespace

bool IsNormalPath(const std::string& path) {
    if (path.size() < 2 || path.size() > 4095 || path[0] != '/' || path.back() == '/') return false;
    if (path.find('\0') != std::string::npos) return false;
    std::size_t start = 1;
    while (start <= path.size()) {
        std::size_t end = path.find('/', start);
        if (end == std::string::npos) end = path.size();
        std::string component = path.substr(start, end - start);
        if (component.empty() || component == "." || component == ".." || component.size() > 255)
            return false;
        start = end + 1;
    }
    return true;
}

const Domain& Tree::TheDomain() {
    static const FilesDomain domain;
    return domain;
}

}  // namespace files
}  // namespace simhost
