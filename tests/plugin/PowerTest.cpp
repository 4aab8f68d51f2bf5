// The maintenance-mode and shutdown commands against throw-away simulated hosts: the states get
// shows, the tool set runs (its command line, its timeout, a tool that fails or is missing),
// and the shutdown's checks in order, its logs, its sleeps and its signal, which reboots or
// powers off the host. Sleeps are shortened by the host's setting (sleep_percent 0), never
// waited for.
#include "Harness.h"
#include "power/Shutdown.h"

#include <norlithctl/Env.h>
#include <norlithctl/ServerStats.h>
#include <simhost/Host.h>
#include <simhost/Trace.h>

#include <gtest/gtest.h>
#include <nlohmann/json.hpp>

#include <atomic>
#include <cerrno>
#include <csignal>
#include <filesystem>
#include <functional>
#include <string>
#include <thread>
#include <vector>

namespace {

using nlohmann::json;
using plugintest::Outcome;
using Kitbase::MetaObj::MetaBool;
using Kitbase::MetaObj::MetaString;

const std::string kSystemInfoNew = "NorlithCtl::System::SystemInfoImpl::SystemInfoImpl";
const std::string kGetState = "NorlithCtl::System::SystemInfoImpl::GetMaintenanceModeState";
const std::string kExec = "NorlithCtl::Util::NorlithCtl_Exec";
const std::string kSleep = "NorlithCtl::Os::Env::NanoSleep";
const std::string kSyslog = "NorlithCtl::Os::Env::Syslog";
const std::string kKill = "NorlithCtl::Os::Env::Kill";
const std::string kQuillInit = "QuillUserLib_Init";
const std::string kQuillAdd = "QuillUserLib_AddQuill";
const std::string kQuillClose = "QuillUserLib_Close";

// Resets the process-wide flag that lets one shutdown request through per loaded library.
struct ShutdownFlag : TarselCli::System::Shutdown {
    static void Reset() { _operationInProgress = false; }
};

// A host whose sleeps return at once, in the given maintenance state.
std::string Host(const std::string& state, json maintenance = json::object()) {
    maintenance["state"] = state;
    return json{{"format", 1}, {"simulation", {{"sleep_percent", 0}}}, {"maintenance", maintenance}}.dump();
}

void Reason(Kitbase::CallSpec::Input& in) { in.SetString("reason", "disk swap"); }

// The maintenance commands report every host failure in its event form; the shutdown commands
// too, while failures of the event library and of the seam are theirs to ignore.
REGISTER_FAULT_CASE(plugintest::FaultCase("MaintenanceModeGet", "system maintenanceMode get").Form(1));
REGISTER_FAULT_CASE(plugintest::FaultCase("MaintenanceModeSet", "system maintenanceMode set")
                        .Scenario(Host("disabled"))
                        .Input([](Kitbase::CallSpec::Input& in) { in.SetBool("enable", true); })
                        .Form(1));
REGISTER_FAULT_CASE(plugintest::FaultCase("ShutdownReboot", "system shutdown reboot")
                        .Scenario(Host("enabled"))
                        .Before(&ShutdownFlag::Reset)
                        .Input([](Kitbase::CallSpec::Input& in) {
                            Reason(in);
                            in.SetInt("delay", 12);
                        })
                        .Form(1)
                        .On(kSleep, Outcome::Ignored())
                        .On(kQuillInit, Outcome::Ignored())
                        .On(kQuillAdd, Outcome::Ignored())
                        .On(kQuillClose, Outcome::Ignored())
                        .On(kSyslog, Outcome::Ignored())
                        .On(kKill, Outcome::Ignored()));
REGISTER_FAULT_CASE(plugintest::FaultCase("ShutdownPowerOff", "system shutdown poweroff")
                        .Scenario(Host("enabled"))
                        .Before(&ShutdownFlag::Reset)
                        .Input(Reason)
                        .Form(1)
                        .On(kSleep, Outcome::Ignored())
                        .On(kQuillInit, Outcome::Ignored())
                        .On(kQuillAdd, Outcome::Ignored())
                        .On(kQuillClose, Outcome::Ignored())
                        .On(kSyslog, Outcome::Ignored())
                        .On(kKill, Outcome::Ignored()));

json Section(simhost::TempHost& host, const std::string& name) {
    return json::parse(host.host().Export())[name];
}

class PowerTest : public ::testing::Test {
protected:
    void SetUp() override {
        ShutdownFlag::Reset();
        simhost::trace::Enable(true);
    }
    void TearDown() override {
        simhost::trace::Disable();
        ShutdownFlag::Reset();
    }

