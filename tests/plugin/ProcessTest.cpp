// The process list, load and running-process statistics, and security domain commands against
// throw-away simulated hosts: rows in the host's order with their labels, worlds left out when
// their label cannot be read, load texts (a scale of 0 shows 0.00), the domains ordered by name,
// levels that hold until the next boot, and the option conflicts of the set command.
#include "Harness.h"

#include <norlithctl/Env.h>
#include <simhost/Host.h>
#include <simhost/Trace.h>

#include <gtest/gtest.h>
#include <nlohmann/json.hpp>

#include <algorithm>
#include <csignal>
#include <functional>
#include <map>
#include <string>
#include <vector>

namespace {

using plugintest::Outcome;
using Kitbase::MetaObj::MetaBool;
using Kitbase::MetaObj::MetaInt;
using Kitbase::MetaObj::MetaList;
using Kitbase::MetaObj::MetaObject;
using Kitbase::MetaObj::MetaString;
using Kitbase::MetaObj::MetaStruct;
using nlohmann::json;

const std::string kAccess = "NorlithCtl::Security::NorlithAccessInterfaceImpl::";
const std::string kAccessNew = kAccess + "NorlithAccessInterfaceImpl";
const std::string kResourceNew = "NorlithCtl::Resource::ResourceInfoImpl::ResourceInfoImpl";
const std::string kGetAllWorlds = "NorlithCtl::Resource::ResourceInfoImpl::GetAllWorlds";
const std::string kStatsNew = "Ravel::AdvStats::ServerStats::ServerStats";
const std::string kFetch = "Ravel::AdvStats::ServerStats::FetchAllStats";

// The list command drops a world whose label fails and reports what fails around the loop; the
// statistics and security commands report every failure after their object is built.
REGISTER_FAULT_CASE(plugintest::FaultCase("ProcessList", "system process list")
                        .On(kResourceNew, Outcome::Escapes())
                        .On(kAccess + "GetLabel", Outcome::Ignored()));
REGISTER_FAULT_CASE(plugintest::FaultCase("ProcessStatsLoadGet", "system process stats load get")
                        .On(kStatsNew, Outcome::Escapes()));
REGISTER_FAULT_CASE(plugintest::FaultCase("ProcessStatsRunningGet", "system process stats running get")
                        .On(kStatsNew, Outcome::Escapes()));
REGISTER_FAULT_CASE(plugintest::FaultCase("SecpolicyDomainList", "system secpolicy domain list")
                        .On(kAccessNew, Outcome::Escapes()));
REGISTER_FAULT_CASE(plugintest::FaultCase("SecpolicyDomainSet", "system secpolicy domain set")
                        .Input([](Kitbase::CallSpec::Input& in) {
                            in.SetString("name", "shell");
                            in.SetString("level", "audit");
                        })
                        .On(kAccessNew, Outcome::Escapes()));
REGISTER_FAULT_CASE(plugintest::FaultCase("SecpolicyDomainSetAll", "system secpolicy domain set")
                        .Input([](Kitbase::CallSpec::Input& in) {
                            in.SetFlag("all-domains");
                            in.SetString("level", "enforcing");
                        })
                        .On(kAccessNew, Outcome::Escapes()));

// A world of a scenario.
json World(long long id, const std::string& name, const std::string& state, unsigned domain) {
    return {{"id", id}, {"cartel_id", id},  {"parent_cartel_id", 1}, {"name", name},
            {"command_line", "/bin/" + name + " -x"}, {"world_group_id", 4}, {"cartel_group_id", id},
            {"session_id", 7}, {"flags", 3}, {"type", "main"}, {"state", state},
            {"security_domain_id", domain}};
}

std::string Scenario(json worlds, json more = json::object()) {
    json scenario = {{"format", 1}, {"worlds", std::move(worlds)}};
    scenario.update(more);
    return scenario.dump();
}

std::string Text(const boost::shared_ptr<MetaStruct>& row, const std::string& field) {
    return boost::dynamic_pointer_cast<MetaString>(row->GetField(field))->GetValue();
}
long long Int(const boost::shared_ptr<MetaStruct>& row, const std::string& field) {
    return boost::dynamic_pointer_cast<MetaInt>(row->GetField(field))->GetValue();
}

std::vector<boost::shared_ptr<MetaStruct>> Rows(const boost::shared_ptr<MetaObject>& result) {
    std::vector<boost::shared_ptr<MetaStruct>> rows;
    auto list = boost::dynamic_pointer_cast<MetaList>(result);
    if (!list) return rows;
    for (const auto& item : list->GetElements()) rows.push_back(boost::dynamic_pointer_cast<MetaStruct>(item));
    return rows;
}

class ProcessTest : public ::testing::Test {
protected:
    void SetUp() override { simhost::trace::Enable(); }
    void TearDown() override { simhost::trace::Disable(); }

