// system snmp get and set against throw-away hosts: the AgentConfig structure and its option
// walk, the order of checks and host calls of set, engine id normalisation, list splitting, the
// boot record's removal, and the library's rules refusing values without writing anything.
#include "SnmpTestSupport.h"

#include <simhost/Host.h>
#include <simhost/Trace.h>

#include <gtest/gtest.h>

#include <filesystem>

#include <sys/stat.h>

namespace {

using nlohmann::ordered_json;
using snmptest::AgentXml;
using snmptest::Args;
using snmptest::Errors;
using snmptest::ResultJson;
using snmptest::Invoke;
using snmptest::ScenarioWithConfig;

const std::string kOps = "NorlithCtl::System::SnmpAgentConfigImpl::";
const char kBootRecord[] = "/var/tmp/snmp_boot.txt";

REGISTER_FAULT_CASE(plugintest::FaultCase("SnmpAgentGet", "system snmp get"));
// Removing the boot record is a system call whose result the command ignores.
REGISTER_FAULT_CASE(plugintest::FaultCase("SnmpAgentSet", "system snmp set")
                        .Input([](Kitbase::CallSpec::Input& input) {
                            input.SetInt("port", 1161);
                            input.SetString("engineid", "0x8000:1:2:3:4");
                            input.SetString("communities", "lab-ro");
                            input.SetString("syslocation", "Lab 3");
                        })
                        .On("NorlithCtl::Os::Env::Unlink", plugintest::Outcome::Ignored()));

std::vector<std::string> Trace() {
    std::vector<std::string> ops;
    for (const std::string& op : simhost::trace::TakeOperations())
        ops.push_back(op.rfind(kOps, 0) == 0 ? op.substr(kOps.size()) : op);
    return ops;
}

std::size_t ChangesJournaled(simhost::TempHost& host) {
    std::size_t changes = 0;
    for (const auto& entry : host.host().Journal())
        if (entry.kind == "change") ++changes;
    return changes;
}

class SnmpCommands : public ::testing::Test {
protected:
    void SetUp() override { simhost::trace::Enable(); }
    void TearDown() override { simhost::trace::Disable(); }
};

// ---- get ------------------------------------------------------------------------------------------

TEST_F(SnmpCommands, GetShowsTheDefaultHostsAgentInFieldOrder) {
    simhost::TempHost host;
    simhost::trace::Take();
    plugintest::Run run = Invoke("system snmp get");
    EXPECT_TRUE(Errors(run).empty());
    EXPECT_TRUE(run.output->IsComplete());
    ordered_json result = ResultJson(run);
    std::vector<std::string> fields;
    for (auto it = result.begin(); it != result.end(); ++it) fields.push_back(it.key());
    EXPECT_EQ(fields, (std::vector<std::string>{"enable", "port", "communities", "targets", "notraps", "hwsrc",
                                                "engineid", "syslocation", "syscontact", "loglevel",
                                                "authentication", "privacy", "users", "remote-users",
                                                "v3targets", "largestorage"}));
    EXPECT_EQ(result["enable"], true);
    EXPECT_EQ(result["port"], 161);
    EXPECT_EQ(result["communities"].size(), 2u);
    EXPECT_EQ(result["targets"].size(), 1u);
    EXPECT_EQ(result["notraps"], ordered_json::array());
    EXPECT_EQ(result["engineid"], nullptr) << "no stored engine id: the field keeps its empty value";
    EXPECT_EQ(result["authentication"], "SHA1");
    EXPECT_EQ(result["users"].size(), 1u);
    EXPECT_EQ(Trace(), (std::vector<std::string>{"SnmpAgentConfigImpl", "ValidConfigFile", "GetEnabled", "GetPort",
                                                 "GetCommunities", "GetTrapTargets", "GetOptions", "GetUsers",
                                                 "GetRemoteUsers", "GetV3Traps", "IsLargeStorageSupported"}));
}

TEST_F(SnmpCommands, GetOfAMalformedFileIsOneMessageAndNoOtherGetter) {
    for (const std::string& text : {std::string("<snmpAgent><port>161</port>"), std::string("not xml at all"),
                                    std::string("")}) {
        SCOPED_TRACE(text);
        simhost::TempHost host(ScenarioWithConfig(text));
        simhost::trace::Take();
        plugintest::Run run = Invoke("system snmp get");
        EXPECT_EQ(Errors(run), (std::vector<std::string>{
                                   "Configuration file, /etc/tarsel/snmp.xml, is not valid xml. Repair or replace it."}));
        EXPECT_FALSE(run.output->GetResult());
        EXPECT_EQ(Trace(), (std::vector<std::string>{"SnmpAgentConfigImpl", "ValidConfigFile"}));
    }
}

TEST_F(SnmpCommands, GetOfAFileThatIsNoRegularFileIsMalformedToo) {
    nlohmann::json scenario = {{"format", 1}};
    scenario["files"] = {{{"path", snmptest::kConfigPath}, {"type", "directory"}}};
    simhost::TempHost host(scenario.dump());
    EXPECT_EQ(Errors(Invoke("system snmp get")).size(), 1u);
    // A FIFO in the file's place must not stall the reader.
    std::filesystem::remove(host.host().Root() + snmptest::kConfigPath);
    ASSERT_EQ(mkfifo((host.host().Root() + snmptest::kConfigPath).c_str(), 0600), 0);
    EXPECT_EQ(Errors(Invoke("system snmp get")).size(), 1u);
}

TEST_F(SnmpCommands, GetWithoutOptionsLeavesTheTextFieldsEmpty) {
    simhost::TempHost host(ScenarioWithConfig(AgentXml("<options/>")));
    ordered_json result = ResultJson(Invoke("system snmp get"));
    for (const char* field : {"hwsrc", "engineid", "syslocation", "syscontact", "loglevel", "authentication", "privacy"})
        EXPECT_EQ(result[field], nullptr) << field;
    EXPECT_EQ(result["notraps"], ordered_json::array());
    // A missing file reads as the factory configuration.
    simhost::TempHost bare(R"({"format": 1, "files": []})");
    result = ResultJson(Invoke("system snmp get"));
    EXPECT_EQ(result["enable"], false);
    EXPECT_EQ(result["loglevel"], "info");
}

TEST_F(SnmpCommands, GetSplitsTheEventFilterAtEverySemicolonKeepingEmptyPieces) {
    const std::pair<std::string, ordered_json> cases[] = {
        {"", ordered_json::array({""})},
        {"1.3.6.1.6.3.1.1.5.1;1.3.6.1.6.3.1.1.5.4", ordered_json::array({"1.3.6.1.6.3.1.1.5.1", "1.3.6.1.6.3.1.1.5.4"})},
        {"a;;b", ordered_json::array({"a", "", "b"})}};
    for (const auto& [stored, shown] : cases) {
        simhost::TempHost host(ScenarioWithConfig(
            AgentXml("<options><option name=\"EventFilter\">" + stored + "</option></options>")));
        EXPECT_EQ(ResultJson(Invoke("system snmp get"))["notraps"], shown) << stored;
    }
}

TEST_F(SnmpCommands, GetReportsEachUnknownOptionAndStillSetsTheResult) {
    simhost::TempHost host(ScenarioWithConfig(AgentXml(
        "<communities><community>c1</community></communities>"
        "<trapTargets><target host=\"nms.lab.example\" port=\"162\" community=\"t1\"/></trapTargets>"
        "<options><option name=\"foo\">bar</option><option name=\"loglevel\">debug</option>"
        "<option name=\"zeta\"></option></options>")));
    plugintest::Run run = Invoke("system snmp get");
    EXPECT_EQ(Errors(run), (std::vector<std::string>{"Unknown option foo value 'bar'", "Unknown option zeta value ''"}));
    ordered_json result = ResultJson(run);
    EXPECT_EQ(result["loglevel"], "debug");
    // Two getters in a row do not mix their lists.
    EXPECT_EQ(result["communities"], ordered_json::array({"c1"}));
    EXPECT_EQ(result["targets"], ordered_json::array({"nms.lab.example@162/t1"}));
    EXPECT_TRUE(run.output->IsComplete());
}

TEST_F(SnmpCommands, GetOfAWellFormedFileThatBreaksARuleNamesTheRule) {
    simhost::TempHost host(ScenarioWithConfig(AgentXml("<port>seventy</port>")));
    std::vector<std::string> errors = Errors(Invoke("system snmp get"));
    ASSERT_EQ(errors.size(), 1u);
    EXPECT_NE(errors[0].find("the port 'seventy' is not a number from 0 to 65535"), std::string::npos) << errors[0];
    EXPECT_NE(errors[0].find("(line 3)"), std::string::npos) << errors[0];
}

// ---- set: the command's own checks and order -------------------------------------------------------

TEST_F(SnmpCommands, SetWithOnlyResetSavesTheFactoryConfigurationWithoutOptions) {
    simhost::TempHost host;
    simhost::trace::Take();
    plugintest::Run run = Invoke("system snmp set", Args{{}, {}, {}, {"reset"}});
    EXPECT_TRUE(Errors(run).empty());
    EXPECT_EQ(ResultJson(run), true);
    EXPECT_EQ(Trace(), (std::vector<std::string>{"SnmpAgentConfigImpl", "Reset", "SaveConfig"}));
    ordered_json result = ResultJson(Invoke("system snmp get"));
    EXPECT_EQ(result["enable"], false);
    EXPECT_EQ(result["communities"], ordered_json::array());
    EXPECT_EQ(result["users"], ordered_json::array());
    EXPECT_EQ(result["authentication"], nullptr);
}

TEST_F(SnmpCommands, SetAppliesGivenParametersOnTopOfAReset) {
    simhost::TempHost host;
    simhost::trace::Take();
    Args args;
    args.flags = {"reset"};
    args.bools = {{"enable", true}, {"largestorage", false}};
    args.ints = {{"port", 1161}};
    args.strings = {{"syslocation", "Lab 3"}, {"communities", "lab-ro"}, {"loglevel", "warning"}};
    plugintest::Run run = Invoke("system snmp set", args);
    ASSERT_TRUE(Errors(run).empty()) << Errors(run)[0];
    EXPECT_EQ(Trace(), (std::vector<std::string>{"SnmpAgentConfigImpl", "Reset", "SetEnabled", "SetPort",
                                                 "SetCommunities", "SetLargeStorageSupport", "SetOptions",
                                                 "SaveConfig"}));
    ordered_json result = ResultJson(Invoke("system snmp get"));
    EXPECT_EQ(result["port"], 1161);
    EXPECT_EQ(result["largestorage"], false);
    EXPECT_EQ(result["syslocation"], "Lab 3");
    EXPECT_EQ(result["loglevel"], "warning");
    EXPECT_EQ(result["targets"], ordered_json::array()) << "the reset removed the default target";
}

TEST_F(SnmpCommands, SetNothingIsRefused) {
    simhost::TempHost host;
    plugintest::Run run = Invoke("system snmp set");
    EXPECT_EQ(Errors(run), (std::vector<std::string>{"Specify what to set or --help"}));
    EXPECT_FALSE(run.output->GetResult());
}

TEST_F(SnmpCommands, SetPortAcceptsItsWholeRangeOnly) {
    simhost::TempHost host;
    for (long long port : {0LL, 65535LL}) {
        Args args;
        args.ints = {{"port", port}};
        EXPECT_TRUE(Errors(Invoke("system snmp set", args)).empty()) << port;
        EXPECT_EQ(ResultJson(Invoke("system snmp get"))["port"], port);
    }
    const std::string before = snmptest::ConfigText();
    for (long long port : {65536LL, -1LL}) {
        Args args;
        args.ints = {{"port", port}};
        EXPECT_EQ(Errors(Invoke("system snmp set", args)),
                  (std::vector<std::string>{
                      "Port must be in range 0 - 65535 and not be already in use by another application."}));
    }
    EXPECT_EQ(snmptest::ConfigText(), before);
}

TEST_F(SnmpCommands, SetEngineIdIsNormalisedAndItsLengthChecked) {
    simhost::TempHost host;
    const std::pair<std::string, std::string> accepted[] = {
        {"0x1:2:3:4:5", "0102030405"},
        {"0X80:00:4f:2a:05:11:22:33:44:55:66:77:88:99:aa:bb", "80004f2a05112233445566778899aabb"},
        {"  0x8000123456  ", "8000123456"}};
    for (const auto& [given, stored] : accepted) {
        Args args;
        args.strings = {{"engineid", given}};
        EXPECT_TRUE(Errors(Invoke("system snmp set", args)).empty()) << given;
        EXPECT_EQ(ResultJson(Invoke("system snmp get"))["engineid"], stored);
    }
    const std::pair<std::string, std::string> refused[] = {
        {"0x12345", "Option engineid minimum length is 10 characters."},
        {std::string(33, 'a'), "Option engineid maximum length is 32 characters."}};
    for (const auto& [given, message] : refused) {
        Args args;
        args.strings = {{"engineid", given}, {"syslocation", "never stored"}};
        plugintest::Run run = Invoke("system snmp set", args);
        EXPECT_EQ(Errors(run), std::vector<std::string>{message});
        EXPECT_FALSE(run.output->GetResult());
    }
    EXPECT_NE(ResultJson(Invoke("system snmp get"))["syslocation"], "never stored");
}

TEST_F(SnmpCommands, SetEngineIdRemovesTheBootRecordBeforeSaving) {
    nlohmann::json scenario = {{"format", 1}};
    scenario["files"] = {{{"path", kBootRecord}, {"text", "boots 7\n"}}};
    simhost::TempHost host(scenario.dump());
    const std::string record = host.host().Root() + kBootRecord;

    Args bad;
    bad.strings = {{"engineid", "0x1234"}};
    Invoke("system snmp set", bad);
    EXPECT_TRUE(std::filesystem::exists(record)) << "a refused engine id leaves the record";

    simhost::trace::Take();
    Args good;
    good.strings = {{"engineid", "8000aabbccdd"}};
    EXPECT_TRUE(Errors(Invoke("system snmp set", good)).empty());
    EXPECT_FALSE(std::filesystem::exists(record));
    EXPECT_EQ(Trace(), (std::vector<std::string>{"SnmpAgentConfigImpl", "SetOptions", "NorlithCtl::Os::Env::Unlink",
                                                 "SaveConfig"}));
    // Without the record it still succeeds.
    EXPECT_TRUE(Errors(Invoke("system snmp set", good)).empty());
}

TEST_F(SnmpCommands, SetListsAreTrimmedAsAWholeAndSplitAtEveryComma) {
    simhost::TempHost host;
    Args args;
    args.strings = {{"communities", " a,b "}};
    EXPECT_TRUE(Errors(Invoke("system snmp set", args)).empty());
    EXPECT_EQ(ResultJson(Invoke("system snmp get"))["communities"], ordered_json::array({"a", "b"}));
    // A blank after a comma stays with its item.
    args.strings = {{"communities", "a, b"}};
    EXPECT_TRUE(Errors(Invoke("system snmp set", args)).empty());
    EXPECT_EQ(ResultJson(Invoke("system snmp get"))["communities"], ordered_json::array({"a", " b"}));
    // An empty value is one empty item, which clears the list.
    args.strings = {{"communities", ""}};
    EXPECT_TRUE(Errors(Invoke("system snmp set", args)).empty());
    EXPECT_EQ(ResultJson(Invoke("system snmp get"))["communities"], ordered_json::array());
}

TEST_F(SnmpCommands, SetLargeStorageAloneIsSaved) {
    simhost::TempHost host;
    Args args;
    args.bools = {{"largestorage", false}};
    EXPECT_TRUE(Errors(Invoke("system snmp set", args)).empty());
    EXPECT_EQ(ResultJson(Invoke("system snmp get"))["largestorage"], false);
}

TEST_F(SnmpCommands, SetNotrapsStoresTheOidsJoinedAndResetRemovesTheFilter) {
    simhost::TempHost host;
    Args args;
    args.strings = {{"notraps", "1.3.6.1.6.3.1.1.5.1, .1.3.6.1.6.3.1.1.5.5"}};
    ASSERT_TRUE(Errors(Invoke("system snmp set", args)).empty());
    EXPECT_EQ(ResultJson(Invoke("system snmp get"))["notraps"],
              ordered_json::array({"1.3.6.1.6.3.1.1.5.1", ".1.3.6.1.6.3.1.1.5.5"}));
    EXPECT_NE(snmptest::ConfigText().find("1.3.6.1.6.3.1.1.5.1;.1.3.6.1.6.3.1.1.5.5"), std::string::npos);
    args.strings = {{"notraps", "reset"}};
    ASSERT_TRUE(Errors(Invoke("system snmp set", args)).empty());
    EXPECT_EQ(ResultJson(Invoke("system snmp get"))["notraps"], ordered_json::array());
}

TEST_F(SnmpCommands, SetAcceptsWhatGetShowsAndGetShowsItBack) {
    simhost::TempHost host;
    Args args;
    args.strings = {
        {"targets", "nms.lab.example/ops,10.20.30.40@1162/ops2"},
        {"authentication", "md5"},
        {"privacy", "AES128"},
        {"users", "alice/" + std::string(32, 'a') + "/" + std::string(32, 'b') + "/priv,bob/-/-/none"},
        {"remote-users", "relay/SHA1/" + std::string(40, 'c') + "/AES/" + std::string(32, 'd') + "/0x8000000001020304"},
        {"v3targets", "127.0.0.1@1162/relay/priv/inform"},
        {"hwsrc", "sensors"}};
    plugintest::Run run = Invoke("system snmp set", args);
    ASSERT_TRUE(Errors(run).empty()) << Errors(run)[0];
    ordered_json shown = ResultJson(Invoke("system snmp get"));
    EXPECT_EQ(shown["targets"], ordered_json::array({"nms.lab.example@162/ops", "10.20.30.40@1162/ops2"}));
    EXPECT_EQ(shown["authentication"], "MD5");
    EXPECT_EQ(shown["hwsrc"], "sensors");
    EXPECT_EQ(shown["remote-users"],
              ordered_json::array({"relay/SHA1/" + std::string(40, 'c') + "/AES/" + std::string(32, 'd') + "/8000000001020304"}));
    // Feeding get's lists back into set changes nothing.
    const std::string before = snmptest::ConfigText();
    auto joined = [](const ordered_json& list) {
        std::string text;
        for (const auto& item : list) text += (text.empty() ? "" : ",") + item.get<std::string>();
        return text;
    };
    Args again;
    for (const char* field : {"targets", "users", "remote-users", "v3targets"}) again.strings[field] = joined(shown[field]);
    ASSERT_TRUE(Errors(Invoke("system snmp set", again)).empty());
    EXPECT_EQ(snmptest::ConfigText(), before);
}

// ---- set: the library's rules ---------------------------------------------------------------------

struct Refusal {
    std::map<std::string, std::string> given;
    std::string message;
};

TEST_F(SnmpCommands, SetRefusalsNameTheItemAndWriteNothing) {
    const std::string md5(32, 'a');
    const std::string sha(40, 'a');
    const Refusal refusals[] = {
        {{{"communities", "c1,c2,c3,c4,c5,c6,c7,c8,c9,c10,c11"}}, "At most 10 communities may be set, not 11"},
        {{{"communities", "ok," + std::string(65, 'x')}}, "Community 2: a community has 1 to 64 characters, not 65"},
        {{{"communities", "a,,b"}}, "Community 2: a community has 1 to 64 characters, not 0"},
        {{{"communities", "a,a"}}, "Community 2: the same community is given twice"},
        {{{"targets", "a/x,b/x,c/x,d/x"}}, "At most 3 trap targets may be set, not 4"},
        {{{"targets", "nms.lab.example"}}, "Trap target 1 'nms.lab.example': expected ip-or-hostname[@port]/community"},
        {{{"targets", "nms@70000/c"}}, "Trap target 1 'nms@70000': the port 70000 is not from 1 to 65535"},
        {{{"targets", "bad_host!/c"}}, "Trap target 1 'bad_host!': 'bad_host!' is not an IP address or host name"},
        {{{"users", "alice/" + md5 + "/-"}}, "User 1 'alice': expected user/-|auth-hash/-|priv-hash/model"},
        {{{"users", "al\"ice/-/-/none"}}, "User 1 'al\"ice': a user name has 1 to 32 letters, digits, '.', '_' or '-'"},
        {{{"users", "al\tice/-/-/none"}}, "User 1 'al\\x09ice': a user name has 1 to 32 letters, digits, '.', '_' or '-'"},
        {{{"users", std::string(33, 'u') + "/-/-/none"}},
         "User 1 '" + std::string(33, 'u') + "': a user name has 1 to 32 letters, digits, '.', '_' or '-'"},
        {{{"users", "alice/xyz/-/auth"}}, "User 1 'alice': the authentication hash is not '-' or 32 or 40 hexadecimal digits"},
        {{{"users", "alice/" + md5 + "/-/priv"}}, "User 1 'alice': model priv takes both hashes"},
        {{{"users", "alice/-/-/full"}}, "User 1 'alice': the model 'full' is not one of none, auth, priv"},
        {{{"users", "a/-/-/none,b/-/-/none,c/-/-/none,d/-/-/none,e/-/-/none,f/-/-/none"}}, "At most 5 users may be set, not 6"},
        {{{"users", "alice/-/-/none,alice/-/-/none"}}, "User 'alice' is given twice"},
        {{{"users", "alice/" + md5 + "/-/auth"}, {"authentication", "SHA1"}},
         "User 'alice': the authentication protocol SHA1 takes a hash of 40 hexadecimal digits, not 32; make it with 'system snmp hash'"},
        {{{"users", "alice/" + sha + "/" + md5 + "/priv"}, {"privacy", "none"}},
         "User 'alice' has security model priv, but the privacy protocol is 'none'; set --privacy AES128"},
        {{{"remote-users", "r/MD5/" + sha + "/none/-/8000000001"}},
         "Remote user 1 'r': protocol MD5 takes an authentication hash of 32 hexadecimal digits"},
        {{{"remote-users", "r/none/-/AES/" + md5 + "/8000000001"}},
         "Remote user 1 'r': privacy needs an authentication protocol too"},
        {{{"remote-users", "r/MD5/" + md5 + "/none/-/80000"}},
         "Remote user 1 'r': the engine id is not 10 to 32 hexadecimal digits in whole octets"},
        {{{"v3targets", "127.0.0.1/nobody/auth/trap"}},
         "SNMPv3 target '127.0.0.1@162' names the remote user 'nobody', which is not configured; set it with --remote-users"},
        {{{"v3targets", "127.0.0.1/r/auth/notify"}}, "SNMPv3 target 1 '127.0.0.1': the type 'notify' is not trap or inform"},
        {{{"v3targets", "a/r/none/trap,b/r/none/trap,c/r/none/trap,d/r/none/trap"}}, "At most 3 SNMPv3 targets may be set, not 4"},
        {{{"hwsrc", "ipmi"}}, "Option hwsrc: 'ipmi' is not one of indications, sensors"},
        {{{"loglevel", "verbose"}}, "Option loglevel: 'verbose' is not one of debug, info, warning, error"},
        {{{"authentication", "SHA256"}}, "Option authentication: 'SHA256' is not one of none, MD5, SHA1"},
        {{{"privacy", "DES"}}, "Option privacy: 'DES' is not one of none, AES128"},
        {{{"syslocation", std::string(256, 'l')}}, "Option syslocation: at most 255 characters are allowed, not 256"},
        {{{"syscontact", "ops\x01"}}, "Option syscontact: the text must be UTF-8 without control characters"},
        {{{"notraps", "1.3.6.1,,1.3.6.2"}},
         "Option notraps: '' is not an object identifier such as 1.3.6.1.6.3.1.1.5.1; give object identifiers separated by commas, or 'reset'"},
        {{{"engineid", "80000000012"}},
         "Option engineid: '80000000012' is not an engine id of 10 to 32 hexadecimal digits in whole octets (an even count)"},
    };
    simhost::TempHost host;
    const std::string before = snmptest::ConfigText();
    const std::size_t journaled = ChangesJournaled(host);
    for (const Refusal& refusal : refusals) {
        Args args;
        args.strings = refusal.given;
        args.strings["syslocation"] = args.strings.count("syslocation") ? args.strings["syslocation"] : "never stored";
        plugintest::Run run = Invoke("system snmp set", args);
        EXPECT_EQ(Errors(run), std::vector<std::string>{refusal.message}) << refusal.given.begin()->second;
        EXPECT_FALSE(run.output->GetResult());
    }
    EXPECT_EQ(snmptest::ConfigText(), before);
    EXPECT_EQ(ChangesJournaled(host), journaled);
}

TEST_F(SnmpCommands, SyslocationCountsCharactersNotBytes) {
    simhost::TempHost host;
    Args args;
    args.strings = {{"syslocation", std::string(255, 'x')}};
    EXPECT_TRUE(Errors(Invoke("system snmp set", args)).empty());
    std::string umlauts;
    for (int i = 0; i < 255; ++i) umlauts += "\xc3\xa4";  // 255 characters, 510 bytes
    args.strings = {{"syslocation", umlauts}};
    EXPECT_TRUE(Errors(Invoke("system snmp set", args)).empty());
    EXPECT_EQ(ResultJson(Invoke("system snmp get"))["syslocation"], umlauts);
}

TEST_F(SnmpCommands, SetOverAMalformedFileIsRefusedButResetRepairsIt) {
    simhost::TempHost host(ScenarioWithConfig("<snmpAgent><port>16"));
    Args args;
    args.ints = {{"port", 1161}};
    std::vector<std::string> errors = Errors(Invoke("system snmp set", args));
    ASSERT_EQ(errors.size(), 1u);
    EXPECT_EQ(errors[0].rfind("The SNMP agent configuration /etc/tarsel/snmp.xml is not well-formed XML (line 1: ", 0), 0u)
        << errors[0];
    EXPECT_EQ(snmptest::ConfigText(), "<snmpAgent><port>16");
    args.flags = {"reset"};
    EXPECT_TRUE(Errors(Invoke("system snmp set", args)).empty());
    EXPECT_EQ(ResultJson(Invoke("system snmp get"))["port"], 1161);
}

TEST_F(SnmpCommands, SaveJournalsOneEntryWithoutSecrets) {
    simhost::TempHost host;
    host.host().ClearJournal();
    const std::string hash(40, 'e');
    Args args;
    args.strings = {{"communities", "secret-community"},
                    {"targets", "127.0.0.1/other-community"},
                    {"users", "carol/" + hash + "/-/auth"}};
    ASSERT_TRUE(Errors(Invoke("system snmp set", args)).empty());
    auto journal = host.host().Journal();
    ASSERT_EQ(journal.size(), 1u);
    EXPECT_EQ(journal[0].operation, kOps + "SaveConfig");
    EXPECT_EQ(journal[0].arguments.find("secret-community"), std::string::npos) << journal[0].arguments;
    EXPECT_EQ(journal[0].arguments.find("other-community"), std::string::npos) << journal[0].arguments;
    EXPECT_EQ(journal[0].arguments.find(hash), std::string::npos) << journal[0].arguments;
    EXPECT_NE(journal[0].arguments.find("carol/***/-/auth"), std::string::npos) << journal[0].arguments;
}

}  // namespace
