// The kernel modules and log levels on the simulated host: the option string format and the
// parameter types, the default module set, loading and enabling kept apart until a reboot,
// option strings for modules and aliases, refusals that leave the host unchanged, log levels of
// the core and of modules, and scenarios that round-trip.
#include "TestSupport.h"

#include <norlithctl/Env.h>
#include <norlithctl/ModuleImpl.h>
#include <norlithctl/RavelException.h>
#include <norlithctl/SystemInfoImpl.h>
#include <norlithctl/Testing.h>
#include <norlithctl/Util.h>
#include <simhost/Host.h>
#include <simhost/domains/Modules.h>

#include <gtest/gtest.h>

#include <csignal>
#include <map>
#include <memory>
#include <string>
#include <vector>

namespace {

using nlohmann::json;
using NorlithCtl::System::ModuleImpl;
namespace modules = simhost::modules;

const json kHost = {
    {"format", 1},
    {"modules",
     {{{"name", "nic_a"},
       {"parameters", {{{"name", "rss"}, {"type", "uint"}}, {{"name", "itr"}, {"type", "int array"}},
                       {{"name", "lro"}, {"type", "bool"}}}},
       {"options", "rss=4"}, {"loaded_options", "rss=4"}, {"loaded", true}, {"enabled", true}},
      {{"name", "stor_b"}, {"loaded", false}, {"enabled", true}},
      {{"name", "old_c"}, {"loaded", false}, {"enabled", false}}}},
    {"log_levels",
     {{{"module", ""}, {"name", "Sched"}, {"current", 2}, {"default", 2}},
      {{"module", ""}, {"name", "Timer"}, {"current", 1}, {"default", 1}},
      {{"module", "nic_a"}, {"name", "Link"}, {"current", 3}, {"default", 1}}}}};

std::string Problem(const std::string& text) {
    modules::Pairs pairs;
    return modules::ParseOptions(text, pairs);
}

std::string HostMessage(const std::function<void()>& body) {
    try {
        body();
    } catch (const Ravel::Lib::RavelException& e) {
        return e.GetMessage(0);
    }
    return "";
}

void Reboot() { ASSERT_EQ(NorlithCtl::Os::Env::Default()->Kill(1, SIGTERM), 0); }

json ModuleJson(simhost::TempHost& host, const std::string& name) {
    const json exported = json::parse(host.host().Export());
    for (const json& m : exported["modules"])
        if (m["name"] == name) return m;
    return json();
}

TEST(ModuleOptions, BlankSeparatedPairsParseAndMalformedStringsAreRefused) {
    modules::Pairs pairs;
    EXPECT_EQ(modules::ParseOptions("  rss=4\titr=10,20  lro=y ", pairs), "");
    EXPECT_EQ(pairs, (modules::Pairs{{"rss", "4"}, {"itr", "10,20"}, {"lro", "y"}}));
    EXPECT_EQ(modules::ParseOptions("", pairs), "");
    EXPECT_TRUE(pairs.empty());
    EXPECT_EQ(modules::ParseOptions("   ", pairs), "");
    EXPECT_EQ(Problem("rss"), "expected name=value pairs separated by blanks, found 'rss'");
    EXPECT_EQ(Problem("rss=4 =5"), "expected name=value pairs separated by blanks, found '=5'");
    EXPECT_EQ(Problem("rss="), "expected name=value pairs separated by blanks, found 'rss='");
    EXPECT_EQ(Problem("rss=4 rss=5"), "parameter 'rss' is given twice");
    EXPECT_NE(Problem("rss=4\x01"), "");
    EXPECT_NE(Problem("r-s=4"), "");
    EXPECT_NE(Problem("rss=" + std::string(256, '1')), "");
    EXPECT_NE(Problem(std::string(2100, 'a') + "=1 " + std::string(2100, 'b') + "=2"), "");
    // An equals sign inside a value belongs to the value.
    EXPECT_EQ(modules::ParseOptions("path=a=b", pairs), "");
    EXPECT_EQ(pairs.front().second, "a=b");
}

TEST(ModuleOptions, ValuesFollowTheirParameterTypes) {
    EXPECT_EQ(modules::CheckValue("int", "-2147483648"), "");
    EXPECT_NE(modules::CheckValue("int", "2147483648"), "");
    EXPECT_NE(modules::CheckValue("int", "12a"), "");
    EXPECT_EQ(modules::CheckValue("uint", "4294967295"), "");
    EXPECT_NE(modules::CheckValue("uint", "-1"), "");
    EXPECT_EQ(modules::CheckValue("bool", "Y"), "");
    EXPECT_NE(modules::CheckValue("bool", "yes"), "");
    EXPECT_EQ(modules::CheckValue("string", "anything,at:all"), "");
    EXPECT_EQ(modules::CheckValue("uint array", "1,2,3"), "");
    EXPECT_NE(modules::CheckValue("uint array", "1,,3"), "");
    std::string many = "1";
    for (int i = 1; i < 32; ++i) many += ",1";
    EXPECT_EQ(modules::CheckValue("int array", many), "");
    EXPECT_NE(modules::CheckValue("int array", many + ",1"), "");
}

TEST(ModuleHost, TheDefaultHostHasARealisticModuleSet) {
    simhost::TempHost host;
    NorlithCtl::System::SystemInfoImpl info;
    std::vector<Ravel::System::Module*> all = info.GetModules();
    ASSERT_GE(all.size(), 100u);
    ASSERT_LE(all.size(), 150u);
    int loaded = 0, disabled = 0, idle = 0, signed_ = 0, withParameters = 0, withOptions = 0;
    for (Ravel::System::Module* module : all) {
        ModuleImpl& impl = dynamic_cast<ModuleImpl&>(*module);
        loaded += module->IsLoaded();
        disabled += !module->IsEnabled();
        idle += module->IsEnabled() && !module->IsLoaded();
        if (!module->GetSignatureIssuer().empty()) {
            ++signed_;
            EXPECT_EQ(module->GetSignatureDigest().size(), 64u) << module->GetName();
            EXPECT_EQ(module->GetSignatureFingerPrint().size(), 59u) << module->GetName();
        }
        EXPECT_FALSE(module->GetVersion().empty());
        EXPECT_FALSE(module->GetModuleFile().empty());
        withParameters += !impl.GetParameters().empty();
        withOptions += !impl.GetOptions().empty();
    }
    NorlithCtl::Util::DeleteVector(all);
    EXPECT_TRUE(all.empty());
    EXPECT_GT(loaded, static_cast<int>(all.size()) / 2 + 40);
    EXPECT_GE(disabled, 5);
    EXPECT_GE(idle, 10);
    EXPECT_GT(signed_, 100);
    EXPECT_GE(withParameters, 20);
    EXPECT_GE(withOptions, 5);

    std::vector<Ravel::System::LogLevel*> core = info.GetAllLogLevels();
    EXPECT_GE(core.size(), 10u);
    NorlithCtl::Util::DeleteVector(core);
}

TEST(ModuleHost, LoadingIsNowAndEnablingIsForTheNextBoot) {
    simhost::TempHost host(kHost.dump());
    const long live = NorlithCtl::Testing::LiveObjects();
    {
        ModuleImpl idle("stor_b");
        EXPECT_FALSE(idle.IsLoaded());
        idle.Load("", false);
        EXPECT_TRUE(idle.IsLoaded());
        EXPECT_EQ(HostMessage([&] { idle.Load("", false); }),
                  "Module 'stor_b' is already loaded; options stored now apply at its next load");
        idle.SetEnabled(false);
        EXPECT_TRUE(ModuleImpl("stor_b").IsLoaded());  // still running until the next boot

        ModuleImpl off("old_c");
        EXPECT_EQ(HostMessage([&] { off.Load("", false); }),
                  "Module 'old_c' is disabled; it loads only when forced");
        EXPECT_FALSE(ModuleImpl("old_c").IsLoaded());
        off.Load("", true);
        EXPECT_TRUE(ModuleImpl("old_c").IsLoaded());

        ModuleImpl nic("nic_a");
        nic.SetOptionString("rss=8 lro=1", false);
        EXPECT_EQ(ModuleJson(host, "nic_a")["loaded_options"], "rss=4");
    }
    EXPECT_EQ(NorlithCtl::Testing::LiveObjects(), live);
    Reboot();
    // The enabled modules are the loaded ones, with the options stored for them.
    EXPECT_FALSE(ModuleImpl("stor_b").IsLoaded());
    EXPECT_FALSE(ModuleImpl("old_c").IsLoaded());
    EXPECT_TRUE(ModuleImpl("nic_a").IsLoaded());
    EXPECT_EQ(ModuleJson(host, "nic_a")["loaded_options"], "rss=8 lro=1");
}

TEST(ModuleHost, UnknownAndMalformedNamesAreRefusedAndChangeNothing) {
    simhost::TempHost host(kHost.dump());
    const std::string before = host.host().Export();
    const std::size_t journal = host.host().Journal().size();
    EXPECT_FALSE(ModuleImpl::IsValidName("nic_b"));
    EXPECT_FALSE(ModuleImpl::IsValidName(""));
    EXPECT_TRUE(ModuleImpl::IsValidName("nic_a"));
    ModuleImpl unknown("nic_b");
    EXPECT_FALSE(unknown.IsEnabled());
    EXPECT_FALSE(unknown.GetEnabled());
    EXPECT_TRUE(unknown.GetParameters().empty());
    EXPECT_EQ(HostMessage([&] { unknown.Load("", true); }),
              "Module 'nic_b' is not known to the host (did you mean 'nic_a'?); 'system module list' "
              "shows the host's modules");
    EXPECT_NE(HostMessage([&] { unknown.SetEnabled(true); }), "");
    EXPECT_NE(HostMessage([&] { unknown.Refresh(); }), "");
    EXPECT_EQ(HostMessage([] { ModuleImpl("a/b").SetEnabled(true); }),
              "Module name 'a/b' is not valid: a module name holds no '/'; give the name, not the "
              "module's file path");
    EXPECT_EQ(HostMessage([] { ModuleImpl("nic\n").SetOptionString("x=1", false); }),
              "Module name 'nic\\n' is not valid: a module name holds no control characters");
    EXPECT_EQ(HostMessage([] { ModuleImpl("").Load("", true); }), "Module name cannot be empty");
    EXPECT_EQ(host.host().Export(), before);
    EXPECT_EQ(host.host().Journal().size(), journal);
}

TEST(ModuleHost, OptionStringsAreCheckedForModulesAndKeptUncheckedForAliases) {
    simhost::TempHost host(kHost.dump());
    ModuleImpl nic("nic_a");
    const std::string before = host.host().Export();
    EXPECT_EQ(HostMessage([&] { nic.SetOptionString("rs=4", false); }),
              "Option string for module 'nic_a' refused: module 'nic_a' declares no parameter 'rs' "
              "(did you mean 'rss'?); 'system module parameters list' shows its parameters");
    EXPECT_EQ(HostMessage([&] { nic.SetOptionString("rss=-1", false); }),
              "Option string for module 'nic_a' refused: value '-1' of parameter 'rss' (uint) is not "
              "an integer from 0 to 4294967295");
    EXPECT_EQ(HostMessage([&] { nic.SetOptionString("rss=4 lro", false); }),
              "Option string for module 'nic_a' refused: expected name=value pairs separated by "
              "blanks, found 'lro'");
    EXPECT_NE(HostMessage([&] { nic.Load("lro=maybe", false); }), "");
    EXPECT_EQ(host.host().Export(), before);

    // Stored byte for byte, blanks included; merge keeps what it does not name.
    nic.SetOptionString(" itr=5,6  lro=n ", false);
    EXPECT_EQ(ModuleJson(host, "nic_a")["options"], " itr=5,6  lro=n ");
    EXPECT_EQ(nic.GetOptions(), (std::map<std::string, std::string>{{"itr", "5,6"}, {"lro", "n"}}));
    nic.SetOptionString("lro=y rss=2", true);
    EXPECT_EQ(ModuleJson(host, "nic_a")["options"], "itr=5,6 lro=y rss=2");
    nic.SetOptionString("", false);
    EXPECT_TRUE(nic.GetOptions().empty());

    // A name the host does not know keeps its string unchecked.
    ModuleImpl alias("nic_alias");
    alias.SetOptionString("anything goes=1 =", false);
    EXPECT_EQ(json::parse(host.host().Export())["module_aliases"],
              json::parse(R"([{"name": "nic_alias", "options": "anything goes=1 ="}])"));
    EXPECT_EQ(alias.GetOptions(), (std::map<std::string, std::string>{{"goes", "1"}}));
    EXPECT_FALSE(ModuleImpl::IsValidName("nic_alias"));
}

TEST(ModuleHost, LogLevelsChangeUntilTheNextBoot) {
    simhost::TempHost host(kHost.dump());
    NorlithCtl::System::SystemInfoImpl info;
    auto levels = [&](Ravel::System::Module* module) {
        std::vector<Ravel::System::LogLevel*> records =
            module ? module->GetLogLevels() : info.GetAllLogLevels();
        std::vector<std::string> text;
        for (auto* r : records)
            text.push_back(r->name + "=" + std::to_string(r->currentLevel) + "/" + std::to_string(r->defaultLevel));
        NorlithCtl::Util::DeleteVector(records);
        return text;
    };
    EXPECT_EQ(levels(nullptr), (std::vector<std::string>{"Sched=2/2", "Timer=1/1"}));
    std::unique_ptr<Ravel::System::Module> nic(info.GetModuleByName("nic_a"));
    ASSERT_TRUE(nic);
    EXPECT_FALSE(std::unique_ptr<Ravel::System::Module>(info.GetModuleByName("nic_b")));
    EXPECT_FALSE(std::unique_ptr<Ravel::System::Module>(info.GetModuleByName("")));
    EXPECT_EQ(levels(nic.get()), (std::vector<std::string>{"Link=3/1"}));
    std::unique_ptr<Ravel::System::Module> stor(info.GetModuleByName("stor_b"));
    EXPECT_TRUE(levels(stor.get()).empty());

    info.SetLogLevel("Timer", 31);
    nic->SetDefaultLogLevel("Link");
    EXPECT_EQ(levels(nullptr), (std::vector<std::string>{"Sched=2/2", "Timer=31/1"}));
    EXPECT_EQ(levels(nic.get()), (std::vector<std::string>{"Link=1/1"}));

    const std::string before = host.host().Export();
    EXPECT_EQ(HostMessage([&] { info.SetLogLevel("Timer", 32); }),
              "Log level 32 for 'Timer' is out of range: levels go from 0 to 31");
    EXPECT_EQ(HostMessage([&] { info.SetLogLevel("Timr", 3); }),
              "Unknown log level 'Timr' of the kernel core (did you mean 'Timer'?); its log levels "
              "are listed by the kernel log list command");
    EXPECT_EQ(HostMessage([&] { nic->SetLogLevel("Sched", 3); }),
              "Unknown log level 'Sched' of module 'nic_a'; its log levels are listed by the kernel "
              "log list command");
    EXPECT_EQ(host.host().Export(), before);

    nic->SetLogLevel("Link", 7);
    Reboot();
    EXPECT_EQ(levels(nullptr), (std::vector<std::string>{"Sched=2/2", "Timer=1/1"}));
    EXPECT_EQ(levels(nic.get()), (std::vector<std::string>{"Link=1/1"}));
}

TEST(ModuleHost, ScenariosRoundTripAndBadOnesAreRefused) {
    simhost::TempHost host(kHost.dump());
    const std::string exported = host.host().Export();
    EXPECT_EQ(json::parse(exported)["log_levels"], kHost["log_levels"]);
    EXPECT_EQ(ModuleJson(host, "nic_a")["parameters"][1],
              json::parse(R"({"name": "itr", "type": "int array", "description": ""})"));
    EXPECT_EQ(ModuleJson(host, "old_c")["enabled"], false);
    simhost::TempHost again(exported);
    EXPECT_EQ(again.host().Export(), exported);

    auto refusal = [](json scenario) {
        simhost::TempHost other;
        try {
            other.host().Init(scenario.dump(), true);
        } catch (const simhost::HostError& error) {
            return std::string(error.what());
        }
        return std::string();
    };
    json bad = kHost;
    bad["modules"][0]["name"] = "nic/a";
    EXPECT_NE(refusal(bad).find("modules[0].name"), std::string::npos) << refusal(bad);
    bad = kHost;
    bad["modules"][1]["name"] = "nic_a";
    EXPECT_NE(refusal(bad).find("appears twice"), std::string::npos);
    bad = kHost;
    bad["log_levels"][0]["current"] = 32;
    EXPECT_NE(refusal(bad).find("log_levels[0].current"), std::string::npos) << refusal(bad);
    bad = kHost;
    bad["modules"][0]["parameters"][0]["type"] = "float";
    EXPECT_NE(refusal(bad), "");
}

}  // namespace
