// Where a run's output and messages go: the result, listing or help on standard output, and
// every message on standard error, one line each, in the order they are given.
//
// Console owns two buffered writers over file descriptors it does not own. Every message line
// is shown in the terminal escape form (\n, \t, \xNN...), so text a command or the host put in
// it can neither forge a second line nor reach the terminal as a control sequence. Finish turns
// a failed write of standard output into status 1 and one line on standard error.
#pragma once

#include "engine/Writer.h"

#include <string>

namespace Kitbase {
namespace Cli {

class Console {
public:
    Console(int outFd, int errFd) : out_(outFd), err_(errFd, 4096), outFd_(outFd) {}

    Engine::Writer& Out() { return out_; }
    int OutFd() const { return outFd_; }

    // "quarncli: <line>" on standard error (after what standard output holds so far).
    void Error(const std::string& line);
    // The line as it is (a command's message), escaped, on standard error.
    void Message(const std::string& line);
    // Flushes standard output: status, or 1 (with one line) when the output could not be
    // written and status was 0.
    int Finish(int status);

private:
    void Line(const char* prefix, const std::string& line);

    Engine::Writer out_;
    Engine::Writer err_;
    int outFd_;
};

}  // namespace Cli
}  // namespace Kitbase
