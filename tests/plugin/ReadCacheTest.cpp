// The read cache commands, which the tree leaves out: made through the factories the loaded
// plug-in exports, run against throw-away hosts, the running and next-boot states kept apart
// until a reboot through the seam, and host failures.
#include "Harness.h"
#include "readcache/ReadCacheGet.h"
#include "readcache/ReadCacheSet.h"

#include <norlithctl/Env.h>
#include <simhost/Host.h>
#include <simhost/Trace.h>

#include <gtest/gtest.h>
#include <nlohmann/json.hpp>

#include <csignal>
#include <dlfcn.h>

namespace {

using namespace TarselCli::System;
using plugintest::Outcome;
using Kitbase::MetaObj::MetaBool;
using Kitbase::MetaObj::MetaStruct;

const std::string kNew = "NorlithCtl::System::SystemInfoImpl::SystemInfoImpl";

using plugintest::FromPlugin;
using plugintest::Plugin;

plugintest::CommandPtr MakeGet() {
    return FromPlugin<ReadCacheGet>("_ZN9TarselCli6System12ReadCacheGet3NewEv");
}
plugintest::CommandPtr MakeSet() {
    return FromPlugin<ReadCacheSet>("_ZN9TarselCli6System12ReadCacheSet3NewEv");
}

REGISTER_FAULT_CASE(plugintest::FaultCase("ReadCacheGet", "(unattached) ReadCacheGet")
                        .Make(MakeGet)
                        .On(kNew, Outcome::Escapes()));
REGISTER_FAULT_CASE(plugintest::FaultCase("ReadCacheSet", "(unattached) ReadCacheSet")
                        .Make(MakeSet)
                        .Input([](Kitbase::CallSpec::Input& input) { input.SetBool("enabled", true); })
                        .On(kNew, Outcome::Escapes()));

std::vector<std::string> Status() {
    plugintest::Run run = plugintest::Execute(MakeGet());
    std::vector<std::string> fields;
    auto result = boost::dynamic_pointer_cast<MetaStruct>(run.output->GetResult());
    if (!result) return fields;
    EXPECT_EQ(result->GetName(), "CBRCStatus");
    for (const auto& field : result->GetFields()) {
        auto flag = boost::dynamic_pointer_cast<MetaBool>(field.second);
        fields.push_back(field.first + "=" + (flag && flag->GetValue() ? "true" : "false"));
    }
    return fields;
}

plugintest::Run Set(bool enabled) {
    plugintest::InputPtr input = Kitbase::CallSpec::Input::New();
    input->SetBool("enabled", enabled);
    return plugintest::Execute(MakeSet(), input);
}

TEST(ReadCache, TheExportedFactoriesMakeCommandsTheTreeDoesNotHave) {
    ASSERT_TRUE(Plugin()) << dlerror();
    plugintest::CommandPtr get = MakeGet();
    plugintest::CommandPtr set = MakeSet();
    ASSERT_TRUE(get);
    ASSERT_TRUE(set);
    EXPECT_EQ(get->GetDescription(), "Get the status of the Content Based Read Cache.");
    EXPECT_EQ(set->GetDescription(), "Configure the Content Based Read Cache");
    EXPECT_EQ(get->GetMetaDataField("type"), "fetcher");
    EXPECT_EQ(set->GetMetaDataField("type"), "fetcher");
    EXPECT_EQ(get->GetDefaultOutputFormatter(), "simple");
    EXPECT_EQ(set->GetDefaultOutputFormatter(), "");
    EXPECT_TRUE(get->GetInputSpec()->GetParameters().empty());
    const auto spec = set->GetInputSpec();
    ASSERT_EQ(spec->GetParameters().size(), 1u);
    const auto& enabled = spec->GetParameters()[0];
    EXPECT_EQ(enabled->GetName(), "enabled");
    EXPECT_EQ(enabled->GetShortName(), "e");
    EXPECT_EQ(enabled->GetType(), Kitbase::CallSpec::ParameterTypeBool);
    EXPECT_TRUE(enabled->IsRequired());
    for (const std::string& path : plugintest::CommandPaths())
        EXPECT_EQ(path.find("cache"), std::string::npos) << path;
}

TEST(ReadCache, EnabledForTheNextBootIsNotYetActive) {
    simhost::TempHost host(R"({"format": 1, "readcache": {"runtime_enabled": false, "configured_enabled": true}})");
    simhost::trace::Enable();
    EXPECT_EQ(Status(), (std::vector<std::string>{"Active=false", "Enabled On Reboot=true"}));
    EXPECT_EQ(simhost::trace::TakeOperations(),
              (std::vector<std::string>{kNew, "NorlithCtl::System::SystemInfoImpl::GetCbrcRuntimeEnabled",
                                        "NorlithCtl::System::SystemInfoImpl::GetCbrcConfiguredEnabled"}));
    simhost::trace::Disable();
}

TEST(ReadCache, SetChangesTheNextBootAndARebootMakesItCurrent) {
    simhost::TempHost host;
    EXPECT_EQ(Status(), (std::vector<std::string>{"Active=false", "Enabled On Reboot=false"}));

    plugintest::Run run = Set(true);
    ASSERT_TRUE(run.output->GetErrors().empty()) << run.output->GetErrors().front();
    EXPECT_TRUE(boost::dynamic_pointer_cast<MetaBool>(run.output->GetResult())->GetValue());
    EXPECT_TRUE(run.output->IsComplete());
    EXPECT_EQ(Status(), (std::vector<std::string>{"Active=false", "Enabled On Reboot=true"}));
    EXPECT_EQ(host.host().Journal().back().operation, "NorlithCtl::System::SystemInfoImpl::SetCbrcEnabled");
    EXPECT_EQ(nlohmann::json::parse(host.host().Journal().back().arguments)["enabled"], true);

    ASSERT_EQ(NorlithCtl::Os::Env::Default()->Kill(1, SIGTERM), 0);
    EXPECT_EQ(Status(), (std::vector<std::string>{"Active=true", "Enabled On Reboot=true"}));

    // Disabling still answers true; the cache runs until the next boot.
    run = Set(false);
    EXPECT_TRUE(boost::dynamic_pointer_cast<MetaBool>(run.output->GetResult())->GetValue());
    EXPECT_EQ(Status(), (std::vector<std::string>{"Active=true", "Enabled On Reboot=false"}));
    ASSERT_EQ(NorlithCtl::Os::Env::Default()->Kill(1, SIGTERM), 0);
    EXPECT_EQ(Status(), (std::vector<std::string>{"Active=false", "Enabled On Reboot=false"}));
}

}  // namespace
