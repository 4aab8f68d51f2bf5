// The advanced options: FormatOption and FormatBranch on option objects the host hands out (and on
// stand-in branches for the walk's failure rules), and system settings advanced list and set
// against throw-away hosts: results, messages, host call order, what persists, failures.
#include "Harness.h"
#include "settings/FormatBranch.h"
#include "settings/FormatOption.h"
#include "settings/SettingsAdvancedList.h"
#include "settings/SettingsAdvancedSet.h"

#include <norlithctl/AdvancedOptionBranchImpl.h>
#include <norlithctl/AdvancedOptionImpl.h>
#include <norlithctl/RavelException.h>
#include <norlithctl/Testing.h>
#include <simhost/Host.h>
#include <simhost/Trace.h>

#include <gtest/gtest.h>
#include <nlohmann/json.hpp>

#include <functional>
#include <memory>
#include <string>
#include <vector>

namespace {

using namespace TarselCli::System;
using Kitbase::MetaObj::MetaInt;
using Kitbase::MetaObj::MetaList;
using Kitbase::MetaObj::MetaObject;
using Kitbase::MetaObj::MetaString;
using Kitbase::MetaObj::MetaStruct;
using plugintest::Outcome;

const std::string kBranchNew = "NorlithCtl::Adv::AdvancedOptionBranchImpl::AdvancedOptionBranchImpl";
const std::string kGetOptions = "NorlithCtl::Adv::AdvancedOptionBranchImpl::GetOptions";
const std::string kGetBranches = "NorlithCtl::Adv::AdvancedOptionBranchImpl::GetBranches";
const std::string kGetBranch = "NorlithCtl::Adv::AdvancedOptionBranchImpl::GetBranch";
const std::string kFindOption = "NorlithCtl::Adv::AdvancedOptionImpl::FindOption";
const std::string kReset = "NorlithCtl::Adv::AdvancedOptionImpl::ResetToDefault";
const std::string kRefresh = "NorlithCtl::Adv::AdvancedOptionImpl::Refresh";
const std::string kCommit = "NorlithCtl::Adv::AdvancedOptionImpl::Commit";
const std::string kSetInt = "NorlithCtl::Adv::AdvancedIntegerOptionImpl::SetValue";
const std::string kSetString = "NorlithCtl::Adv::AdvancedStringOptionImpl::SetValue";

// A small tree: root option first, nested branches, an empty branch, and in /B five options of
// which the third cannot be read.
const char kTree[] = R"({"format": 1, "advanced": {
  "branches": ["/A", "/A/Deep", "/A/Deep/Er", "/B", "/Empty"],
  "options": [
    {"path": "/RootInt", "type": "integer", "description": "root", "value": 7, "default": 7, "min": 0, "max": 10},
    {"path": "/A/Int", "type": "integer", "description": "an int", "value": 5, "default": 3, "min": 1, "max": 9},
    {"path": "/A/Max", "type": "integer", "description": "all ones", "value": 4294967295, "default": 4294967295},
    {"path": "/A/Str", "type": "string", "description": "a string", "value": "abc ", "default": "abc"},
    {"path": "/A/Deep/Kind", "type": 7, "description": "opaque", "value": "x"},
    {"path": "/A/Deep/Er/Leaf", "type": "integer", "description": "leaf", "value": 1, "default": 1},
    {"path": "/B/Host", "type": "string", "description": "host", "value": "h1", "default": "h1",
     "valid_characters": "abcdefgh0123456789-"},
    {"path": "/B/Untyped", "type": "integer", "typed": false, "description": "no interface", "value": 1, "default": 1},
    {"path": "/B/Broken", "type": "integer", "read_error": "sensor offline", "description": "broken"},
    {"path": "/B/UntypedStr", "type": "string", "typed": false, "description": "no interface either"},
    {"path": "/B/User", "type": "integer", "user": true, "value": 2, "default": 2, "min": 0, "max": 5,
     "description": "a user variable"}
  ]}})";

