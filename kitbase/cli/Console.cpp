// Standard output, standard error and the exit status of a failed write.
#include "cli/Console.h"

#include "cli/Cli.h"
#include "engine/Text.h"

#include <cstring>

namespace Kitbase {
namespace Cli {

void Console::Line(const char* prefix, const std::string& line) {
    out_.Flush();
    if (prefix != nullptr) {
        err_.PutText(prefix);
        err_.Put(": ", 2);
    }
    Engine::PutEscaped(err_, line);
    err_.Put('\n');
    err_.Flush();
}

void Console::Error(const std::string& line) { Line(kProgramName, line); }

void Console::Message(const std::string& line) { Line(nullptr, line); }

int Console::Finish(int status) {
    if (!out_.Flush()) {
        Error(std::string("cannot write the output: ") + std::strerror(out_.ErrorCode()));
        return status == kExitOk ? kExitFailed : status;
    }
    return status;
}

}  // namespace Cli
}  // namespace Kitbase
