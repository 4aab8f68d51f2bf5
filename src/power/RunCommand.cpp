#include "power/RunCommand.h"

#include <cerrno>
#include <csignal>
#include <cstddef>
#include <initializer_list>

#include <fcntl.h>
#include <poll.h>
#include <pthread.h>
#include <sys/syscall.h>
#include <sys/wait.h>
#include <unistd.h>

namespace TarselCli {
namespace System {
namespace {

enum { kRead = 0, kWrite = 1 };

void CloseIfOpen(int& fd) {
    if (fd >= 0) close(fd);
    fd = -1;
}

// The pipe's ends, close-on-exec and above the standard descriptors: the child's duplications
// onto 0, 1 and 2 then never overwrite another pipe end, even for a caller that closed its own
// standard streams.
bool MakePipe(int ends[2]) {
    if (pipe2(ends, O_CLOEXEC) != 0) return false;
    for (int i = 0; i < 2; ++i) {
        if (ends[i] > 2) continue;
        int lifted = fcntl(ends[i], F_DUPFD_CLOEXEC, 3);
        close(ends[i]);
        ends[i] = lifted;
    }
    if (ends[kRead] >= 0 && ends[kWrite] >= 0) return true;
    CloseIfOpen(ends[kRead]);
    CloseIfOpen(ends[kWrite]);
    return false;
}

// In the child: the pipes become its standard streams, then the program. Only async-signal-safe
// calls, since the caller may have other threads.
[[noreturn]] void RunChild(const char* path, const char** argv, int in[2], int out[2], int err[2]) {
    close(in[kWrite]);
    close(err[kRead]);
    close(out[kRead]);
    close(0);
    close(1);
    close(2);
    if (dup2(in[kRead], 0) < 0 || dup2(out[kWrite], 1) < 0 || dup2(err[kWrite], 2) < 0) _exit(255);
    close(in[kRead]);
    close(out[kWrite]);
    close(err[kWrite]);
    execv(path, const_cast<char* const*>(argv));
    _exit(1);
}

// One output stream of the child: what is stored in the caller's buffer, and whether reading
// failed. Bytes beyond the capacity (or all of them, without a buffer) are read and dropped.
struct Capture {
    int fd = -1;
    char* buffer = nullptr;
    int capacity = 0;
    int stored = 0;
    bool failed = false;

    Capture(int readEnd, char* buf, const int* length)
        : fd(readEnd), buffer(buf), capacity(buf && length && *length > 0 ? *length : 0) {}

    // Reads what the pipe holds now; closes it at its end or on an error.
    void Drain() {
        char scratch[65536];
        while (fd >= 0) {
            const bool keep = buffer && stored < capacity;
            char* into = keep ? buffer + stored : scratch;
            std::size_t room = keep ? static_cast<std::size_t>(capacity - stored) : sizeof scratch;
            ssize_t got = read(fd, into, room);
            if (got > 0) {
                if (keep) stored += static_cast<int>(got);
                continue;
            }
            if (got < 0 && errno == EINTR) continue;
            if (got < 0 && errno == EAGAIN) return;
            failed = got < 0;
            CloseIfOpen(fd);
        }
    }

    void Report(int* length) const {
        if (buffer && length) *length = failed ? -1 : stored;
    }
};

// The input still to be written to the child.
struct Feed {
    int fd = -1;
    const char* next = nullptr;
    std::size_t left = 0;
    bool brokenPipe = false;