    plugintest::Run Run(const std::string& path, std::function<void(Kitbase::CallSpec::Input&)> fill = {}) {
        plugintest::InputPtr input = Kitbase::CallSpec::Input::New();
        if (fill) fill(*input);
        simhost::trace::Take();
        plugintest::Run run = plugintest::Execute(plugintest::FindCommand(path), input);
        EXPECT_FALSE(run.escaped) << run.exception;
        EXPECT_EQ(run.leaked, 0) << "host objects were not released";
        return run;
    }
    std::vector<std::string> Names(const plugintest::Run& run) {
        std::vector<std::string> names;
        for (const auto& row : Rows(run.output->GetResult())) names.push_back(Text(row, "Name"));
        return names;
    }
    // "name=level" of every domain, as the list command shows them.
    std::vector<std::string> Levels() {
        std::vector<std::string> levels;
        for (const auto& row : Rows(Run("system secpolicy domain list").output->GetResult()))
            levels.push_back(Text(row, "Domain Name") + "=" + Text(row, "Enforcement Level"));
        return levels;
    }
    std::map<std::string, std::string> LoadTexts() {
        plugintest::Run run = Run("system process stats load get");
        auto result = boost::dynamic_pointer_cast<MetaStruct>(run.output->GetResult());
        std::map<std::string, std::string> texts;
        if (!result) return texts;
        EXPECT_EQ(result->GetFields().size(), 3u);
        for (const auto& field : result->GetFields())
            texts[field.first] = boost::dynamic_pointer_cast<MetaString>(field.second)->GetValue();
        return texts;
    }

