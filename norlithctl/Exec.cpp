#include <norlithctl/Util.h>

#include "HostCall.h"

#include <simhost/Kernel.h>
#include <simhost/RootFs.h>

#include <cerrno>
#include <climits>
#include <cstdlib>
#include <cstring>
#include <string>
#include <vector>

#include <fcntl.h>
#include <linux/close_range.h>
#include <sys/stat.h>
#include <sys/syscall.h>
#include <sys/wait.h>
#include <syslog.h>
#include <unistd.h>

extern char** environ;

namespace NorlithCtl {
namespace Util {
namespace {

constexpr int kNotFound = 127;
constexpr int kCannotRun = 126;
constexpr std::size_t kMaxLoggedError = 64 * 1024;

std::vector<std::string> SplitBlanks(const std::string& text) {
    std::vector<std::string> words;
    std::string word;
    for (char c : text) {
        if (c == ' ' || c == '\t') {
            if (!word.empty()) words.push_back(std::move(word));
            word.clear();
        } else {
            word += c;
        }
    }
    if (!word.empty()) words.push_back(std::move(word));
    return words;
}

// What the program needs, gathered while the host is held; the program itself runs after.
struct Launch {
    int program = -1;        // O_PATH descriptor of the program inside root/
    int refusal = 0;         // 127 or 126 when it cannot be run
    std::string state_dir;   // absolute
};

// The environment of the program: the caller's, with QUARN_HOST_STATE naming this host.
std::vector<std::string> ProgramEnvironment(const std::string& state_dir) {
    std::vector<std::string> env;
    for (char** entry = environ; entry && *entry; ++entry)
        if (std::strncmp(*entry, "QUARN_HOST_STATE=", 17) != 0) env.push_back(*entry);
    env.push_back("QUARN_HOST_STATE=" + state_dir);
    return env;
}

std::vector<char*> Pointers(std::vector<std::string>& texts) {
    std::vector<char*> pointers;
    for (std::string& text : texts) pointers.push_back(&text[0]);
    pointers.push_back(nullptr);
    return pointers;
}

// In the child: standard streams set up, every other descriptor closed at exec, then the
// program. Only async-signal-safe calls from here on.
[[noreturn]] void RunChild(int program, char** argv, char** envp, int out, int err) {
    int null = open("/dev/null", O_RDWR | O_CLOEXEC);
    if (null < 0 || dup2(null, 0) < 0) _exit(kCannotRun);
    if (out >= 0 && dup2(out, 1) < 0) _exit(kCannotRun);
    if (err >= 0 && dup2(err, 2) < 0) _exit(kCannotRun);
    syscall(SYS_close_range, 3U, ~0U, CLOSE_RANGE_CLOEXEC);
    // A script is handed to its interpreter as /dev/fd/N: its descriptor must outlive the exec.
    fcntl(program, F_SETFD, 0);
    syscall(SYS_execveat, program, "", argv, envp, AT_EMPTY_PATH);
    _exit(errno == ENOENT ? kNotFound : kCannotRun);
}

int WaitFor(pid_t pid) {
    int status = 0;
    while (waitpid(pid, &status, 0) < 0) {
        if (errno != EINTR) return kCannotRun;
    }
    if (WIFEXITED(status)) return WEXITSTATUS(status);
    if (WIFSIGNALED(status)) return 128 + WTERMSIG(status);
    return kCannotRun;
}

// Reads the program's error output to its end (keeping at most kMaxLoggedError bytes).
std::string Drain(int fd) {
    std::string text;
    char buffer[4096];
    for (;;) {
        ssize_t got = read(fd, buffer, sizeof buffer);
        if (got < 0 && errno == EINTR) continue;
        if (got <= 0) break;
        if (text.size() < kMaxLoggedError)
            text.append(buffer, std::min(static_cast<std::size_t>(got), kMaxLoggedError - text.size()));
    }
    return text;
}

void LogErrorLines(const std::string& program, const std::string& text) {
    std::string::size_type start = 0;
    while (start < text.size()) {
        std::string::size_type end = text.find('\n', start);
        if (end == std::string::npos) end = text.size();
        if (end > start) simhost::kernel::LogToHost(LOG_ERR, program + ": " + text.substr(start, end - start));
        start = end + 1;
    }
}

// The failure to create the program's process, with its event record (the program and the
// reason), so that a caller reading the event form sees which program it was.
[[noreturn]] void CannotStart(const std::string& program) {
    const std::string reason = std::strerror(errno);
    throw Ravel::Lib::RavelException("Cannot start a program on the host: " + reason,
                                     Ravel::Lib::QuillMessage("quill.host.exec.cannotstart",
                                                              {program, reason}));
}

}  // namespace

int NorlithCtl_Exec(const std::string& command, bool background, bool quiet, bool trace) {
    std::vector<std::string> words = SplitBlanks(command);
    Launch launch;
    norlithctl::HostCall([&] {
        simhost::Call call(simhost::Op::NorlithCtl_Exec, simhost::Args()
                                                             .Add("command", command)
                                                             .Add("background", background)
                                                             .Add("quiet", quiet)
                                                             .Add("trace", trace));
        char resolved[PATH_MAX];
        launch.state_dir = realpath(call.StateDir().c_str(), resolved) ? resolved : call.StateDir();
        if (trace) simhost::kernel::Syslog(call, LOG_INFO, "exec: " + command);
        if (words.empty()) {
            launch.refusal = kNotFound;
            return;
        }
        simhost::RootFs fs(call.Root());
        int error = fs.Open(words[0], O_PATH, 0, &launch.program);
        if (error) {
            launch.refusal = error == ENOENT || error == ENOTDIR || error == EINVAL ? kNotFound : kCannotRun;
            return;
        }
        struct stat info {};
        if (fstat(launch.program, &info) != 0 || !S_ISREG(info.st_mode) || !(info.st_mode & 0111))
            launch.refusal = kCannotRun;
    });
    if (launch.refusal) {
        if (launch.program >= 0) close(launch.program);
        if (quiet)
            simhost::kernel::LogToHost(LOG_ERR, "exec: cannot run '" + command + "': " +
                                                    (launch.refusal == kNotFound ? "no such program"
                                                                                 : "not an executable program"));
        return launch.refusal;
    }

    std::vector<std::string> env = ProgramEnvironment(launch.state_dir);
    std::vector<char*> envp = Pointers(env);
    std::vector<char*> argv = Pointers(words);
    int null = -1, pipe_fds[2] = {-1, -1};
    if (quiet) {
        null = open("/dev/null", O_WRONLY | O_CLOEXEC);
        if (null < 0 || (!background && pipe2(pipe_fds, O_CLOEXEC) != 0)) {
            int error = errno;
            if (null >= 0) close(null);
            close(launch.program);
            errno = error;
            CannotStart(words[0]);
        }
    }
    int err = quiet ? (background ? null : pipe_fds[1]) : -1;
    pid_t pid = fork();
    if (pid == 0) {
        if (background) {
            // A second child runs the program, so that nothing waits for it and no zombie stays.
            if (fork() != 0) _exit(0);
            setsid();
        }
        RunChild(launch.program, argv.data(), envp.data(), null, err);
    }
    int fork_error = errno;
    close(launch.program);
    if (null >= 0) close(null);
    if (pipe_fds[1] >= 0) close(pipe_fds[1]);
    if (pid < 0) {
        if (pipe_fds[0] >= 0) close(pipe_fds[0]);
        errno = fork_error;
        CannotStart(words[0]);
    }
    std::string errors;
    if (pipe_fds[0] >= 0) {
        errors = Drain(pipe_fds[0]);
        close(pipe_fds[0]);
    }
    int status = WaitFor(pid);
    if (background) return 0;
    if (!errors.empty()) LogErrorLines(words[0], errors);
    return status;
}

}  // namespace Util
}  // namespace NorlithCtl
