#include "support/Process.h"

#include "support/Files.h"

#include <cerrno>
#include <cstdlib>
#include <cstring>
#include <stdexcept>

#include <fcntl.h>
#include <spawn.h>
#include <sys/wait.h>
#include <unistd.h>

extern char** environ;

namespace testsupport {

namespace {

// Closes a descriptor when the scope ends.
class Descriptor {
public:
    explicit Descriptor(int fd) : fd_(fd) {}
    ~Descriptor() {
        if (fd_ >= 0) close(fd_);
    }
    Descriptor(const Descriptor&) = delete;
    Descriptor& operator=(const Descriptor&) = delete;
    int Get() const { return fd_; }

private:
    int fd_;
};

Descriptor OpenForWriting(const std::string& path) {
    int fd = open(path.c_str(), O_WRONLY | O_CREAT | O_TRUNC | O_CLOEXEC, 0600);
    if (fd < 0) throw std::runtime_error("cannot open " + path + ": " + std::strerror(errno));
    return Descriptor(fd);
}

// This process's environment with env applied, as NAME=value strings.
std::vector<std::string> ChildEnvironment(
    const std::map<std::string, std::optional<std::string>>& env) {
    std::vector<std::string> entries;
    for (char** entry = environ; *entry != nullptr; ++entry) {
        std::string setting = *entry;
        if (env.count(setting.substr(0, setting.find('='))) == 0) entries.push_back(setting);
    }
    for (const auto& [name, value] : env) {
        if (value) entries.push_back(name + "=" + *value);
    }
    return entries;
}

std::vector<char*> Pointers(std::vector<std::string>& strings) {
    std::vector<char*> pointers;
    for (std::string& text : strings) pointers.push_back(text.data());
    pointers.push_back(nullptr);
    return pointers;
}

}  // namespace

EnvOverride::EnvOverride(const std::string& name, const std::optional<std::string>& value)
    : name_(name) {
    if (const char* old = std::getenv(name.c_str())) saved_ = old;
    if (value)
        setenv(name.c_str(), value->c_str(), 1);
    else
        unsetenv(name.c_str());
}

EnvOverride::~EnvOverride() {
    if (saved_)
        setenv(name_.c_str(), saved_->c_str(), 1);
    else
        unsetenv(name_.c_str());
}

ProcessResult RunProgram(const std::string& program, const std::vector<std::string>& args,
                         const std::map<std::string, std::optional<std::string>>& env,
                         const std::optional<std::string>& stdoutPath) {
    TempDir capture;
    const std::string outPath = stdoutPath ? *stdoutPath : capture / "out";
    const std::string errPath = capture / "err";
    ProcessResult result;
    pid_t pid = -1;
    int spawned = 0;
    {
        Descriptor out = OpenForWriting(outPath);
        Descriptor err = OpenForWriting(errPath);
        std::vector<std::string> argStrings{program};
        argStrings.insert(argStrings.end(), args.begin(), args.end());
        std::vector<std::string> envStrings = ChildEnvironment(env);
        std::vector<char*> argv = Pointers(argStrings);
        std::vector<char*> envp = Pointers(envStrings);

        posix_spawn_file_actions_t actions;
        posix_spawn_file_actions_init(&actions);
        posix_spawn_file_actions_addopen(&actions, 0, "/dev/null", O_RDONLY, 0);
        posix_spawn_file_actions_adddup2(&actions, out.Get(), 1);
        posix_spawn_file_actions_adddup2(&actions, err.Get(), 2);
        spawned = posix_spawn(&pid, program.c_str(), &actions, nullptr, argv.data(), envp.data());
        posix_spawn_file_actions_destroy(&actions);
    }
    if (spawned != 0) {
        result.status = 127;
        result.err = "cannot run " + program + ": " + std::strerror(spawned) + "\n";
        return result;
    }
    result.status = WaitChild(pid);
    if (!stdoutPath) result.out = ReadFile(outPath);
    result.err = ReadFile(errPath);
    return result;
}

int ForkChild(int (*body)(void*), void* context) {
    pid_t pid = fork();
    if (pid < 0) throw std::runtime_error(std::string("fork failed: ") + std::strerror(errno));
    if (pid == 0) {
        int status = 255;
        try {
            status = body(context);
        } catch (...) {
        }
        _exit(status);
    }
    return pid;
}

int WaitChild(int pid) {
    int status = 0;
    while (waitpid(pid, &status, 0) < 0) {
        if (errno != EINTR) return -1;
    }
    if (WIFEXITED(status)) return WEXITSTATUS(status);
    if (WIFSIGNALED(status)) return 128 + WTERMSIG(status);
    return -1;
}

}  // namespace testsupport
