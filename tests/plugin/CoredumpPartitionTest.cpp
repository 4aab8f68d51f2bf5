// The dump partition commands against throw-away hosts: get and list with active and configured
// kept apart, a configured partition the host lost, every option rule of set in its order, the
// actions' call order, smart selection, refusals, and the next boot.
#include "CoredumpTestSupport.h"

#include <norlithctl/Env.h>
#include <simhost/Host.h>

#include <gtest/gtest.h>
#include <nlohmann/json.hpp>

#include <csignal>
#include <string>
#include <vector>

namespace {

using namespace coredumptest;

const std::string kStorage = "NorlithCtl::Storage::StorageInfoImpl::";

// Two disks: a small local diagnostic partition, a larger remote one, and a larger local one.
const char kDisks[] = R"js({"format": 1, "dump_partitions": {
  "disks": [
    {"name": "dsk.alpha", "partitions": [{"number": 1, "type": "boot", "size_mb": 100},
                                          {"number": 2, "type": "diagnostic", "size_mb": 110}]},
    {"name": "dsk.beta", "local": false, "partitions": [{"number": 1, "type": "diagnostic", "size_mb": 9000}]},
    {"name": "dsk.gamma", "partitions": [{"number": 7, "type": "diagnostic", "size_mb": 2560},
                                          {"number": 8, "type": "qrfs", "size_mb": 90000}]}],
  "active": "dsk.alpha:2", "configured": "dsk.gamma:7"}})js";

class PartitionCommands : public ::testing::Test {
protected:
    void SetUp() override { simhost::trace::Enable(); }
    void TearDown() override { simhost::trace::Disable(); }

    plugintest::Run Set(const std::function<void(Input&)>& fill) {
        simhost::trace::Take();
        return RunCommand("system coredump partition set", fill);
    }
    nlohmann::json State() { return nlohmann::json::parse(host_.host().Export())["dump_partitions"]; }
    std::vector<std::string> Calls() {
        std::vector<std::string> calls;
        for (const std::string& name : simhost::trace::TakeOperations())
            calls.push_back(name.substr(name.rfind("::") + 2));
        return calls;
    }

    simhost::TempHost host_{kDisks};
};

TEST_F(PartitionCommands, GetShowsTheActiveAndTheConfiguredPartition) {
    plugintest::Run run = RunCommand("system coredump partition get");
    auto result = Struct(run.output->GetResult());
    ASSERT_TRUE(result);
    EXPECT_EQ(result->GetName(), "KernelDumpParition");
    EXPECT_EQ(Text(result, "Active"), "dsk.alpha:2");
    EXPECT_EQ(Text(result, "Configured"), "dsk.gamma:7");
    EXPECT_TRUE(run.output->IsComplete());
}

TEST_F(PartitionCommands, ListShowsEveryDiagnosticPartitionWithItsStates) {
    plugintest::Run run = RunCommand("system coredump partition list");
    EXPECT_TRUE(Errors(run).empty());
    std::vector<std::string> lines;
    for (const auto& row : Rows(run))
        lines.push_back(Text(row, "Name") + " " + Text(row, "Path") + " " + std::to_string(Flag(row, "Active")) +
                        std::to_string(Flag(row, "Configured")));
    EXPECT_EQ(lines, (std::vector<std::string>{"dsk.alpha:2 /dev/disks/dsk.alpha:2 10",
                                               "dsk.beta:1 /dev/disks/dsk.beta:1 00",
                                               "dsk.gamma:7 /dev/disks/dsk.gamma:7 01"}));
}

TEST_F(PartitionCommands, NothingActiveOrConfiguredIsNoError) {
    simhost::TempHost bare(R"({"format": 1, "dump_partitions": {"disks": [], "active": "", "configured": ""}})");
    plugintest::Run run = RunCommand("system coredump partition get");
    EXPECT_TRUE(Errors(run).empty());
    EXPECT_EQ(Text(Struct(run.output->GetResult()), "Active"), "");
    EXPECT_EQ(Text(Struct(run.output->GetResult()), "Configured"), "");
    run = RunCommand("system coredump partition list");
    EXPECT_TRUE(Errors(run).empty());
    EXPECT_TRUE(Rows(run).empty());
    EXPECT_TRUE(run.output->IsComplete());
}

TEST_F(PartitionCommands, AConfiguredPartitionTheHostLostIsSkippedByListAndFailsGet) {
    simhost::TempHost lost(R"({"format": 1, "dump_partitions": {"disks": [
        {"name": "dsk.alpha", "partitions": [{"number": 2, "type": "diagnostic"}]}],
        "active": "dsk.alpha:2", "configured": "dsk.pulled:3"}})");
    plugintest::Run run = RunCommand("system coredump partition list");
    EXPECT_EQ(Errors(run), (std::vector<std::string>{"no configured dump partition found; skipping"}));
    ASSERT_EQ(Rows(run).size(), 1u);
    EXPECT_TRUE(Flag(Rows(run)[0], "Active"));
    EXPECT_FALSE(Flag(Rows(run)[0], "Configured"));
    EXPECT_TRUE(run.output->IsComplete());

    run = RunCommand("system coredump partition get");
    EXPECT_EQ(Errors(run),
              (std::vector<std::string>{"The configured dump partition dsk.pulled:3 is not a partition of this host"}));
    EXPECT_FALSE(run.output->GetResult());
}

