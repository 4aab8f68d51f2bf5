// The kernel boot settings: IsDelta's comparison by type, and system settings kernel list and set
// against throw-away hosts (rows, the delta filter, unset runtime values, host call order, the
// configured value taking effect at the next boot, failures).
#include "Harness.h"
#include "settings/IsDelta.h"
#include "settings/SettingsKernelList.h"
#include "settings/SettingsKernelSet.h"

#include <norlithctl/Env.h>
#include <simhost/Host.h>
#include <simhost/Trace.h>

#include <gtest/gtest.h>
#include <nlohmann/json.hpp>

#include <csignal>
#include <functional>
#include <string>
#include <vector>

namespace {

using namespace TarselCli::System;
using Kitbase::MetaObj::MetaList;
using Kitbase::MetaObj::MetaObject;
using Kitbase::MetaObj::MetaString;
using Kitbase::MetaObj::MetaStruct;
typedef Ravel::System::KernelOption::OptionType Type;

const std::string kNew = "NorlithCtl::System::KernelOpts::KernelOpts";
const std::string kNames = "NorlithCtl::System::KernelOpts::GetOptionNames";
const std::string kType = "NorlithCtl::System::KernelOpts::GetOptionType";
const std::string kTypeString = "NorlithCtl::System::KernelOpts::GetOptionTypeString";
const std::string kDescription = "NorlithCtl::System::KernelOpts::GetOptionDescription";
const std::string kConfigured = "NorlithCtl::System::KernelOpts::GetOption";
const std::string kRuntime = "NorlithCtl::System::KernelOpts::GetRuntimeValue";
const std::string kDefault = "NorlithCtl::System::KernelOpts::GetOptionDefault";
const std::string kSet = "NorlithCtl::System::KernelOpts::SetOption";

bool Delta(int type, const char* def, const char* configured, const char* runtime) {
    return IsDelta(static_cast<Type>(type), def, configured, runtime);
}

TEST(IsDelta, StringsCompareByteForByte) {
    EXPECT_FALSE(Delta(0, "vga", "vga", ""));
    EXPECT_TRUE(Delta(0, "vga", "VGA", ""));
    EXPECT_TRUE(Delta(0, "vga", "vga ", ""));
    EXPECT_TRUE(Delta(0, "vga", "vga", "com1")) << "the runtime value differs";
    EXPECT_FALSE(Delta(0, "vga", "vga", "vga"));
}

TEST(IsDelta, BooleansAreTrueWhenTheyBeginWithTrueInAnyCase) {
    EXPECT_TRUE(Delta(1, "TRUE", "FALSE", ""));
    EXPECT_FALSE(Delta(1, "TRUE", "true", ""));
    EXPECT_FALSE(Delta(1, "tRuE", "TrUe", ""));
    EXPECT_FALSE(Delta(1, "true", "trueish", "")) << "a longer word that begins with true is true";
    EXPECT_TRUE(Delta(1, "TRUE", "TRUE", "1")) << "1 is false";
    EXPECT_FALSE(Delta(1, "FALSE", "yes", "")) << "yes is false";
    EXPECT_FALSE(Delta(1, "no", "", "0"));
    EXPECT_TRUE(Delta(1, "tru", "TRUE", ""));
}

TEST(IsDelta, NumbersCompareByValueWithAutomaticBase) {
    EXPECT_FALSE(Delta(2, "16", "0x10", ""));
    EXPECT_FALSE(Delta(2, "8", "010", "")) << "leading 0 is octal";
    EXPECT_TRUE(Delta(2, "10", "010", ""));
    EXPECT_FALSE(Delta(2, "12abc", "12", "")) << "reading stops at the first character that does not fit";
    EXPECT_FALSE(Delta(2, "", "none", "")) << "no digits read as 0";
    EXPECT_FALSE(Delta(4, "60", "0x3c", "60"));
    EXPECT_TRUE(Delta(4, "60", "0x3c", "61"));
    // Read as 32 bits: beyond them the largest value; -1 is the largest value too.
    EXPECT_FALSE(Delta(2, "4294967295", "99999999999", ""));
    EXPECT_FALSE(Delta(2, "4294967295", "-1", ""));
    EXPECT_FALSE(Delta(2, "4294967291", "-5", ""));
}

TEST(IsDelta, TypeThreeComparesTheLowestEightBits) {
    EXPECT_FALSE(Delta(3, "1", "257", ""));
    EXPECT_TRUE(Delta(3, "1", "258", ""));
    EXPECT_FALSE(Delta(3, "1", "1", "0x101"));
}

TEST(IsDelta, OtherTypesAreNeverADelta) {
    for (int type : {5, 6, 255, -1}) EXPECT_FALSE(Delta(type, "a", "b", "c")) << type;
}

// ---- the commands ---------------------------------------------------------------------------------

const char kSettings[] = R"({"format": 1, "kernel_settings": [
  {"name": "banner", "type": 0, "description": "text", "default": "hi", "configured": "hi", "runtime": "hi"},
  {"name": "fastBoot", "type": 1, "description": "flag", "default": "TRUE", "configured": "FALSE", "runtime": null},
  {"name": "pages", "type": 2, "description": "count", "default": "16", "configured": "0x10", "runtime": "16"},
  {"name": "level", "type": 3, "description": "small", "default": "1", "configured": "1", "runtime": "2"},
  {"name": "bigSize", "type": 5, "description": "wide", "default": "0", "configured": "7", "runtime": "7"}
]})";