// "name=value" of every field in the structure's order; a value-less integer shows "<none>".
std::vector<std::string> Fields(const boost::shared_ptr<MetaObject>& object) {
    std::vector<std::string> fields;
    boost::shared_ptr<MetaStruct> structure = boost::dynamic_pointer_cast<MetaStruct>(object);
    if (!structure) return fields;
    for (const MetaStruct::Field& field : structure->GetFields()) {
        std::string value = "?";
        if (auto text = boost::dynamic_pointer_cast<MetaString>(field.second))
            value = text->HasValue() ? text->GetValue() : "<none>";
        if (auto number = boost::dynamic_pointer_cast<MetaInt>(field.second))
            value = number->HasValue() ? std::to_string(number->GetValue()) : "<none>";
        fields.push_back(field.first + "=" + value);
    }
    return fields;
}

// The "Path" of every row of a list result.
std::vector<std::string> Paths(const boost::shared_ptr<MetaObject>& result) {
    std::vector<std::string> paths;
    boost::shared_ptr<MetaList> list = boost::dynamic_pointer_cast<MetaList>(result);
    if (!list) return paths;
    for (const auto& row : list->GetElements())
        paths.push_back(boost::dynamic_pointer_cast<MetaString>(
                            boost::dynamic_pointer_cast<MetaStruct>(row)->GetField("Path"))
                            ->GetValue());
    return paths;
}

std::unique_ptr<Ravel::Adv::AdvancedOption> Find(const std::string& path) {
    std::unique_ptr<Ravel::Adv::AdvancedOption> option(NorlithCtl::Adv::AdvancedOptionImpl::FindOption(path));
    EXPECT_TRUE(option) << path;
    return option;
}

// FormatOption of the option at path: the fields and the include flag.
std::vector<std::string> Format(const std::string& path, bool delta, bool* include) {
    std::unique_ptr<Ravel::Adv::AdvancedOption> option = Find(path);
    *include = !*include;  // must be written either way
    return Fields(FormatOption(option.get(), delta, include));
}

nlohmann::json Option(simhost::TempHost& host, const std::string& path) {
    const nlohmann::json exported = nlohmann::json::parse(host.host().Export());
    for (const auto& option : exported["advanced"]["options"])
        if (option["path"] == path) return option;
    return nullptr;
}

// ---- FormatOption ------------------------------------------------------------------------------

TEST(FormatOption, IntegerOptionFillsTheIntegersAndEmptyStrings) {
    simhost::TempHost host(kTree);
    bool include = false;
    EXPECT_EQ(Format("/A/Int", false, &include),
              (std::vector<std::string>{"Path=/A/Int", "Type=integer", "Int Value=5", "Default Int Value=3",
                                        "Min Value=1", "Max Value=9", "String Value=",
                                        "Default String Value=", "Valid Characters=",
                                        "Description=an int"}));
    EXPECT_TRUE(include);
    Format("/A/Int", true, &include);
    EXPECT_TRUE(include) << "5 differs from its default 3";
    Format("/RootInt", true, &include);
    EXPECT_FALSE(include) << "value equals default";
    Format("/RootInt", false, &include);
    EXPECT_TRUE(include);
}

TEST(FormatOption, TheLargestUnsignedValueIsNotNegative) {
    simhost::TempHost host(kTree);
    bool include = false;
    std::vector<std::string> fields = Format("/A/Max", false, &include);
    EXPECT_EQ(fields[2], "Int Value=4294967295");
    EXPECT_EQ(fields[3], "Default Int Value=4294967295");
    EXPECT_EQ(fields[5], "Max Value=4294967295");
}

TEST(FormatOption, StringOptionLeavesTheIntegersWithoutValue) {
    simhost::TempHost host(kTree);
    bool include = false;
    EXPECT_EQ(Format("/B/Host", false, &include),
              (std::vector<std::string>{"Path=/B/Host", "Type=string", "Int Value=<none>",
                                        "Default Int Value=<none>", "Min Value=<none>",
                                        "Max Value=<none>", "String Value=h1", "Default String Value=h1",
                                        "Valid Characters=abcdefgh0123456789-", "Description=host"}));
    Format("/B/Host", true, &include);
    EXPECT_FALSE(include);
    // A trailing blank is a difference.
    Format("/A/Str", true, &include);
    EXPECT_TRUE(include);
}

