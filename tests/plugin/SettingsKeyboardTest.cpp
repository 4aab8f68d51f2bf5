// The keyboard layout commands against throw-away hosts: the layout in use and the one for later
// boots kept apart, --no-persist, set without a layout, refusals, a failure after the layout was
// stored, and the next boot.
#include "Harness.h"
#include "settings/SettingsKeyboardLayoutGet.h"
#include "settings/SettingsKeyboardLayoutList.h"
#include "settings/SettingsKeyboardLayoutSet.h"

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
using Kitbase::MetaObj::MetaString;
using Kitbase::MetaObj::MetaStruct;

const std::string kNew = "NorlithCtl::System::SystemInfoImpl::SystemInfoImpl";
const std::string kGet = "NorlithCtl::System::SystemInfoImpl::GetKeyboardLayout";
const std::string kList = "NorlithCtl::System::SystemInfoImpl::GetKeyboardLayouts";
const std::string kStore = "NorlithCtl::System::SystemInfoImpl::SetKeyboardLayout";
const std::string kApply = "NorlithCtl::System::SystemInfoImpl::LoadKeyboardMappings";

const char kLayouts[] = R"js({"format": 1, "keyboard": {"current": "Dutch", "configured": "Dutch",
                             "available": ["Dutch", "German", "French (Canada)"]}})js";

class KeyboardCommands : public ::testing::Test {
protected:
    void SetUp() override { simhost::trace::Enable(); }
    void TearDown() override { simhost::trace::Disable(); }

    std::string Current() {
        plugintest::Run run = plugintest::ExecuteClean(SettingsKeyboardLayoutGet::New());
        return boost::dynamic_pointer_cast<MetaString>(run.output->GetResult())->GetValue();
    }
    std::string Configured() {
        return nlohmann::json::parse(host_.host().Export())["keyboard"]["configured"];
    }
    plugintest::Run Set(const char* layout, bool persist = true) {
        return plugintest::ExecuteClean(SettingsKeyboardLayoutSet::New(), [&](CallSpec::Input& in) {
            if (layout) in.SetString("layout", layout);
            if (!persist) in.SetFlag("no-persist");
        });
    }
    simhost::TempHost host_{kLayouts};
};

TEST_F(KeyboardCommands, GetAndListReadTheHost) {
    EXPECT_EQ(Current(), "Dutch");
    EXPECT_EQ(simhost::trace::TakeOperations(), (std::vector<std::string>{kNew, kGet}));
    plugintest::Run run = plugintest::ExecuteClean(SettingsKeyboardLayoutList::New());
    std::vector<std::string> names;
    for (const auto& row : boost::dynamic_pointer_cast<MetaList>(run.output->GetResult())->GetElements()) {
        auto layout = boost::dynamic_pointer_cast<MetaStruct>(row);
        EXPECT_EQ(layout->GetName(), "Layout");
        names.push_back(boost::dynamic_pointer_cast<MetaString>(layout->GetField("Layout"))->GetValue());
    }
    EXPECT_EQ(names, (std::vector<std::string>{"Dutch", "German", "French (Canada)"}));
}

TEST_F(KeyboardCommands, AHostWithoutLayoutsListsNone) {
    simhost::TempHost empty(R"({"format": 1, "keyboard": {"current": "", "configured": "", "available": []}})");
    plugintest::Run run = plugintest::ExecuteClean(SettingsKeyboardLayoutList::New());
    EXPECT_EQ(boost::dynamic_pointer_cast<MetaList>(run.output->GetResult())->Size(), 0u);
    EXPECT_TRUE(run.output->IsComplete());
    EXPECT_EQ(Current(), "");
}