    plugintest::Run Run(const std::string& path, std::function<void(Kitbase::CallSpec::Input&)> fill = {}) {
        plugintest::InputPtr input = Kitbase::CallSpec::Input::New();
        if (fill) fill(*input);
        simhost::trace::Take();
        plugintest::Run run = plugintest::Execute(plugintest::FindCommand(path), input);
        EXPECT_FALSE(run.escaped) << run.exception;
        EXPECT_EQ(run.leaked, 0) << "host objects were not released";
        return run;
    }
    plugintest::Run Set(bool enable, std::optional<long long> timeout = std::nullopt) {
        return Run("system maintenanceMode set", [&](Kitbase::CallSpec::Input& in) {
            in.SetBool("enable", enable);
            if (timeout) in.SetInt("timeout", *timeout);
        });
    }
    plugintest::Run Shutdown(const std::string& which, const std::string& reason,
                             std::optional<long long> delay = std::nullopt) {
        return Run("system shutdown " + which, [&](Kitbase::CallSpec::Input& in) {
            in.SetString("reason", reason);
            if (delay) in.SetInt("delay", *delay);
        });
    }
    std::string Mode() {
        plugintest::Run run = Run("system maintenanceMode get");
        auto text = boost::dynamic_pointer_cast<MetaString>(run.output->GetResult());
        return text ? text->GetValue() : "<none>";
    }
    static bool True(const plugintest::Run& run) {
        auto value = boost::dynamic_pointer_cast<MetaBool>(run.output->GetResult());
        return value && value->GetValue() && run.output->IsComplete();
    }
    // The command lines the executor was asked to run since the last Take.
    static std::vector<std::string> Executed() {
        std::vector<std::string> lines;
        for (const simhost::TraceEntry& entry : simhost::trace::Take())
            if (entry.operation == kExec) {
                json args = json::parse(entry.arguments);
                EXPECT_EQ(args["background"], false);
                EXPECT_EQ(args["quiet"], true);
                EXPECT_EQ(args["trace"], false);
                lines.push_back(args["command"]);
            }
        return lines;
    }
    std::vector<std::string> SyslogMessages() {
        std::vector<std::string> messages;
        for (const auto& entry : host_.host().SystemLog()) messages.push_back(entry.message);
        return messages;
    }
    // Whether the system log has a line containing text.
    bool Logged(const std::string& text) {
        for (const std::string& line : SyslogMessages())
            if (line.find(text) != std::string::npos) return true;
        return false;
    }