TEST_F(PartitionCommands, NamesMatchExactlyNotIgnoringCase) {
    simhost::TempHost cased(R"({"format": 1, "dump_partitions": {"disks": [
        {"name": "dsk.a", "partitions": [{"number": 1, "type": "diagnostic"}]},
        {"name": "DSK.A", "partitions": [{"number": 1, "type": "diagnostic"}]}],
        "active": "DSK.A:1", "configured": "DSK.A:1"}})");
    plugintest::Run run = RunCommand("system coredump partition list");
    ASSERT_EQ(Rows(run).size(), 2u);
    EXPECT_FALSE(Flag(Rows(run)[0], "Active"));
    EXPECT_TRUE(Flag(Rows(run)[1], "Active"));
    EXPECT_TRUE(Flag(Rows(run)[1], "Configured"));
}

TEST_F(PartitionCommands, TheOptionRulesRunInOrderAndTouchNothing) {
    struct Case {
        std::function<void(Input&)> fill;
        std::string message;
    };
    const std::string smart = "--smart can be specified only with --enable=true.";
    const std::vector<Case> cases = {
        {[](Input& in) { in.SetBool("enable", true); in.SetString("partition", "dsk.beta:1"); },
         "--enable cannot be combined with --partition or --unconfigure."},
        {[](Input& in) { in.SetBool("enable", false); in.SetFlag("unconfigure"); in.SetFlag("smart"); },
         "--enable cannot be combined with --partition or --unconfigure."},
        {[](Input& in) { in.SetFlag("smart"); }, smart},
        {[](Input& in) { in.SetFlag("smart"); in.SetString("partition", "x:1"); in.SetFlag("unconfigure"); }, smart},
        {[](Input& in) { in.SetString("partition", "dsk.beta:1"); in.SetFlag("unconfigure"); },
         "--partition and --unconfigure may not be specified simultaneously."},
        {[](Input&) {}, "Please specify an action. Run with --help for details."},
        {[](Input& in) { in.SetBool("enable", false); in.SetFlag("smart"); }, smart},
    };
    const nlohmann::json before = State();
    for (const Case& c : cases) {
        plugintest::Run run = Set(c.fill);
        EXPECT_EQ(Errors(run), std::vector<std::string>{c.message});
        EXPECT_FALSE(run.output->GetResult());
        EXPECT_TRUE(Calls().empty()) << c.message;
    }
    EXPECT_EQ(State(), before);
}

TEST_F(PartitionCommands, EnableActivatesTheConfiguredPartitionAndDisableDeactivates) {
    ASSERT_TRUE(Succeeded(Set([](Input& in) { in.SetBool("enable", true); })));
    EXPECT_EQ(Calls(), (std::vector<std::string>{"StorageInfoImpl", "ActivateDiagnosticPartition"}));
    EXPECT_EQ(State()["active"], "dsk.gamma:7");
    ASSERT_TRUE(Succeeded(Set([](Input& in) { in.SetBool("enable", false); })));
    EXPECT_EQ(Calls(), (std::vector<std::string>{"StorageInfoImpl", "DeactivateDiagnosticPartition"}));
    EXPECT_EQ(State()["active"], "");
    EXPECT_EQ(State()["configured"], "dsk.gamma:7");
}

TEST_F(PartitionCommands, SmartPrefersTheConfiguredThenLocalThenLarger) {
    ASSERT_TRUE(Succeeded(Set([](Input& in) { in.SetBool("enable", true); in.SetFlag("smart"); })));
    EXPECT_EQ(Calls(), (std::vector<std::string>{"StorageInfoImpl", "SmartActivateDiagnosticPartition"}));
    EXPECT_EQ(State()["active"], "dsk.gamma:7");
    // Unconfigured: the larger local partition wins over the largest, remote one.
    ASSERT_TRUE(Succeeded(Set([](Input& in) { in.SetFlag("unconfigure"); })));
    EXPECT_EQ(Calls(), (std::vector<std::string>{"StorageInfoImpl", "DeactivateDiagnosticPartition",
                                                 "UnconfigureDiagnosticPartition"}));
    EXPECT_EQ(State()["active"], "");
    EXPECT_EQ(State()["configured"], "");
    ASSERT_TRUE(Succeeded(Set([](Input& in) { in.SetBool("enable", true); in.SetFlag("smart"); })));
    EXPECT_EQ(State()["active"], "dsk.gamma:7");
    // Without a configured partition a plain enable has nothing to activate.
    plugintest::Run run = Set([](Input& in) { in.SetBool("enable", true); });
    EXPECT_EQ(Errors(run), (std::vector<std::string>{
                               "No dump partition is configured to activate: set one with --partition, or use --smart"}));
}

