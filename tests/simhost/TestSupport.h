// Helpers shared by the simulated host's tests: temporary directories, environment overrides,
// files, scenario edits and running quarnhost as a process.
#pragma once

#include <nlohmann/json.hpp>

#include <map>
#include <optional>
#include <string>
#include <vector>

namespace simtest {

// A fresh directory, removed with everything in it on destruction.
class TempDir {
public:
    TempDir();
    ~TempDir();
    TempDir(const TempDir&) = delete;
    TempDir& operator=(const TempDir&) = delete;
    const std::string& Path() const { return path_; }
    std::string operator/(const std::string& name) const { return path_ + "/" + name; }

private:
    std::string path_;
};

// Sets (or, with nullopt, unsets) an environment variable for the scope's lifetime.
class EnvOverride {
public:
    EnvOverride(const char* name, const std::optional<std::string>& value);
    ~EnvOverride();
    EnvOverride(const EnvOverride&) = delete;
    EnvOverride& operator=(const EnvOverride&) = delete;

private:
    std::string name_;
    std::optional<std::string> saved_;
};

std::string ReadFile(const std::string& path);
void WriteFile(const std::string& path, const std::string& text);
std::string ScenarioFile(const std::string& name);  // path under scenarios/

// The default scenario with one JSON pointer replaced (e.g. "/identity/product").
std::string EditedDefault(const std::string& pointer, const nlohmann::json& value);

struct ProcessResult {
    int status = -1;  // exit status, or 128 + signal
    std::string out;
    std::string err;
};

// Runs quarnhost with the arguments; env entries are set in the child (a nullopt value unsets).
ProcessResult RunQuarnhost(const std::vector<std::string>& args,
                           const std::map<std::string, std::optional<std::string>>& env = {});

// Runs body in a forked child that exits with body's result (0..255); returns the pids.
int ForkChild(int (*body)(void*), void* context);
// Waits for a child; returns its exit status (or 128 + signal).
int WaitChild(int pid);

}  // namespace simtest