TEST(FormatOption, UnknownKindHasOnlyPathTypeAndDescriptionAndIsAlwaysListed) {
    simhost::TempHost host(kTree);
    bool include = false;
    EXPECT_EQ(Format("/A/Deep/Kind", true, &include),
              (std::vector<std::string>{"Path=/A/Deep/Kind", "Type=", "Description=opaque"}));
    EXPECT_TRUE(include);
}

TEST(FormatOption, OptionsWithoutTheirTypedInterfaceShowTheFallbacks) {
    simhost::TempHost host(kTree);
    bool include = true;
    EXPECT_EQ(Format("/B/Untyped", false, &include),
              (std::vector<std::string>{"Path=/B/Untyped", "Type=integer", "Int Value=-1",
                                        "Default Int Value=-1", "Min Value=-1", "Max Value=-1",
                                        "String Value=ERROR getting value", "Default String Value=",
                                        "Valid Characters=", "Description=no interface"}));
    EXPECT_TRUE(include);
    Format("/B/Untyped", true, &include);
    EXPECT_FALSE(include);

    EXPECT_EQ(Format("/B/UntypedStr", false, &include),
              (std::vector<std::string>{"Path=/B/UntypedStr", "Type=string", "Int Value=<none>",
                                        "Default Int Value=<none>", "Min Value=<none>",
                                        "Max Value=<none>", "String Value=ERROR getting values",
                                        "Default String Value=", "Valid Characters=",
                                        "Description=no interface either"}));
    EXPECT_TRUE(include);
    Format("/B/UntypedStr", true, &include);
    EXPECT_FALSE(include);
}

TEST(FormatOption, UserVariablesAreFormattedThroughTheirTypedInterface) {
    simhost::TempHost host(kTree);
    bool include = false;
    std::vector<std::string> fields = Format("/B/User", false, &include);
    EXPECT_EQ(fields[2], "Int Value=2");
    EXPECT_EQ(fields[5], "Max Value=5");
}

TEST(FormatOption, AFailingGetterPassesThrough) {
    simhost::TempHost host(kTree);
    std::unique_ptr<Ravel::Adv::AdvancedOption> option = Find("/B/Broken");
    bool include = false;
    try {
        FormatOption(option.get(), false, &include);
        ADD_FAILURE() << "no exception";
    } catch (const Ravel::Lib::RavelException& error) {
        EXPECT_EQ(error.GetMessage(0), "The value of option /B/Broken cannot be read: sensor offline");
    }
}

// ---- FormatBranch ------------------------------------------------------------------------------

TEST(FormatBranch, DepthFirstWithEachBranchsOwnOptionsFirst) {
    simhost::TempHost host(kTree);
    long before = NorlithCtl::Testing::LiveObjects();
    boost::shared_ptr<MetaList> list = MetaList::New(Kitbase::MetaObj::MetaTypeStruct,
                                                     SettingsAdvancedList::New()->GetOutputStructure());
    {
        NorlithCtl::Adv::AdvancedOptionBranchImpl root;
        FormatBranch(&root, list, false);
    }
    // /B/Broken cannot be read and is left out; the empty branch adds nothing.
    EXPECT_EQ(Paths(list), (std::vector<std::string>{"/RootInt", "/A/Int", "/A/Max", "/A/Str",
                                                     "/A/Deep/Kind", "/A/Deep/Er/Leaf", "/B/Host",
                                                     "/B/Untyped", "/B/UntypedStr", "/B/User"}));
    EXPECT_EQ(NorlithCtl::Testing::LiveObjects(), before);

    list = MetaList::New(Kitbase::MetaObj::MetaTypeStruct, SettingsAdvancedList::New()->GetOutputStructure());
    NorlithCtl::Adv::AdvancedOptionBranchImpl root;
    FormatBranch(&root, list, true);
    EXPECT_EQ(Paths(list), (std::vector<std::string>{"/A/Int", "/A/Str", "/A/Deep/Kind"}));
}

