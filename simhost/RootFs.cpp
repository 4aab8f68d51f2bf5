#include <simhost/RootFs.h>

#include <cerrno>
#include <cstring>
#include <vector>

#include <fcntl.h>
#include <linux/openat2.h>
#include <sys/syscall.h>
#include <unistd.h>

namespace simhost {
namespace {

int OpenInRoot(int root, const std::string& path, int flags, mode_t mode) {
    open_how how{};
    how.flags = static_cast<std::uint64_t>(flags | O_CLOEXEC);
    how.mode = (flags & (O_CREAT | O_TMPFILE)) ? mode : 0;
    how.resolve = RESOLVE_IN_ROOT | RESOLVE_NO_MAGICLINKS;
    // The kernel resolves an absolute path from the given root with RESOLVE_IN_ROOT.
    const char* relative = path.c_str();
    long fd = syscall(SYS_openat2, root, relative, &how, sizeof how);
    return static_cast<int>(fd);
}

class Fd {
public:
    explicit Fd(int fd = -1) : fd_(fd) {}
    ~Fd() {
        if (fd_ >= 0) close(fd_);
    }
    Fd(const Fd&) = delete;
    Fd& operator=(const Fd&) = delete;
    int get() const { return fd_; }

private:
    int fd_;
};

}  // namespace

bool IsHostPath(const std::string& path) {
    return !path.empty() && path[0] == '/' && path.find('\0') == std::string::npos &&
           path.size() < 4096;
}

RootFs::RootFs(const std::string& root) {
    root_ = open(root.c_str(), O_PATH | O_DIRECTORY | O_NOFOLLOW | O_CLOEXEC);
    if (root_ < 0) error_ = errno;
}

RootFs::~RootFs() {
    if (root_ >= 0) close(root_);
}

int RootFs::OpenParent(const std::string& path, int* dirfd, std::string* name) const {
    if (error_) return error_;
    if (!IsHostPath(path)) return EINVAL;
    std::string trimmed = path;
    while (trimmed.size() > 1 && trimmed.back() == '/') trimmed.pop_back();
    std::string::size_type slash = trimmed.rfind('/');
    *name = trimmed.substr(slash + 1);
    if (name->empty() || *name == "." || *name == "..") return EINVAL;
    std::string parent = slash == 0 ? "/" : trimmed.substr(0, slash);
    int fd = OpenInRoot(root_, parent, O_PATH | O_DIRECTORY, 0);
    if (fd < 0) return errno;
    *dirfd = fd;
    return 0;
}

int RootFs::Open(const std::string& path, int flags, mode_t mode, int* fd) const {
    if (error_) return error_;
    if (!IsHostPath(path)) return EINVAL;
    int opened = OpenInRoot(root_, path, flags, mode);
    if (opened < 0) return errno;
    *fd = opened;
    return 0;
}

int RootFs::Stat(const std::string& path, struct stat* info) const {
    int dirfd = -1;
    std::string name;
    if (path == "/") {
        if (error_) return error_;
        return fstat(root_, info) == 0 ? 0 : errno;
    }
    if (int error = OpenParent(path, &dirfd, &name)) return error;
    Fd dir(dirfd);
    return fstatat(dir.get(), name.c_str(), info, AT_SYMLINK_NOFOLLOW) == 0 ? 0 : errno;
}

int RootFs::Unlink(const std::string& path) const {
    int dirfd = -1;
    std::string name;
    if (int error = OpenParent(path, &dirfd, &name)) return error == EINVAL && path == "/" ? EISDIR : error;
    Fd dir(dirfd);
    return unlinkat(dir.get(), name.c_str(), 0) == 0 ? 0 : errno;
}

int RootFs::MakeDirectory(const std::string& path, mode_t mode) const {
    int dirfd = -1;
    std::string name;
    if (int error = OpenParent(path, &dirfd, &name)) return error;
    Fd dir(dirfd);
    return mkdirat(dir.get(), name.c_str(), mode) == 0 ? 0 : errno;
}

int RootFs::MakeDirectories(const std::string& path, mode_t mode) const {
    if (!IsHostPath(path)) return EINVAL;
    std::string partial;
    std::size_t start = 1;
    while (start <= path.size()) {
        std::size_t end = path.find('/', start);
        if (end == std::string::npos) end = path.size();
        if (end > start) {
            partial += "/" + path.substr(start, end - start);
            int error = MakeDirectory(partial, mode);
            if (error && error != EEXIST) return error;
            if (error == EEXIST) {
                struct stat info {};
                if (int stat_error = Stat(partial, &info)) return stat_error;
                if (!S_ISDIR(info.st_mode)) return ENOTDIR;
            }
        }
        start = end + 1;
    }
    return 0;
}

int RootFs::Symlink(const std::string& target, const std::string& path) const {
    int dirfd = -1;
    std::string name;
    if (int error = OpenParent(path, &dirfd, &name)) return error;
    Fd dir(dirfd);
    return symlinkat(target.c_str(), dir.get(), name.c_str()) == 0 ? 0 : errno;
}

int RootFs::ReadFile(const std::string& path, std::string* content, std::size_t limit) const {
    int fd = -1;
    if (int error = Open(path, O_RDONLY | O_NOFOLLOW, 0, &fd)) return error;
    Fd file(fd);
    struct stat info {};
    if (fstat(fd, &info) != 0) return errno;
    if (!S_ISREG(info.st_mode)) return S_ISDIR(info.st_mode) ? EISDIR : EINVAL;
    if (static_cast<std::uint64_t>(info.st_size) > limit) return E2BIG;
    std::string data;
    char buffer[65536];
    for (;;) {
        ssize_t got = read(fd, buffer, sizeof buffer);
        if (got < 0) {
            if (errno == EINTR) continue;
            return errno;
        }
        if (got == 0) break;
        if (data.size() + static_cast<std::size_t>(got) > limit) return E2BIG;
        data.append(buffer, static_cast<std::size_t>(got));
    }
    content->swap(data);
    return 0;
}

int RootFs::WriteFileAtomic(const std::string& path, const std::string& content, mode_t mode) const {
    int dirfd = -1;
    std::string name;
    if (int error = OpenParent(path, &dirfd, &name)) return error;
    Fd dir(dirfd);
    // O_PATH descriptors cannot create files; reopen the directory for real.
    int realdir = openat(dir.get(), ".", O_RDONLY | O_DIRECTORY | O_CLOEXEC);
    if (realdir < 0) return errno;
    Fd parent(realdir);
    std::string temporary = "." + name + ".new." + std::to_string(getpid());
    int fd = openat(parent.get(), temporary.c_str(),
                    O_WRONLY | O_CREAT | O_TRUNC | O_NOFOLLOW | O_CLOEXEC, mode);
    if (fd < 0) return errno;
    int error = 0;
    {
        Fd file(fd);
        std::size_t done = 0;
        while (done < content.size() && !error) {
            ssize_t wrote = write(fd, content.data() + done, content.size() - done);
            if (wrote < 0 && errno != EINTR) error = errno;
            if (wrote > 0) done += static_cast<std::size_t>(wrote);
        }
        if (!error && fchmod(fd, mode) != 0) error = errno;
        if (!error && fsync(fd) != 0) error = errno;
    }
    if (!error && renameat(parent.get(), temporary.c_str(), parent.get(), name.c_str()) != 0)
        error = errno;
    if (error) {
        unlinkat(parent.get(), temporary.c_str(), 0);
        return error;
    }
    fsync(parent.get());
    return 0;
}

}  // namespace simhost
