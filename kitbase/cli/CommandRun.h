// Running one command: help, option parsing, --format-param checks, execution, rendering the
// result and printing the command's messages.
//
// The command (and the tree holding it) belongs to the caller, which keeps the plug-ins loaded
// throughout. An exception from the command's declarations or execution never escapes: it
// becomes one line on standard error and status 1.
#pragma once

#include "cli/Console.h"
#include "cli/GlobalOptions.h"

#include <kitbase/AutoCli.h>
#include <kitbase/CallSpec.h>

#include <string>
#include <vector>

namespace Kitbase {
namespace Cli {

// words: the command's own options (global options already taken out); spec: its InputSpec.
// Returns the exit status.
int RunCommand(Console& console, AutoCli::Command& command, const std::vector<std::string>& path,
               const CallSpec::InputSpec& spec, const std::vector<std::string>& words,
               const GlobalOptions& options);

}  // namespace Cli
}  // namespace Kitbase
