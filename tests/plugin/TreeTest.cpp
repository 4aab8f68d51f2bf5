// The "system" tree the entry point builds, held to the golden schema (schema.json beside this
// file): every node's path, kind, description and order, and each command's metadata, formatter,
// output parameters, parameters and result shape, as `quarncli --schema system` prints them.
// Set QUARN_UPDATE_GOLDEN=1 to rewrite the golden file from the current build, then review the
// difference.
#include "Harness.h"

#include "support/Files.h"
#include "support/Process.h"

#include <dlfcn.h>
#include <gtest/gtest.h>
#include <nlohmann/json.hpp>

#include <cstdlib>
#include <string>
#include <vector>

namespace {

using Kitbase::AutoCli::Command;
using Kitbase::AutoCli::Namespace;
using Kitbase::AutoCli::NamespaceNode;

const std::string kGolden = std::string(PLUGIN_TEST_DIR) + "/schema.json";

std::string PluginDir() {
    std::string plugin = SYSTEM_PLUGIN;
    return plugin.substr(0, plugin.rfind('/'));
}

TEST(Tree, SchemaMatchesTheGoldenFile) {
    testsupport::ProcessResult schema =
        testsupport::RunProgram(QUARNCLI, {"--plugin-dir", PluginDir(), "--schema", "system"});
    ASSERT_EQ(schema.status, 0) << schema.err;
    const char* update = std::getenv("QUARN_UPDATE_GOLDEN");
    if (update && std::string(update) == "1") testsupport::WriteFile(kGolden, schema.out);
    EXPECT_EQ(schema.out, testsupport::ReadFile(kGolden))
        << "the tree differs from " << kGolden << "; QUARN_UPDATE_GOLDEN=1 rewrites it";
}

TEST(Tree, ThirtyThreeNamespaces) {
    nlohmann::json schema = nlohmann::json::parse(testsupport::ReadFile(kGolden));
    std::size_t namespaces = 0;
    std::vector<const nlohmann::json*> pending{&schema};
    while (!pending.empty()) {
        const nlohmann::json& node = *pending.back();
        pending.pop_back();
        if (node["kind"] == "namespace") {
            ++namespaces;
            for (const auto& child : node["children"]) pending.push_back(&child);
        }
    }
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
    std::vector<std::string> paths = plugintest::CommandPaths();
    ASSERT_FALSE(paths.empty());
    for (const std::string& path : paths)
        EXPECT_NE(plugintest::FindCommand(path), plugintest::FindCommand(path)) << path;
}

// The built plug-in, loaded as quarncli loads it, builds the same tree as the objects linked here.
TEST(Plugin, TheLoadedPluginBuildsTheSameTree) {
    void* module = dlopen(SYSTEM_PLUGIN, RTLD_NOW | RTLD_LOCAL);
    ASSERT_NE(module, nullptr) << dlerror();
    {
        auto entry = reinterpret_cast<AutoCli_RegisterNamespacesFn>(
            dlsym(module, "AutoCli_RegisterNamespaces"));
        ASSERT_NE(entry, nullptr);
        boost::shared_ptr<NamespaceNode> root = Namespace::New();
        entry(root);
        EXPECT_EQ(plugintest::CommandPaths(root), plugintest::CommandPaths());
    }
    dlclose(module);
}

}  // namespace
