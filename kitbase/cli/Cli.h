// quarncli's program logic: global options, plug-in loading, resolving the command words,
// listings and help, parsing, running the command and rendering its result.
//
//   quarncli [global options] WORD... [command options]
//
// Exit statuses: 0 success; 1 the command set an error, threw, output could not be written, or
// the default plug-in directory cannot be found or read; 2 a usage error (unknown words or options, missing or refused values, bad global options).
// Everything the run owns (plug-in handles, the command tree, results) is released before Run
// returns; nothing escapes it as an exception except std::bad_alloc.
#pragma once

#include <string>
#include <vector>

namespace Kitbase {
namespace Cli {

enum ExitStatus { kExitOk = 0, kExitFailed = 1, kExitUsage = 2 };

extern const char kProgramName[];
extern const char kVersion[];

// What a run takes from its surroundings; tests replace it.
struct RunSettings {
    // The link naming the running program, for the default plug-in directory.
    const char* exeLink = "/proc/self/exe";
};

// args: the arguments after the program name. Output goes to outFd, messages to errFd.
int Run(const std::vector<std::string>& args, int outFd, int errFd);
int Run(const std::vector<std::string>& args, int outFd, int errFd, const RunSettings& settings);

// The program's main: Run on argv[1..] with standard output and standard error.
int Main(int argc, char** argv);

}  // namespace Cli
}  // namespace Kitbase
