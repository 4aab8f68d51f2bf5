// The module commands as a user runs them on the default host: a module shown, listed with a
// filter, loaded (and refused when disabled), enabled for the next boot, its parameters stored
// and listed, and refusals as one line with exit status 1.
#include "support/Files.h"
#include "support/Process.h"
#include "HostFixture.h"

#include <gtest/gtest.h>
#include <nlohmann/json.hpp>

#include <string>
#include <vector>

namespace {

using nlohmann::json;
using Result = testsupport::ProcessResult;

class ModuleEndToEnd : public e2e::HostFixture {
protected:
    void SetUp() override { ASSERT_EQ(Host({"init"}).status, 0); }
    // The listed module of that name as {"Name", "Is Loaded", "Is Enabled"}.
    json Listed(const std::string& name) {
        Result list = Json({"system", "module", "list"});
        EXPECT_EQ(list.status, 0) << list.err;
        for (const json& row : json::parse(list.out))
            if (row["Name"] == name) return row;
        return json();
    }
};

TEST_F(ModuleEndToEnd, AModuleIsShownAndTheListFilters) {
    Result get = Cli({"system", "module", "get", "-m", "stor_nvme_pci"});
    ASSERT_EQ(get.status, 0) << get.err;
    EXPECT_NE(get.out.find("Module: stor_nvme_pci"), std::string::npos) << get.out;
    EXPECT_NE(get.out.find("Provided Namespaces: nvme_api@1.4"), std::string::npos) << get.out;
    EXPECT_EQ(get.out.find("File Version"), std::string::npos) << get.out;

    Result all = Json({"system", "module", "list"});
    ASSERT_EQ(all.status, 0) << all.err;
    const std::size_t total = json::parse(all.out).size();
    EXPECT_GE(total, 100u);
    Result off = Json({"system", "module", "list", "--enabled", "false"});
    ASSERT_EQ(off.status, 0) << off.err;
    EXPECT_GT(json::parse(off.out).size(), 0u);
    for (const json& row : json::parse(off.out)) EXPECT_EQ(row["Is Enabled"], false);

    Result unknown = Cli({"system", "module", "get", "-m", "nosuch"});
    EXPECT_EQ(unknown.status, 1);
    EXPECT_EQ(unknown.err, "unknown module 'nosuch'\n");
    EXPECT_EQ(unknown.out, "");
}

TEST_F(ModuleEndToEnd, LoadEnableAndParametersThroughTheCommandLine) {
    Result refused = Cli({"system", "module", "load", "-m", "stor_raid_sx8"});
    EXPECT_EQ(refused.status, 1);
    EXPECT_EQ(refused.err, "module 'stor_raid_sx8' is disabled, use --force to load.\n");
    EXPECT_EQ(Listed("stor_raid_sx8")["Is Loaded"], false);
    Result forced = Cli({"system", "module", "load", "-m", "stor_raid_sx8", "--force"});
    ASSERT_EQ(forced.status, 0) << forced.err;
    EXPECT_EQ(forced.out, "true\n");
    EXPECT_EQ(Listed("stor_raid_sx8")["Is Loaded"], true);

    ASSERT_EQ(Cli({"system", "module", "set", "-m", "fs_iso", "-e", "false"}).status, 0);
    EXPECT_EQ(Listed("fs_iso")["Is Enabled"], false);

    Result set = Cli({"system", "module", "parameters", "set", "-m", "stor_nvme_pci", "-p", "ioQueues=8 pollMode=y"});
    ASSERT_EQ(set.status, 0) << set.err;
    Result params = Json({"system", "module", "parameters", "list", "-m", "stor_nvme_pci"});
    ASSERT_EQ(params.status, 0) << params.err;
    json rows = json::parse(params.out);
    ASSERT_GE(rows.size(), 2u);
    EXPECT_EQ(rows[0]["Name"], "ioQueues");
    EXPECT_EQ(rows[0]["Value"], "8");
    EXPECT_EQ(rows[1]["Value"], "y");

    Result bad = Cli({"system", "module", "parameters", "set", "-m", "stor_nvme_pci", "-p", "ioQueues"});
    EXPECT_EQ(bad.status, 1);
    EXPECT_EQ(bad.err, "Option string for module 'stor_nvme_pci' refused: expected name=value pairs "
                       "separated by blanks, found 'ioQueues'\n");
    params = Json({"system", "module", "parameters", "list", "-m", "stor_nvme_pci"});
    EXPECT_EQ(json::parse(params.out)[0]["Value"], "8");
}

}  // namespace
