// The host side of maintenance, shutdown and time: the maintenance domain (its scenario rules,
// its round trip, what a reboot does to it), the host management tool kelp-cmd (its operations,
// timeouts and refusals, each leaving the state as it was), the tool as part of every host's
// image but not of its exports, the event id the event library records, and the limits of the
// host clock.
#include "TestSupport.h"

#include <norlithctl/Env.h>
#include <norlithctl/QuillUserLib.h>
#include <norlithctl/RavelException.h>
#include <norlithctl/SystemInfoImpl.h>
#include <norlithctl/Util.h>
#include <simhost/Host.h>
#include <simhost/Image.h>
#include <simhost/domains/Maintenance.h>
#include <simhost/kelp/KelpCmd.h>

#include <gtest/gtest.h>
#include <nlohmann/json.hpp>

#include <algorithm>
#include <cerrno>
#include <csignal>
#include <dirent.h>
#include <filesystem>
#include <sstream>
#include <string>
#include <sys/resource.h>
#include <sys/stat.h>
#include <unistd.h>
#include <vector>

namespace {

using nlohmann::json;

std::string Scenario(json maintenance, json more = json::object()) {
    json scenario = {{"format", 1}, {"simulation", {{"sleep_percent", 0}}}, {"maintenance", maintenance}};
    scenario.update(more);
    return scenario.dump();
}

class PowerHostTest : public ::testing::Test {
protected:
    json Section(const std::string& name) { return json::parse(host_.host().Export())[name]; }
    std::string State() { return Section("maintenance")["state"]; }

    // kelp-cmd run in this process: its exit status, standard output and error.
    struct Tool {
        int status;
        std::string out, err;
    };
    Tool Kelp(std::vector<std::string> args) {
        args.insert(args.begin(), "/bin/kelp-cmd");
        std::vector<char*> argv;
        for (std::string& arg : args) argv.push_back(&arg[0]);
        std::ostringstream out, err;
        int status = simhost::kelp::Main(static_cast<int>(argv.size()), argv.data(), out, err);
        return {status, out.str(), err.str()};
    }
    // The states the tool journaled, in order.
    std::vector<std::string> Steps() {
        std::vector<std::string> steps;
        for (const auto& entry : host_.host().Journal())
            if (entry.kind == "change" && entry.operation.rfind("hostsvc/", 0) == 0)
                steps.push_back(json::parse(entry.arguments)["state"]);
        return steps;
    }