// Each row as "Name|Type|Description|Configured|Runtime|Default".
std::vector<std::string> Rows(const boost::shared_ptr<MetaObject>& result) {
    std::vector<std::string> rows;
    boost::shared_ptr<MetaList> list = boost::dynamic_pointer_cast<MetaList>(result);
    if (!list) return rows;
    for (const auto& element : list->GetElements()) {
        std::string row;
        for (const MetaStruct::Field& field : boost::dynamic_pointer_cast<MetaStruct>(element)->GetFields())
            row += (row.empty() ? "" : "|") + boost::dynamic_pointer_cast<MetaString>(field.second)->GetValue();
        rows.push_back(row);
    }
    return rows;
}

class KernelCommands : public ::testing::Test {
protected:
    void SetUp() override { simhost::trace::Enable(); }
    void TearDown() override { simhost::trace::Disable(); }

    simhost::TempHost host_{kSettings};
};

TEST_F(KernelCommands, EverySettingInTheHostsOrderWithUnsetRuntimeShown) {
    plugintest::Run run = plugintest::ExecuteClean(SettingsKernelList::New());
    EXPECT_TRUE(run.output->IsComplete());
    EXPECT_EQ(Rows(run.output->GetResult()),
              (std::vector<std::string>{"banner|string|text|hi|hi|hi", "fastBoot|bool|flag|FALSE|<unset>|TRUE",
                                        "pages|uint32|count|0x10|16|16", "level|uint8|small|1|2|1",
                                        "bigSize|uint64|wide|7|7|0"}));
    std::vector<std::string> calls = simhost::trace::TakeOperations();
    EXPECT_EQ(std::vector<std::string>(calls.begin(), calls.begin() + 8),
              (std::vector<std::string>{kNew, kNames, kType, kDescription, kConfigured, kRuntime, kDefault,
                                        kTypeString}));
    EXPECT_EQ(calls.size(), 2u + 5 * 6);
}

TEST_F(KernelCommands, DeltaListsOnlyWhatDiffersByType) {
    plugintest::Run run = plugintest::ExecuteClean(SettingsKernelList::New(), [](CallSpec::Input& in) { in.SetFlag("delta"); });
    // pages: 0x10 is 16; level: runtime 2 differs from 1; bigSize's type is never a delta.
    EXPECT_EQ(Rows(run.output->GetResult()),
              (std::vector<std::string>{"fastBoot|bool|flag|FALSE|<unset>|TRUE", "level|uint8|small|1|2|1"}));
}

TEST_F(KernelCommands, OneSettingByNameAndAnUnknownNameFails) {
    plugintest::Run run = plugintest::ExecuteClean(SettingsKernelList::New(), [](CallSpec::Input& in) { in.SetString("option", "pages"); });
    EXPECT_EQ(Rows(run.output->GetResult()), (std::vector<std::string>{"pages|uint32|count|0x10|16|16"}));
    EXPECT_EQ(simhost::trace::TakeOperations().at(1), kType) << "no list of names is read";

    run = plugintest::ExecuteClean(SettingsKernelList::New(), [](CallSpec::Input& in) { in.SetString("option", "page"); });
    EXPECT_EQ(run.output->GetErrors(), (std::vector<std::string>{"Unknown kernel setting 'page' (nearest: pages)"}));
    EXPECT_FALSE(run.output->GetResult());

    // Under delta a setting that equals its default yields an empty list.
    run = plugintest::ExecuteClean(SettingsKernelList::New(), [](CallSpec::Input& in) {
        in.SetString("option", "banner");
        in.SetFlag("delta");
    });
    EXPECT_TRUE(Rows(run.output->GetResult()).empty());
    EXPECT_TRUE(run.output->IsComplete());
}

