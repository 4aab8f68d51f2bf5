// Plug-in discovery and registration.
#include "cli/PluginSet.h"

#include "util/Text.h"

#include <norlithctl/RavelException.h>

#include <algorithm>
#include <cerrno>
#include <cstring>
#include <dirent.h>
#include <dlfcn.h>
#include <exception>
#include <unistd.h>

namespace Kitbase {
namespace Cli {

namespace {

const char kEntryPoint[] = "AutoCli_RegisterNamespaces";

bool IsPluginName(const std::string& name) {
    return name.size() > 3 && name[0] != '.' && name.compare(name.size() - 3, 3, ".so") == 0;
}

// The names of the directory's plug-in files, sorted; false with errno set when unreadable.
bool ListPlugins(const std::string& directory, std::vector<std::string>* names) {
    DIR* dir = opendir(directory.c_str());
    if (dir == nullptr) return false;
    while (struct dirent* entry = readdir(dir)) {
        std::string name = entry->d_name;
        if (IsPluginName(name)) names->push_back(name);
    }
    closedir(dir);
    std::sort(names->begin(), names->end());
    return true;
}

// A path in a message: quoted and escaped like any user text, but cut only when absurdly long.
std::string QuotePath(const std::string& path) { return quarn::util::Quote(path, 1024); }

}  // namespace

bool DefaultPluginDir(const char* exeLink, std::string* dir, std::string* error) {
    char path[4096];
    ssize_t size = readlink(exeLink, path, sizeof path);
    std::string exe = size > 0 ? std::string(path, static_cast<std::size_t>(size)) : std::string();
    if (size <= 0 || static_cast<std::size_t>(size) >= sizeof path || exe[0] != '/') {
        std::string why = size < 0 ? std::strerror(errno) : "not an absolute path";
        *error = std::string("cannot find the plug-in directory: the program's location (") +
                 exeLink + ") cannot be read: " + why + "; give --plugin-dir DIR";
        return false;
    }
    *dir = exe.substr(0, exe.rfind('/')) + "/../lib/quarncli/plugins";
    return true;
}

PluginSet::~PluginSet() {
    for (std::size_t i = handles_.size(); i > 0; --i) dlclose(handles_[i - 1]);
}

bool PluginSet::LoadDirectory(const std::string& directory,
                              const boost::shared_ptr<AutoCli::NamespaceNode>& root,
                              std::vector<std::string>* problems, std::string* error) {
    std::vector<std::string> names;
    if (!ListPlugins(directory, &names)) {
        *error = "cannot read the plug-in directory " + QuotePath(directory) + ": " +
                 std::strerror(errno);
        return false;
    }
    for (std::size_t i = 0; i < names.size(); ++i) {
        std::string path = directory + "/" + names[i];
        void* handle = dlopen(path.c_str(), RTLD_LAZY | RTLD_LOCAL);
        if (handle == nullptr) {
            const char* why = dlerror();
            problems->push_back("cannot load plug-in " + QuotePath(path) + ": " +
                                (why ? why : "unknown dlopen error"));
            continue;
        }
        dlerror();
        void* symbol = dlsym(handle, kEntryPoint);
        if (symbol == nullptr) {
            problems->push_back("plug-in " + QuotePath(path) + " has no entry point " + kEntryPoint +
                                "; skipped");
            dlclose(handle);
            continue;
        }
        // Kept open from here on: the tree may hold objects the plug-in made, even after a throw.
        handles_.push_back(handle);
        AutoCli_RegisterNamespacesFn registerNamespaces =
            reinterpret_cast<AutoCli_RegisterNamespacesFn>(symbol);
        bool failed = true;
        std::string failure;
        try {
            registerNamespaces(root);
            failed = false;
        } catch (const Ravel::Lib::RavelException& e) {
            failure = e.GetMessage(0);
        } catch (const std::exception& e) {
            failure = e.what();
        } catch (...) {
            failure = "an exception of unknown type";
        }
        if (failed) {
            problems->push_back("plug-in " + QuotePath(path) + " failed while registering its commands: " +
                                failure);
        }
    }
    return true;
}

}  // namespace Cli
}  // namespace Kitbase