    simhost::TempHost host_;
};

TEST_F(ProcessTest, EveryWorldOfTheHostInItsOrderWithEveryField) {
    host_.host().Init(Scenario({World(900, "zeta", "running", 7), World(12, "alpha", "sleeping", 1),
                                World(450, "mid", "waiting", 12)}),
                      true);
    plugintest::Run run = Run("system process list");
    EXPECT_TRUE(run.output->GetErrors().empty());
    EXPECT_TRUE(run.output->IsComplete());
    EXPECT_EQ(Names(run), (std::vector<std::string>{"zeta", "alpha", "mid"}));
    auto rows = Rows(run.output->GetResult());
    ASSERT_EQ(rows.size(), 3u);
    std::vector<std::string> fields;
    for (const auto& field : rows[0]->GetFields()) fields.push_back(field.first);
    EXPECT_EQ(fields, (std::vector<std::string>{"Id", "Name", "Command Line", "Cartel Id",
                                                "Parent Cartel Id", "World Group Id", "Cartel Group Id",
                                                "Session Id", "World Flags", "World State",
                                                "World Type", "Security Domain"}));
    EXPECT_EQ(Int(rows[0], "Id"), 900);
    EXPECT_EQ(Text(rows[0], "Command Line"), "/bin/zeta -x");
    EXPECT_EQ(Int(rows[0], "Parent Cartel Id"), 1);
    EXPECT_EQ(Int(rows[0], "World Group Id"), 4);
    EXPECT_EQ(Int(rows[0], "Session Id"), 7);
    EXPECT_EQ(Int(rows[0], "World Flags"), 3);
    EXPECT_EQ(Text(rows[0], "World State"), "running");
    EXPECT_EQ(Text(rows[0], "World Type"), "main");
    EXPECT_EQ(Text(rows[0], "Security Domain"), "shell");
    EXPECT_EQ(Text(rows[1], "Security Domain"), "system");
    EXPECT_EQ(Text(rows[2], "Security Domain"), "thirdparty");
    EXPECT_EQ(simhost::trace::TakeOperations(),
              (std::vector<std::string>{kResourceNew, kGetAllWorlds, kAccessNew, kAccess + "GetLabel",
                                        kAccess + "GetLabel", kAccess + "GetLabel"}));
}

TEST_F(ProcessTest, AWorldWhoseLabelCannotBeReadIsLeftOutSilently) {
    host_.host().Init(Scenario({World(10, "a", "running", 1), World(11, "orphan", "running", 4242),
                                World(12, "c", "running", 2)}),
                      true);
    plugintest::Run run = Run("system process list");
    EXPECT_TRUE(run.output->GetErrors().empty());
    EXPECT_EQ(Names(run), (std::vector<std::string>{"a", "c"}));

    // A failing label for one world (a fault that fires once) drops only that world.
    host_.host().AddFault(kAccess + "GetLabel", "label service restarting", 1);
    EXPECT_EQ(Names(Run("system process list")), (std::vector<std::string>{"c"}));
}

TEST_F(ProcessTest, AHostWithoutWorldsListsNothingAndSucceeds) {
    host_.host().Init(Scenario(json::array()), true);
    plugintest::Run run = Run("system process list");
    EXPECT_TRUE(run.output->GetErrors().empty());
    ASSERT_TRUE(run.output->GetResult());
    EXPECT_TRUE(Rows(run.output->GetResult()).empty());
    EXPECT_EQ(simhost::trace::TakeOperations(),
              (std::vector<std::string>{kResourceNew, kGetAllWorlds, kAccessNew}));
}

TEST_F(ProcessTest, TheDefaultHostHasAboutSixtyLabelledWorldsAndAgreesOnTheRunningCount) {
    plugintest::Run run = Run("system process list");
    auto rows = Rows(run.output->GetResult());
    EXPECT_GE(rows.size(), 55u);
    EXPECT_LE(rows.size(), 70u);
    int running = 0;
    for (const auto& row : rows) {
        EXPECT_FALSE(Text(row, "Security Domain").empty());
        if (Text(row, "World State") == "running") ++running;
    }
    EXPECT_GT(running, 0);
    auto stats = boost::dynamic_pointer_cast<MetaStruct>(
        Run("system process stats running get").output->GetResult());
    ASSERT_TRUE(stats);
    EXPECT_EQ(stats->GetName(), "ProcessStatsRunningGet");
    EXPECT_EQ(Int(stats, "Running Processes"), running);
    EXPECT_EQ(simhost::trace::TakeOperations(), (std::vector<std::string>{kStatsNew, kFetch}));
}

TEST_F(ProcessTest, LoadTextsAreTheRawValuesOverOneHundredTimesTheScale) {
    host_.host().Init(Scenario(json::array(), {{"load", {{"scale", 2}, {"one_minute", 300},
                                                         {"five_minutes", 123}, {"fifteen_minutes", 0}}}}),
                      true);
    EXPECT_EQ(LoadTexts(), (std::map<std::string, std::string>{
                               {"Load 1 Minute", "1.50"}, {"Load 5 Minutes", "0.61"}, {"Load 15 Minutes", "0.00"}}));
    EXPECT_EQ(simhost::trace::TakeOperations(), (std::vector<std::string>{kStatsNew, kFetch}));
    host_.host().Init(Scenario(json::array(), {{"load", {{"scale", 1}, {"one_minute", 4294967295u},
                                                         {"five_minutes", 150}, {"fifteen_minutes", 123}}}}),
                      true);
    EXPECT_EQ(LoadTexts(), (std::map<std::string, std::string>{{"Load 1 Minute", "42949672.95"},
                                                               {"Load 5 Minutes", "1.50"},
                                                               {"Load 15 Minutes", "1.23"}}));
}

TEST_F(ProcessTest, AScaleOfZeroShowsZeroLoadsNotInfinityOrNan) {
    host_.host().Init(Scenario(json::array(), {{"load", {{"scale", 0}, {"one_minute", 250},
                                                         {"five_minutes", 0}, {"fifteen_minutes", 7}}}}),
                      true);
    EXPECT_EQ(LoadTexts(), (std::map<std::string, std::string>{
                               {"Load 1 Minute", "0.00"}, {"Load 5 Minutes", "0.00"}, {"Load 15 Minutes", "0.00"}}));
}

TEST_F(ProcessTest, DomainsAreListedByNameWithTheirLevelNow) {
    host_.host().Init(R"({"format": 1, "secpolicy": [
        {"name": "zone", "id": 3, "boot_level": "audit"},
        {"name": "Zeta", "id": 4, "boot_level": "enforcing", "level": "disabled"},
        {"name": "alpha", "id": 5}]})",
                      true);
    EXPECT_EQ(Levels(), (std::vector<std::string>{"Zeta=disabled", "alpha=enforcing", "zone=audit"}));
    Run("system secpolicy domain list");
    EXPECT_EQ(simhost::trace::TakeOperations(),
              (std::vector<std::string>{kAccessNew, kAccess + "GetKeywordsMap", kAccess + "GetStatus",
                                        kAccess + "GetStatus", kAccess + "GetStatus"}));
}