// Stand-ins for the walk's failure rules: options that count themselves, and branches whose
// GetOptions or GetBranches fail.
struct Counts {
    int alive = 0;
};

class FakeOption : public Ravel::Adv::AdvancedIntegerOption {
public:
    FakeOption(Counts& counts, std::string path, bool fails) : counts_(counts), path_(path), fails_(fails) {
        ++counts_.alive;
    }
    ~FakeOption() override { --counts_.alive; }
    void Refresh() override {}
    void Commit() override {}
    bool HasPendingChanges() override { return false; }
    void DiscardChanges() override {}
    std::string GetName() override { return path_; }
    std::string ToString() override { return path_; }
    std::string GetPath() override { return path_; }
    int GetType() override { return 0; }
    std::string GetDescription() override { return ""; }
    void ResetToDefault() override {}
    std::uint32_t GetDefault() override { return 0; }
    std::uint32_t GetMin() override { return 0; }
    std::uint32_t GetMax() override { return 9; }
    std::uint32_t GetValue() override {
        if (fails_) throw Ravel::Lib::RavelException("unreadable");
        return 1;
    }
    void SetValue(std::uint32_t) override {}

private:
    Counts& counts_;
    std::string path_;
    bool fails_;
};

class FakeBranch : public Ravel::Adv::AdvancedOptionBranch {
public:
    FakeBranch(Counts& counts, std::string name, int options, int failing_option = -1)
        : counts_(counts), name_(name), options_(options), failing_(failing_option) {
        ++counts_.alive;
    }
    ~FakeBranch() override { --counts_.alive; }
    std::vector<Ravel::Adv::AdvancedOption*> GetOptions() override {
        if (fail_options_) throw Ravel::Lib::RavelException("options of " + name_ + " failed");
        std::vector<Ravel::Adv::AdvancedOption*> out;
        for (int i = 0; i < options_; ++i)
            out.push_back(new FakeOption(counts_, "/" + name_ + "/" + std::to_string(i), i == failing_));
        return out;
    }
    std::vector<Ravel::Adv::AdvancedOptionBranch*> GetBranches() override {
        if (fail_branches_) throw Ravel::Lib::RavelException("branches of " + name_ + " failed");
        std::vector<Ravel::Adv::AdvancedOptionBranch*> out;
        for (const auto& make : children_) out.push_back(make());
        return out;
    }
    Ravel::Adv::AdvancedOptionBranch* GetBranch(const std::string&) override { return nullptr; }

    std::vector<std::function<Ravel::Adv::AdvancedOptionBranch*()>> children_;
    bool fail_options_ = false;
    bool fail_branches_ = false;

private:
    Counts& counts_;
    std::string name_;
    int options_;
    int failing_;
};

boost::shared_ptr<MetaList> EmptyList() {
    return MetaList::New(Kitbase::MetaObj::MetaTypeStruct, SettingsAdvancedList::New()->GetOutputStructure());
}

TEST(FormatBranch, AnOptionThatFailsIsSkippedAndTheOthersKeepTheirOrder) {
    Counts counts;
    FakeBranch branch(counts, "five", 5, 2);
    boost::shared_ptr<MetaList> list = EmptyList();
    FormatBranch(&branch, list, false);
    EXPECT_EQ(Paths(list), (std::vector<std::string>{"/five/0", "/five/1", "/five/3", "/five/4"}));
    EXPECT_EQ(counts.alive, 1) << "every option object deleted";
}

TEST(FormatBranch, AFailingSubTreeKeepsWhatItAddedAndTheWalkGoesOn) {
    Counts counts;
    FakeBranch root(counts, "root", 1);
    root.children_.push_back([&] {
        FakeBranch* broken = new FakeBranch(counts, "broken", 2);
        broken->fail_branches_ = true;  // its options are listed, then its sub-branches fail
        return broken;
    });
    root.children_.push_back([&] {
        FakeBranch* mute = new FakeBranch(counts, "mute", 2);
        mute->fail_options_ = true;
        return mute;
    });
    root.children_.push_back([&] { return new FakeBranch(counts, "last", 1); });
    boost::shared_ptr<MetaList> list = EmptyList();
    FormatBranch(&root, list, false);
    EXPECT_EQ(Paths(list), (std::vector<std::string>{"/root/0", "/broken/0", "/broken/1", "/last/0"}));
    EXPECT_EQ(counts.alive, 1);
}