TEST_F(KeyboardCommands, SetAppliesNowAndStoresForLaterBoots) {
    plugintest::Run run = Set("german");
    EXPECT_TRUE(run.output->GetErrors().empty());
    EXPECT_TRUE(boost::dynamic_pointer_cast<Kitbase::MetaObj::MetaBool>(run.output->GetResult())->GetValue());
    EXPECT_EQ(simhost::trace::TakeOperations(), (std::vector<std::string>{kNew, kStore, kApply}));
    EXPECT_EQ(Current(), "German") << "stored in the host's spelling";
    EXPECT_EQ(Configured(), "German");
}

TEST_F(KeyboardCommands, NoPersistAppliesWithoutStoringAndTheNextBootUndoesIt) {
    Set("French (Canada)", false);
    EXPECT_EQ(simhost::trace::TakeOperations(), (std::vector<std::string>{kNew, kApply}));
    EXPECT_EQ(Current(), "French (Canada)");
    EXPECT_EQ(Configured(), "Dutch");
    ASSERT_EQ(NorlithCtl::Os::Env::Default()->Kill(1, SIGTERM), 0);
    EXPECT_EQ(Current(), "Dutch");
}

TEST_F(KeyboardCommands, WithoutALayoutNothingIsStoredAndTheLayoutInUseIsAppliedAgain) {
    Set("German", false);
    plugintest::Run run = Set(nullptr);
    EXPECT_TRUE(run.output->GetErrors().empty());
    EXPECT_EQ(simhost::trace::Take().size(), 2u);
    EXPECT_EQ(Current(), "German");
    EXPECT_EQ(Configured(), "Dutch");
    EXPECT_EQ(host_.host().Journal().back().operation, kApply);
    EXPECT_EQ(host_.host().Journal().back().arguments, R"({"layout":""})");
}

TEST_F(KeyboardCommands, AnUnknownLayoutIsRefusedAndNothingChanges) {
    const std::string before = host_.host().Export();
    plugintest::Run run = Set("Germn");
    EXPECT_EQ(run.output->GetErrors(), (std::vector<std::string>{"Unknown keyboard layout 'Germn' (nearest: German)"}));
    EXPECT_FALSE(run.output->GetResult());
    run = Set("Klingon", false);
    EXPECT_EQ(run.output->GetErrors(),
              (std::vector<std::string>{
                  "Unknown keyboard layout 'Klingon'; this host offers: Dutch, German, French (Canada)"}));
    EXPECT_EQ(host_.host().Export(), before);
}

TEST_F(KeyboardCommands, AFailureToApplyComesAfterTheLayoutWasStored) {
    host_.host().AddFault(kApply, "mapping table busy");
    plugintest::Run run = Set("German");
    EXPECT_EQ(run.output->GetErrors(), (std::vector<std::string>{"mapping table busy"}));
    EXPECT_FALSE(run.output->GetResult());
    host_.host().ClearFaults();
    EXPECT_EQ(Configured(), "German");
    EXPECT_EQ(Current(), "Dutch");
}

TEST_F(KeyboardCommands, TheDefaultHostOffersManyLayouts) {
    simhost::TempHost host;
    plugintest::Run run = plugintest::ExecuteClean(SettingsKeyboardLayoutList::New());
    EXPECT_GE(boost::dynamic_pointer_cast<MetaList>(run.output->GetResult())->Size(), 20u);
    EXPECT_FALSE(Current().empty());
}

REGISTER_FAULT_CASE(plugintest::FaultCase("SettingsKeyboardLayoutGet", "system settings keyboard layout get"));
REGISTER_FAULT_CASE(plugintest::FaultCase("SettingsKeyboardLayoutList", "system settings keyboard layout list"));
REGISTER_FAULT_CASE(plugintest::FaultCase("SettingsKeyboardLayoutSet", "system settings keyboard layout set")
                        .Input([](CallSpec::Input& in) { in.SetString("layout", "German"); }));
REGISTER_FAULT_CASE(plugintest::FaultCase("SettingsKeyboardLayoutSetBare", "system settings keyboard layout set"));

}  // namespace
