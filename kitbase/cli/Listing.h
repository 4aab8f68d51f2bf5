// A namespace's listing: what `quarncli WORD...` prints for a namespace (the root included).
//
// Without --formatter it is the help-style text (usage, description, namespaces and commands
// apart; the root adds the global options). With --formatter it is the namespace's children as
// a list of "Child" structures with the fields Name, Kind ("namespace" or "command") and
// Description, rendered like any command's result, so --format-param applies (and is checked)
// against that shape.
#pragma once

#include "cli/Console.h"
#include "cli/GlobalOptions.h"

#include <kitbase/AutoCli.h>

#include <string>
#include <vector>

namespace Kitbase {
namespace Cli {

// Writes the listing of node (at path); returns the exit status (2 for a refused
// --format-param, else 0 unless the output could not be written).
int ListNamespace(Console& console, const AutoCli::NamespaceNode& node,
                  const std::vector<std::string>& path, const GlobalOptions& options);

}  // namespace Cli
}  // namespace Kitbase