TEST(FormatBranch, TheBranchsOwnFailurePassesToTheCallerWithEverythingReleased) {
    Counts counts;
    FakeBranch root(counts, "root", 3);
    root.fail_branches_ = true;
    boost::shared_ptr<MetaList> list = EmptyList();
    EXPECT_THROW(FormatBranch(&root, list, false), Ravel::Lib::RavelException);
    EXPECT_EQ(list->Size(), 3u) << "its options were appended before GetBranches failed";
    EXPECT_EQ(counts.alive, 1);
    root.fail_options_ = true;
    EXPECT_THROW(FormatBranch(&root, EmptyList(), false), Ravel::Lib::RavelException);
}

// ---- system settings advanced list ---------------------------------------------------------------

class AdvancedCommands : public ::testing::Test {
protected:
    void SetUp() override { simhost::trace::Enable(); }
    void TearDown() override { simhost::trace::Disable(); }

    plugintest::Run List(std::function<void(CallSpec::Input&)> fill = {}) {
        return plugintest::ExecuteClean(SettingsAdvancedList::New(), fill);
    }
    plugintest::Run Set(std::function<void(CallSpec::Input&)> fill) { return plugintest::ExecuteClean(SettingsAdvancedSet::New(), fill); }
    simhost::TempHost host_{kTree};
};

TEST_F(AdvancedCommands, TheWholeTreeWalksBranchByBranch) {
    plugintest::Run run = List();
    EXPECT_TRUE(run.output->GetErrors().empty());
    EXPECT_TRUE(run.output->IsComplete());
    EXPECT_EQ(Paths(run.output->GetResult()).size(), 10u);
    // The root is made, then each branch lists its options before its sub-branches.
    std::vector<std::string> calls = simhost::trace::TakeOperations();
    ASSERT_GE(calls.size(), 5u);
    EXPECT_EQ(std::vector<std::string>(calls.begin(), calls.begin() + 5),
              (std::vector<std::string>{kBranchNew, kGetOptions, kGetBranches, kGetOptions, kGetBranches}));
    EXPECT_EQ(calls.size(), 1u + 2 * 6) << "one GetOptions and GetBranches per branch, root included";
}

TEST_F(AdvancedCommands, ASubTreeOfTwoComponentsDescendsTwoLevels) {
    plugintest::Run run = List([](CallSpec::Input& in) { in.SetString("tree", "A/Deep"); });
    EXPECT_EQ(Paths(run.output->GetResult()), (std::vector<std::string>{"/A/Deep/Kind", "/A/Deep/Er/Leaf"}));
    std::vector<std::string> calls = simhost::trace::TakeOperations();
    EXPECT_EQ(std::vector<std::string>(calls.begin(), calls.begin() + 4),
              (std::vector<std::string>{kBranchNew, kGetBranch, kGetBranch, kGetOptions}));
}

TEST_F(AdvancedCommands, EmptyComponentsAreDroppedSoTheseNameTheSameBranch) {
    for (const char* tree : {"/A/Deep", "A/Deep/", "/A//Deep", "//A/Deep//"}) {
        plugintest::Run run = List([&](CallSpec::Input& in) { in.SetString("tree", tree); });
        EXPECT_EQ(Paths(run.output->GetResult()).size(), 2u) << tree;
    }
    // No component at all stays at the root: the whole tree.
    for (const char* tree : {"", "/", "//"}) {
        plugintest::Run run = List([&](CallSpec::Input& in) { in.SetString("tree", tree); });
        EXPECT_TRUE(run.output->GetErrors().empty()) << tree;
        EXPECT_EQ(Paths(run.output->GetResult()).size(), 10u) << tree;
    }
}