    simhost::TempHost host_;
};

// ---- the maintenance domain ------------------------------------------------------------------

TEST_F(PowerHostTest, TheMaintenanceSectionRoundTripsAndRefusesWhatItDoesNotKnow) {
    EXPECT_EQ(Section("maintenance"), json::parse(R"({"state": "disabled", "enter_seconds": 3, "exit_seconds": 1})"));
    const std::string scenario = Scenario({{"state", "exiting"}, {"enter_seconds", 86400}, {"exit_seconds", 0}});
    host_.host().Init(scenario, true);
    EXPECT_TRUE(simtest::Holds(host_.host().Export(), scenario));
    const std::string exported = host_.host().Export();
    host_.host().Init(exported, true);
    EXPECT_EQ(host_.host().Export(), exported);

    const std::pair<json, std::string> refused[] = {
        {{{"state", "on"}}, "scenario: maintenance.state: expected \"enabled\", \"disabled\", \"entering\", \"exiting\" or \"unknown\""},
        {{{"enter_seconds", 86401}}, "scenario: maintenance.enter_seconds: expected an integer from 0 to 86400"},
        {{{"exit_seconds", 90000}}, "scenario: maintenance.exit_seconds: expected an integer from 0 to 86400"},
        {{{"mode", "enabled"}}, "scenario: maintenance: unknown member 'mode'"},
    };
    for (const auto& c : refused) {
        try {
            host_.host().Init(Scenario(c.first), true);
            ADD_FAILURE() << "accepted " << c.first.dump();
        } catch (const simhost::HostError& error) {
            EXPECT_EQ(std::string(error.what()).substr(0, c.second.size()), c.second);
        }
        EXPECT_EQ(host_.host().Export(), exported) << "a refused scenario changes nothing";
    }
}

TEST_F(PowerHostTest, MaintenanceModeSurvivesARebootAndATransitionDoesNot) {
    const std::pair<const char*, const char*> cases[] = {
        {"enabled", "enabled"}, {"disabled", "disabled"}, {"entering", "disabled"},
        {"exiting", "enabled"}, {"unknown", "unknown"}};
    for (const auto& c : cases) {
        host_.host().Init(Scenario({{"state", c.first}}), true);
        NorlithCtl::System::SystemInfoImpl info;
        ASSERT_EQ(NorlithCtl::Os::Env::Default()->Kill(1, SIGUSR2), 0);
        EXPECT_EQ(State(), c.second) << c.first;
        EXPECT_EQ(info.GetMaintenanceModeState(), simhost::maintenance::StateCode(c.second));
    }
}

// ---- the host management tool ----------------------------------------------------------------

TEST_F(PowerHostTest, TheToolEntersAndLeavesThroughATransitionJournaledStepByStep) {
    host_.host().Init(Scenario({{"state", "disabled"}}), true);
    Tool enter = Kelp({"hostsvc/maintenance_mode_enter", "60"});
    EXPECT_EQ(enter.status, 0) << enter.err;
    EXPECT_EQ(enter.out, "The host is in maintenance mode.\n");
    EXPECT_EQ(State(), "enabled");
    Tool exit = Kelp({"hostsvc/maintenance_mode_exit"});  // the default timeout
    EXPECT_EQ(exit.status, 0) << exit.err;
    EXPECT_EQ(exit.out, "The host is out of maintenance mode.\n");
    EXPECT_EQ(Steps(), (std::vector<std::string>{"entering", "enabled", "exiting", "disabled"}));
    EXPECT_EQ(json::parse(host_.host().Journal().back().arguments),
              json::parse(R"({"timeout": 60, "state": "disabled"})"));

    // Asking for the state the host is in succeeds and changes nothing.
    Tool again = Kelp({"hostsvc/maintenance_mode_exit", "0"});
    EXPECT_EQ(again.status, 0);
    EXPECT_EQ(again.out, "The host is out of maintenance mode.\n");
    EXPECT_EQ(Steps().size(), 4u);
}

TEST_F(PowerHostTest, ATimeoutShorterThanTheHostNeedsGivesUpAndPutsTheStateBack) {
    for (const char* from : {"disabled", "unknown", "exiting"}) {
        host_.host().Init(Scenario({{"state", from}, {"enter_seconds", 40}}), true);
        Tool late = Kelp({"hostsvc/maintenance_mode_enter", "39"});
        EXPECT_EQ(late.status, 1) << from;
        EXPECT_EQ(late.err,
                  "hostsvc/maintenance_mode_enter: timed out after 39 seconds; entering maintenance "
                  "mode takes 40 seconds on this host\n");
        EXPECT_EQ(State(), from);
        EXPECT_EQ(Steps(), (std::vector<std::string>{"entering", from}));
        EXPECT_EQ(Kelp({"hostsvc/maintenance_mode_enter", "40"}).status, 0);
        EXPECT_EQ(State(), "enabled");
    }
    host_.host().Init(Scenario({{"state", "enabled"}, {"exit_seconds", 86400}}), true);
    EXPECT_EQ(Kelp({"hostsvc/maintenance_mode_exit", "0"}).status, 0) << "0 is no limit";
    EXPECT_EQ(Kelp({"hostsvc/maintenance_mode_enter", "9223372036854775807"}).status, 0);
}

TEST_F(PowerHostTest, UsageErrorsAndFaultsLeaveTheHostAsItWas) {
    host_.host().Init(Scenario({{"state", "disabled"}}), true);
    const std::string before = host_.host().Export();
    const std::vector<std::vector<std::string>> usage = {
        {},
        {"hostsvc/maintenance_mode"},
        {"hostsvc/maintenance_mode_enter", "-1"},
        {"hostsvc/maintenance_mode_enter", "-9223372036854775808"},
        {"hostsvc/maintenance_mode_enter", "9223372036854775808"},
        {"hostsvc/maintenance_mode_enter", "1e3"},
        {"hostsvc/maintenance_mode_enter", ""},
        {"hostsvc/maintenance_mode_enter", "60", "extra"},
    };
    for (const auto& args : usage) {
        Tool tool = Kelp(args);
        EXPECT_EQ(tool.status, 2) << (args.empty() ? "" : args.back());
        EXPECT_FALSE(tool.err.empty());
        EXPECT_EQ(tool.out, "");
    }
    EXPECT_EQ(Kelp({"hostsvc/maintenance_mode_enter", "-5"}).err,
              "kelp-cmd: invalid timeout '-5': expected a number of seconds from 0 (no limit) to "
              "9223372036854775807\n");
    EXPECT_EQ(Kelp({"--help"}).status, 0);

    host_.host().AddFault("hostsvc/maintenance_mode_enter", "host agent restarting", 1);
    Tool faulted = Kelp({"hostsvc/maintenance_mode_enter", "10"});
    EXPECT_EQ(faulted.status, 1);
    EXPECT_EQ(faulted.err, "hostsvc/maintenance_mode_enter: host agent restarting\n");
    EXPECT_EQ(host_.host().Journal().back().kind, "fault");
    host_.host().ClearJournal();
    EXPECT_EQ(host_.host().Export(), before);
}

// ---- the host's image --------------------------------------------------------------------------

TEST_F(PowerHostTest, EveryHostHasTheToolWhichExportsLeaveOut) {
    const std::string tool = host_.host().Root() + "/bin/kelp-cmd";
    struct stat info {};
    ASSERT_EQ(stat(tool.c_str(), &info), 0) << "a new host has /bin/kelp-cmd";
    EXPECT_TRUE(S_ISREG(info.st_mode) && (info.st_mode & 0111));
    const std::string built = simhost::image::BuiltProgram("/bin/kelp-cmd");
    ASSERT_FALSE(built.empty());
    EXPECT_TRUE(testsupport::ReadFile(tool) == testsupport::ReadFile(built)) << "a copy of the built tool";

    const std::string exported = host_.host().Export();
    const json document = json::parse(exported);  // alive while its files are walked
    for (const json& file : document["files"])
        EXPECT_NE(file["path"], "/bin/kelp-cmd") << "the image is not the host's state";
    {
        simhost::TempHost copy(exported);
        EXPECT_EQ(stat((copy.host().Root() + "/bin/kelp-cmd").c_str(), &info), 0);
        EXPECT_EQ(copy.host().Export(), exported);
    }

    // A scenario's own program there is kept (and exported); other files of /bin are the host's.
    json own = json::parse(Scenario({{"state", "disabled"}}));
    own["files"] = {{{"path", "/bin/kelp-cmd"}, {"mode", "0755"}, {"text", "#!/bin/sh\nexit 4\n"}},
                    {{"path", "/bin/uptime-report"}, {"text", "x"}}};
    host_.host().Init(own.dump(), true);
    EXPECT_EQ(json::parse(host_.host().Export())["files"], own["files"]);
    EXPECT_EQ(NorlithCtl::Util::NorlithCtl_Exec("/bin/kelp-cmd", false, true, false), 4);
}

// ---- the event library and the clock ---------------------------------------------------------

TEST_F(PowerHostTest, TheEventLibraryRecordsTheEventIdItsFormatNames) {
    ASSERT_EQ(QuillUserLib_Init(), 0);
    EXPECT_EQ(QuillUserLib_AddQuill("@&!*@*@(quill.user.quarncli.host.reboot)%s", "Reason for reboot: <50%>"), 0);
    EXPECT_EQ(QuillUserLib_AddQuill("plain %d", 7), 0);
    EXPECT_EQ(QuillUserLib_AddQuill("@&!*@*@(not closed%s", "x"), 0);
    EXPECT_EQ(QuillUserLib_AddQuill("@&!*@*@(bad id)%s", "x"), -1) << "an id the log refuses";
    EXPECT_EQ(QuillUserLib_AddQuill("@&!*@*@(quill.only)"), -1) << "an empty message";
    QuillUserLib_Close();
    auto log = host_.host().ObservationLog(3);
    ASSERT_EQ(log.size(), 3u);
    EXPECT_EQ(log[0].event, "quill.user.quarncli.host.reboot");
    EXPECT_EQ(log[0].message, "Reason for reboot: <50%>");
    EXPECT_EQ(log[1].event, "");
    EXPECT_EQ(log[1].message, "plain 7");
    EXPECT_EQ(log[2].event, "");
    EXPECT_EQ(log[2].message, "@&!*@*@(not closedx");
    auto observations = json::parse(host_.host().Export())["observations"];
    EXPECT_EQ(observations[observations.size() - 3]["event"], "quill.user.quarncli.host.reboot");
}

TEST_F(PowerHostTest, TheHostClockRefusesTimesBeyondItsRange) {
    NorlithCtl::Os::Env* env = NorlithCtl::Os::Env::Default();
    const json clock = Section("clock");
    for (time_t seconds : {static_cast<time_t>(INT64_MAX), static_cast<time_t>(INT64_MIN),
                           static_cast<time_t>(9223372036854LL), static_cast<time_t>(253402300800LL)}) {
        timeval tv{seconds, 0};
        errno = 0;
        EXPECT_EQ(env->SetTimeOfDay(&tv, nullptr), -1) << seconds;
        EXPECT_EQ(errno, EINVAL);
    }
    EXPECT_EQ(Section("clock"), clock);
    timeval y2100{4102444800, 0};
    EXPECT_EQ(env->SetTimeOfDay(&y2100, nullptr), 0);
    EXPECT_GE(env->Time(nullptr), 4102444800);
}

// A program whose process cannot be created is an error with its event: which program, and why.
TEST_F(PowerHostTest, AProgramThatCannotStartCarriesItsEvent) {
    NorlithCtl::System::SystemInfoImpl warm;  // the host's connection is open before the limit
    warm.GetMaintenanceModeState();
    int highest = 0;
    DIR* dir = opendir("/proc/self/fd");
    while (dirent* entry = readdir(dir)) highest = std::max(highest, std::atoi(entry->d_name));
    closedir(dir);
    rlimit saved{};
    ASSERT_EQ(getrlimit(RLIMIT_NOFILE, &saved), 0);
    rlimit lowered = saved;
    lowered.rlim_cur = static_cast<rlim_t>(highest) + 16;
    ASSERT_EQ(setrlimit(RLIMIT_NOFILE, &lowered), 0);
    // Two descriptors left: enough to find the program, not to start it.
    std::vector<int> held;
    for (int fd; (fd = dup(0)) >= 0;) held.push_back(fd);
    close(held.back());
    close(held[held.size() - 2]);
    held.resize(held.size() - 2);
    std::string plain, event;
    try {
        NorlithCtl::Util::NorlithCtl_Exec("/bin/kelp-cmd hostsvc/maintenance_mode_enter 5", false, true, false);
    } catch (const Ravel::Lib::RavelException& error) {
        plain = error.GetMessage(0);
        event = error.GetMessage(1);
    }
    for (int fd : held) close(fd);
    setrlimit(RLIMIT_NOFILE, &saved);
    EXPECT_EQ(plain, "Cannot start a program on the host: Too many open files");
    EXPECT_EQ(event, "Cannot start /bin/kelp-cmd on the host: Too many open files");
    EXPECT_EQ(State(), "disabled");
}

}  // namespace
