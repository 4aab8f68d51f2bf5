// Help and namespace listings, and the terminal width they and the table formatter fit.
//
// A namespace's listing (also its --help) shows a usage line, its description and its children
// with their descriptions, namespaces and commands apart, each group in attachment order. A
// command's help shows usage, description and every parameter: long and short name, kind,
// whether it is required, its help text and its constraints. Text wraps at the given width.
// Nothing here throws but std::bad_alloc.
#pragma once

#include "engine/Writer.h"

#include <kitbase/AutoCli.h>
#include <kitbase/CallSpec.h>
#include <kitbase/Export.h>

#include <string>
#include <vector>

namespace Kitbase {
namespace Engine {

// Columns of the terminal on fd: TIOCGWINSZ when fd is a terminal; otherwise COLUMNS when it
// is a positive number; otherwise 80.
KITBASE_API std::size_t TerminalWidth(int fd);

// "name  description" rows with the descriptions aligned and wrapped under each other.
struct HelpRow {
    std::string name;
    std::string text;
};
KITBASE_API void WriteRows(Writer& out, const std::vector<HelpRow>& rows, std::size_t width);

// usage: the whole "Usage: ..." line's text after "Usage: ".
KITBASE_API void WriteNamespaceHelp(Writer& out, const AutoCli::NamespaceNode& node,
                                    const std::string& usage, std::size_t width);
// spec: the command's InputSpec, as the caller built it for parsing.
KITBASE_API void WriteCommandHelp(Writer& out, const AutoCli::Command& command,
                                  const CallSpec::InputSpec& spec, const std::string& usage,
                                  std::size_t width);

}  // namespace Engine
}  // namespace Kitbase
