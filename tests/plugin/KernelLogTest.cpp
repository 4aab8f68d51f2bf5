// The log level commands, which the tree leaves out: made through the factories the loaded
// plug-in exports (as a caller outside would), run against throw-away hosts: listing the core's
// and a module's levels with the name filter, setting and resetting them until the next boot,
// the missing-module message of both, the host's refusals, and the call order.
#include "Harness.h"
#include "module/KernelLogList.h"
#include "module/KernelLogSetLevel.h"

#include <norlithctl/Env.h>
#include <simhost/Host.h>
#include <simhost/Trace.h>

#include <gtest/gtest.h>
#include <nlohmann/json.hpp>

#include <csignal>
#include <dlfcn.h>
#include <functional>
#include <string>
#include <vector>

namespace {

using namespace TarselCli::System;
using Kitbase::MetaObj::MetaBool;
using Kitbase::MetaObj::MetaInt;
using Kitbase::MetaObj::MetaList;
using Kitbase::MetaObj::MetaString;
using Kitbase::MetaObj::MetaStruct;
using nlohmann::json;

const std::string kInfoNew = "NorlithCtl::System::SystemInfoImpl::SystemInfoImpl";
const std::string kByName = "NorlithCtl::System::SystemInfoImpl::GetModuleByName";

using plugintest::FromPlugin;
using plugintest::Plugin;

plugintest::CommandPtr MakeList() {
    return FromPlugin<KernelLogList>("_ZN9TarselCli6System13KernelLogList3NewEv");
}
plugintest::CommandPtr MakeSet() {
    return FromPlugin<KernelLogSetLevel>("_ZN9TarselCli6System17KernelLogSetLevel3NewEv");
}

REGISTER_FAULT_CASE(plugintest::FaultCase("KernelLogList", "(unattached) KernelLogList")
                        .Make(MakeList)
                        .Input([](CallSpec::Input& in) { in.SetString("module", "net_stack"); }));
REGISTER_FAULT_CASE(plugintest::FaultCase("KernelLogListCore", "(unattached) KernelLogList core")
                        .Make(MakeList));
REGISTER_FAULT_CASE(plugintest::FaultCase("KernelLogSetLevel", "(unattached) KernelLogSetLevel")
                        .Make(MakeSet)
                        .Input([](CallSpec::Input& in) {
                            in.SetString("module", "net_stack");
                            in.SetString("level-name", "Net");
                            in.SetInt("level", 4);
                        }));
REGISTER_FAULT_CASE(plugintest::FaultCase("KernelLogSetLevelCore", "(unattached) KernelLogSetLevel core")
                        .Make(MakeSet)
                        .Input([](CallSpec::Input& in) {
                            in.SetString("level-name", "Sched");
                            in.SetBool("default", true);
                        }));

const json kHost = {
    {"format", 1},
    {"modules", {{{"name", "nic_a"}, {"loaded", true}}, {{"name", "stor_b"}, {"loaded", true}}}},
    {"log_levels",
     {{{"module", ""}, {"name", "Sched"}, {"current", 2}, {"default", 2}},
      {{"module", ""}, {"name", "Timer"}, {"current", 5}, {"default", 1}},
      {{"module", "nic_a"}, {"name", "Link"}, {"current", 3}, {"default", 1}},
      {{"module", "nic_a"}, {"name", "Rx"}, {"current", 0}, {"default", 0}}}}};

class KernelLog : public ::testing::Test {
protected:
    void SetUp() override {
        ASSERT_TRUE(Plugin()) << dlerror();
        simhost::trace::Enable();
    }
    void TearDown() override { simhost::trace::Disable(); }

    // "name current/default" per row, or the errors.
    std::vector<std::string> Levels(std::function<void(CallSpec::Input&)> fill = {}) {
        plugintest::Run run = plugintest::ExecuteClean(MakeList(), fill);
        std::vector<std::string> rows = run.output->GetErrors();
        auto list = boost::dynamic_pointer_cast<MetaList>(run.output->GetResult());
        if (!list) return rows;
        for (const auto& element : list->GetElements()) {
            auto row = boost::dynamic_pointer_cast<MetaStruct>(element);
            EXPECT_EQ(row->GetName(), "LogLevel");
            rows.push_back(boost::dynamic_pointer_cast<MetaString>(row->GetField("Name"))->GetValue() + " " +
                           std::to_string(boost::dynamic_pointer_cast<MetaInt>(row->GetField("Current Level"))->GetValue()) +
                           "/" +
                           std::to_string(boost::dynamic_pointer_cast<MetaInt>(row->GetField("Default Level"))->GetValue()));
        }
        return rows;
    }
    // The errors of a set, or "true" for success.
    std::string Set(std::function<void(CallSpec::Input&)> fill) {
        plugintest::Run run = plugintest::ExecuteClean(MakeSet(), fill);
        if (!run.output->GetErrors().empty()) {
            EXPECT_FALSE(run.output->GetResult());
            return run.output->GetErrors().front();
        }
        auto result = boost::dynamic_pointer_cast<MetaBool>(run.output->GetResult());
        return result && result->GetValue() && run.output->IsComplete() ? "true" : "no result";
    }

