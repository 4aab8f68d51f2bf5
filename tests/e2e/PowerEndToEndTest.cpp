// quarncli and quarnhost as a user runs them for maintenance mode, reboot and power-off, and the
// host's clock: a host put in maintenance mode by one process reboots in the next, is up again
// for the one after, and quarnhost shows the reason in both logs; the clock set by one process
// is the one the next reads.
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
using testsupport::RunProgram;
using testsupport::TempDir;

class PowerEndToEnd : public e2e::HostFixture {
protected:
    void SetUp() override {
        // Sleeps on this host return at once.
        testsupport::WriteFile(dir_ / "fast.json", R"({"format": 1, "simulation": {"sleep_percent": 0}})");
        Result init = Host({"init", "--scenario", dir_ / "fast.json"});
        ASSERT_EQ(init.status, 0) << init.err;
    }
    json Lines(const std::string& text) {
        json lines = json::array();
        std::string::size_type start = 0, end;
        while ((end = text.find('\n', start)) != std::string::npos) {
            lines.push_back(json::parse(text.substr(start, end - start)));
            start = end + 1;
        }
        return lines;
    }
};

TEST_F(PowerEndToEnd, AHostInMaintenanceModeRebootsAndIsUpForTheNextCommand) {
    Result refused = Cli({"system", "shutdown", "reboot", "-r", "kernel patch"});
    EXPECT_EQ(refused.status, 1);
    EXPECT_EQ(refused.err, "System is not in maintenance mode. Cannot perform requested operation.\n");

    Result enter = Cli({"system", "maintenanceMode", "set", "--enable", "true", "--timeout", "30"});
    ASSERT_EQ(enter.status, 0) << enter.err;
    EXPECT_EQ(enter.out, "true\n");
    EXPECT_EQ(Cli({"system", "maintenanceMode", "get"}).out, "Enabled\n");
    Result again = Cli({"system", "maintenanceMode", "set", "-e", "yes"});
    EXPECT_EQ(again.status, 1);
    EXPECT_EQ(again.err, "Maintenance mode is already enabled.\n");

    Result reboot = Cli({"system", "shutdown", "reboot", "--reason", "kernel patch 7%", "--delay", "20"});
    ASSERT_EQ(reboot.status, 0) << reboot.err;
    EXPECT_EQ(reboot.out, "true\n");
    // Each process may request one operation: the next process powers the host off.
    Result off = Cli({"system", "shutdown", "poweroff", "-r", "rack move"});
    ASSERT_EQ(off.status, 0) << off.err;

    json observations = Lines(Host({"observations", "--json", "--limit", "2"}).out);
    ASSERT_EQ(observations.size(), 2u);
    EXPECT_EQ(observations[0]["event"], "quill.user.quarncli.host.reboot");
    EXPECT_EQ(observations[0]["message"], "Reason for reboot: <kernel patch 7%>");
    EXPECT_EQ(observations[1]["event"], "quill.user.quarncli.host.poweroff");
    json syslog = Lines(Host({"syslog", "--json"}).out);
    ASSERT_FALSE(syslog.empty());
    EXPECT_EQ(syslog[0]["message"], "Reason for reboot: <kernel patch 7%>");
    EXPECT_EQ(syslog[0]["priority"], 2);
    EXPECT_NE(Host({"observations"}).out.find("quill.user.quarncli.host.poweroff"), std::string::npos);

    json boot = json::parse(Host({"export"}).out)["boot"];
    EXPECT_EQ(boot["boot_count"], 3);
    EXPECT_EQ(boot["last_request"], "poweroff");
    Result uptime = Cli({"system", "stats", "uptime", "get"});
    ASSERT_EQ(uptime.status, 0) << uptime.err;
    EXPECT_LT(std::stoll(uptime.out), 60LL * 1000000) << "the uptime started again";
    EXPECT_EQ(Cli({"system", "maintenanceMode", "get"}).out, "Enabled\n");
    EXPECT_EQ(Cli({"system", "maintenanceMode", "set", "-e", "false"}).status, 0);
    EXPECT_EQ(Cli({"system", "maintenanceMode", "get"}).out, "Disabled\n");
}

TEST_F(PowerEndToEnd, TheFrameworkRefusesADelayOutsideItsRange) {
    for (const char* delay : {"9", "4294967296", "-10"}) {
        Result result = Cli({"system", "shutdown", "poweroff", "-r", "x", "-d", delay});
        EXPECT_EQ(result.status, 2) << delay;
        EXPECT_NE(result.err.find("10 to 4294967295"), std::string::npos) << result.err;
    }
    EXPECT_EQ(Cli({"system", "shutdown", "reboot"}).status, 2) << "the reason is required";
}

TEST_F(PowerEndToEnd, TheClockSetByOneProcessIsTheOneTheNextReads) {
    Result set = Cli({"system", "time", "set", "-y", "2031", "-M", "2", "-d", "30", "-H", "23", "-m", "59", "-s", "0"});
    ASSERT_EQ(set.status, 0) << set.err;
    EXPECT_EQ(set.out, "true\n");
    Result get = Cli({"system", "time", "get"});
    ASSERT_EQ(get.status, 0) << get.err;
    EXPECT_EQ(get.out.substr(0, 16), "2031-03-02T23:59") << "February 30 is March 2";
    EXPECT_EQ(get.out.back(), '\n');
    EXPECT_EQ(get.out.size(), 21u);

    Result bad = Cli({"system", "time", "set", "--year", "4294969296"});
    EXPECT_EQ(bad.status, 1);
    EXPECT_EQ(bad.err, "Year must be > 1970\n");
    EXPECT_EQ(Cli({"system", "time", "get"}).out.substr(0, 10), "2031-03-02");
}

}  // namespace
