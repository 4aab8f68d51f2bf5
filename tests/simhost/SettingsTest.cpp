// The kernel settings domains on the simulated host: the advanced option tree (scenario rules,
// round trip, the default tree, staged changes, refusals that leave the host unchanged), the
// boot-time kernel settings and the keyboard layouts (their rules and the next boot), and the
// path splitter.
#include "TestSupport.h"

#include <norlithctl/AdvancedOptionBranchImpl.h>
#include <norlithctl/AdvancedOptionImpl.h>
#include <norlithctl/Env.h>
#include <norlithctl/KernelOpts.h>
#include <norlithctl/RavelException.h>
#include <norlithctl/SystemInfoImpl.h>
#include <norlithctl/Testing.h>
#include <norlithctl/Util.h>
#include <simhost/Host.h>

#include <gtest/gtest.h>

#include <algorithm>
#include <csignal>
#include <map>
#include <memory>
#include <set>
#include <string>
#include <vector>

namespace {

using nlohmann::json;
using OptionPtr = std::unique_ptr<Ravel::Adv::AdvancedOption>;

json Export(simhost::TempHost& host) { return json::parse(host.host().Export()); }

json Tree(json branches, json options) {
    return json{{"format", 1}, {"advanced", {{"branches", branches}, {"options", options}}}};
}

const json kSmall = Tree({"/Net", "/Net/Tcp"},
                         {{{"path", "/Net/Mss"}, {"type", "integer"}, {"value", 1460}, {"default", 1460},
                           {"min", 536}, {"max", 9000}, {"description", "segment size"}},
                          {{"path", "/Net/Tcp/Algo"}, {"type", "string"}, {"value", "cubic"},
                           {"default", "reno"}, {"valid_characters", "abcdefghijklmnopqrstuvwxyz"}}});

// The message of a scenario the host refuses.
std::string Refusal(const json& scenario) {
    simhost::TempHost host;
    try {
        host.host().Init(scenario.dump(), true);
    } catch (const simhost::HostError& error) {
        return error.what();
    }
    return "";
}

OptionPtr Find(const std::string& path) {
    return OptionPtr(NorlithCtl::Adv::AdvancedOptionImpl::FindOption(path));
}

Ravel::Adv::AdvancedIntegerOption& AsInteger(const OptionPtr& option) {
    return dynamic_cast<Ravel::Adv::AdvancedIntegerOption&>(*option);
}

// ---- the advanced option tree ------------------------------------------------------------------

TEST(AdvancedTree, TheDefaultTreeIsLargeNestedAndMixed) {
    simhost::TempHost host;
    json advanced = Export(host)["advanced"];
    EXPECT_GE(advanced["options"].size(), 1300u);
    EXPECT_GE(advanced["branches"].size(), 25u);
    EXPECT_LE(advanced["branches"].size(), 40u);
    std::size_t deepest = 0, changed = 0, strings = 0, others = 0, users = 0;
    std::set<std::string> paths;
    for (const json& branch : advanced["branches"]) {
        const std::string path = branch;
        deepest = std::max<std::size_t>(deepest, std::count(path.begin(), path.end(), '/'));
    }
    for (const json& option : advanced["options"]) {
        EXPECT_TRUE(paths.insert(option["path"]).second) << option["path"];
        changed += option["value"] != option.value("default", option["value"]);
        strings += option["type"] == "string";
        others += option["type"].is_number();
        users += option.value("user", false);
    }
    EXPECT_EQ(deepest, 3u);
    EXPECT_GE(changed, 5u);
    EXPECT_GE(strings, 10u);
    EXPECT_GE(others, 2u);
    EXPECT_GE(users, 2u);
    // The export of the default host imports again as the same host.
    std::string exported = host.host().Export();
    host.host().Init(exported, true);
    EXPECT_EQ(host.host().Export(), exported);
}

TEST(AdvancedTree, AScenarioRoundTripsAndOnlyItsOwnMembersAreWritten) {
    json scenario = kSmall;
    scenario["advanced"]["options"].push_back({{"path", "/Odd"}, {"type", 9}, {"value", "blob"},
                                              {"description", "opaque"}, {"typed", false},
                                              {"user", true}, {"read_error", "gone"}});
    // Text that needs escaping in the stored form comes back byte for byte.
    const std::string tricky = "quote \" back\\slash /tab\t\x01 caf\xc3\xa9 \xf0\x9f\x98\x80 \x7f end";
    scenario["advanced"]["options"].push_back({{"path", "/Tricky"}, {"type", "string"}, {"description", tricky},
                                              {"value", tricky.substr(0, 12)}});
    simhost::TempHost host(scenario.dump());
    json advanced = Export(host)["advanced"];
    EXPECT_EQ(advanced["branches"], json({"/Net", "/Net/Tcp"}));
    EXPECT_EQ(advanced["options"][0], json::parse(R"({"path": "/Net/Mss", "type": "integer",
        "description": "segment size", "value": 1460, "default": 1460, "min": 536, "max": 9000})"));
    EXPECT_EQ(advanced["options"][1]["value"], "cubic");
    EXPECT_EQ(advanced["options"][2], json::parse(R"({"path": "/Odd", "type": 9, "description": "opaque",
        "value": "blob", "user": true, "typed": false, "read_error": "gone"})"));
    EXPECT_EQ(advanced["options"][3]["description"], tricky);
    OptionPtr found = Find("/Tricky");
    EXPECT_EQ(found->GetDescription(), tricky);
    EXPECT_EQ(dynamic_cast<Ravel::Adv::AdvancedStringOption&>(*found).GetValue(), tricky.substr(0, 12));
    std::string exported = host.host().Export();
    host.host().Init(exported, true);
    EXPECT_EQ(host.host().Export(), exported);
}

TEST(AdvancedTree, ScenariosThatBreakTheTreeOrAnOptionsRulesAreRefused) {
    auto option = [](json extra) {
        json base = {{"path", "/Net/X"}, {"type", "integer"}};
        for (auto it = extra.begin(); it != extra.end(); ++it) base[it.key()] = it.value();
        return Tree({"/Net"}, json::array({base}));
    };
    const std::map<std::string, json> cases = {
        {"scenario: advanced.branches[0]: its parent branch '/A' is not listed", Tree({"/A/B"}, json::array())},
        {"scenario: advanced.branches[1]: '/A' appears twice", Tree({"/A", "/A"}, json::array())},
        {"scenario: advanced.options[0]: its branch '/Nope' is not listed",
         Tree({"/Net"}, {{{"path", "/Nope/X"}, {"type", "integer"}}})},
        {"scenario: advanced.options[0]: '/Net' is a branch", Tree({"/Net"}, {{{"path", "/Net"}, {"type", "string"}}})},
        {"scenario: advanced.options[1]: '/Net/X' appears twice",
         Tree({"/Net"}, {{{"path", "/Net/X"}, {"type", "integer"}}, {{"path", "/Net/X"}, {"type", "string"}}})},
        {"scenario: advanced.options[0]: min 5 is above max 4", option({{"min", 5}, {"max", 4}})},
        {"scenario: advanced.options[0]: value 10 is outside 0 to 9", option({{"max", 9}, {"value", 10}})},
        {"scenario: advanced.options[0]: default 1 is outside 2 to 9",
         option({{"min", 2}, {"max", 9}, {"default", 1}, {"value", 3}})},
        {"scenario: advanced.options[0].value: expected an integer from 0 to 4294967295", option({{"value", -1}})},
        {"scenario: advanced.options[0]: value 'a b' holds the character ' ', which the option does not accept",
         option({{"type", "string"}, {"valid_characters", "ab"}, {"value", "a b"}})},
        {"scenario: advanced.options[0].type: expected \"integer\", \"string\" or a kind from 2 to 255",
         option({{"type", 256}})},
        {"scenario: advanced.options[0].type: expected \"integer\", \"string\" or a kind from 2 to 255",
         option({{"type", 1}})},
        {"scenario: advanced.options[0].path: expected a path of 1 to 8 components of 1 to 63 characters "
         "A-Z a-z 0-9 _ . -, each after a '/'",
         Tree({"/Net"}, {{{"path", "/Net//X"}, {"type", "integer"}}})},
        {"scenario: advanced.options[0]: unknown member 'colour'", option({{"colour", "red"}})},
    };
    for (const auto& [message, scenario] : cases) EXPECT_EQ(Refusal(scenario), message) << scenario.dump();
}

TEST(AdvancedTree, BranchesHandOutTheirOwnChildrenInOrder) {
    simhost::TempHost host(kSmall.dump());
    long before = NorlithCtl::Testing::LiveObjects();
    {
        NorlithCtl::Adv::AdvancedOptionBranchImpl root;
        EXPECT_TRUE(root.GetOptions().empty());
        std::vector<Ravel::Adv::AdvancedOptionBranch*> branches = root.GetBranches();
        ASSERT_EQ(branches.size(), 1u);
        std::unique_ptr<Ravel::Adv::AdvancedOptionBranch> net(branches[0]);
        std::vector<Ravel::Adv::AdvancedOption*> options = net->GetOptions();
        ASSERT_EQ(options.size(), 1u) << "the sub-branch's option is not the branch's own";
        OptionPtr mss(options[0]);
        EXPECT_EQ(mss->GetPath(), "/Net/Mss");
        EXPECT_EQ(mss->GetName(), "Mss");
        EXPECT_EQ(mss->ToString(), "advanced option /Net/Mss");
        std::vector<Ravel::Adv::AdvancedOption*> deeper =
            std::unique_ptr<Ravel::Adv::AdvancedOptionBranch>(net->GetBranch("Tcp"))->GetOptions();
        ASSERT_EQ(deeper.size(), 1u);
        OptionPtr algo(deeper[0]);
        EXPECT_EQ(algo->GetPath(), "/Net/Tcp/Algo");
        for (const char* name : {"tcp", "Tcp/", "", "Tcp/Algo", "Mss"}) EXPECT_EQ(net->GetBranch(name), nullptr) << name;
        EXPECT_GT(NorlithCtl::Testing::LiveObjects(), before);
    }
    EXPECT_EQ(NorlithCtl::Testing::LiveObjects(), before);
}

TEST(AdvancedTree, ChangesAreStagedUntilCommitAndRefreshKeepsThem) {
    simhost::TempHost host(kSmall.dump());
    OptionPtr option = Find("/Net/Mss");
    Ravel::Adv::AdvancedIntegerOption& mss = AsInteger(option);
    EXPECT_FALSE(mss.HasPendingChanges());
    mss.SetValue(9000);
    EXPECT_TRUE(mss.HasPendingChanges());
    EXPECT_EQ(mss.GetValue(), 9000u);
    mss.Refresh();
    EXPECT_EQ(mss.GetValue(), 9000u) << "refresh keeps what is staged";
    EXPECT_EQ(Export(host)["advanced"]["options"][0]["value"], 1460) << "nothing applied yet";
    mss.Commit();
    EXPECT_FALSE(mss.HasPendingChanges());
    EXPECT_EQ(Export(host)["advanced"]["options"][0]["value"], 9000);

    // Discarded and reset-to-default changes.
    mss.SetValue(600);
    mss.DiscardChanges();
    EXPECT_EQ(mss.GetValue(), 9000u);
    mss.ResetToDefault();
    EXPECT_EQ(mss.GetValue(), 1460u);
    std::size_t journal = host.host().Journal().size();
    mss.Commit();
    mss.Commit();  // nothing staged: nothing changes, nothing is journaled
    EXPECT_EQ(host.host().Journal().size(), journal + 1);
    EXPECT_EQ(Export(host)["advanced"]["options"][0]["value"], 1460);
}

TEST(AdvancedTree, RefusedValuesAreNeitherStagedNorApplied) {
    simhost::TempHost host(kSmall.dump());
    const std::string before = host.host().Export();
    OptionPtr option = Find("/Net/Mss");
    try {
        AsInteger(option).SetValue(535);
        ADD_FAILURE();
    } catch (const Ravel::Lib::RavelException& error) {
        const std::string text = "Value 535 is out of range for option /Net/Mss: it accepts an integer from 536 to 9000";
        EXPECT_EQ(error.GetMessage(0), text);
        EXPECT_EQ(error.GetMessage(1), text) << "the event record gives the same text";
        EXPECT_EQ(error.GetQuillMessage().GetId(), "quill.adv.option.out-of-range");
    }
    EXPECT_FALSE(option->HasPendingChanges());
    option->Commit();
    OptionPtr algo = Find("/Net/Tcp/Algo");
    auto& text = dynamic_cast<Ravel::Adv::AdvancedStringOption&>(*algo);
    EXPECT_THROW(text.SetValue("Cubic"), Ravel::Lib::RavelException);
    text.SetValue("");
    EXPECT_EQ(text.GetValue(), "");
    EXPECT_EQ(host.host().Export(), before);
}

TEST(AdvancedTree, CommitChecksAgainstTheOptionAsTheHostHoldsItThen) {
    simhost::TempHost host(kSmall.dump());
    OptionPtr option = Find("/Net/Mss");
    AsInteger(option).SetValue(8000);
    // Meanwhile the host's option narrows its range.
    json narrower = kSmall;
    narrower["advanced"]["options"][0]["max"] = 1500;
    host.host().Init(narrower.dump(), true);
    EXPECT_THROW(option->Commit(), Ravel::Lib::RavelException);
    EXPECT_FALSE(option->HasPendingChanges()) << "a refused commit empties the stage";
    EXPECT_EQ(Export(host)["advanced"]["options"][0]["value"], 1460);
    option->Refresh();
    EXPECT_EQ(AsInteger(option).GetMax(), 1500u);

    // An option that is gone can be neither refreshed nor committed to.
    host.host().Init(Tree({"/Net"}, json::array()).dump(), true);
    try {
        option->Refresh();
        ADD_FAILURE();
    } catch (const Ravel::Lib::RavelException& error) {
        EXPECT_EQ(error.GetMessage(1), "Option /Net/Mss is no longer on the host");
    }
    EXPECT_EQ(Find("/Net/Mss"), nullptr);
}

TEST(AdvancedTree, TheHostHandsOutTheClassOfEachOption) {
    json scenario = kSmall;
    scenario["advanced"]["branches"].push_back("/UserVars");
    scenario["advanced"]["options"].push_back({{"path", "/UserVars/Count"}, {"type", "integer"}, {"user", true}});
    scenario["advanced"]["options"].push_back({{"path", "/UserVars/Motd"}, {"type", "string"}, {"user", true}});
    scenario["advanced"]["options"].push_back({{"path", "/UserVars/Raw"}, {"type", "string"}, {"typed", false}});
    simhost::TempHost host(scenario.dump());
    using namespace NorlithCtl::Adv;
    EXPECT_NE(dynamic_cast<AdvancedIntegerOptionImpl*>(Find("/Net/Mss").get()), nullptr);
    EXPECT_NE(dynamic_cast<AdvancedStringOptionImpl*>(Find("/Net/Tcp/Algo").get()), nullptr);
    EXPECT_NE(dynamic_cast<AdvancedUserIntegerOptionImpl*>(Find("/UserVars/Count").get()), nullptr);
    EXPECT_NE(dynamic_cast<AdvancedUserStringOptionImpl*>(Find("/UserVars/Motd").get()), nullptr);
    OptionPtr raw = Find("/UserVars/Raw");
    EXPECT_EQ(dynamic_cast<Ravel::Adv::AdvancedStringOption*>(raw.get()), nullptr);
    EXPECT_EQ(raw->GetType(), 1);
}

TEST(AdvancedTree, AFindIsOneLookUpWhateverTheTreesSize) {
    json options = json::array();
    json branches = json::array();
    for (int b = 0; b < 60; ++b) {
        branches.push_back("/B" + std::to_string(b));
        for (int o = 0; o < 60; ++o)
            options.push_back({{"path", "/B" + std::to_string(b) + "/O" + std::to_string(o)}, {"type", "integer"},
                               {"value", o}});
    }
    simhost::TempHost host(Tree(branches, options).dump());
    EXPECT_EQ(AsInteger(Find("/B59/O42")).GetValue(), 42u);
    NorlithCtl::Adv::AdvancedOptionBranchImpl root;
    std::vector<Ravel::Adv::AdvancedOptionBranch*> all = root.GetBranches();
    EXPECT_EQ(all.size(), 60u);
    std::vector<Ravel::Adv::AdvancedOption*> some = all[7]->GetOptions();
    EXPECT_EQ(some.size(), 60u);
    EXPECT_EQ(some[59]->GetPath(), "/B7/O59");
    for (auto* option : some) delete option;
    for (auto* branch : all) delete branch;
}

// ---- the path splitter ---------------------------------------------------------------------------

TEST(StringTokenize, EmptyComponentsAreDropped) {
    auto split = [](const std::string& value, const std::string& separators) {
        std::vector<std::string> tokens{"kept"};
        NorlithCtl::Util::StringTokenize(value, tokens, separators);
        return tokens;
    };
    EXPECT_EQ(split("/Net/Tcp", "/"), (std::vector<std::string>{"kept", "Net", "Tcp"}));
    EXPECT_EQ(split("Net//Tcp/", "/"), (std::vector<std::string>{"kept", "Net", "Tcp"}));
    EXPECT_EQ(split("", "/"), (std::vector<std::string>{"kept"}));
    EXPECT_EQ(split("///", "/"), (std::vector<std::string>{"kept"}));
    EXPECT_EQ(split("a,b;c", ",;"), (std::vector<std::string>{"kept", "a", "b", "c"}));
    EXPECT_EQ(split("a b", ""), (std::vector<std::string>{"kept", "a b"}));
}

// ---- boot-time kernel settings -------------------------------------------------------------------

json Settings(json list) { return json{{"format", 1}, {"kernel_settings", list}}; }

TEST(KernelSettings, ValuesAreCheckedByTypeAndRefusalsChangeNothing) {
    simhost::TempHost host(Settings({{{"name", "a8"}, {"type", 3}, {"default", "1"}, {"configured", "1"}},
                                     {{"name", "b"}, {"type", 1}, {"default", "TRUE"}, {"configured", "true"}},
                                     {{"name", "w"}, {"type", 5}, {"default", "0"}, {"configured", "0"}}})
                               .dump());
    NorlithCtl::System::KernelOpts settings;
    const std::string before = host.host().Export();
    for (const auto& [name, value] : std::vector<std::pair<std::string, std::string>>{
             {"a8", "0x100"}, {"a8", "08"}, {"a8", " 1"}, {"a8", "+1"}, {"b", "TRUEISH"}, {"w", "18446744073709551616"}})
        EXPECT_THROW(settings.SetOption(name, value), Ravel::Lib::RavelException) << name << "=" << value;
    EXPECT_EQ(host.host().Export(), before);
    settings.SetOption("a8", "0377");
    settings.SetOption("b", "fAlSe");
    settings.SetOption("w", "0xffffffffffffffff");
    EXPECT_EQ(settings.GetOption("a8"), "0377");
    EXPECT_EQ(settings.GetOption("b"), "fAlSe");
    EXPECT_EQ(settings.GetOptionTypeString(settings.GetOptionType("w")), "uint64");
    EXPECT_EQ(settings.GetOptionTypeString(static_cast<Ravel::System::KernelOption::OptionType>(9)), "unknown");
    try {
        settings.GetOption("A8");
        ADD_FAILURE();
    } catch (const Ravel::Lib::RavelException& error) {
        EXPECT_EQ(error.GetMessage(0), "Unknown kernel setting 'A8' (nearest: a8)");
    }
}

TEST(KernelSettings, TheNextBootRunsWithTheConfiguredValues) {
    simhost::TempHost host(Settings({{{"name", "x"}, {"type", 2}, {"default", "1"}, {"configured", "1"}, {"runtime", "1"}},
                                     {{"name", "y"}, {"type", 2}, {"default", "1"}, {"configured", "1"}}})
                               .dump());
    NorlithCtl::System::KernelOpts settings;
    settings.SetOption("x", "5");
    settings.SetOption("y", "6");
    EXPECT_EQ(settings.GetRuntimeValue("x"), "1");
    ASSERT_EQ(NorlithCtl::Os::Env::Default()->Kill(1, SIGTERM), 0);
    EXPECT_EQ(settings.GetRuntimeValue("x"), "5");
    EXPECT_EQ(settings.GetRuntimeValue("y"), "") << "a setting the kernel does not report stays without runtime value";
    EXPECT_EQ(settings.GetOption("y"), "6");
}

TEST(KernelSettings, ScenariosHoldDefaultsAndConfiguredValuesToTheirType) {
    EXPECT_EQ(Refusal(Settings({{{"name", "b"}, {"type", 1}, {"default", "yes"}, {"configured", "TRUE"}}})),
              "scenario: kernel_settings[0]: default: expected TRUE or FALSE (in any case)");
    EXPECT_EQ(Refusal(Settings({{{"name", "n"}, {"type", 4}, {"default", "1"}, {"configured", "65536"}}})),
              "scenario: kernel_settings[0]: configured: expected an unsigned integer from 0 to 65535 (decimal, "
              "hexadecimal after 0x, octal after a leading 0)");
    EXPECT_EQ(Refusal(Settings({{{"name", "n"}, {"type", 6}}})),
              "scenario: kernel_settings[0].type: expected an integer from 0 to 5");
    EXPECT_EQ(Refusal(Settings({{{"name", "bad name"}, {"type", 0}}})),
              "scenario: kernel_settings[0].name: expected 1 to 64 characters A-Z a-z 0-9 _");
}

TEST(KernelSettings, TheDefaultHostCanCreateADumpFileByItself) {
    simhost::TempHost host;
    NorlithCtl::System::KernelOpts settings;
    EXPECT_EQ(settings.GetOptionType("autoCreateDumpFile"), Ravel::System::KernelOption::OptionTypeBool);
    EXPECT_EQ(settings.GetOption("autoCreateDumpFile"), "TRUE");
    std::set<int> types;
    for (const std::string& name : settings.GetOptionNames()) types.insert(settings.GetOptionType(name));
    EXPECT_EQ(types, (std::set<int>{0, 1, 2, 3, 4, 5}));
}

// ---- keyboard layouts ----------------------------------------------------------------------------

TEST(KeyboardLayouts, NowAndLaterBootsAreKeptApart) {
    simhost::TempHost host;
    NorlithCtl::System::SystemInfoImpl info;
    const std::string first = info.GetKeyboardLayout();
    info.LoadKeyboardMappings("swedish");
    EXPECT_EQ(info.GetKeyboardLayout(), "Swedish");
    info.SetKeyboardLayout("GERMAN (switzerland)");
    EXPECT_EQ(info.GetKeyboardLayout(), "Swedish");
    ASSERT_EQ(NorlithCtl::Os::Env::Default()->Kill(1, SIGTERM), 0);
    EXPECT_EQ(info.GetKeyboardLayout(), "German (Switzerland)");
    EXPECT_NE(first, "German (Switzerland)");
}

TEST(KeyboardLayouts, UnknownLayoutsAreRefusedButAnEmptyNameReappliesTheCurrentOne) {
    simhost::TempHost host;
    NorlithCtl::System::SystemInfoImpl info;
    const std::string before = host.host().Export();
    EXPECT_THROW(info.SetKeyboardLayout(""), Ravel::Lib::RavelException);
    EXPECT_THROW(info.SetKeyboardLayout("Dvorak Left"), Ravel::Lib::RavelException);
    EXPECT_THROW(info.LoadKeyboardMappings("English"), Ravel::Lib::RavelException);
    EXPECT_EQ(host.host().Export(), before);
    info.LoadKeyboardMappings("");
    EXPECT_EQ(host.host().Export(), before);
    EXPECT_EQ(host.host().Journal().back().operation, "NorlithCtl::System::SystemInfoImpl::LoadKeyboardMappings");
}

TEST(KeyboardLayouts, ScenariosNameOnlyOfferedLayouts) {
    EXPECT_EQ(Refusal(json::parse(R"js({"format": 1, "keyboard": {"current": "Dutch", "configured": "Dutch",
                                   "available": ["German"]}})js")),
              "scenario: keyboard: current: 'Dutch' is not an available layout");
    EXPECT_EQ(Refusal(json::parse(R"js({"format": 1, "keyboard": {"current": "", "configured": "",
                                   "available": ["German", "german"]}})js")),
              "scenario: keyboard: available[1]: 'german' appears twice");
}

}  // namespace
