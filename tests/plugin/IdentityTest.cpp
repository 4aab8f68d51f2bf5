// The version, UUID and boot device commands against a throw-away simulated host: results,
// field order, host call order, and every failure path.
#include "Harness.h"
#include "identity/BootDeviceGet.h"
#include "identity/UuidGet.h"
#include "identity/VersionGet.h"

#include <norlithctl/RavelException.h>
#include <simhost/Host.h>
#include <simhost/Trace.h>

#include <gtest/gtest.h>
#include <nlohmann/json.hpp>

#include <string>
#include <vector>

namespace {

using namespace TarselCli::System;
using plugintest::Outcome;
using Kitbase::MetaObj::MetaObject;
using Kitbase::MetaObj::MetaString;
using Kitbase::MetaObj::MetaStruct;

const std::string kSysinfoNew = "NorlithCtl::Util::Sysinfo::Sysinfo";
const std::string kSysinfoGet = "NorlithCtl::Util::Sysinfo::Get";
const std::string kSystemInfoNew = "NorlithCtl::System::SystemInfoImpl::SystemInfoImpl";
const std::string kGetUuid = "NorlithCtl::System::SystemInfoImpl::GetSystemUuid";
const std::string kGetBootNic = "NorlithCtl::System::SystemInfoImpl::GetBootNicMacAddress";
const std::string kGetBootFs = "NorlithCtl::System::SystemInfoImpl::GetBootFsUUID";
const std::string kGetStateless =
    "NorlithCtl::System::SystemInfoImpl::GetStatelessBootNicMacAddress";

// Host failures: the version command reports them with its prefix (its handler also covers the
// construction of its kernel information object); the UUID and boot device commands guard only
// what follows the construction of their system-information object.
REGISTER_FAULT_CASE(plugintest::FaultCase("VersionGet", "system version get")
                        .Prefix("Unable to query product version: "));
REGISTER_FAULT_CASE(plugintest::FaultCase("UuidGet", "system uuid get")
                        .On(kSystemInfoNew, Outcome::Escapes()));
REGISTER_FAULT_CASE(plugintest::FaultCase("BootDeviceGet", "system boot device get")
                        .On(kSystemInfoNew, Outcome::Escapes()));

// The default host's state as an export shows it.
nlohmann::json DefaultHost() {
    simhost::TempHost temp;
    return nlohmann::json::parse(temp.host().Export());
}

OutputPtr Execute(const boost::shared_ptr<AutoCli::Command>& command) {
    OutputPtr output = CallSpec::Output::New();
    command->Execute(CallSpec::Input::New(), output);
    return output;
}

// "name=value" of every field, in the structure's own order.
std::vector<std::string> Fields(const boost::shared_ptr<MetaObject>& result) {
    std::vector<std::string> fields;
    boost::shared_ptr<MetaStruct> structure = boost::dynamic_pointer_cast<MetaStruct>(result);
    if (!structure) return fields;
    for (const MetaStruct::Field& field : structure->GetFields()) {
        boost::shared_ptr<MetaString> text = boost::dynamic_pointer_cast<MetaString>(field.second);
        fields.push_back(field.first + "=" + (text && text->HasValue() ? text->GetValue() : "<none>"));
    }
    return fields;
}

class IdentityCommands : public ::testing::Test {
protected:
    void SetUp() override { simhost::trace::Enable(); }
    void TearDown() override { simhost::trace::Disable(); }
};

TEST_F(IdentityCommands, VersionFieldsAreSetBuildFirstFromTheRecord) {
    simhost::TempHost temp;
    const nlohmann::json identity = DefaultHost()["identity"];
    simhost::trace::Take();

    OutputPtr output = Execute(VersionGet::New());

    EXPECT_TRUE(output->GetErrors().empty());
    EXPECT_TRUE(output->IsComplete());
    EXPECT_EQ(boost::dynamic_pointer_cast<MetaStruct>(output->GetResult())->GetName(), "VersionGet");
    EXPECT_EQ(Fields(output->GetResult()),
              (std::vector<std::string>{"Build=" + identity["build"].get<std::string>(),
                                        "Version=" + identity["version"].get<std::string>(),
                                        "Product=" + identity["product"].get<std::string>(),
                                        "Update=" + identity["update"].get<std::string>()}));
    EXPECT_EQ(simhost::trace::TakeOperations(), (std::vector<std::string>{kSysinfoNew, kSysinfoGet}));
}

TEST_F(IdentityCommands, VersionFieldsAtTheRecordLimitsComeBackWhole) {
    nlohmann::json scenario = DefaultHost();
    scenario["identity"]["product"] = std::string(31, 'p');
    scenario["identity"]["version"] = std::string(31, 'v');
    scenario["identity"]["build"] = std::string(95, 'b');
    scenario["identity"]["update"] = std::string(151, 'u');
    simhost::TempHost temp(scenario.dump());

    OutputPtr output = Execute(VersionGet::New());

    EXPECT_EQ(Fields(output->GetResult()),
              (std::vector<std::string>{"Build=" + std::string(95, 'b'),
                                        "Version=" + std::string(31, 'v'),
                                        "Product=" + std::string(31, 'p'),
                                        "Update=" + std::string(151, 'u')}));
}

TEST_F(IdentityCommands, UuidIsReturnedUnchanged) {
    simhost::TempHost temp;
    simhost::trace::Take();
    OutputPtr output = Execute(UuidGet::New());
    boost::shared_ptr<MetaString> uuid = boost::dynamic_pointer_cast<MetaString>(output->GetResult());
    ASSERT_TRUE(uuid);
    EXPECT_EQ(uuid->GetValue(), DefaultHost()["identity"]["system_uuid"].get<std::string>());
    EXPECT_TRUE(output->IsComplete());
    EXPECT_EQ(simhost::trace::TakeOperations(), (std::vector<std::string>{kSystemInfoNew, kGetUuid}));
}

TEST_F(IdentityCommands, BootDeviceAsksForEachFieldInOrder) {
    simhost::TempHost temp;
    const nlohmann::json identity = DefaultHost()["identity"];
    simhost::trace::Take();

    OutputPtr output = Execute(BootDeviceGet::New());

    EXPECT_TRUE(output->IsComplete());
    EXPECT_EQ(boost::dynamic_pointer_cast<MetaStruct>(output->GetResult())->GetName(),
              "SystemBootDevice");
    EXPECT_EQ(Fields(output->GetResult()),
              (std::vector<std::string>{
                  "Boot NIC=" + identity["boot_nic_mac"].get<std::string>(),
                  "Boot Filesystem UUID=" + identity["boot_fs_uuid"].get<std::string>(),
                  "Stateless Boot NIC=" + identity["stateless_boot_nic_mac"].get<std::string>()}));
    EXPECT_EQ(simhost::trace::TakeOperations(),
              (std::vector<std::string>{kSystemInfoNew, kGetBootNic, kGetBootFs, kGetStateless}));
}

TEST_F(IdentityCommands, BootDeviceEmptyAnswersAreEmptyFields) {
    nlohmann::json scenario = DefaultHost();
    scenario["identity"]["boot_nic_mac"] = "";
    scenario["identity"]["boot_fs_uuid"] = "";
    scenario["identity"]["stateless_boot_nic_mac"] = "";
    simhost::TempHost temp(scenario.dump());

    OutputPtr output = Execute(BootDeviceGet::New());

    EXPECT_TRUE(output->GetErrors().empty());
    EXPECT_EQ(Fields(output->GetResult()),
              (std::vector<std::string>{"Boot NIC=", "Boot Filesystem UUID=", "Stateless Boot NIC="}));
}

TEST(IdentitySpecs, NoParametersAndTheDeclaredResultShapes) {
    const boost::shared_ptr<AutoCli::Command> commands[] = {VersionGet::New(), UuidGet::New(),
                                                            BootDeviceGet::New()};
    for (const auto& command : commands) EXPECT_TRUE(command->GetInputSpec()->GetParameters().empty());

    EXPECT_EQ(Fields(VersionGet::New()->GetOutputSpec()->GetResultTemplate()),
              (std::vector<std::string>{"Product=<none>", "Version=<none>", "Build=<none>",
                                        "Update=<none>"}));
    boost::shared_ptr<MetaString> uuid =
        boost::dynamic_pointer_cast<MetaString>(UuidGet::New()->GetOutputSpec()->GetResultTemplate());
    ASSERT_TRUE(uuid);
    EXPECT_FALSE(uuid->HasValue());
    EXPECT_EQ(Fields(BootDeviceGet::New()->GetOutputSpec()->GetResultTemplate()),
              (std::vector<std::string>{"Boot NIC=<none>", "Boot Filesystem UUID=<none>",
                                        "Stateless Boot NIC=<none>"}));
    // Each call makes a fresh structure.
    boost::shared_ptr<BootDeviceGet> boot = BootDeviceGet::New();
    EXPECT_NE(boot->GetOutputStructure(), boot->GetOutputStructure());
}

TEST(IdentitySpecs, VersionSteersItsSimpleOutput) {
    boost::shared_ptr<VersionGet> version = VersionGet::New();
    EXPECT_EQ(version->GetDefaultOutputParameters(),
              (std::vector<AutoCli::Command::KeyValue>{
                  {"fields:VersionGet", "Product,Version,Build,Update"},
                  {"show-header:VersionGet", "false"}}));
    EXPECT_TRUE(UuidGet::New()->GetDefaultOutputParameters().empty());
    EXPECT_TRUE(BootDeviceGet::New()->GetDefaultOutputParameters().empty());
}

}  // namespace
