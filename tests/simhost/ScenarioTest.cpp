// Scenarios: defaults for what a scenario leaves out, round trips through a host (files under
// root/ included), and every kind of malformed document.
#include "TestSupport.h"

#include <simhost/Host.h>
#include <simhost/domains/Files.h>
#include <simhost/Scenario.h>

#include <gtest/gtest.h>

#include <sys/stat.h>

namespace {

using simtest::EditedDefault;

std::string RejectionOf(const std::string& text) {
    try {
        simhost::ParseScenario(text);
    } catch (const simhost::HostError& error) {
        EXPECT_EQ(error.code(), simhost::HostError::Code::kScenario);
        return error.what();
    }
    return "(accepted)";
}

nlohmann::json Exported(const std::string& text) {
    simhost::TempHost host(text);
    return nlohmann::json::parse(host.host().Export());
}

TEST(ScenarioRoundTrip, EachShippedScenarioSurvivesAndExportsStably) {
    for (const char* name :
         {"default.json", "no-netboot.json", "stateless.json", "limits.json", "faults.json"}) {
        SCOPED_TRACE(name);
        std::string text = testsupport::ReadFile(simtest::ScenarioFile(name));
        simhost::TempHost host(text);
        std::string exported = host.host().Export();
        // What the scenario says is what the host holds; the rest is the defaults.
        nlohmann::json original = nlohmann::json::parse(text);
        nlohmann::json state = nlohmann::json::parse(exported);
        for (auto it = original.begin(); it != original.end(); ++it) {
            if (it.key() != "identity") {
                EXPECT_EQ(state[it.key()], it.value()) << it.key();
            }
        }
        const nlohmann::json identity = original.value("identity", nlohmann::json::object());
        for (auto it = identity.begin(); it != identity.end(); ++it)
            EXPECT_EQ(state["identity"][it.key()], it.value()) << it.key();
        simhost::TempHost again(exported);
        EXPECT_EQ(again.host().Export(), exported);
    }
    EXPECT_EQ(simhost::DefaultScenario(), testsupport::ReadFile(simtest::ScenarioFile("default.json")));
}

TEST(ScenarioDefaults, AMissingSectionOrMemberIsTheDomainsDefault) {
    nlohmann::json bare = Exported(R"({"format": 1})");
    EXPECT_EQ(bare["identity"]["product"], "Quarn");
    EXPECT_EQ(bare["clock"]["offset_us"], 0);
    EXPECT_EQ(bare["simulation"]["sleep_percent"], 100);
    EXPECT_EQ(bare["boot"]["boot_count"], 1);
    EXPECT_TRUE(bare["mounts"].empty());
    // The default host's files are those embedded from simhost/defaults/root/.
    ASSERT_EQ(bare["files"].size(), simhost::files::kDefaultFileCount);
    for (std::size_t i = 0; i < simhost::files::kDefaultFileCount; ++i)
        EXPECT_EQ(bare["files"][i]["path"], simhost::files::kDefaultFiles[i].path);
    EXPECT_FALSE(bare["observations"].empty());
    // A section overlays the default member by member; a list replaces the default list.
    nlohmann::json partial =
        Exported(R"({"format": 1, "identity": {"product": "Lab"}, "observations": []})");
    EXPECT_EQ(partial["identity"]["product"], "Lab");
    EXPECT_EQ(partial["identity"]["version"], bare["identity"]["version"]);
    EXPECT_TRUE(partial["observations"].empty());
}

TEST(ScenarioRoundTrip, NormalisesAnyValidDocumentToOneText) {
    // Members in another order, compact layout, faults unsorted, an event on one.
    std::string compact =
        R"({"faults":[{"times":3,"message":"m","operation":"QuillUserLib_Init"},)"
        R"({"message":"n","operation":"NorlithCtl::Util::Sysinfo::Get",)"
        R"("event":{"args":["x"],"id":"quill.host.unavailable"}}],)"
        R"("identity":{"stateless_boot_nic_mac":"","boot_fs_uuid":"","boot_nic_mac":"",)"
        R"("system_uuid":"00000000-0000-0000-0000-000000000000","update":"","build":"",)"
        R"("version":"","product":"Q"},"format":1})";
    std::string text = simhost::ScenarioText(simhost::ParseScenario(compact));
    EXPECT_EQ(simhost::ScenarioText(simhost::ParseScenario(text)), text);
    auto document = nlohmann::ordered_json::parse(text);
    EXPECT_EQ(document.begin().key(), "format");
    EXPECT_EQ(document["faults"][0]["operation"], "NorlithCtl::Util::Sysinfo::Get");
    EXPECT_EQ(document["faults"][0]["event"]["id"], "quill.host.unavailable");
    EXPECT_FALSE(document["faults"][0].contains("times"));
    EXPECT_EQ(document["faults"][1]["times"], 3);
    EXPECT_FALSE(document["faults"][1].contains("event"));
}

TEST(ScenarioFiles, HostFilesAreWrittenUnderRootAndExportedBack) {
    nlohmann::json scenario = {{"format", 1}};
    scenario["files"] = nlohmann::json::array(
        {{{"path", "/etc/motd"}, {"text", "Welcome\n"}},
         {{"path", "/bin/tool"}, {"base64", "f0VMRv8="}, {"mode", "0755"}},
         {{"path", "/scratch/dump.1"}, {"text", "HDR"}, {"size", 1 << 30}},
         {{"path", "/mnt/empty"}, {"type", "directory"}},
         {{"path", "/etc/link"}, {"type", "symlink"}, {"target", "../../../etc/passwd"}}});
    simhost::TempHost host(scenario.dump());
    EXPECT_EQ(testsupport::ReadFile(host.host().Root() + "/etc/motd"), "Welcome\n");
    struct stat info {};
    ASSERT_EQ(stat((host.host().Root() + "/scratch/dump.1").c_str(), &info), 0);
    EXPECT_EQ(info.st_size, 1 << 30);
    EXPECT_LT(info.st_blocks * 512, 1 << 20) << "a pre-allocated file stays sparse";
    ASSERT_EQ(stat((host.host().Root() + "/bin/tool").c_str(), &info), 0);
    EXPECT_EQ(info.st_mode & 07777, 0755u);

    nlohmann::json files = nlohmann::json::parse(host.host().Export())["files"];
    ASSERT_EQ(files.size(), 5u);  // sorted by path
    EXPECT_EQ(files[0], (nlohmann::json{{"path", "/bin/tool"}, {"mode", "0755"}, {"base64", "f0VMRv8="}}));
    EXPECT_EQ(files[1], (nlohmann::json{{"path", "/etc/link"}, {"type", "symlink"},
                                        {"target", "../../../etc/passwd"}}));
    EXPECT_EQ(files[2], (nlohmann::json{{"path", "/etc/motd"}, {"text", "Welcome\n"}}));
    EXPECT_EQ(files[3], (nlohmann::json{{"path", "/mnt/empty"}, {"type", "directory"}}));
    EXPECT_EQ(files[4], (nlohmann::json{{"path", "/scratch/dump.1"}, {"text", "HDR"}, {"size", 1 << 30}}));

    // Replacing the host replaces its files too.
    host.host().Init(R"({"format": 1, "files": [{"path": "/only", "text": ""}]})", true);
    EXPECT_EQ(nlohmann::json::parse(host.host().Export())["files"],
              nlohmann::json::parse(R"([{"path": "/only", "text": ""}])"));
}

TEST(ScenarioValidation, ReportsTheFirstProblemWithItsLocation) {
    std::string euro_33 = "";
    for (int i = 0; i < 11; ++i) euro_33 += "\xe2\x82\xac";  // 11 characters, 33 bytes
    auto files = [](nlohmann::json entries) {
        return nlohmann::json{{"format", 1}, {"files", entries}}.dump();
    };
    struct Case {
        std::string text;
        std::string message;
    } cases[] = {
        {"{", "scenario: not valid JSON: "},
        {"[]", "scenario: expected an object"},
        {R"({"format": 1e999})", "scenario: not valid JSON: number overflow"},
        {R"({"identity": {}})", "scenario: missing member 'format'"},
        {EditedDefault("/format", 2), "scenario: format: expected 1"},
        {EditedDefault("/identity/product", euro_33),
         "scenario: identity.product: expected a string of at most 31 bytes"},
        {EditedDefault("/identity/product", 5), "scenario: identity.product: expected a string"},
        {EditedDefault("/identity/product", ""),
         "scenario: identity.product: expected a non-empty string"},
        {EditedDefault("/identity/version", std::string("8\0" "1", 3)),
         "scenario: identity.version: must not contain a NUL character"},
        {EditedDefault("/identity/update", std::string(152, 'u')),
         "scenario: identity.update: expected a string of at most 151 bytes"},
        {EditedDefault("/identity/system_uuid", "6523a1f4-8c1e-4d2b-9f3a-0050569a2b3"),
         "scenario: identity.system_uuid: expected a UUID"},
        {EditedDefault("/identity/boot_nic_mac", "00:50:56:a1:2b:3g"),
         "scenario: identity.boot_nic_mac: expected \"\" or a MAC address"},
        {EditedDefault("/identity/colour", "blue"), "scenario: identity: unknown member 'colour'"},
        {EditedDefault("/identity", nullptr), "scenario: identity: expected an object"},
        {EditedDefault("/observations", "none"), "scenario: observations: expected an array"},
        {EditedDefault("/observations/0/time", "2024-03-18 09:12:44"),
         "scenario: observations[0].time: expected a UTC time"},
        // Times are checked as dates, not only for their shape.
        {EditedDefault("/observations/0", {{"time", "2024-13-18T09:12:44.000Z"}, {"message", "m"}}),
         "scenario: observations[0].time: expected a UTC time"},
        {EditedDefault("/observations/0", {{"time", "2023-02-29T09:12:44.000Z"}, {"message", "m"}}),
         "scenario: observations[0].time: expected a UTC time"},
        {EditedDefault("/observations/0", {{"time", "2024-03-18T09:12:44.000Z"}}),
         "scenario: observations[0]: missing member 'message'"},
        {EditedDefault("/simulation/sleep_percent", 101),
         "scenario: simulation.sleep_percent: expected an integer from 0 to 100"},
        {EditedDefault("/clock/offset_us", -1.5), "scenario: clock.offset_us: expected an integer"},
        {EditedDefault("/boot/booted_at", "2024-02-30T00:00:00Z"),
         "scenario: boot.booted_at: expected a UTC time"},
        {EditedDefault("/boot/boot_count", 4294967296), "scenario: boot.boot_count: expected an integer from 0 to 4294967295"},
        {EditedDefault("/mounts", nlohmann::json::array({{{"target", "/a"}, {"type", "tmpfs"}},
                                                         {{"target", "/a"}, {"type", "tmpfs"}}})),
         "scenario: mounts[1]: '/a' appears twice"},
        {files({{{"path", "etc/motd"}, {"text", ""}}}),
         "scenario: files[0].path: expected a normalised absolute path"},
        {files({{{"path", "/etc/../motd"}, {"text", ""}}}),
         "scenario: files[0].path: expected a normalised absolute path"},
        {files({{{"path", "/x"}, {"text", "a"}, {"base64", "YQ=="}}}),
         "scenario: files[0]: give \"text\" or \"base64\", not both"},
        {files({{{"path", "/x"}, {"base64", "YQ="}}}), "scenario: files[0].base64: expected base64 text"},
        {files({{{"path", "/x"}, {"text", "abc"}, {"size", 2}}}),
         "scenario: files[0].size: is smaller than the file's content"},
        {files({{{"path", "/x"}, {"mode", "0888"}}}), "scenario: files[0].mode: expected an octal mode"},
        {files({{{"path", "/x"}, {"text", ""}}, {{"path", "/x/y"}, {"text", ""}}}),
         "scenario: files[1].path: '/x/y' lies under '/x', which is not a directory"},
        {files({{{"path", "/x/y/z"}, {"text", ""}}, {{"path", "/x"}, {"text", ""}}}),
         "scenario: files[1].path: '/x/y/z' lies under '/x', which is not a directory"},
        {files({{{"path", "/x/y"}, {"type", "directory"}}, {{"path", "/x/y"}, {"text", ""}}}),
         "scenario: files[1].path: '/x/y' appears twice"},
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
                                                          {"event", {{"id", "quill.nope"}}}}})),
         "scenario: faults[0].event: unknown event id 'quill.nope'"},
        {EditedDefault("/faults", nlohmann::json::array({{{"operation", "QuillUserLib_Init"},
                                                          {"message", "m"},
                                                          {"event", {{"id", "quill.host.unavailable"}}}}})),
         "scenario: faults[0].event: event 'quill.host.unavailable' takes 1 argument, not 0"},
        {EditedDefault("/faults",
                       nlohmann::json::array({{{"operation", "QuillUserLib_Init"}, {"message", "a"}},
                                              {{"operation", "QuillUserLib_Init"}, {"message", "b"}}})),
         "scenario: faults[1].operation: a fault on 'QuillUserLib_Init' is already set"},
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
    for (const std::string& bad :
         {EditedDefault("/identity/update", std::string(152, 'u')), std::string("not json"),
          nlohmann::json{{"format", 1}, {"files", {{{"path", "/a"}, {"type", "symlink"}, {"target", "/nowhere"}},
                                                  {{"path", "/a/b"}, {"text", ""}}}}}
              .dump()}) {
        try {
            host.host().Init(bad, true);
            ADD_FAILURE() << "accepted " << bad;
        } catch (const simhost::HostError&) {
        }
        EXPECT_EQ(host.host().Export(), before);
    }
    testsupport::TempDir dir;
    simhost::Host absent(dir / "never");
    EXPECT_THROW(absent.Init(EditedDefault("/identity/update", std::string(152, 'u'))),
                 simhost::HostError);
    EXPECT_FALSE(absent.Exists());
}

}  // namespace
