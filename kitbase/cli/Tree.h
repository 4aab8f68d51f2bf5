// The command tree of one run: the host state put in the environment (plug-ins may read it
// while registering), then every plug-in of the chosen directory loaded into a fresh root.
//
// A Tree owns its plug-ins and the nodes they made; the nodes go first when it is destroyed.
// Building fails, with its lines on the console, when the program's location cannot be read
// (and no --plugin-dir is given: status 1) or the directory cannot be read (status 2 for a
// --plugin-dir, 1 for the default one); a single broken plug-in is one line and no failure.
#pragma once

#include "cli/Console.h"
#include "cli/GlobalOptions.h"
#include "cli/PluginSet.h"

#include <kitbase/AutoCli.h>

#include <boost/shared_ptr.hpp>

#include <memory>
#include <string>

namespace Kitbase {
namespace Cli {

struct Tree {
    // Declared before the root: destroyed after it, so no node outlives its plug-in's code.
    PluginSet plugins;
    boost::shared_ptr<AutoCli::NamespaceNode> root;
    // What it was built with.
    std::string pluginDir;
    bool pluginDirSet = false;
    std::string hostState;
    bool hostStateSet = false;

    // Whether the tree was built with the plug-in directory and host state options hold.
    bool BuiltFor(const GlobalOptions& options) const;
};

// The host state variable's value before the run changed it, for building a tree again.
struct HostStateBefore {
    bool set = false;
    std::string value;
    static HostStateBefore Read();
};

// Builds the tree for options (--plugin-dir, --host-state); exeLink names the running program
// for the default plug-in directory. Null with *status set when the run ends here.
std::unique_ptr<Tree> BuildTree(const GlobalOptions& options, const HostStateBefore& before,
                                const char* exeLink, Console& console, int* status);

}  // namespace Cli
}  // namespace Kitbase