    simhost::TempHost host_;
};

// ---- maintenanceMode get -----------------------------------------------------------------------

TEST_F(PowerTest, GetShowsEnabledDisabledAndUnknownForEveryOtherState) {
    const std::pair<const char*, const char*> cases[] = {{"enabled", "Enabled"},
                                                         {"disabled", "Disabled"},
                                                         {"unknown", "Unknown"},   // 0
                                                         {"entering", "Unknown"},  // 3
                                                         {"exiting", "Unknown"}};  // 4
    for (const auto& c : cases) {
        host_.host().Init(Host(c.first), true);
        EXPECT_EQ(Mode(), c.second) << c.first;
        EXPECT_EQ(simhost::trace::TakeOperations(), (std::vector<std::string>{kSystemInfoNew, kGetState}));
    }
    host_.host().Init(simhost::DefaultScenario(), true);
    EXPECT_EQ(Mode(), "Disabled") << "the default host runs its workloads";
}

// ---- maintenanceMode set -----------------------------------------------------------------------

TEST_F(PowerTest, SetRunsTheToolWithItsOperationAndTimeoutAndTheHostFollows) {
    host_.host().Init(Host("disabled"), true);
    plugintest::Run enter = Set(true);
    EXPECT_TRUE(True(enter));
    EXPECT_TRUE(enter.output->GetErrors().empty());
    EXPECT_EQ(Executed(), (std::vector<std::string>{"/bin/kelp-cmd hostsvc/maintenance_mode_enter 60"}));
    EXPECT_EQ(Mode(), "Enabled");

    plugintest::Run exit = Set(false, 120);
    EXPECT_TRUE(True(exit));
    EXPECT_EQ(Executed(), (std::vector<std::string>{"/bin/kelp-cmd hostsvc/maintenance_mode_exit 120"}));
    EXPECT_EQ(Mode(), "Disabled");

    // The tool's own operations are journaled: the transition, then its end.
    std::vector<std::string> steps;
    for (const auto& entry : host_.host().Journal())
        if (entry.operation.rfind("hostsvc/", 0) == 0)
            steps.push_back(entry.operation + " " + json::parse(entry.arguments)["state"].get<std::string>());
    EXPECT_EQ(steps, (std::vector<std::string>{"hostsvc/maintenance_mode_enter entering",
                                               "hostsvc/maintenance_mode_enter enabled",
                                               "hostsvc/maintenance_mode_exit exiting",
                                               "hostsvc/maintenance_mode_exit disabled"}));
}

TEST_F(PowerTest, SetRefusesTheStateTheHostIsInWithoutRunningTheTool) {
    host_.host().Init(Host("enabled"), true);
    plugintest::Run again = Set(true);
    EXPECT_EQ(again.output->GetErrors(), (std::vector<std::string>{"Maintenance mode is already enabled."}));
    EXPECT_FALSE(again.output->GetResult());
    EXPECT_EQ(simhost::trace::TakeOperations(), (std::vector<std::string>{kSystemInfoNew, kGetState}));

    host_.host().Init(Host("disabled"), true);
    plugintest::Run off = Set(false, 5);
    EXPECT_EQ(off.output->GetErrors(), (std::vector<std::string>{"Maintenance mode is already disabled."}));
    EXPECT_TRUE(Executed().empty());
}

TEST_F(PowerTest, AnUndeterminedStateNeverStopsSet) {
    for (const char* state : {"unknown", "entering", "exiting"}) {
        host_.host().Init(Host(state), true);
        EXPECT_TRUE(True(Set(true))) << state;
        EXPECT_EQ(Executed(), (std::vector<std::string>{"/bin/kelp-cmd hostsvc/maintenance_mode_enter 60"}));
        EXPECT_EQ(Mode(), "Enabled");
        host_.host().Init(Host(state), true);
        EXPECT_TRUE(True(Set(false))) << state;
        EXPECT_EQ(Mode(), "Disabled");
    }
}

// The tool gives up when the host needs longer than the timeout; 0 means no limit, a negative
// timeout is refused by the tool, and a huge one is only a limit never reached.
TEST_F(PowerTest, TheTimeoutIsTheToolsAndAShortOneFailsLeavingTheHostAsItWas) {
    host_.host().Init(Host("disabled", {{"enter_seconds", 30}, {"exit_seconds", 20}}), true);
    plugintest::Run short_one = Set(true, 5);
    EXPECT_EQ(short_one.output->GetErrors(), (std::vector<std::string>{"Failed to perform requested operation."}));
    EXPECT_FALSE(short_one.output->GetResult());
    EXPECT_EQ(Executed(), (std::vector<std::string>{"/bin/kelp-cmd hostsvc/maintenance_mode_enter 5"}));
    EXPECT_EQ(Mode(), "Disabled");
    EXPECT_TRUE(Logged("hostsvc/maintenance_mode_enter: timed out after 5 seconds; entering maintenance "
                       "mode takes 30 seconds on this host"));

    plugintest::Run negative = Set(true, -1);
    EXPECT_EQ(negative.output->GetErrors(), (std::vector<std::string>{"Failed to perform requested operation."}));
    EXPECT_EQ(Executed(), (std::vector<std::string>{"/bin/kelp-cmd hostsvc/maintenance_mode_enter -1"}));
    EXPECT_TRUE(Logged("invalid timeout '-1'"));
    EXPECT_EQ(Mode(), "Disabled");

    EXPECT_TRUE(True(Set(true, 30))) << "a timeout equal to the time needed is enough";
    EXPECT_TRUE(True(Set(false, 0)));
    EXPECT_EQ(Executed(), (std::vector<std::string>{"/bin/kelp-cmd hostsvc/maintenance_mode_exit 0"}));
    EXPECT_TRUE(True(Set(true, 9223372036854775807LL)));
    EXPECT_EQ(Mode(), "Enabled");
    EXPECT_EQ(Set(false, 19).output->GetErrors(),
              (std::vector<std::string>{"Failed to perform requested operation."}));
    EXPECT_EQ(Mode(), "Enabled");
}

TEST_F(PowerTest, AMissingOrFailingToolFailsTheCommandAndChangesNothing) {
    host_.host().Init(Host("disabled"), true);
    std::filesystem::remove(host_.host().Root() + "/bin/kelp-cmd");
    EXPECT_EQ(Set(true).output->GetErrors(), (std::vector<std::string>{"Failed to perform requested operation."}));
    EXPECT_EQ(Mode(), "Disabled");
    EXPECT_TRUE(Logged("exec: cannot run '/bin/kelp-cmd hostsvc/maintenance_mode_enter 60': no such program"));

    // A scenario's own program at /bin/kelp-cmd is kept in place of the host's tool.
    json broken = json::parse(Host("disabled"));
    broken["files"] = {{{"path", "/bin/kelp-cmd"}, {"mode", "0755"},
                        {"text", "#!/bin/sh\necho \"service unavailable\" >&2\nexit 3\n"}}};
    host_.host().Init(broken.dump(), true);
    EXPECT_EQ(Set(true).output->GetErrors(), (std::vector<std::string>{"Failed to perform requested operation."}));
    EXPECT_TRUE(Logged("/bin/kelp-cmd: service unavailable"));
    EXPECT_EQ(Mode(), "Disabled");

    // The tool's operation failing on the host (a fault) fails it too, and is journaled.
    host_.host().Init(Host("enabled"), true);
    host_.host().AddFault("hostsvc/maintenance_mode_exit", "host agent not responding", 1);
    EXPECT_EQ(Set(false).output->GetErrors(), (std::vector<std::string>{"Failed to perform requested operation."}));
    EXPECT_EQ(Mode(), "Enabled");
    EXPECT_TRUE(Logged("hostsvc/maintenance_mode_exit: host agent not responding"));
    EXPECT_EQ(host_.host().Journal().back().kind, "fault");
}

// ---- shutdown ------------------------------------------------------------------------------------

TEST_F(PowerTest, RebootLogsTheReasonWaitsAndSignalsInitWhichRebootsTheHost) {
    host_.host().Init(Host("enabled"), true);
    const json boot = Section(host_, "boot");
    plugintest::Run run = Shutdown("reboot", "disk swap");
    EXPECT_TRUE(True(run));
    EXPECT_TRUE(run.output->GetErrors().empty());

    std::vector<std::string> calls;
    for (const simhost::TraceEntry& entry : simhost::trace::Take())
        calls.push_back(entry.operation + (entry.operation == kSleep || entry.operation == kKill
                                               ? " " + entry.arguments
                                               : ""));
    EXPECT_EQ(calls, (std::vector<std::string>{
                         kSystemInfoNew, kGetState, kQuillInit, kQuillAdd, kQuillClose, kSyslog,
                         kSleep + R"( {"seconds":10,"nanoseconds":0})", kKill + R"( {"pid":1,"signal":15})"}));

    const auto observations = host_.host().ObservationLog(1);
    ASSERT_EQ(observations.size(), 1u);
    EXPECT_EQ(observations[0].event, "quill.user.quarncli.host.reboot");
    EXPECT_EQ(observations[0].message, "Reason for reboot: <disk swap>");
    const auto syslog = host_.host().SystemLog();
    ASSERT_GE(syslog.size(), 2u);
    EXPECT_EQ(syslog[0].message, "Reason for reboot: <disk swap>");
    EXPECT_EQ(syslog[0].priority, 2u);
    EXPECT_NE(syslog[1].message.find("reboot requested by signal 15"), std::string::npos);

    const json after = Section(host_, "boot");
    EXPECT_EQ(after["last_request"], "reboot");
    EXPECT_EQ(after["boot_count"], boot["boot_count"].get<int>() + 1);
    // Up again: maintenance mode survives the reboot, and the uptime started again.
    EXPECT_EQ(Mode(), "Enabled");
    Ravel::AdvStats::ServerStats stats;
    stats.FetchAllStats();
    EXPECT_LT(stats.GetUptimeMicros(), 60LL * 1000000);
}

TEST_F(PowerTest, PowerOffSignalsUsr2AndPostsItsOwnEvent) {
    host_.host().Init(Host("enabled"), true);
    EXPECT_TRUE(True(Shutdown("poweroff", "rack move")));
    auto calls = simhost::trace::Take();
    ASSERT_FALSE(calls.empty());
    EXPECT_EQ(calls.back().arguments, R"({"pid":1,"signal":12})");
    const auto observations = host_.host().ObservationLog(1);
    EXPECT_EQ(observations.at(0).event, "quill.user.quarncli.host.poweroff");
    EXPECT_EQ(observations.at(0).message, "Reason for power off: <rack move>");
    EXPECT_EQ(SyslogMessages().at(0), "Reason for power off: <rack move>");
    EXPECT_EQ(Section(host_, "boot")["last_request"], "poweroff");
}

TEST_F(PowerTest, TheDelayIsSleptLessTenSecondsBeforeLoggingAndTenAfter) {
    host_.host().Init(Host("enabled"), true);
    auto sleeps = [] {
        std::vector<std::string> seconds;
        for (const simhost::TraceEntry& entry : simhost::trace::Take())
            if (entry.operation == kSleep) seconds.push_back(json::parse(entry.arguments)["seconds"].dump());
            else if (entry.operation == kQuillInit) seconds.push_back("log");
        return seconds;
    };
    EXPECT_TRUE(True(Shutdown("reboot", "r", 10)));
    EXPECT_EQ(sleeps(), (std::vector<std::string>{"0", "log", "10"}));
    ShutdownFlag::Reset();
    EXPECT_TRUE(True(Shutdown("reboot", "r", 4294967295LL)));
    EXPECT_EQ(sleeps(), (std::vector<std::string>{"4294967285", "log", "10"}));
}

// The framework refuses a delay below 10 or above 4294967295 before the command runs.
TEST_F(PowerTest, TheDelayIsConstrainedToTheFrameworksRange) {
    auto spec = plugintest::FindCommand("system shutdown reboot")->GetInputSpec();
    ASSERT_EQ(spec->GetParameters().size(), 2u);
    const auto& delay = spec->GetParameters()[1];
    EXPECT_EQ(delay->GetName(), "delay");
    ASSERT_EQ(delay->GetConstraints().size(), 1u);
    EXPECT_EQ(delay->GetConstraints()[0]->GetLow(), 10);
    EXPECT_EQ(delay->GetConstraints()[0]->GetHigh(), 4294967295LL);
    EXPECT_TRUE(spec->GetParameters()[0]->IsRequired());
}

// A sleep interrupted by a signal goes on for the time it reported left; another error ends it.
TEST_F(PowerTest, SafeSleepResumesAfterAnInterruptionWithWhatWasLeft) {
    host_.host().Init(Host("enabled"), true);
    struct Interrupted : NorlithCtl::Os::EnvWrapper {
        using EnvWrapper::EnvWrapper;
        std::vector<long> asked;
        int NanoSleep(const timespec* request, timespec* remaining) override {
            asked.push_back(static_cast<long>(request->tv_sec));
            if (request->tv_sec > 3) {
                remaining->tv_sec = request->tv_sec / 2;
                remaining->tv_nsec = 0;
                errno = EINTR;
                return -1;
            }
            if (request->tv_sec == 3) {
                errno = EINVAL;  // ends the sleep early, unreported
                return -1;
            }
            return 0;
        }
    } env(NorlithCtl::Os::SimulatedEnv());
    NorlithCtl::Os::Env* previous = NorlithCtl::Os::Env::SetDefault(&env);
    plugintest::Run run = Shutdown("reboot", "r", 16);
    NorlithCtl::Os::Env::SetDefault(previous);
    EXPECT_TRUE(True(run));
    EXPECT_EQ(env.asked, (std::vector<long>{6, 3, 10, 5, 2}));
}

TEST_F(PowerTest, TheReasonIsCheckedFirstThenMaintenanceModeThenTheFlag) {
    host_.host().Init(Host("disabled"), true);
    const std::string limit(512, 'x');
    plugintest::Run too_long = Shutdown("reboot", limit + "y");
    EXPECT_EQ(too_long.output->GetErrors(),
              (std::vector<std::string>{"Reason message cannot be longer than 512 characters."}));
    EXPECT_FALSE(too_long.output->GetResult());
    EXPECT_EQ(simhost::trace::TakeOperations(), (std::vector<std::string>{kSystemInfoNew}))
        << "the length is refused before the state is read";

    for (const char* state : {"disabled", "unknown", "entering", "exiting"}) {
        host_.host().Init(Host(state), true);
        const std::string before = host_.host().Export();
        plugintest::Run refused = Shutdown("poweroff", limit);
        EXPECT_EQ(refused.output->GetErrors(),
                  (std::vector<std::string>{"System is not in maintenance mode. Cannot perform requested operation."}))
            << state;
        EXPECT_EQ(simhost::trace::TakeOperations(), (std::vector<std::string>{kSystemInfoNew, kGetState}));
        EXPECT_EQ(host_.host().Export(), before) << "nothing logged, no signal";
    }

    // Neither refusal set the flag: the next request in maintenance mode is accepted, with a
    // reason of exactly 512 bytes.
    host_.host().Init(Host("enabled"), true);
    EXPECT_TRUE(True(Shutdown("poweroff", limit)));
    EXPECT_EQ(host_.host().ObservationLog(1).at(0).message, "Reason for power off: <" + limit + ">");

    // From now on every request of this library is refused, whatever its operation, and the
    // host is left alone.
    const std::string before = host_.host().Export();
    plugintest::Run again = Shutdown("reboot", "second");
    EXPECT_EQ(again.output->GetErrors(),
              (std::vector<std::string>{"System is already performing requested operation."}));
    EXPECT_FALSE(again.output->GetResult());
    EXPECT_EQ(simhost::trace::TakeOperations(), (std::vector<std::string>{kSystemInfoNew, kGetState}));
    EXPECT_EQ(host_.host().Export(), before);
}

TEST_F(PowerTest, AReasonIsLoggedLiterallyNeverInterpreted) {
    host_.host().Init(Host("enabled"), true);
    const std::string reason = "100% %s %n %d\t\x01 \x1b[2J done";
    EXPECT_TRUE(True(Shutdown("reboot", reason)));
    EXPECT_EQ(host_.host().ObservationLog(1).at(0).message, "Reason for reboot: <" + reason + ">");
    EXPECT_EQ(SyslogMessages().at(0), "Reason for reboot: <" + reason + ">");
}

TEST_F(PowerTest, AnEventLibraryThatCannotOpenSkipsOnlyTheObservation) {
    host_.host().Init(Host("enabled"), true);
    const std::size_t observations = host_.host().ObservationLog().size();
    host_.host().AddFault(kQuillInit, "event service down", 1);
    EXPECT_TRUE(True(Shutdown("reboot", "patch")));
    EXPECT_EQ(simhost::trace::TakeOperations(),
              (std::vector<std::string>{kSystemInfoNew, kGetState, kQuillInit, kSyslog, kSleep, kKill}));
    EXPECT_EQ(host_.host().ObservationLog().size(), observations);
    EXPECT_EQ(SyslogMessages().at(0), "Reason for reboot: <patch>");
}

TEST_F(PowerTest, OneRequestIsAcceptedWhenSeveralThreadsAskAtOnce) {
    host_.host().Init(Host("enabled"), true);
    simhost::trace::Disable();
    std::atomic<int> accepted{0}, refused{0};
    std::vector<std::thread> threads;
    for (int i = 0; i < 6; ++i)
        threads.emplace_back([&, i] {
            plugintest::InputPtr input = Kitbase::CallSpec::Input::New();
            input->SetString("reason", "thread " + std::to_string(i));
            plugintest::Run run = plugintest::Execute(
                plugintest::FindCommand(i % 2 ? "system shutdown reboot" : "system shutdown poweroff"), input);
            if (True(run)) ++accepted;
            if (run.output->GetErrors() ==
                std::vector<std::string>{"System is already performing requested operation."})
                ++refused;
        });
    for (std::thread& thread : threads) thread.join();
    EXPECT_EQ(accepted, 1);
    EXPECT_EQ(refused, 5);
    EXPECT_EQ(Section(host_, "boot")["boot_count"], 2);
}

}  // namespace