TEST_F(PartitionCommands, SetConfiguresAndActivatesANamedDiagnosticPartitionOnly) {
    ASSERT_TRUE(Succeeded(Set([](Input& in) { in.SetString("partition", "dsk.beta:1"); })));
    EXPECT_EQ(Calls(), (std::vector<std::string>{"StorageInfoImpl", "SetDiagnosticPartition"}));
    EXPECT_EQ(State()["active"], "dsk.beta:1");
    EXPECT_EQ(State()["configured"], "dsk.beta:1");
    EXPECT_EQ(host_.host().Journal().back().arguments, R"({"name":"dsk.beta:1","activate":true})");

    const nlohmann::json before = State();
    plugintest::Run run = Set([](Input& in) { in.SetString("partition", "dsk.alpha:1"); });
    EXPECT_EQ(Errors(run), (std::vector<std::string>{
                               "Partition dsk.alpha:1 is a boot partition, not a diagnostic partition"}));
    run = Set([](Input& in) { in.SetString("partition", "dsk.beta"); });
    EXPECT_EQ(Errors(run), (std::vector<std::string>{
                               "Unknown partition 'dsk.beta'; the diagnostic partitions of this host are: "
                               "dsk.alpha:2, dsk.beta:1, dsk.gamma:7"}));
    EXPECT_FALSE(run.output->GetResult());
    EXPECT_EQ(State(), before);
}

TEST_F(PartitionCommands, UnconfigureStopsWhenDeactivationFails) {
    host_.host().AddFault(kStorage + "DeactivateDiagnosticPartition", "device busy");
    plugintest::Run run = Set([](Input& in) { in.SetFlag("unconfigure"); });
    EXPECT_EQ(Errors(run), (std::vector<std::string>{"device busy"}));
    EXPECT_EQ(Calls(), (std::vector<std::string>{"StorageInfoImpl", "DeactivateDiagnosticPartition"}));
    host_.host().ClearFaults();
    EXPECT_EQ(State()["configured"], "dsk.gamma:7");
}

TEST_F(PartitionCommands, TheNextBootActivatesTheConfiguredOrTheSmartChoice) {
    ASSERT_EQ(NorlithCtl::Os::Env::Default()->Kill(1, SIGTERM), 0);
    EXPECT_EQ(State()["active"], "dsk.gamma:7");
    Set([](Input& in) { in.SetFlag("unconfigure"); });
    ASSERT_EQ(NorlithCtl::Os::Env::Default()->Kill(1, SIGTERM), 0);
    EXPECT_EQ(State()["active"], "dsk.gamma:7") << "unconfigured: smart selection at boot";
    EXPECT_EQ(State()["configured"], "");
}

TEST_F(PartitionCommands, TheDefaultHostHasTwoDisksWithDiagnosticPartitions) {
    simhost::TempHost fresh;
    plugintest::Run run = RunCommand("system coredump partition list");
    ASSERT_EQ(Rows(run).size(), 2u);
    EXPECT_TRUE(Flag(Rows(run)[0], "Active"));
    EXPECT_TRUE(Flag(Rows(run)[0], "Configured"));
    const std::string first = Text(Rows(run)[0], "Name");
    const std::string second = Text(Rows(run)[1], "Name");
    EXPECT_NE(first.substr(0, first.find(':')), second.substr(0, second.find(':'))) << "on two disks";
    EXPECT_FALSE(Flag(Rows(run)[1], "Active"));
}

REGISTER_FAULT_CASE(plugintest::FaultCase("KernelDumpGetPartition", "system coredump partition get"));
REGISTER_FAULT_CASE(plugintest::FaultCase("KernelDumpListPartitions", "system coredump partition list")
                        .On(kStorage + "GetConfiguredDiagnosticPartition",
                            plugintest::Outcome::Reported({"no configured dump partition found; skipping"}, true)));
REGISTER_FAULT_CASE(plugintest::FaultCase("KernelDumpSetPartitionEnable", "system coredump partition set")
                        .Input([](Input& in) { in.SetBool("enable", true); in.SetFlag("smart"); }));
REGISTER_FAULT_CASE(plugintest::FaultCase("KernelDumpSetPartitionUnconfigure", "system coredump partition set")
                        .Input([](Input& in) { in.SetFlag("unconfigure"); }));
REGISTER_FAULT_CASE(plugintest::FaultCase("KernelDumpSetPartitionName", "system coredump partition set")
                        .Input([](Input& in) { in.SetString("partition", "nvd.5000c5009b3d4c81:1"); }));

}  // namespace
