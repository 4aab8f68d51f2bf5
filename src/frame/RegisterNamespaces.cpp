// The plug-in's entry point: builds the "system" command tree.
//
// AutoCli_RegisterNamespaces obtains the node "system" from the framework's root and walks one
// table, in order: each row is either a namespace with its description or a command leaf made by
// its class's factory, attached to its parent under the last word of its path. A parent always
// precedes its children, so children end up attached in table order. When the function returns,
// the framework owns the tree; nothing here keeps a reference.
#include "frame/CommandModel.h"
#include "frame/Export.h"
// identity, time and console
#include "identity/BootDeviceGet.h"
#include "identity/UuidGet.h"
#include "identity/VersionGet.h"
// processes and security policy

// SNMP agent

// power and maintenance

// kernel settings

// kernel modules

// core dump

// memory file system
#include "memfs/MirafsGet.h"
#include "memfs/MirafsRamdiskAdd.h"
#include "memfs/MirafsRamdiskList.h"
#include "memfs/MirafsRamdiskRemove.h"
#include "memfs/MirafsTardiskList.h"

#include <map>
#include <string>

namespace TarselCli {
namespace System {
namespace {

typedef boost::shared_ptr<AutoCli::NamespaceNode> NodePtr;
typedef NodePtr (*NodeFactory)();

template <class CommandClass>
NodePtr Make() {
    return CommandClass::New();
}

// The tree's ramdisk add command does not declare the inode and core dump options.
NodePtr MakeRamdiskAdd() { return MirafsRamdiskAdd::New(false); }

struct TreeRow {
    const char* path;
    const char* description;  // namespaces only; a command describes itself
    NodeFactory factory;      // commands only
};

const TreeRow kTree[] = {
    {"system", "Norlith system properties and commands for configuring properties of the kernel core system.", nullptr},
    {"system boot", "Operations relating to host boot that allow manipulation of Norlith boot time configuration.", nullptr},
    {"system boot device", "Display the system boot device", nullptr},
    {"system boot device get", nullptr, &Make<BootDeviceGet>},
    {"system settings", "Operations that allow viewing and manipulation of system settings.", nullptr},
    {"system settings kernel", "Operations that allow viewing and manipulation of system kernel settings.", nullptr},
    {"system settings advanced", "The advanced settings are a set of Norlith options that specific configuration settings to be modified. These options are typically in place for specific workarounds or debugging.", nullptr},
    {"system settings keyboard", "Operations that relate to the keyboard", nullptr},
    {"system settings keyboard layout", "Operations that relate to keyboard layout", nullptr},
    {"system module", "Operations that allow manipulation of the Norlith loadable modules and device drivers. Operations include load, list and setting options.", nullptr},
    {"system module parameters", "Operations that allow manipulation of parameters of Norlith loadable modules and device drivers. Operations include list and set options.", nullptr},
    {"system coredump", "Operations pertaining to the Norlith Core dump configuration. ", nullptr},
    {"system coredump partition", "Operations pertaining to the Norlith Core dump configuration on Norlith Diagnostic partitions.", nullptr},
    {"system coredump network", "Operations pertaining to the Norlith Core dump configuration on network dump servers.", nullptr},
    {"system coredump file", "Operations pertaining to the Norlith Core dump configuration on QRFS Files.", nullptr},
    {"system secpolicy", "Options related to Norlith access control subsystem. These options are typically in place for specific workarounds or debugging. These commands should be used at the direction of Tarsel Support Engineers.", nullptr},
    {"system secpolicy domain", "Options related to Norlith access control security domains.", nullptr},
    {"system process", "Commands relating to running processes.", nullptr},
    {"system process stats", "Process related statistics", nullptr},
    {"system process stats load", "System load averages", nullptr},
    {"system process stats running", "Number of currently running worlds", nullptr},
    {"system welcomemsg", "Commands to get and set the welcome banner for Tolmar.", nullptr},
    {"system mirafs", "Operations pertaining to the mirafs memory filesytem.", nullptr},
    {"system mirafs get", nullptr, &Make<MirafsGet>},
    {"system mirafs ramdisk", "Operations pertaining to mirafs ramdisks.", nullptr},
    {"system mirafs ramdisk add", nullptr, &MakeRamdiskAdd},
    {"system mirafs ramdisk list", nullptr, &Make<MirafsRamdiskList>},
    {"system mirafs ramdisk remove", nullptr, &Make<MirafsRamdiskRemove>},
    {"system mirafs tardisk", "Operations pertaining to mirafs tardisks.", nullptr},
    {"system mirafs tardisk list", nullptr, &Make<MirafsTardiskList>},
    {"system version", "Commands to get version information.", nullptr},
    {"system version get", nullptr, &Make<VersionGet>},
    {"system time", "Commands to get and set system time.", nullptr},
    {"system stats", "Access to various system statistics", nullptr},
    {"system stats uptime", "System uptime, in microseconds", nullptr},
    {"system uuid", "Get the system UUID", nullptr},
    {"system uuid get", nullptr, &Make<UuidGet>},
    {"system hostname", "Operations pertaining the network name of the Quarn host.", nullptr},
    {"system snmp", "Commands pertaining to SNMPv1/v2c/v3 Agent configuration.", nullptr},
    {"system shutdown", "Command to shutdown the system.", nullptr},
    {"system maintenanceMode", "Command to manage the system's maintenance mode.", nullptr},
};

}  // namespace
}  // namespace System
}  // namespace TarselCli

extern "C" SYSTEM_EXPORT void AutoCli_RegisterNamespaces(
    boost::shared_ptr<Kitbase::AutoCli::NamespaceNode> root) {
    using namespace TarselCli::System;
    std::map<std::string, NodePtr> nodes;
    for (const TreeRow& row : kTree) {
        const std::string path = row.path;
        const std::string::size_type blank = path.rfind(' ');
        if (blank == std::string::npos) {
            NodePtr top = root->SubNamespace(path);
            top->SetDescription(row.description);
            nodes[path] = top;
            continue;
        }
        NodePtr node;
        if (row.factory) {
            node = row.factory();
        } else {
            node = Kitbase::AutoCli::Namespace::New();
            node->SetDescription(row.description);
        }
        nodes.at(path.substr(0, blank))->RegisterNamespaceNode(node, path.substr(blank + 1));
        nodes[path] = node;
    }
}