    // Writes what the pipe takes now; closes it when all is written or the child stopped
    // reading.
    void Write() {
        while (fd >= 0 && left > 0) {
            ssize_t wrote = write(fd, next, left);
            if (wrote > 0) {
                next += wrote;
                left -= static_cast<std::size_t>(wrote);
                continue;
            }
            if (wrote < 0 && errno == EINTR) continue;
            if (wrote < 0 && errno == EAGAIN) return;
            brokenPipe = wrote < 0 && errno == EPIPE;
            break;
        }
        CloseIfOpen(fd);
    }
};

void SetNonBlocking(int fd) {
    int flags = fcntl(fd, F_GETFL);
    if (flags >= 0) fcntl(fd, F_SETFL, flags | O_NONBLOCK);
}

// Feeds the input and drains both outputs until the child has ended (known through pidfd) or,
// without pidfd, until both outputs are at their end. Whatever is still readable when the child
// ends is taken; a descendant that keeps the pipes open does not hold the caller.
void Exchange(Feed& feed, Capture& out, Capture& err, int pidfd) {
    bool ended = false;
    while (!ended && (out.fd >= 0 || err.fd >= 0 || (feed.fd >= 0 && pidfd >= 0))) {
        pollfd fds[4];
        nfds_t count = 0;
        int feedAt = -1, outAt = -1, errAt = -1, pidAt = -1;
        if (feed.fd >= 0) fds[feedAt = count++] = {feed.fd, POLLOUT, 0};
        if (out.fd >= 0) fds[outAt = count++] = {out.fd, POLLIN, 0};
        if (err.fd >= 0) fds[errAt = count++] = {err.fd, POLLIN, 0};
        if (pidfd >= 0) fds[pidAt = count++] = {pidfd, POLLIN, 0};
        if (poll(fds, count, -1) < 0) {
            if (errno == EINTR) continue;
            break;
        }
        if (feedAt >= 0 && fds[feedAt].revents) feed.Write();
        if (outAt >= 0 && fds[outAt].revents) out.Drain();
        if (errAt >= 0 && fds[errAt].revents) err.Drain();
        if (pidAt >= 0 && fds[pidAt].revents) ended = true;
    }
    CloseIfOpen(feed.fd);
    out.Drain();
    err.Drain();
}

// Blocks SIGPIPE for the calling thread while it writes to the child, and discards a SIGPIPE
// that those writes raised, so a child that closes its input early cannot end the caller.
class PipeSignalGuard {
public:
    PipeSignalGuard() {
        sigemptyset(&pipe_);
        sigaddset(&pipe_, SIGPIPE);
        pthread_sigmask(SIG_BLOCK, &pipe_, &saved_);
        sigset_t pending;
        sigpending(&pending);
        wasPending_ = sigismember(&pending, SIGPIPE) == 1;
    }
    void Discard() {
        if (wasPending_) return;  // not ours to take
        const timespec now{0, 0};
        while (sigtimedwait(&pipe_, nullptr, &now) < 0 && errno == EINTR) {
        }
    }
    ~PipeSignalGuard() { pthread_sigmask(SIG_SETMASK, &saved_, nullptr); }

private:
    sigset_t pipe_, saved_;
    bool wasPending_ = false;
};

int WaitFor(pid_t pid) {
    int status = 0;
    while (waitpid(pid, &status, 0) < 0)
        if (errno != EINTR) return -1;
    return status;
}

}  // namespace

int RunCommand(char const* path, char const** argv, char* outBuf, int* outLen, char* errBuf,
               int* errLen, char const* input, int inputLen) {
    int err[2] = {-1, -1}, out[2] = {-1, -1}, in[2] = {-1, -1};
    if (!MakePipe(err)) return -1;
    if (!MakePipe(out)) {
        CloseIfOpen(err[kRead]);
        CloseIfOpen(err[kWrite]);
        return -1;
    }
    if (!MakePipe(in)) {
        for (int* fd : {&err[kRead], &err[kWrite], &out[kRead], &out[kWrite]}) CloseIfOpen(*fd);
        return -1;
    }
    pid_t pid = fork();
    if (pid == 0) RunChild(path, argv, in, out, err);
    CloseIfOpen(in[kRead]);
    CloseIfOpen(err[kWrite]);
    CloseIfOpen(out[kWrite]);
    if (pid < 0) {
        for (int* fd : {&in[kWrite], &err[kRead], &out[kRead]}) CloseIfOpen(*fd);
        return -1;
    }

    PipeSignalGuard guard;
    Feed feed;
    feed.fd = in[kWrite];
    feed.next = input;
    feed.left = input && inputLen > 0 ? static_cast<std::size_t>(inputLen) : 0;
    if (feed.left == 0) CloseIfOpen(feed.fd);
    Capture outCapture(out[kRead], outBuf, outLen);
    Capture errCapture(err[kRead], errBuf, errLen);
    for (int fd : {feed.fd, outCapture.fd, errCapture.fd})
        if (fd >= 0) SetNonBlocking(fd);
    int pidfd = static_cast<int>(syscall(SYS_pidfd_open, pid, 0));
    Exchange(feed, outCapture, errCapture, pidfd);
    if (feed.brokenPipe) guard.Discard();
    CloseIfOpen(pidfd);
    CloseIfOpen(outCapture.fd);
    CloseIfOpen(errCapture.fd);

    int status = WaitFor(pid);
    outCapture.Report(outLen);
    errCapture.Report(errLen);
    return status;
}

}  // namespace System
}  // namespace TarselCli
