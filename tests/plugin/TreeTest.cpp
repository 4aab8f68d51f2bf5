// The "system" tree the entry point builds: every node's path, kind, description and order, and
// the settings each command makes in its constructor, checked against one expected table.
#include <kitbase/AutoCli.h>

#include <dlfcn.h>
#include <gtest/gtest.h>

#include <string>
#include <vector>

extern "C" void AutoCli_RegisterNamespaces(boost::shared_ptr<Kitbase::AutoCli::NamespaceNode> root);

namespace {

using Kitbase::AutoCli::Command;
using Kitbase::AutoCli::Namespace;
using Kitbase::AutoCli::NamespaceNode;

struct Row {
    const char* path;
    const char* command;  // the command class, or null for a namespace
    const char* description;
    const char* type;
    const char* formatter;
};

// Depth first, children in attachment order.
const Row kExpected[] = {
    {"system", nullptr, "Norlith system properties and commands for configuring properties of the kernel core system.", nullptr, nullptr},
    {"system boot", nullptr, "Operations relating to host boot that allow manipulation of Norlith boot time configuration.", nullptr, nullptr},
    {"system boot device", nullptr, "Display the system boot device", nullptr, nullptr},
    {"system boot device get", "BootDeviceGet", "Get the systems boot device.", "fetcher", "simple"},
    {"system settings", nullptr, "Operations that allow viewing and manipulation of system settings.", nullptr, nullptr},
    {"system settings kernel", nullptr, "Operations that allow viewing and manipulation of system kernel settings.", nullptr, nullptr},
    {"system settings advanced", nullptr, "The advanced settings are a set of Norlith options that specific configuration settings to be modified. These options are typically in place for specific workarounds or debugging.", nullptr, nullptr},
    {"system settings keyboard", nullptr, "Operations that relate to the keyboard", nullptr, nullptr},
    {"system settings keyboard layout", nullptr, "Operations that relate to keyboard layout", nullptr, nullptr},
    {"system module", nullptr, "Operations that allow manipulation of the Norlith loadable modules and device drivers. Operations include load, list and setting options.", nullptr, nullptr},
    {"system module parameters", nullptr, "Operations that allow manipulation of parameters of Norlith loadable modules and device drivers. Operations include list and set options.", nullptr, nullptr},
    {"system coredump", nullptr, "Operations pertaining to the Norlith Core dump configuration. ", nullptr, nullptr},
    {"system coredump partition", nullptr, "Operations pertaining to the Norlith Core dump configuration on Norlith Diagnostic partitions.", nullptr, nullptr},
    {"system coredump network", nullptr, "Operations pertaining to the Norlith Core dump configuration on network dump servers.", nullptr, nullptr},
    {"system coredump file", nullptr, "Operations pertaining to the Norlith Core dump configuration on QRFS Files.", nullptr, nullptr},
    {"system secpolicy", nullptr, "Options related to Norlith access control subsystem. These options are typically in place for specific workarounds or debugging. These commands should be used at the direction of Tarsel Support Engineers.", nullptr, nullptr},
    {"system secpolicy domain", nullptr, "Options related to Norlith access control security domains.", nullptr, nullptr},
    {"system process", nullptr, "Commands relating to running processes.", nullptr, nullptr},
    {"system process stats", nullptr, "Process related statistics", nullptr, nullptr},
    {"system process stats load", nullptr, "System load averages", nullptr, nullptr},
    {"system process stats running", nullptr, "Number of currently running worlds", nullptr, nullptr},
    {"system welcomemsg", nullptr, "Commands to get and set the welcome banner for Tolmar.", nullptr, nullptr},
    {"system mirafs", nullptr, "Operations pertaining to the mirafs memory filesytem.", nullptr, nullptr},
    {"system mirafs ramdisk", nullptr, "Operations pertaining to mirafs ramdisks.", nullptr, nullptr},
    {"system mirafs tardisk", nullptr, "Operations pertaining to mirafs tardisks.", nullptr, nullptr},
    {"system version", nullptr, "Commands to get version information.", nullptr, nullptr},
    {"system version get", "VersionGet", "Display the product name, version and build information.", "fetcher", "simple"},
    {"system time", nullptr, "Commands to get and set system time.", nullptr, nullptr},
    {"system stats", nullptr, "Access to various system statistics", nullptr, nullptr},
    {"system stats uptime", nullptr, "System uptime, in microseconds", nullptr, nullptr},
    {"system uuid", nullptr, "Get the system UUID", nullptr, nullptr},
    {"system uuid get", "UuidGet", "Get the system UUID.", "fetcher", "simple"},
    {"system hostname", nullptr, "Operations pertaining the network name of the Quarn host.", nullptr, nullptr},
    {"system snmp", nullptr, "Commands pertaining to SNMPv1/v2c/v3 Agent configuration.", nullptr, nullptr},
    {"system shutdown", nullptr, "Command to shutdown the system.", nullptr, nullptr},
    {"system maintenanceMode", nullptr, "Command to manage the system's maintenance mode.", nullptr, nullptr},
};

struct Visited {
    std::string path;
    bool isCommand;
    std::string description;
    boost::shared_ptr<NamespaceNode> node;
};

void Walk(const boost::shared_ptr<NamespaceNode>& node, const std::string& path,
          std::vector<Visited>& out) {
    out.push_back({path, node->IsCommand(), node->GetDescription(), node});
    for (const NamespaceNode::Child& child : node->GetChildren()) {
        Walk(child.second, path + " " + child.first, out);
    }
}

std::vector<Visited> BuildTree(AutoCli_RegisterNamespacesFn entry) {
    boost::shared_ptr<NamespaceNode> root = Namespace::New();
    entry(root);
    EXPECT_EQ(root->GetChildren().size(), 1u);
    std::vector<Visited> visited;
    Walk(root->GetChild("system"), "system", visited);
    return visited;
}

void ExpectTreeAsSpecified(const std::vector<Visited>& visited) {
    const std::size_t expected = sizeof kExpected / sizeof kExpected[0];
    ASSERT_EQ(visited.size(), expected);
    for (std::size_t i = 0; i < expected; ++i) {
        const Row& row = kExpected[i];
        const Visited& node = visited[i];
        SCOPED_TRACE(row.path);
        EXPECT_EQ(node.path, row.path);
        EXPECT_EQ(node.description, row.description);
        ASSERT_EQ(node.isCommand, row.command != nullptr);
        if (!row.command) continue;
        boost::shared_ptr<Command> command = boost::dynamic_pointer_cast<Command>(node.node);
        ASSERT_TRUE(command);
        EXPECT_TRUE(node.node->GetChildren().empty());
        EXPECT_EQ(command->GetMetaDataField("type"), row.type);
        EXPECT_EQ(command->GetDefaultOutputFormatter(), row.formatter);
    }
}

TEST(Tree, EveryNodeInOrderWithItsDescription) { ExpectTreeAsSpecified(BuildTree(&AutoCli_RegisterNamespaces)); }

TEST(Tree, ThirtyThreeNamespaces) {
    std::size_t namespaces = 0;
    for (const Visited& node : BuildTree(&AutoCli_RegisterNamespaces)) namespaces += !node.isCommand;
    EXPECT_EQ(namespaces, 33u);
}

TEST(Tree, ExistingSystemNodeIsExtendedNotReplaced) {
    boost::shared_ptr<NamespaceNode> root = Namespace::New();
    boost::shared_ptr<NamespaceNode> system = root->SubNamespace("system");
    system->RegisterNamespaceNode(Namespace::New(), "other");
    AutoCli_RegisterNamespaces(root);
    ASSERT_EQ(root->GetChild("system"), system);
    EXPECT_EQ(system->GetChildren().front().first, "other");
    EXPECT_TRUE(system->GetChild("version"));
}

TEST(Tree, EachRegistrationMakesItsOwnCommandObjects) {
    std::vector<Visited> first = BuildTree(&AutoCli_RegisterNamespaces);
    std::vector<Visited> second = BuildTree(&AutoCli_RegisterNamespaces);
    ASSERT_EQ(first.size(), second.size());
    for (std::size_t i = 0; i < first.size(); ++i) EXPECT_NE(first[i].node, second[i].node);
}

// The built plug-in exports its entry point and hides everything else.
TEST(Plugin, ExportsOnlyTheEntryPoint) {
    void* module = dlopen(SYSTEM_PLUGIN, RTLD_NOW | RTLD_LOCAL);
    ASSERT_NE(module, nullptr) << dlerror();
    {
        auto entry = reinterpret_cast<AutoCli_RegisterNamespacesFn>(
            dlsym(module, "AutoCli_RegisterNamespaces"));
        ASSERT_NE(entry, nullptr);
        ExpectTreeAsSpecified(BuildTree(entry));
    }
    EXPECT_EQ(dlsym(module, "_ZN9TarselCli6System10VersionGet3NewEv"), nullptr);
    dlclose(module);
}

}  // namespace