TEST_F(ProcessTest, AFailingLevelEndsTheListWithNoPartialList) {
    host_.host().AddFault(kAccess + "GetStatus", "domain table busy", 1);
    plugintest::Run run = Run("system secpolicy domain list");
    EXPECT_EQ(run.output->GetErrors(), (std::vector<std::string>{"domain table busy"}));
    EXPECT_FALSE(run.output->GetResult());
    host_.host().Init(R"({"format": 1, "secpolicy": []})", true);
    plugintest::Run empty = Run("system secpolicy domain list");
    EXPECT_TRUE(empty.output->GetErrors().empty());
    ASSERT_TRUE(empty.output->GetResult());
    EXPECT_TRUE(Rows(empty.output->GetResult()).empty());
}

TEST_F(ProcessTest, SetChangesOneOrAllDomainsUntilTheNextBoot) {
    const std::vector<std::string> boot = Levels();
    plugintest::Run one = Run("system secpolicy domain set", [](auto& in) {
        in.SetString("name", "shell");
        in.SetString("level", "enforcing");
    });
    EXPECT_TRUE(boost::dynamic_pointer_cast<MetaBool>(one.output->GetResult())->GetValue());
    EXPECT_EQ(simhost::trace::TakeOperations(), (std::vector<std::string>{kAccessNew, kAccess + "EnableDomain"}));
    std::vector<std::string> levels = Levels();
    EXPECT_NE(std::find(levels.begin(), levels.end(), "shell=enforcing"), levels.end());

    plugintest::Run all = Run("system secpolicy domain set", [](auto& in) {
        in.SetFlag("all-domains");
        in.SetString("level", "audit");
    });
    EXPECT_TRUE(all.output->IsComplete());
    EXPECT_EQ(simhost::trace::TakeOperations(), (std::vector<std::string>{kAccessNew, kAccess + "Enable"}));
    for (const std::string& level : Levels()) EXPECT_EQ(level.substr(level.find('=')), "=audit");

    // A reboot through the seam brings back the levels the domains boot with.
    ASSERT_EQ(NorlithCtl::Os::Env::Default()->Kill(1, SIGTERM), 0);
    EXPECT_EQ(Levels(), boot);
}

