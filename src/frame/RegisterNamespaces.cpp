// The plug-in's entry point: builds the "system" command tree.
//
// AutoCli_RegisterNamespaces obtains the node "system" from the framework's root and walks one
// table, in order: each row is either a namespace with its description or a command leaf made by
// its class's factory, attached to its parent under the last word of its path. The table lists
// the tree depth first (a parent before its children, each subtree contiguous), so children end
// up attached in table order; a row out of that order is a programming error (std::logic_error).
// When the function returns, the framework owns the tree; nothing here keeps a reference.
#include "frame/CommandModel.h"
#include "frame/Export.h"
// identity, time and console
#include "identity/BootDeviceGet.h"
#include "identity/HostnameGet.h"
#include "identity/HostnameSet.h"
#include "identity/TimeGetSystem.h"
#include "identity/TimeGetUptime.h"
#include "identity/TimeSetSystem.h"
#include "identity/UuidGet.h"
#include "identity/VersionGet.h"
#include "identity/WelcomeMessageGet.h"
#include "identity/WelcomeMessageSet.h"
// processes and security policy
#include "process/ProcessList.h"
#include "process/ProcessStatsLoadGet.h"
#include "process/ProcessStatsRunningGet.h"
#include "process/SecpolicyDomainList.h"
#include "process/SecpolicyDomainSet.h"

// SNMP agent
#include "snmp/SnmpAgentGet.h"
#include "snmp/SnmpAgentHash.h"
#include "snmp/SnmpAgentSet.h"
#include "snmp/SnmpAgentTest.h"

// power and maintenance
#include "power/MaintenanceModeGet.h"
#include "power/MaintenanceModeSet.h"
#include "power/Shutdown.h"

// kernel settings
#include "settings/SettingsAdvancedList.h"
#include "settings/SettingsAdvancedSet.h"
#include "settings/SettingsKernelList.h"
#include "settings/SettingsKernelSet.h"
#include "settings/SettingsKeyboardLayoutGet.h"
#include "settings/SettingsKeyboardLayoutList.h"
#include "settings/SettingsKeyboardLayoutSet.h"

// kernel modules
#include "module/ModuleGet.h"
#include "module/ModuleList.h"
#include "module/ModuleLoad.h"
#include "module/ModuleParametersList.h"
#include "module/ModuleParametersSet.h"
#include "module/ModuleSet.h"

// core dump
#include "coredump/KernelDumpAddFile.h"
#include "coredump/KernelDumpCheckNetwork.h"
#include "coredump/KernelDumpGetFile.h"
#include "coredump/KernelDumpGetNetwork.h"
#include "coredump/KernelDumpGetPartition.h"
#include "coredump/KernelDumpListFiles.h"
#include "coredump/KernelDumpListPartitions.h"
#include "coredump/KernelDumpRemoveFile.h"
#include "coredump/KernelDumpSetFile.h"
#include "coredump/KernelDumpSetNetwork.h"
#include "coredump/KernelDumpSetPartition.h"

// memory file system
#include "memfs/MirafsGet.h"
#include "memfs/MirafsRamdiskAdd.h"
#include "memfs/MirafsRamdiskList.h"
#include "memfs/MirafsRamdiskRemove.h"
#include "memfs/MirafsTardiskList.h"