TEST_F(KernelCommands, SetChangesTheConfiguredValueAndTheNextBootRunsWithIt) {
    plugintest::Run run = plugintest::ExecuteClean(SettingsKernelSet::New(), [](CallSpec::Input& in) {
        in.SetString("setting", "pages");
        in.SetString("value", "0x40");
    });
    EXPECT_TRUE(run.output->GetErrors().empty());
    EXPECT_TRUE(boost::dynamic_pointer_cast<Kitbase::MetaObj::MetaBool>(run.output->GetResult())->GetValue());
    EXPECT_EQ(simhost::trace::TakeOperations(), (std::vector<std::string>{kNew, kSet}));
    run = plugintest::ExecuteClean(SettingsKernelList::New(), [](CallSpec::Input& in) { in.SetString("option", "pages"); });
    EXPECT_EQ(Rows(run.output->GetResult()), (std::vector<std::string>{"pages|uint32|count|0x40|16|16"}));

    ASSERT_EQ(NorlithCtl::Os::Env::Default()->Kill(1, SIGTERM), 0);
    run = plugintest::ExecuteClean(SettingsKernelList::New());
    std::vector<std::string> rows = Rows(run.output->GetResult());
    EXPECT_EQ(rows[2], "pages|uint32|count|0x40|0x40|16");
    EXPECT_EQ(rows[1], "fastBoot|bool|flag|FALSE|<unset>|TRUE") << "a setting without runtime value keeps none";
}

TEST_F(KernelCommands, ValuesTheTypeRefusesAreReportedAndNothingChanges) {
    const std::string before = host_.host().Export();
    const std::pair<const char*, const char*> refused[] = {
        {"pages", "-1"}, {"pages", "4294967296"}, {"pages", "12abc"}, {"pages", ""},
        {"level", "256"}, {"fastBoot", "yes"}, {"fastBoot", "1"}, {"banner", "a\nb"},
    };
    for (const auto& entry : refused) {
        const std::string& name = entry.first;
        const std::string& value = entry.second;
        plugintest::Run run = plugintest::ExecuteClean(SettingsKernelSet::New(), [&](CallSpec::Input& in) {
            in.SetString("setting", name);
            in.SetString("value", value);
        });
        ASSERT_EQ(run.output->GetErrors().size(), 1u) << name << "=" << value;
        EXPECT_EQ(run.output->GetErrors()[0].rfind(std::string("Invalid value '"), 0), 0u) << run.output->GetErrors()[0];
        EXPECT_NE(run.output->GetErrors()[0].find(std::string("for kernel setting '") + name + "'"), std::string::npos);
        EXPECT_FALSE(run.output->GetResult());
    }
    plugintest::Run run = plugintest::ExecuteClean(SettingsKernelSet::New(), [](CallSpec::Input& in) {
        in.SetString("setting", "level");
        in.SetString("value", "256");
    });
    EXPECT_EQ(run.output->GetErrors()[0],
              "Invalid value '256' for kernel setting 'level' of type uint8: expected an unsigned integer "
              "from 0 to 255 (decimal, hexadecimal after 0x, octal after a leading 0)");
    run = plugintest::ExecuteClean(SettingsKernelSet::New(), [](CallSpec::Input& in) {
        in.SetString("setting", "nosuch");
        in.SetString("value", "1");
    });
    EXPECT_EQ(run.output->GetErrors(), (std::vector<std::string>{"Unknown kernel setting 'nosuch'"}));
    EXPECT_EQ(host_.host().Export(), before);
}

TEST_F(KernelCommands, TheDefaultHostHasAFewDozenSettingsOfEveryType) {
    simhost::TempHost host;
    plugintest::Run run = plugintest::ExecuteClean(SettingsKernelList::New());
    std::vector<std::string> rows = Rows(run.output->GetResult());
    EXPECT_GE(rows.size(), 24u);
    for (const char* type : {"|string|", "|bool|", "|uint32|", "|uint8|", "|uint16|"}) {
        bool found = false;
        for (const std::string& row : rows) found = found || row.find(type) != std::string::npos;
        EXPECT_TRUE(found) << type;
    }
    bool dumpFile = false;
    for (const std::string& row : rows) dumpFile = dumpFile || row.rfind("autoCreateDumpFile|bool|", 0) == 0;
    EXPECT_TRUE(dumpFile);
    run = plugintest::ExecuteClean(SettingsKernelList::New(), [](CallSpec::Input& in) { in.SetFlag("delta"); });
    EXPECT_FALSE(Rows(run.output->GetResult()).empty());
}

REGISTER_FAULT_CASE(plugintest::FaultCase("SettingsKernelList", "system settings kernel list").Scenario(kSettings));
REGISTER_FAULT_CASE(plugintest::FaultCase("SettingsKernelListDelta", "system settings kernel list")
                        .Scenario(kSettings)
                        .Input([](CallSpec::Input& in) {
                            in.SetString("option", "level");
                            in.SetFlag("delta");
                        }));
REGISTER_FAULT_CASE(plugintest::FaultCase("SettingsKernelSet", "system settings kernel set")
                        .Input([](CallSpec::Input& in) {
                            in.SetString("setting", "autoCreateDumpFile");
                            in.SetString("value", "false");
                        }));

}  // namespace
