#include <simhost/Image.h>

#include <cerrno>
#include <climits>
#include <cstring>

#include <fcntl.h>
#include <sys/stat.h>
#include <unistd.h>

namespace simhost {
namespace image {
namespace {

bool IsProgram(const std::string& path) {
    struct stat info {};
    return !path.empty() && stat(path.c_str(), &info) == 0 && S_ISREG(info.st_mode) &&
           (info.st_mode & 0111) != 0;
}

std::string RunningProgramDir() {
    char path[PATH_MAX];
    ssize_t length = readlink("/proc/self/exe", path, sizeof path - 1);
    if (length <= 0) return "";
    std::string exe(path, static_cast<std::size_t>(length));
    return exe.substr(0, exe.rfind('/'));
}

// Copies the file open at `from` into `to`, a new file.
int CopyContent(int from, int to) {
    for (;;) {
        ssize_t copied = copy_file_range(from, nullptr, to, nullptr, 1 << 30, 0);
        if (copied == 0) return 0;
        if (copied > 0) continue;
        if (errno == EINTR) continue;
        if (errno != EXDEV && errno != ENOSYS && errno != EINVAL && errno != EOPNOTSUPP)
            return errno;
        break;
    }
    char buffer[65536];
    for (;;) {
        ssize_t got = read(from, buffer, sizeof buffer);
        if (got < 0 && errno == EINTR) continue;
        if (got < 0) return errno;
        if (got == 0) return 0;
        for (ssize_t done = 0; done < got;) {
            ssize_t wrote = write(to, buffer + done, static_cast<std::size_t>(got - done));
            if (wrote < 0 && errno == EINTR) continue;
            if (wrote < 0) return errno;
            done += wrote;
        }
    }
}

int Install(const RootFs& root, const std::string& program, const std::string& built) {
    std::string dir = program.substr(0, program.rfind('/'));
    std::string name = program.substr(program.rfind('/') + 1);
    if (int error = root.MakeDirectories(dir, 0755)) return error;
    int dirfd = -1;
    if (int error = root.Open(dir, O_PATH | O_DIRECTORY, 0, &dirfd)) return error;
    int error = 0;
    if (linkat(AT_FDCWD, built.c_str(), dirfd, name.c_str(), 0) != 0) {
        int from = open(built.c_str(), O_RDONLY | O_CLOEXEC);
        const int flags = O_WRONLY | O_CREAT | O_EXCL | O_NOFOLLOW | O_CLOEXEC;
        int to = from < 0 ? -1 : openat(dirfd, name.c_str(), flags, 0755);
        error = from < 0 || to < 0 ? errno : CopyContent(from, to);
        if (to >= 0 && close(to) != 0 && !error) error = errno;
        if (from >= 0) close(from);
        if (error && to >= 0) unlinkat(dirfd, name.c_str(), 0);
    }
    close(dirfd);
    return error;
}

}  // namespace

std::string BuiltProgram(const std::string& program) {
    std::string name = program.substr(program.rfind('/') + 1);
    const std::string candidates[] = {
        RunningProgramDir() + "/" + name,
        std::string(QUARN_IMAGE_INSTALL_DIR) + "/" + name,
        std::string(QUARN_IMAGE_BUILD_DIR) + "/" + name,
    };
    for (const std::string& candidate : candidates)
        if (IsProgram(candidate)) return candidate;
    return "";
}

int InstallImage(const RootFs& root) {
    for (const char* program : kPrograms) {
        struct stat info {};
        if (root.Stat(program, &info) != ENOENT) continue;  // the scenario gave its own
        std::string built = BuiltProgram(program);
        if (built.empty()) continue;
        if (int error = Install(root, program, built)) return error;
    }
    return 0;
}

bool IsImageFile(const std::string& path, const std::string& head) {
    for (const char* program : kPrograms)
        if (path == program) return head.compare(0, 4, "\x7f" "ELF") == 0;
    return false;
}

}  // namespace image
}  // namespace simhost