    simhost::TempHost host_{kHost.dump()};
};

TEST_F(KernelLog, TheExportedFactoriesMakeCommandsTheTreeDoesNotHave) {
    plugintest::CommandPtr list = MakeList();
    plugintest::CommandPtr set = MakeSet();
    ASSERT_TRUE(list);
    ASSERT_TRUE(set);
    EXPECT_EQ(list->GetMetaDataField("type"), "fetcher");
    EXPECT_EQ(set->GetMetaDataField("type"), "operation");
    EXPECT_EQ(list->GetDefaultOutputFormatter(), "table");
    EXPECT_EQ(set->GetDefaultOutputFormatter(), "");
    const auto params = set->GetInputSpec()->GetParameters();
    ASSERT_EQ(params.size(), 4u);
    EXPECT_EQ(params[0]->GetName(), "level-name");
    EXPECT_TRUE(params[0]->IsRequired());
    EXPECT_EQ(params[3]->GetName(), "level");
    EXPECT_EQ(params[3]->GetShortName(), "L");
    for (const std::string& path : plugintest::CommandPaths()) EXPECT_EQ(path.find("log"), std::string::npos) << path;
}

TEST_F(KernelLog, ListShowsTheCoreOrAModuleAndFiltersByExactName) {
    EXPECT_EQ(Levels(), (std::vector<std::string>{"Sched 2/2", "Timer 5/1"}));
    EXPECT_EQ(simhost::trace::TakeOperations(),
              (std::vector<std::string>{kInfoNew, "NorlithCtl::System::SystemInfoImpl::GetAllLogLevels"}));
    EXPECT_EQ(Levels([](CallSpec::Input& in) { in.SetString("module", "nic_a"); }),
              (std::vector<std::string>{"Link 3/1", "Rx 0/0"}));
    EXPECT_EQ(simhost::trace::TakeOperations(),
              (std::vector<std::string>{kInfoNew, kByName, "NorlithCtl::System::ModuleImpl::GetLogLevels"}));
    EXPECT_EQ(Levels([](CallSpec::Input& in) {
                  in.SetString("module", "nic_a");
                  in.SetString("level-name", "Rx");
              }),
              (std::vector<std::string>{"Rx 0/0"}));
    EXPECT_TRUE(Levels([](CallSpec::Input& in) { in.SetString("level-name", "sched"); }).empty());
    EXPECT_TRUE(Levels([](CallSpec::Input& in) { in.SetString("module", "stor_b"); }).empty());
    EXPECT_EQ(Levels([](CallSpec::Input& in) { in.SetString("module", "nic_x"); }),
              (std::vector<std::string>{"Could not find module with the name 'nic_x'"}));
}

TEST_F(KernelLog, SetChangesALevelUntilTheNextBoot) {
    EXPECT_EQ(Set([](CallSpec::Input& in) {
                  in.SetString("level-name", "Sched");
                  in.SetInt("level", 7);
              }),
              "true");
    EXPECT_EQ(simhost::trace::TakeOperations(),
              (std::vector<std::string>{kInfoNew, "NorlithCtl::System::SystemInfoImpl::SetLogLevel"}));
    EXPECT_EQ(Set([](CallSpec::Input& in) {
                  in.SetString("module", "nic_a");
                  in.SetString("level-name", "Rx");
                  in.SetInt("level", 31);
              }),
              "true");
    EXPECT_EQ(simhost::trace::TakeOperations(),
              (std::vector<std::string>{kInfoNew, kByName, "NorlithCtl::System::ModuleImpl::SetLogLevel"}));
    // --default resets whatever its value.
    EXPECT_EQ(Set([](CallSpec::Input& in) {
                  in.SetString("module", "nic_a");
                  in.SetString("level-name", "Link");
                  in.SetBool("default", false);
              }),
              "true");
    EXPECT_EQ(Levels(), (std::vector<std::string>{"Sched 7/2", "Timer 5/1"}));
    EXPECT_EQ(Levels([](CallSpec::Input& in) { in.SetString("module", "nic_a"); }),
              (std::vector<std::string>{"Link 1/1", "Rx 31/0"}));
    ASSERT_EQ(NorlithCtl::Os::Env::Default()->Kill(1, SIGTERM), 0);
    EXPECT_EQ(Levels(), (std::vector<std::string>{"Sched 2/2", "Timer 1/1"}));
    EXPECT_EQ(Levels([](CallSpec::Input& in) { in.SetString("module", "nic_a"); }),
              (std::vector<std::string>{"Link 1/1", "Rx 0/0"}));
}

TEST_F(KernelLog, SetRefusalsChangeNothing) {
    const std::string before = host_.host().Export();
    EXPECT_EQ(Set([](CallSpec::Input& in) { in.SetString("level-name", "Sched"); }),
              "must specify default or level");
    EXPECT_EQ(Set([](CallSpec::Input& in) {
                  in.SetString("level-name", "Sched");
                  in.SetBool("default", true);
                  in.SetInt("level", 3);
              }),
              "cant specify default with level");
    // A module the host does not know is reported, never used.
    EXPECT_EQ(Set([](CallSpec::Input& in) {
                  in.SetString("module", "nic_x");
                  in.SetString("level-name", "Link");
                  in.SetInt("level", 3);
              }),
              "Could not find module with the name 'nic_x'");
    EXPECT_EQ(simhost::trace::TakeOperations(), (std::vector<std::string>{kInfoNew, kByName}));
    EXPECT_EQ(Set([](CallSpec::Input& in) {
                  in.SetString("module", "nic_a");
                  in.SetString("level-name", "Lnk");
                  in.SetBool("default", true);
              }),
              "Unknown log level 'Lnk' of module 'nic_a' (did you mean 'Link'?); its log levels are "
              "listed by the kernel log list command");
    EXPECT_EQ(Set([](CallSpec::Input& in) {
                  in.SetString("level-name", "Timer");
                  in.SetInt("level", 2147483647);
              }),
              "Log level 2147483647 for 'Timer' is out of range: levels go from 0 to 31");
    EXPECT_EQ(host_.host().Export(), before);
}

}  // namespace
