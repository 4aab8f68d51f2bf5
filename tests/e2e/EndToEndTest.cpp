// quarncli and quarnhost as a user runs them: the identity commands through the plug-in and the
// simulated host, faults set with quarnhost, and the refusals a user meets.
#include "support/Files.h"
#include "support/Process.h"
#include "HostFixture.h"

#include <gtest/gtest.h>
#include <nlohmann/json.hpp>

#include <sys/stat.h>

#include <algorithm>
#include <string>
#include <vector>

namespace {

using ordered_json = nlohmann::ordered_json;
using Result = testsupport::ProcessResult;
using testsupport::ReadFile;
using testsupport::RunProgram;
using testsupport::TempDir;
using testsupport::WriteFile;

class EndToEnd : public e2e::HostFixture {
protected:
    // The host's identity as quarnhost exports it (creating the host on first use).
    ordered_json Identity() { return ordered_json::parse(Host({"export"}).out)["identity"]; }
};

TEST_F(EndToEnd, VersionOfTheDefaultHostInTemplateOrder) {
    // The first use creates the host and says where, once.
    const Result first = Json({"system", "version", "get"});
    ASSERT_EQ(first.status, 0) << first.err;
    EXPECT_EQ(first.err,
              "quarncli: created a new simulated host at '" + state_ + "' from the default scenario\n");
    const Result r = Json({"system", "version", "get"});
    ASSERT_EQ(r.status, 0) << r.err;
    EXPECT_EQ(r.err, "");
    EXPECT_EQ(r.out, first.out);
    const ordered_json identity = Identity();
    const ordered_json expected = {{"Product", identity["product"]},
                                   {"Version", identity["version"]},
                                   {"Build", identity["build"]},
                                   {"Update", identity["update"]}};
    EXPECT_EQ(ordered_json::parse(r.out), expected);
}

TEST_F(EndToEnd, VersionDefaultOutputShowsFieldsWithoutStructureHeader) {
    const Result r = Cli({"system", "version", "get"});
    ASSERT_EQ(r.status, 0) << r.err;
    const ordered_json identity = Identity();
    std::size_t last = 0;
    for (const char* field : {"Product", "Version", "Build", "Update"}) {
        const std::string key = std::string(field) == "Product" ? "product"
                              : std::string(field) == "Version" ? "version"
                              : std::string(field) == "Build" ? "build" : "update";
        const std::string line = std::string(field) + ": " + identity[key].get<std::string>();
        const std::size_t at = r.out.find(line);
        ASSERT_NE(at, std::string::npos) << line << "\n" << r.out;
        EXPECT_GE(at, last) << "fields out of order:\n" << r.out;
        last = at;
    }
    EXPECT_EQ(r.out.find("VersionGet"), std::string::npos) << r.out;
}

TEST_F(EndToEnd, UuidAndBootDeviceOfAnImportedHost) {
    ordered_json scenario = {{"format", 1}};
    scenario["identity"]["system_uuid"] = "00000000-1111-2222-3333-444444444444";
    scenario["identity"]["boot_nic_mac"] = "";
    scenario["identity"]["boot_fs_uuid"] = "0123-abcd";
    scenario["identity"]["stateless_boot_nic_mac"] = "00:50:56:00:00:01";
    const std::string file = dir_ / "scenario.json";
    WriteFile(file, scenario.dump(2));
    ASSERT_EQ(Host({"init", "--scenario", file}).status, 0);

    Result r = Json({"system", "uuid", "get"});
    ASSERT_EQ(r.status, 0) << r.err;
    EXPECT_EQ(ordered_json::parse(r.out), "00000000-1111-2222-3333-444444444444");

    r = Json({"system", "boot", "device", "get"});
    ASSERT_EQ(r.status, 0) << r.err;
    const ordered_json expected = {{"Boot NIC", ""},
                                   {"Boot Filesystem UUID", scenario["identity"]["boot_fs_uuid"]},
                                   {"Stateless Boot NIC", "00:50:56:00:00:01"}};
    EXPECT_EQ(ordered_json::parse(r.out), expected);
}

TEST_F(EndToEnd, HostFaultsBecomeTheCommandsErrors) {
    ASSERT_EQ(Cli({"system", "uuid", "get"}).status, 0);  // creates the host
    ASSERT_EQ(Host({"fault", "add", "NorlithCtl::Util::Sysinfo::Get", "record unavailable"}).status, 0);
    ASSERT_EQ(Host({"fault", "add", "NorlithCtl::System::SystemInfoImpl::GetBootFsUUID",
                    "no boot file system", "--times", "1"}).status, 0);

    Result r = Json({"system", "version", "get"});
    EXPECT_EQ(r.status, 1);
    EXPECT_EQ(r.out, "");
    EXPECT_EQ(r.err, "Unable to query product version: record unavailable\n");

    r = Json({"system", "boot", "device", "get"});
    EXPECT_EQ(r.status, 1);
    EXPECT_EQ(r.out, "");
    EXPECT_EQ(r.err, "no boot file system\n");
    // A fault set for one call is gone after it.
    EXPECT_EQ(Json({"system", "boot", "device", "get"}).status, 0);

    const Result journal = Host({"journal"});
    EXPECT_NE(journal.out.find("NorlithCtl::System::SystemInfoImpl::GetBootFsUUID"), std::string::npos)
        << journal.out;
}

TEST_F(EndToEnd, ConstructorFaultEscapingTheCommandIsReportedByTheFramework) {
    ASSERT_EQ(Host({"init"}).status, 0);
    ASSERT_EQ(Host({"fault", "add", "NorlithCtl::System::SystemInfoImpl::SystemInfoImpl",
                    "host agent not responding"}).status, 0);
    const Result r = Json({"system", "uuid", "get"});
    EXPECT_EQ(r.status, 1);
    EXPECT_EQ(r.out, "");
    EXPECT_NE(r.err.find("host agent not responding"), std::string::npos) << r.err;
    EXPECT_EQ(std::count(r.err.begin(), r.err.end(), '\n'), 1) << r.err;
}

TEST_F(EndToEnd, UnusableStateDirectoryIsOneClearError) {
    // A state directory whose database is not a database.
    ASSERT_EQ(mkdir(state_.c_str(), 0700), 0);
    WriteFile(state_ + "/host.db", "this is not a host database, nor any database at all.");
    Result r = Json({"system", "version", "get"});
    EXPECT_EQ(r.status, 1);
    EXPECT_EQ(r.err.rfind("Unable to query product version: ", 0), 0u) << r.err;
    r = Json({"system", "uuid", "get"});
    EXPECT_EQ(r.status, 1);
    EXPECT_EQ(std::count(r.err.begin(), r.err.end(), '\n'), 1) << r.err;
    // The broken file is left as it was.
    EXPECT_EQ(ReadFile(state_ + "/host.db"), "this is not a host database, nor any database at all.");
}

TEST_F(EndToEnd, ADamagedHostDatabaseIsNamedInOneLine) {
    ASSERT_EQ(Host({"init"}).status, 0);
    // Every page but the first (the schema) overwritten; a new host's database has no WAL yet.
    std::string db = ReadFile(state_ + "/host.db");
    ASSERT_GT(db.size(), 4096u);
    WriteFile(state_ + "/host.db", db.substr(0, 4096) + std::string(db.size() - 4096, '\xa5'));
    for (const Result& r : {Json({"system", "version", "get"}), Host({"export"})}) {
        EXPECT_EQ(r.status, 1);
        EXPECT_EQ(r.out, "");
        EXPECT_NE(r.err.find("'" + state_ + "/host.db' is damaged"), std::string::npos) << r.err;
        EXPECT_EQ(r.err.find("SELECT"), std::string::npos) << r.err;
        EXPECT_EQ(std::count(r.err.begin(), r.err.end(), '\n'), 1) << r.err;
    }
}

TEST_F(EndToEnd, SchemaDescribesTheTree) {
    const Result r = RunProgram(QUARNCLI, {"--schema", "system"});
    ASSERT_EQ(r.status, 0) << r.err;
    const ordered_json system = ordered_json::parse(r.out);
    std::size_t namespaces = 0;
    ordered_json version;
    std::vector<ordered_json> pending{system};
    while (!pending.empty()) {
        ordered_json node = pending.back();
        pending.pop_back();
        if (node["kind"] == "namespace") {
            ++namespaces;
            for (const auto& child : node["children"]) pending.push_back(child);
        } else if (node["path"] == "system version get") {
            version = node;
        }
    }
    EXPECT_EQ(namespaces, 33u);
    // What the plug-in's golden schema holds (tests/plugin/schema.json), which grows with the tree.
    std::string root = DEFAULT_SCENARIO;
    root.erase(root.rfind("/scenarios/"));
    EXPECT_EQ(system, ordered_json::parse(testsupport::ReadFile(root + "/tests/plugin/schema.json")));
    ASSERT_FALSE(version.is_null());
    EXPECT_EQ(version["metadata"], ordered_json({{"type", "fetcher"}}));
    EXPECT_EQ(version["formatter"], "simple");
    EXPECT_EQ(version["output_params"],
              ordered_json::parse(R"([["fields:VersionGet","Product,Version,Build,Update"],
                                      ["show-header:VersionGet","false"]])"));
    EXPECT_EQ(version["parameters"], ordered_json::array());
    EXPECT_EQ(version["output"]["kind"], "struct");
    EXPECT_EQ(version["output"]["name"], "VersionGet");
    EXPECT_EQ(version["output"]["fields"].size(), 4u);
}

TEST_F(EndToEnd, UsageErrorsExitTwoWithOneLine) {
    for (const std::vector<std::string>& args :
         {std::vector<std::string>{"system", "verison", "get"},
          std::vector<std::string>{"system", "version", "get", "--verbose"},
          std::vector<std::string>{"system", "version", "get", "extra"},
          std::vector<std::string>{"--formatter", "yaml", "system", "version", "get"}}) {
        const Result r = Cli(args);
        EXPECT_EQ(r.status, 2) << r.err;
        EXPECT_EQ(std::count(r.err.begin(), r.err.end(), '\n'), 1) << r.err;
        EXPECT_EQ(r.out, "");
    }
    const Result r = Cli({"system", "verison", "get"});
    EXPECT_NE(r.err.find("version"), std::string::npos) << r.err;
}

TEST_F(EndToEnd, MissingPluginDirectoryIsRefused) {
    const Result r = Cli({"--plugin-dir", dir_ / "nowhere", "system", "version", "get"});
    EXPECT_NE(r.status, 0);
    EXPECT_NE(r.err.find("nowhere"), std::string::npos) << r.err;
    EXPECT_EQ(r.out, "");
}

}  // namespace
