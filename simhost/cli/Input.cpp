#include <simhost/cli/Input.h>

#include <cerrno>
#include <cstdint>
#include <cstring>

#include <fcntl.h>
#include <sys/stat.h>
#include <unistd.h>

namespace simhost {
namespace {

std::string TooLarge(const std::string& source, std::size_t limit) {
    return SourceName(source) + " is larger than the " + std::to_string(limit >> 20) +
           " MiB a scenario may have";
}

// Reads fd to its end, refusing more than limit bytes.
std::string ReadAll(int fd, const std::string& source, std::size_t limit) {
    std::string text;
    char buffer[65536];
    for (;;) {
        ssize_t got = read(fd, buffer, sizeof buffer);
        if (got < 0 && errno == EINTR) continue;
        if (got < 0) throw InputError("cannot read " + SourceName(source) + ": " + std::strerror(errno));
        if (got == 0) return text;
        if (text.size() + static_cast<std::size_t>(got) > limit) throw InputError(TooLarge(source, limit));
        text.append(buffer, static_cast<std::size_t>(got));
    }
}

}  // namespace

std::string SourceName(const std::string& source) {
    return source == "-" ? "standard input" : "'" + source + "'";
}

std::string ReadScenarioSource(const std::string& source, std::size_t limit) {
    if (source == "-") return ReadAll(STDIN_FILENO, source, limit);
    // Non-blocking, so that opening a FIFO does not wait for a writer; it is refused below.
    int fd = open(source.c_str(), O_RDONLY | O_CLOEXEC | O_NONBLOCK);
    if (fd < 0) throw InputError("cannot read " + SourceName(source) + ": " + std::strerror(errno));
    struct Closer {
        int fd;
        ~Closer() { close(fd); }
    } closer{fd};
    struct stat info {};
    if (fstat(fd, &info) != 0)
        throw InputError("cannot read " + SourceName(source) + ": " + std::strerror(errno));
    if (!S_ISREG(info.st_mode)) throw InputError(SourceName(source) + " is not a regular file");
    if (static_cast<std::uint64_t>(info.st_size) > limit) throw InputError(TooLarge(source, limit));
    return ReadAll(fd, source, limit);  // the file may have grown since
}

}  // namespace simhost
