#include "snmp/ReadSecretFile.h"

#include <norlithctl/RavelException.h>

#include <boost/algorithm/string/trim.hpp>

#include <cerrno>
#include <chrono>
#include <cstring>

#include <fcntl.h>
#include <poll.h>
#include <unistd.h>

namespace TarselCli {
namespace System {
namespace {

[[noreturn]] void CannotRead(const std::string& name, int error) {
    throw Ravel::Lib::RavelException("File name '" + name + "' could not be read, " + std::strerror(error));
}

class Fd {
public:
    explicit Fd(int fd) : fd_(fd) {}
    ~Fd() { close(fd_); }
    Fd(const Fd&) = delete;
    Fd& operator=(const Fd&) = delete;

private:
    int fd_;
};

// Waits until fd can be read or the deadline passes; false at the deadline.
bool WaitReadable(int fd, std::chrono::steady_clock::time_point deadline) {
    for (;;) {
        auto left = std::chrono::duration_cast<std::chrono::milliseconds>(deadline - std::chrono::steady_clock::now());
        if (left.count() <= 0) return false;
        pollfd watch{fd, POLLIN, 0};
        int ready = poll(&watch, 1, static_cast<int>(left.count()));
        if (ready > 0) return true;
        if (ready < 0 && errno != EINTR) return true;  // the next read reports it
    }
}

}  // namespace

std::string ReadSecretFile(const std::string& name) {
    errno = 0;
    // Non-blocking, so that opening a FIFO without a writer returns at once.
    int fd = open(name.c_str(), O_RDONLY | O_NONBLOCK | O_CLOEXEC | O_NOCTTY);
    if (fd < 0) CannotRead(name, errno);
    Fd file(fd);
    const auto deadline = std::chrono::steady_clock::now() + std::chrono::seconds(kSecretWaitSeconds);
    errno = 0;
    std::string line;
    bool any = false;
    char buffer[512];
    for (;;) {
        const std::size_t room = kMaxSecretLine + 1 - line.size();
        ssize_t got = read(fd, buffer, room < sizeof buffer ? room : sizeof buffer);
        if (got < 0 && errno == EINTR) continue;
        if (got < 0 && errno == EAGAIN) {
            if (!WaitReadable(fd, deadline)) CannotRead(name, ETIMEDOUT);
            continue;
        }
        if (got < 0) CannotRead(name, errno);
        if (got == 0) break;
        any = true;
        line.append(buffer, static_cast<std::size_t>(got));
        std::size_t newline = line.find('\n');
        if (newline != std::string::npos) {
            line.erase(newline);
            break;
        }
        if (line.size() > kMaxSecretLine) CannotRead(name, EFBIG);
    }
    // An empty file yields no line at all; errno is still 0 here.
    if (!any) CannotRead(name, errno);
    boost::algorithm::trim(line);
    return line;
}

}  // namespace System
}  // namespace TarselCli