#include <algorithm>
#include <stdexcept>
#include <string>
#include <utility>
#include <vector>

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
    {"system settings kernel list", nullptr, &Make<SettingsKernelList>},
    {"system settings kernel set", nullptr, &Make<SettingsKernelSet>},
    {"system settings advanced", "The advanced settings are a set of Norlith options that specific configuration settings to be modified. These options are typically in place for specific workarounds or debugging.", nullptr},
    {"system settings advanced list", nullptr, &Make<SettingsAdvancedList>},
    {"system settings advanced set", nullptr, &Make<SettingsAdvancedSet>},
    {"system settings keyboard", "Operations that relate to the keyboard", nullptr},
    {"system settings keyboard layout", "Operations that relate to keyboard layout", nullptr},
    {"system settings keyboard layout get", nullptr, &Make<SettingsKeyboardLayoutGet>},
    {"system settings keyboard layout set", nullptr, &Make<SettingsKeyboardLayoutSet>},
    {"system settings keyboard layout list", nullptr, &Make<SettingsKeyboardLayoutList>},
    {"system module", "Operations that allow manipulation of the Norlith loadable modules and device drivers. Operations include load, list and setting options.", nullptr},
    {"system module get", nullptr, &Make<ModuleGet>},
    {"system module parameters", "Operations that allow manipulation of parameters of Norlith loadable modules and device drivers. Operations include list and set options.", nullptr},
    {"system module parameters list", nullptr, &Make<ModuleParametersList>},
    {"system module parameters set", nullptr, &Make<ModuleParametersSet>},
    {"system module list", nullptr, &Make<ModuleList>},
    {"system module load", nullptr, &Make<ModuleLoad>},
    {"system module set", nullptr, &Make<ModuleSet>},
    {"system coredump", "Operations pertaining to the Norlith Core dump configuration. ", nullptr},
    {"system coredump partition", "Operations pertaining to the Norlith Core dump configuration on Norlith Diagnostic partitions.", nullptr},
    {"system coredump partition get", nullptr, &Make<KernelDumpGetPartition>},
    {"system coredump partition list", nullptr, &Make<KernelDumpListPartitions>},
    {"system coredump partition set", nullptr, &Make<KernelDumpSetPartition>},
    {"system coredump network", "Operations pertaining to the Norlith Core dump configuration on network dump servers.", nullptr},
    {"system coredump network set", nullptr, &Make<KernelDumpSetNetwork>},
    {"system coredump network get", nullptr, &Make<KernelDumpGetNetwork>},
    {"system coredump network check", nullptr, &Make<KernelDumpCheckNetwork>},
    {"system coredump file", "Operations pertaining to the Norlith Core dump configuration on QRFS Files.", nullptr},
    {"system coredump file get", nullptr, &Make<KernelDumpGetFile>},
    {"system coredump file set", nullptr, &Make<KernelDumpSetFile>},
    {"system coredump file add", nullptr, &Make<KernelDumpAddFile>},
    {"system coredump file remove", nullptr, &Make<KernelDumpRemoveFile>},
    {"system coredump file list", nullptr, &Make<KernelDumpListFiles>},
    {"system secpolicy", "Options related to Norlith access control subsystem. These options are typically in place for specific workarounds or debugging. These commands should be used at the direction of Tarsel Support Engineers.", nullptr},
    {"system secpolicy domain", "Options related to Norlith access control security domains.", nullptr},
    {"system secpolicy domain list", nullptr, &Make<SecpolicyDomainList>},
    {"system secpolicy domain set", nullptr, &Make<SecpolicyDomainSet>},
    {"system process", "Commands relating to running processes.", nullptr},
    {"system process list", nullptr, &Make<ProcessList>},
    {"system process stats", "Process related statistics", nullptr},
    {"system process stats load", "System load averages", nullptr},
    {"system process stats load get", nullptr, &Make<ProcessStatsLoadGet>},
    {"system process stats running", "Number of currently running worlds", nullptr},
    {"system process stats running get", nullptr, &Make<ProcessStatsRunningGet>},
    {"system welcomemsg", "Commands to get and set the welcome banner for Tolmar.", nullptr},
    {"system welcomemsg set", nullptr, &Make<WelcomeMessageSet>},
    {"system welcomemsg get", nullptr, &Make<WelcomeMessageGet>},
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
    {"system time get", nullptr, &Make<TimeGetSystem>},
    {"system time set", nullptr, &Make<TimeSetSystem>},
    {"system stats", "Access to various system statistics", nullptr},
    {"system stats uptime", "System uptime, in microseconds", nullptr},
    {"system stats uptime get", nullptr, &Make<TimeGetUptime>},
    {"system uuid", "Get the system UUID", nullptr},
    {"system uuid get", nullptr, &Make<UuidGet>},
    {"system hostname", "Operations pertaining the network name of the Quarn host.", nullptr},
    {"system hostname set", nullptr, &Make<HostnameSet>},
    {"system hostname get", nullptr, &Make<HostnameGet>},
    {"system snmp", "Commands pertaining to SNMPv1/v2c/v3 Agent configuration.", nullptr},
    {"system snmp set", nullptr, &Make<SnmpAgentSet>},
    {"system snmp get", nullptr, &Make<SnmpAgentGet>},
    {"system snmp test", nullptr, &Make<SnmpAgentTest>},
    {"system snmp hash", nullptr, &Make<SnmpAgentHash>},
    {"system shutdown", "Command to shutdown the system.", nullptr},
    {"system shutdown poweroff", nullptr, [] { return NodePtr(Shutdown::New(Shutdown::PowerOff)); }},
    {"system shutdown reboot", nullptr, [] { return NodePtr(Shutdown::New(Shutdown::Reboot)); }},
    {"system maintenanceMode", "Command to manage the system's maintenance mode.", nullptr},
    {"system maintenanceMode set", nullptr, &Make<MaintenanceModeSet>},
    {"system maintenanceMode get", nullptr, &Make<MaintenanceModeGet>},
};

}  // namespace
}  // namespace System
}  // namespace TarselCli

extern "C" SYSTEM_EXPORT void AutoCli_RegisterNamespaces(
    boost::shared_ptr<Kitbase::AutoCli::NamespaceNode> root) {
    using namespace TarselCli::System;
    // The table is depth first, so a row's parent is the last node seen one level up.
    std::vector<std::pair<std::string, NodePtr> > open;  // path and node, by depth
    for (const TreeRow& row : kTree) {
        const std::string path = row.path;
        const std::string::size_type blank = path.rfind(' ');
        const std::size_t depth = static_cast<std::size_t>(std::count(path.begin(), path.end(), ' '));
        NodePtr node;
        if (blank == std::string::npos) {
            node = root->SubNamespace(path);
            node->SetDescription(row.description);
        } else {
            if (depth > open.size() || open[depth - 1].first != path.substr(0, blank))
                throw std::logic_error("the tree table is not depth first at '" + path + "'");
            if (row.factory) {
                node = row.factory();
            } else {
                node = Kitbase::AutoCli::Namespace::New();
                node->SetDescription(row.description);
            }
            open[depth - 1].second->RegisterNamespaceNode(node, path.substr(blank + 1));
        }
        open.resize(depth);
        open.emplace_back(path, node);
    }
}