TEST_F(AdvancedCommands, AnUnknownSubTreeIsReportedWithAnEmptyList) {
    for (const char* tree : {"/Nope", "/A/Int", "/A/Deep/Nope", "a/deep"}) {
        plugintest::Run run = List([&](CallSpec::Input& in) { in.SetString("tree", tree); });
        EXPECT_EQ(run.output->GetErrors(),
                  (std::vector<std::string>{std::string("Invalid value for --tree No tree with the name ") +
                                            tree + " found"}));
        ASSERT_TRUE(run.output->GetResult()) << tree;
        EXPECT_TRUE(Paths(run.output->GetResult()).empty());
        EXPECT_TRUE(run.output->IsComplete());
    }
}

TEST_F(AdvancedCommands, DeltaKeepsOnlyChangedOptions) {
    plugintest::Run run = List([](CallSpec::Input& in) {
        in.SetString("tree", "/A");
        in.SetFlag("delta");
    });
    EXPECT_EQ(Paths(run.output->GetResult()), (std::vector<std::string>{"/A/Int", "/A/Str", "/A/Deep/Kind"}));
}

TEST_F(AdvancedCommands, OneOptionIsListedEvenUnderDelta) {
    plugintest::Run run = List([](CallSpec::Input& in) {
        in.SetString("option", "/RootInt");
        in.SetFlag("delta");
        in.SetString("tree", "/Nope");  // not read with --option
    });
    EXPECT_TRUE(run.output->GetErrors().empty());
    EXPECT_EQ(Paths(run.output->GetResult()), (std::vector<std::string>{"/RootInt"}));
    EXPECT_EQ(simhost::trace::TakeOperations(), (std::vector<std::string>{kFindOption}));
}

TEST_F(AdvancedCommands, AnUnknownOptionIsReportedWithoutResult) {
    for (const char* name : {"/Nope", "/A", "A/Int", "/A//Int", "/A/Int/"}) {
        plugintest::Run run = List([&](CallSpec::Input& in) { in.SetString("option", name); });
        EXPECT_EQ(run.output->GetErrors(), (std::vector<std::string>{std::string("unknown option: ") + name}));
        EXPECT_FALSE(run.output->GetResult());
    }
}

TEST_F(AdvancedCommands, AnOptionThatCannotBeReadIsReportedAndReleased) {
    plugintest::Run run = List([](CallSpec::Input& in) { in.SetString("option", "/B/Broken"); });
    EXPECT_EQ(run.output->GetErrors(),
              (std::vector<std::string>{"The value of option /B/Broken cannot be read: sensor offline"}));
    EXPECT_FALSE(run.output->GetResult());
}

// ---- system settings advanced set -----------------------------------------------------------------

TEST_F(AdvancedCommands, SetTakesExactlyOneValueBeforeAnyLookup) {
    const std::vector<std::function<void(CallSpec::Input&)>> wrong = {
        [](CallSpec::Input&) {},
        [](CallSpec::Input& in) { in.SetInt("int-value", 1); in.SetFlag("default"); },
        [](CallSpec::Input& in) { in.SetInt("int-value", 1); in.SetString("string-value", "x"); },
        [](CallSpec::Input& in) { in.SetString("string-value", ""); in.SetFlag("default"); },
    };
    for (const auto& fill : wrong) {
        plugintest::Run run = Set([&](CallSpec::Input& in) {
            in.SetString("option", "/A/Int");
            fill(in);
        });
        EXPECT_EQ(run.output->GetErrors(),
                  (std::vector<std::string>{"must specify exactly one of: int-value, string-value, default"}));
        EXPECT_FALSE(run.output->GetResult());
        EXPECT_TRUE(simhost::trace::TakeOperations().empty());
    }
}

