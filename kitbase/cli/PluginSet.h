// The plug-ins quarncli loads: every *.so of one directory, opened with dlopen in name order,
// each given the command tree's root once through its AutoCli_RegisterNamespaces entry point.
//
// PluginSet owns the library handles and closes them, in reverse order, when it is destroyed;
// whatever holds objects made by a plug-in (the command tree, results) must be gone by then.
// A plug-in that cannot be opened, lacks the entry point, or throws from it is reported in one
// line naming the file, and the others still load. Plug-ins are opened with lazy binding: a
// command line runs one command, so the loader resolves only the functions that command calls
// (the plug-in tests open it with every symbol bound, so a missing one is found there).
//
// DefaultPluginDir finds the directory next to the running program; when the program's own
// location cannot be read it fails rather than fall back to a directory relative to the
// current one, where anybody could plant a plug-in.
#pragma once

#include <kitbase/AutoCli.h>

#include <boost/shared_ptr.hpp>

#include <string>
#include <vector>

namespace Kitbase {
namespace Cli {

// <directory of the program>/../lib/quarncli/plugins, the program being what exeLink (normally
// /proc/self/exe) points to. False with *error set (one line) when the link cannot be read or
// does not name an absolute path.
bool DefaultPluginDir(const char* exeLink, std::string* dir, std::string* error);

class PluginSet {
public:
    PluginSet() {}
    ~PluginSet();
    PluginSet(const PluginSet&) = delete;
    PluginSet& operator=(const PluginSet&) = delete;

    // Loads the directory's plug-ins into root. False, with *error set to one line, when the
    // directory cannot be read; problems with single plug-ins go to *problems, one line each.
    bool LoadDirectory(const std::string& directory,
                       const boost::shared_ptr<AutoCli::NamespaceNode>& root,
                       std::vector<std::string>* problems, std::string* error);

private:
    std::vector<void*> handles_;
};

}  // namespace Cli
}  // namespace Kitbase
