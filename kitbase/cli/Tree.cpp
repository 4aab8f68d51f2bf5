// Building the command tree: host state, plug-in directory, plug-ins.
#include "cli/Tree.h"

#include "cli/Cli.h"

#include <cstdlib>
#include <vector>

namespace Kitbase {
namespace Cli {

namespace {
const char kHostStateVariable[] = "QUARN_HOST_STATE";
}  // namespace

bool Tree::BuiltFor(const GlobalOptions& options) const {
    if (options.pluginDirSet != pluginDirSet) return false;
    if (options.pluginDirSet && options.pluginDir != pluginDir) return false;
    if (options.hostStateSet != hostStateSet) return false;
    return !options.hostStateSet || options.hostState == hostState;
}

HostStateBefore HostStateBefore::Read() {
    HostStateBefore before;
    const char* value = std::getenv(kHostStateVariable);
    before.set = value != nullptr;
    if (value != nullptr) before.value = value;
    return before;
}

std::unique_ptr<Tree> BuildTree(const GlobalOptions& options, const HostStateBefore& before,
                                const char* exeLink, Console& console, int* status) {
    std::unique_ptr<Tree> tree(new Tree);
    tree->pluginDirSet = options.pluginDirSet;
    tree->hostStateSet = options.hostStateSet;
    tree->hostState = options.hostState;
    if (options.hostStateSet) {
        setenv(kHostStateVariable, options.hostState.c_str(), 1);
    } else if (before.set) {
        setenv(kHostStateVariable, before.value.c_str(), 1);
    } else {
        unsetenv(kHostStateVariable);
    }
    std::string error;
    if (options.pluginDirSet) {
        tree->pluginDir = options.pluginDir;
    } else if (!DefaultPluginDir(exeLink, &tree->pluginDir, &error)) {
        console.Error(error);
        *status = console.Finish(kExitFailed);
        return nullptr;
    }
    std::vector<std::string> problems;
    tree->root = AutoCli::Namespace::New();
    bool ok = tree->plugins.LoadDirectory(tree->pluginDir, tree->root, &problems, &error);
    for (const std::string& problem : problems) console.Error(problem);
    if (!ok) {
        console.Error(error);
        *status = console.Finish(options.pluginDirSet ? kExitUsage : kExitFailed);
        return nullptr;
    }
    return tree;
}

}  // namespace Cli
}  // namespace Kitbase
