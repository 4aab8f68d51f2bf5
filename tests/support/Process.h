// Processes for tests: scoped changes to this process's environment, programs run as child
// processes with their exit status and output captured, and bodies run in forked children.
// An EnvOverride owns the variable it set until it restores the previous value. RunProgram owns
// the files its child writes to and removes them before returning. Starting a child throws
// std::runtime_error when the system refuses to create a process or the capture files; a program
// that cannot be executed ends with status 127 and the reason on err, as a shell reports it.
#pragma once

#include <map>
#include <optional>
#include <string>
#include <vector>

namespace testsupport {

// Sets (or, with nullopt, unsets) an environment variable for the scope's lifetime.
class EnvOverride {
public:
    EnvOverride(const std::string& name, const std::optional<std::string>& value);
    ~EnvOverride();
    EnvOverride(const EnvOverride&) = delete;
    EnvOverride& operator=(const EnvOverride&) = delete;

private:
    std::string name_;
    std::optional<std::string> saved_;
};

struct ProcessResult {
    int status = -1;  // exit status, or 128 + signal
    std::string out;
    std::string err;
};

// Runs program (a path, not searched for) with args and waits for it. Stdin reads /dev/null;
// stdout and stderr are captured into out and err. Entries of env are set in the child's
// environment, a nullopt value removes the variable; this process's environment is untouched.
// With stdoutPath, stdout goes to that file instead (e.g. /dev/full) and out stays empty.
ProcessResult RunProgram(const std::string& program, const std::vector<std::string>& args,
                         const std::map<std::string, std::optional<std::string>>& env = {},
                         const std::optional<std::string>& stdoutPath = std::nullopt);

// Runs body in a forked child that exits with body's result (0..255; 255 when it throws);
// returns the child's pid for WaitChild.
int ForkChild(int (*body)(void*), void* context);
// Waits for a child; returns its exit status, 128 + signal, or -1 when it cannot be waited for.
int WaitChild(int pid);

}  // namespace testsupport
