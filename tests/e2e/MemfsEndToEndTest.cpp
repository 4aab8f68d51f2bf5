// The memory file system as a user meets it through quarncli: a ramdisk added, listed, refused
// and removed on a host made by quarnhost, and the status and tardisks of the default host.
#include "support/Files.h"
#include "support/Process.h"
#include "HostFixture.h"

#include <gtest/gtest.h>
#include <nlohmann/json.hpp>

#include <string>
#include <vector>

namespace {

using Result = testsupport::ProcessResult;
using testsupport::RunProgram;
using testsupport::TempDir;

class MemfsEndToEnd : public e2e::HostFixture {
protected:
    nlohmann::json Json(std::vector<std::string> args) {
        args.insert(args.begin(), {"--formatter", "json"});
        Result r = Cli(args);
        EXPECT_EQ(r.status, 0) << r.err;
        return nlohmann::json::parse(r.out);
    }
    std::vector<std::string> Names() {
        std::vector<std::string> names;
        for (const auto& row : Json({"system", "mirafs", "ramdisk", "list"})) names.push_back(row["Ramdisk Name"]);
        return names;
    }
};

TEST_F(MemfsEndToEnd, ARamdiskIsAddedListedRefusedAndRemoved) {
    testsupport::WriteFile(dir_ / "host.json", R"({"format": 1, "ramdisks": [],
      "files": [{"path": "/srv/cache", "type": "directory"}]})");
    ASSERT_EQ(RunProgram(QUARNHOST, {"--state", state_, "init", "--scenario", dir_ / "host.json"}).status, 0);

    Result added = Cli({"system", "mirafs", "ramdisk", "add", "-m", "16", "-M", "32", "-p", "0755", "-n", "cache",
                        "-t", "/srv/cache"});
    ASSERT_EQ(added.status, 0) << added.err;
    EXPECT_EQ(added.out, "true\n");
    nlohmann::json rows = Json({"system", "mirafs", "ramdisk", "list"});
    ASSERT_EQ(rows.size(), 1u);
    EXPECT_EQ(rows[0], nlohmann::json::parse(R"({"Ramdisk Name": "cache", "System": false,
        "Include in Coredumps": false, "Reserved": 16384, "Maximum": 32768, "Used": 0, "Peak Used": 0,
        "Free": 100, "Reserved Free": 100, "Maximum Inodes": 8192, "Allocated Inodes": 0,
        "Used Inodes": 0, "Mount Point": "/srv/cache"})"));

    // The kernel's refusals, and the comma the command refuses itself: exit 1, one line, no change.
    struct Case {
        std::vector<std::string> args;
        std::string error;
    } refused[] = {
        {{"add", "-m", "1", "-M", "2", "-p", "0755", "-n", "cache", "-t", "/srv"}, "File exists\n"},
        {{"add", "-m", "1", "-M", "2", "-p", "0755", "-n", "other", "-t", "/srv/cache"}, "Device or resource busy\n"},
        {{"add", "-m", "3", "-M", "2", "-p", "0755", "-n", "other", "-t", "/srv"}, "Invalid argument\n"},
        {{"add", "-m", "1", "-M", "2", "-p", "0755", "-n", "a,b", "-t", "/srv"},
         "Invalid name 'a,b': a ramdisk name cannot contain ','\n"},
        {{"remove", "-t", "/srv"}, "Invalid argument\n"},
    };
    for (const Case& c : refused) {
        std::vector<std::string> args = {"system", "mirafs", "ramdisk"};
        args.insert(args.end(), c.args.begin(), c.args.end());
        Result r = Cli(args);
        EXPECT_EQ(r.status, 1) << c.error;
        EXPECT_EQ(r.err, c.error);
        EXPECT_EQ(r.out, "");
    }
    EXPECT_EQ(Names(), std::vector<std::string>{"cache"});

    Result removed = Cli({"system", "mirafs", "ramdisk", "remove", "-t", "/srv/cache"});
    ASSERT_EQ(removed.status, 0) << removed.err;
    EXPECT_TRUE(Names().empty());
}

TEST_F(MemfsEndToEnd, TheDefaultHostShowsItsFileSystem) {
    nlohmann::json status = Json({"system", "mirafs", "get"});
    EXPECT_EQ(status.size(), 9u);
    EXPECT_GT(status["Total Inodes"].get<long long>(), status["Used Inodes"].get<long long>());
    for (const auto& row : Json({"system", "mirafs", "ramdisk", "list"})) {
        EXPECT_TRUE(row["System"].get<bool>()) << row;
        EXPECT_GT(row["Used"].get<long long>(), 0) << row;
        EXPECT_LE(row["Used"].get<long long>(), row["Maximum"].get<long long>()) << row;
    }
    EXPECT_EQ(Json({"system", "mirafs", "tardisk", "list"}).size(), 12u);
    // A system ramdisk stays.
    Result r = Cli({"system", "mirafs", "ramdisk", "remove", "-t", "/etc"});
    EXPECT_EQ(r.status, 1);
    EXPECT_EQ(r.err, "Device or resource busy\n");
}

}  // namespace