TEST_F(AdvancedCommands, AnIntegerValueIsStagedCommittedAndKept) {
    plugintest::Run run = Set([](CallSpec::Input& in) {
        in.SetString("option", "/A/Int");
        in.SetInt("int-value", 9);
    });
    EXPECT_TRUE(run.output->GetErrors().empty());
    auto result = boost::dynamic_pointer_cast<Kitbase::MetaObj::MetaBool>(run.output->GetResult());
    ASSERT_TRUE(result);
    EXPECT_TRUE(result->GetValue());
    EXPECT_EQ(simhost::trace::TakeOperations(), (std::vector<std::string>{kFindOption, kSetInt, kCommit}));
    EXPECT_EQ(Option(host_, "/A/Int")["value"], 9);
    EXPECT_EQ(host_.host().Journal().back().operation, kCommit);
    EXPECT_EQ(host_.host().Journal().back().arguments, R"({"/A/Int":9})");
}

TEST_F(AdvancedCommands, AStringValueIsKept) {
    plugintest::Run run = Set([](CallSpec::Input& in) {
        in.SetString("option", "/B/Host");
        in.SetString("string-value", "ab-07");
    });
    EXPECT_TRUE(run.output->GetErrors().empty());
    EXPECT_EQ(simhost::trace::TakeOperations(), (std::vector<std::string>{kFindOption, kSetString, kCommit}));
    EXPECT_EQ(Option(host_, "/B/Host")["value"], "ab-07");
}

TEST_F(AdvancedCommands, ValuesTheOptionRefusesAreReportedAndNothingChanges) {
    const std::string before = host_.host().Export();
    struct Case {
        const char* option;
        std::function<void(CallSpec::Input&)> value;
        const char* message;
    };
    const Case cases[] = {
        {"/A/Int", [](CallSpec::Input& in) { in.SetInt("int-value", 10); },
         "Value 10 is out of range for option /A/Int: it accepts an integer from 1 to 9"},
        {"/A/Int", [](CallSpec::Input& in) { in.SetInt("int-value", 0); },
         "Value 0 is out of range for option /A/Int: it accepts an integer from 1 to 9"},
        {"/B/Host", [](CallSpec::Input& in) { in.SetString("string-value", "ab c"); },
         "Value 'ab c' for option /B/Host holds the character ' ', which the option does not accept: "
         "it accepts only the characters 'abcdefgh0123456789-'"},
        {"/A/Str", [](CallSpec::Input& in) { in.SetString("string-value", "tab\there"); },
         "Value 'tab\\there' for option /A/Str holds the control character 0x09, which the option does "
         "not accept: it accepts printable characters only"},
        {"/A/Str", [](CallSpec::Input& in) { in.SetString("string-value", std::string(1024, 'x')); },
         "Value for option /A/Str is 1024 bytes long: it accepts at most 1023 bytes"},
        {"/B/User", [](CallSpec::Input& in) { in.SetInt("int-value", 6); },
         "Value 6 is out of range for option /B/User: it accepts an integer from 0 to 5"},
    };
    for (const Case& c : cases) {
        plugintest::Run run = Set([&](CallSpec::Input& in) {
            in.SetString("option", c.option);
            c.value(in);
        });
        EXPECT_EQ(run.output->GetErrors(), (std::vector<std::string>{c.message}));
        EXPECT_FALSE(run.output->GetResult());
    }
    EXPECT_EQ(host_.host().Export(), before);
}

TEST_F(AdvancedCommands, TheOptionsKindDecidesWhichValueApplies) {
    struct Case {
        const char* option;
        std::function<void(CallSpec::Input&)> value;
        const char* message;
    };
    const Case cases[] = {
        {"/B/Host", [](CallSpec::Input& in) { in.SetInt("int-value", 1); },
         "option is type of string, but input does not have string value"},
        {"/A/Int", [](CallSpec::Input& in) { in.SetString("string-value", "1"); },
         "option is of type int, but input does not have int value"},
        {"/B/Untyped", [](CallSpec::Input& in) { in.SetInt("int-value", 1); },
         "unable to access option '/B/Untyped' as integer option"},
        {"/B/UntypedStr", [](CallSpec::Input& in) { in.SetString("string-value", "x"); },
         "unable to access option '/B/UntypedStr' as string option"},
        {"/A/Deep/Kind", [](CallSpec::Input& in) { in.SetString("string-value", "x"); },
         "unable to access option '/A/Deep/Kind' as string or integer option"},
        {"/A/Nope", [](CallSpec::Input& in) { in.SetInt("int-value", 1); }, "unknown option: /A/Nope"},
    };
    const std::string before = host_.host().Export();
    for (const Case& c : cases) {
        plugintest::Run run = Set([&](CallSpec::Input& in) {
            in.SetString("option", c.option);
            c.value(in);
        });
        EXPECT_EQ(run.output->GetErrors(), (std::vector<std::string>{c.message})) << c.option;
        EXPECT_FALSE(run.output->GetResult());
    }
    EXPECT_EQ(host_.host().Export(), before);
}

