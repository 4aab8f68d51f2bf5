// The kernel settings commands as a user runs them: advanced options listed and changed through
// quarncli with the change kept by the host, refusals with exit status 1 and one line, and the
// keyboard layout kept apart for now and later boots.
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

class SettingsEndToEnd : public e2e::HostFixture {
protected:
    void SetUp() override { ASSERT_EQ(Host({"init"}).status, 0); }
};

TEST_F(SettingsEndToEnd, AnAdvancedOptionIsChangedListedAndResetThroughTheCommandLine) {
    Result set = Cli({"system", "settings", "advanced", "set", "--option", "/Net/Tcp/MssDefault", "--int-value", "9000"});
    ASSERT_EQ(set.status, 0) << set.err;
    EXPECT_EQ(set.out, "true\n");
    Result listed = Json({"system", "settings", "advanced", "list", "-o", "/Net/Tcp/MssDefault"});
    ASSERT_EQ(listed.status, 0) << listed.err;
    json row = json::parse(listed.out).at(0);
    EXPECT_EQ(row["Int Value"], 9000);
    EXPECT_EQ(row["Default Int Value"], 1460);
    EXPECT_EQ(row["String Value"], "");

    Result delta = Json({"system", "settings", "advanced", "list", "--tree", "Net/Tcp", "--delta"});
    ASSERT_EQ(delta.status, 0) << delta.err;
    bool found = false;
    for (const json& option : json::parse(delta.out)) found = found || option["Path"] == "/Net/Tcp/MssDefault";
    EXPECT_TRUE(found) << delta.out;

    ASSERT_EQ(Cli({"system", "settings", "advanced", "set", "-o", "/Net/Tcp/MssDefault", "-d"}).status, 0);
    listed = Json({"system", "settings", "advanced", "list", "-o", "/Net/Tcp/MssDefault"});
    EXPECT_EQ(json::parse(listed.out).at(0)["Int Value"], 1460);
}

TEST_F(SettingsEndToEnd, RefusalsAreOneLineWithStatusOneAndNothingChanges) {
    const std::string before = Host({"export"}).out;
    Result r = Cli({"system", "settings", "advanced", "set", "-o", "/Net/Tcp/MssDefault", "-i", "70000"});
    EXPECT_EQ(r.status, 1);
    EXPECT_EQ(r.err, "Value 70000 is out of range for option /Net/Tcp/MssDefault: it accepts an integer from 536 to 9000\n");
    r = Cli({"system", "settings", "advanced", "set", "-o", "/Net/Tcp/MssDefault", "-i", "-1"});
    EXPECT_EQ(r.status, 2) << "the framework holds --int-value to 0..4294967295";
    r = Cli({"system", "settings", "advanced", "set", "-o", "/Net/Tcp/MssDefault", "-i", "many"});
    EXPECT_EQ(r.status, 2);
    r = Cli({"system", "settings", "advanced", "list", "--tree", "/Net/Nope"});
    EXPECT_EQ(r.status, 1);
    EXPECT_EQ(r.err, "Invalid value for --tree No tree with the name /Net/Nope found\n");
    r = Cli({"system", "settings", "kernel", "set", "-s", "logLevel", "-v", "eight"});
    EXPECT_EQ(r.status, 1);
    r = Cli({"system", "settings", "keyboard", "layout", "set", "-l", "Elvish"});
    EXPECT_EQ(r.status, 1);
    EXPECT_EQ(Host({"export"}).out, before);
}

TEST_F(SettingsEndToEnd, AKernelSettingAndAKeyboardLayoutForLaterBoots) {
    ASSERT_EQ(Cli({"system", "settings", "kernel", "set", "--setting", "logLevel", "--value", "5"}).status, 0);
    Result r = Json({"system", "settings", "kernel", "list", "--option", "logLevel"});
    ASSERT_EQ(r.status, 0) << r.err;
    EXPECT_EQ(json::parse(r.out).at(0)["Configured"], "5");
    EXPECT_EQ(json::parse(r.out).at(0)["Runtime"], "3");

    ASSERT_EQ(Cli({"system", "settings", "keyboard", "layout", "set", "-l", "German"}).status, 0);
    ASSERT_EQ(Cli({"system", "settings", "keyboard", "layout", "set", "-l", "French", "--no-persist"}).status, 0);
    EXPECT_EQ(Cli({"system", "settings", "keyboard", "layout", "get"}).out, "French\n");
    json keyboard = json::parse(Host({"export"}).out)["keyboard"];
    EXPECT_EQ(keyboard["current"], "French");
    EXPECT_EQ(keyboard["configured"], "German");
}

}  // namespace