TEST_F(ProcessTest, SetRefusesConflictingOrMissingTargetsBeforeAnyChange) {
    plugintest::Run both = Run("system secpolicy domain set", [](auto& in) {
        in.SetFlag("all-domains");
        in.SetString("name", "shell");
        in.SetString("level", "audit");
    });
    EXPECT_EQ(both.output->GetErrors(),
              (std::vector<std::string>{"Can't specify domain name with all-domains option"}));
    EXPECT_FALSE(both.output->GetResult());
    plugintest::Run neither = Run("system secpolicy domain set", [](auto& in) { in.SetString("level", "audit"); });
    EXPECT_EQ(neither.output->GetErrors(), (std::vector<std::string>{"Must specify one of all-domains or name"}));
    EXPECT_EQ(simhost::trace::TakeOperations(), (std::vector<std::string>{kAccessNew}));
    EXPECT_EQ(host_.host().Journal().size(), 0u);
}

TEST_F(ProcessTest, UnknownDomainsAndLevelsAreRefusedByTheHostLayer) {
    const std::vector<std::string> before = Levels();
    plugintest::Run domain = Run("system secpolicy domain set", [](auto& in) {
        in.SetString("name", "shel");
        in.SetString("level", "audit");
    });
    EXPECT_EQ(domain.output->GetErrors(),
              (std::vector<std::string>{"Unknown security domain 'shel' (did you mean 'shell'?); "
                                        "'system secpolicy domain list' shows the host's domains"}));
    EXPECT_FALSE(domain.output->GetResult());
    plugintest::Run level = Run("system secpolicy domain set", [](auto& in) {
        in.SetFlag("all-domains");
        in.SetString("level", "Enforcing");
    });
    EXPECT_EQ(level.output->GetErrors(),
              (std::vector<std::string>{"Unknown enforcement level 'Enforcing' (did you mean 'enforcing'?); "
                                        "the levels are: disabled, audit, enforcing"}));
    plugintest::Run empty = Run("system secpolicy domain set", [](auto& in) {
        in.SetString("name", "shell");
        in.SetString("level", "");
    });
    EXPECT_EQ(empty.output->GetErrors(),
              (std::vector<std::string>{"Unknown enforcement level ''; the levels are: disabled, audit, enforcing"}));
    EXPECT_EQ(Levels(), before);
    EXPECT_EQ(host_.host().Journal().size(), 0u);
}

TEST(ProcessSpecs, DefaultParametersAndShapes) {
    auto list = plugintest::FindCommand("system process list");
    EXPECT_EQ(list->GetDefaultOutputParameters(),
              (std::vector<Kitbase::AutoCli::Command::KeyValue>{
                  {"fields:UserWorld", "Id,Cartel Id,Name,Security Domain,Command Line"}}));
    EXPECT_EQ(plugintest::FindCommand("system secpolicy domain list")->GetDefaultOutputParameters(),
              (std::vector<Kitbase::AutoCli::Command::KeyValue>{
                  {"fields:DomainList", "Domain Name,Enforcement Level"}}));
    auto set = plugintest::FindCommand("system secpolicy domain set")->GetInputSpec()->GetParameters();
    ASSERT_EQ(set.size(), 3u);
    EXPECT_EQ(set[0]->GetName(), "all-domains");
    EXPECT_EQ(set[0]->GetType(), Kitbase::CallSpec::ParameterTypeFlag);
    EXPECT_EQ(set[1]->GetName(), "name");
    EXPECT_FALSE(set[1]->IsRequired());
    EXPECT_EQ(set[2]->GetName(), "level");
    EXPECT_TRUE(set[2]->IsRequired());
}

}  // namespace