TEST_F(AdvancedCommands, DefaultResetsEitherKindThroughRefreshAndCommit) {
    for (const char* path : {"/A/Int", "/A/Str"}) {
        plugintest::Run run = Set([&](CallSpec::Input& in) {
            in.SetString("option", path);
            in.SetFlag("default");
        });
        EXPECT_TRUE(run.output->GetErrors().empty()) << path;
        EXPECT_TRUE(boost::dynamic_pointer_cast<Kitbase::MetaObj::MetaBool>(run.output->GetResult())->GetValue());
        EXPECT_EQ(simhost::trace::TakeOperations(),
                  (std::vector<std::string>{kFindOption, kReset, kRefresh, kCommit}));
    }
    EXPECT_EQ(Option(host_, "/A/Int")["value"], 3);
    EXPECT_EQ(Option(host_, "/A/Str")["value"], "abc");
}

TEST_F(AdvancedCommands, HostFailuresOfSetAreReportedInTheEventForm) {
    host_.host().AddFault(kCommit, "plain text", std::nullopt,
                          simhost::Event{"quill.host.unavailable", {"commit refused"}});
    plugintest::Run run = Set([](CallSpec::Input& in) {
        in.SetString("option", "/A/Int");
        in.SetInt("int-value", 4);
    });
    EXPECT_EQ(run.output->GetErrors(), (std::vector<std::string>{"The host is not available: commit refused"}));
    EXPECT_EQ(Option(host_, "/A/Int")["value"], 5);
}

// ---- fault cases ---------------------------------------------------------------------------------

REGISTER_FAULT_CASE(plugintest::FaultCase("SettingsAdvancedList", "system settings advanced list")
                        .Scenario(kTree));
REGISTER_FAULT_CASE(plugintest::FaultCase("SettingsAdvancedListTree", "system settings advanced list")
                        .Scenario(kTree)
                        .Input([](CallSpec::Input& in) {
                            in.SetString("tree", "/A/Deep");
                            in.SetFlag("delta");
                        }));
REGISTER_FAULT_CASE(plugintest::FaultCase("SettingsAdvancedListOption", "system settings advanced list")
                        .Scenario(kTree)
                        .Input([](CallSpec::Input& in) { in.SetString("option", "/A/Str"); }));
REGISTER_FAULT_CASE(plugintest::FaultCase("SettingsAdvancedSetInt", "system settings advanced set")
                        .Scenario(kTree)
                        .Form(1)
                        .Input([](CallSpec::Input& in) {
                            in.SetString("option", "/A/Int");
                            in.SetInt("int-value", 2);
                        }));
REGISTER_FAULT_CASE(plugintest::FaultCase("SettingsAdvancedSetUserString", "system settings advanced set")
                        .Scenario(R"({"format": 1, "advanced": {"branches": ["/UserVars"], "options": [
                            {"path": "/UserVars/Motd", "type": "string", "user": true}]}})")
                        .Form(1)
                        .Input([](CallSpec::Input& in) {
                            in.SetString("option", "/UserVars/Motd");
                            in.SetString("string-value", "hello");
                        }));
REGISTER_FAULT_CASE(plugintest::FaultCase("SettingsAdvancedSetDefault", "system settings advanced set")
                        .Scenario(kTree)
                        .Form(1)
                        .Input([](CallSpec::Input& in) {
                            in.SetString("option", "/A/Str");
                            in.SetFlag("default");
                        }));

}  // namespace
