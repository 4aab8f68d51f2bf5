// Scenarios: round trips through a host, and every kind of malformed document.
#include "TestSupport.h"

#include <simhost/Host.h>
#include <simhost/Scenario.h>

#include <gtest/gtest.h>

namespace {

using simtest::EditedDefault;

std::string RejectionOf(const std::string& text) {
    try {
        simhost::ParseScenario(text);
    } catch (const simhost::ScenarioError& error) {
        return error.what();
    }
    return "(accepted)";
}

TEST(ScenarioRoundTrip, EachShippedScenarioExportsAsItsOwnText) {
    EXPECT_EQ(simhost::DefaultScenario(),
              testsupport::ReadFile(simtest::ScenarioFile("default.json")));
    for (const char* name :
         {"default.json", "no-netboot.json", "stateless.json", "limits.json", "faults.json"}) {
        SCOPED_TRACE(name);
        std::string text = testsupport::ReadFile(simtest::ScenarioFile(name));
        simhost::TempHost host(text);
        std::string exported = host.host().Export();
        EXPECT_EQ(exported, text);
        simhost::TempHost again(exported);
        EXPECT_EQ(again.host().Export(), exported);
    }
}

TEST(ScenarioRoundTrip, NormalisesAnyValidDocumentToOneText) {
    // Members in another order, compact layout, no optional sections, faults unsorted.
    std::string compact =
        R"({"faults":[{"times":3,"message":"m","operation":"QuillUserLib_Init"},)"
        R"({"message":"n","operation":"NorlithCtl::Util::Sysinfo::Get"}],)"
        R"("identity":{"stateless_boot_nic_mac":"","boot_fs_uuid":"","boot_nic_mac":"",)"
        R"("system_uuid":"00000000-0000-0000-0000-000000000000","update":"","build":"",)"
        R"("version":"","product":"Q"},"format":1})";
    std::string text = simhost::ScenarioText(simhost::ParseScenario(compact));
    EXPECT_EQ(simhost::ScenarioText(simhost::ParseScenario(text)), text);
    auto document = nlohmann::ordered_json::parse(text);
    EXPECT_EQ(document.begin().key(), "format");
    EXPECT_EQ(document["faults"][0]["operation"], "NorlithCtl::Util::Sysinfo::Get");
    EXPECT_FALSE(document["faults"][0].contains("times"));
    EXPECT_EQ(document["faults"][1]["times"], 3);
    EXPECT_TRUE(document["observations"].empty());
}

TEST(ScenarioValidation, ReportsTheFirstProblemWithItsLocation) {
    std::string euro_33 = "";
    for (int i = 0; i < 11; ++i) euro_33 += "\xe2\x82\xac";  // 11 characters, 33 bytes
    struct Case {
        std::string text;
        std::string message;
    } cases[] = {
        {"{", "scenario: not valid JSON: "},
        {"[]", "scenario: expected an object"},
        {R"({"format": 1e999})", "scenario: not valid JSON: number overflow"},
        {R"({"identity": {}})", "scenario: missing member 'format'"},
        {EditedDefault("/format", 2), "scenario: format: expected 1"},
        {EditedDefault("/format", "1"), "scenario: format: expected 1"},
        {EditedDefault("/identity/product", std::string(32, 'p')),
         "scenario: identity.product: expected a string of at most 31 bytes"},
        {EditedDefault("/identity/product", euro_33),
         "scenario: identity.product: expected a string of at most 31 bytes"},
        {EditedDefault("/identity/product", 5),
         "scenario: identity.product: expected a string of at most 31 bytes"},
        {EditedDefault("/identity/product", ""),
         "scenario: identity.product: expected a non-empty string"},
        {EditedDefault("/identity/version", std::string("8\0" "1", 3)),
         "scenario: identity.version: must not contain a NUL character"},
        {EditedDefault("/identity/build", std::string(96, 'b')),
         "scenario: identity.build: expected a string of at most 95 bytes"},
        {EditedDefault("/identity/update", std::string(152, 'u')),
         "scenario: identity.update: expected a string of at most 151 bytes"},
        {EditedDefault("/identity/system_uuid", "6523a1f4-8c1e-4d2b-9f3a-0050569a2b3"),
         "scenario: identity.system_uuid: expected a UUID"},
        {EditedDefault("/identity/boot_nic_mac", "00:50:56:a1:2b:3g"),
         "scenario: identity.boot_nic_mac: expected \"\" or a MAC address"},
        {EditedDefault("/identity/stateless_boot_nic_mac", "00-50-56-a1-2b-3c"),
         "scenario: identity.stateless_boot_nic_mac: expected \"\" or a MAC address"},
        {EditedDefault("/identity/boot_fs_uuid", "not/hex"),
         "scenario: identity.boot_fs_uuid: expected \"\" or at most 63 hexadecimal digits"},
        {EditedDefault("/identity/colour", "blue"), "scenario: identity: unknown member 'colour'"},
        {EditedDefault("/identity", nullptr), "scenario: identity: expected an object"},
        {R"({"format": 1})", "scenario: missing member 'identity'"},
        {EditedDefault("/observations", "none"), "scenario: observations: expected an array"},
        {EditedDefault("/observations/0/time", "2024-03-18 09:12:44"),
         "scenario: observations[0].time: expected a UTC time"},
        {EditedDefault("/observations/0/message", ""),
         "scenario: observations[0].message: expected a non-empty string"},
        {EditedDefault("/faults", nlohmann::json::array({{{"operation", "GetSystemUuid"},
                                                          {"message", "m"}}})),
         "scenario: faults[0].operation: unknown operation 'GetSystemUuid' (nearest: "
         "NorlithCtl::System::SystemInfoImpl::GetSystemUuid"},
        {EditedDefault("/faults", nlohmann::json::array({{{"operation", "QuillUserLib_Init"},
                                                          {"message", "m"},
                                                          {"times", 0}}})),
         "scenario: faults[0].times: expected an integer from 1 to 1000000000"},
        {EditedDefault("/faults", nlohmann::json::array({{{"operation", "QuillUserLib_Init"},
                                                          {"message", "m"},
                                                          {"times", 1.5}}})),
         "scenario: faults[0].times: expected an integer"},
        {EditedDefault("/faults",
                       nlohmann::json::array({{{"operation", "QuillUserLib_Init"}, {"message", "a"}},
                                              {{"operation", "QuillUserLib_Init"}, {"message", "b"}}})),
         "scenario: faults[1].operation: a fault on 'QuillUserLib_Init' is already set"},
        {EditedDefault("/faults", nlohmann::json::array({{{"operation", "QuillUserLib_Init"}}})),
         "scenario: faults[0]: missing member 'message'"},
        {EditedDefault("/extra", true), "scenario: unknown member 'extra'"},
        {R"({"format": 1, "format": 1})", "scenario: member 'format' appears twice in one object"},
    };
    for (const Case& c : cases) {
        std::string message = RejectionOf(c.text);
        EXPECT_EQ(message.substr(0, c.message.size()), c.message) << "scenario text: " << c.text;
    }
}

TEST(ScenarioValidation, ARefusedScenarioLeavesTheHostExactlyAsItWas) {
    simhost::TempHost host(testsupport::ReadFile(simtest::ScenarioFile("stateless.json")));
    host.host().AddFault("QuillUserLib_Init", "kept", 2);
    std::string before = host.host().Export();
    std::string bad = EditedDefault("/identity/update", std::string(152, 'u'));
    EXPECT_THROW(host.host().Init(bad, true), simhost::ScenarioError);
    EXPECT_THROW(host.host().Init("not json", true), simhost::ScenarioError);
    EXPECT_EQ(host.host().Export(), before);

    testsupport::TempDir dir;
    simhost::Host absent(dir / "never");
    EXPECT_THROW(absent.Init(bad), simhost::ScenarioError);
    EXPECT_FALSE(absent.Exists());
}

}  // namespace
