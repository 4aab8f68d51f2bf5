// system snmp hash and system snmp test against throw-away hosts: localized keys checked against
// the published test vectors, the engine id a host derives, secret files of every bad kind, the
// order of the checks, the mended empty-secret case, user tests and the target count lines.
#include "SnmpTestSupport.h"

#include <simhost/Host.h>
#include <simhost/Trace.h>

#include "support/Files.h"

#include <gtest/gtest.h>

#include <chrono>
#include <fcntl.h>
#include <sys/stat.h>
#include <unistd.h>

namespace {

using nlohmann::ordered_json;
using snmptest::AgentXml;
using snmptest::Args;
using snmptest::Errors;
using snmptest::ResultJson;
using snmptest::Invoke;
using snmptest::ScenarioWithConfig;
using testsupport::TempDir;
using testsupport::WriteFile;

const std::string kOps = "NorlithCtl::System::SnmpAgentConfigImpl::";
const char kShortAuth[] = "Authentication secret must be at least eight(8) characters in length";

REGISTER_FAULT_CASE(plugintest::FaultCase("SnmpAgentHash", "system snmp hash").Input([](Kitbase::CallSpec::Input& input) {
    input.SetString("auth-hash", "monitor-auth-secret");
    input.SetString("priv-hash", "monitor-priv-secret");
    input.SetFlag("raw-secret");
}));
REGISTER_FAULT_CASE(plugintest::FaultCase("SnmpAgentTest", "system snmp test"));
REGISTER_FAULT_CASE(plugintest::FaultCase("SnmpAgentTestUser", "system snmp test").Input([](Kitbase::CallSpec::Input& input) {
    input.SetString("user", "monitor");
    input.SetString("auth-hash", "monitor-auth-secret");
    input.SetFlag("raw-secret");
}));

// A host whose agent has the given engine id and protocols (empty: none stored) and targets.
std::string Agent(const std::string& engine, const std::string& auth, const std::string& priv,
                  const std::string& more = "") {
    std::string options;
    if (!engine.empty()) options += "<option name=\"engineid\">" + engine + "</option>";
    if (!auth.empty()) options += "<option name=\"authentication\">" + auth + "</option>";
    if (!priv.empty()) options += "<option name=\"privacy\">" + priv + "</option>";
    return ScenarioWithConfig(AgentXml(more + "<options>" + options + "</options>"));
}

Args Raw(const std::string& auth, const std::string& priv = "") {
    Args args;
    args.strings = {{"auth-hash", auth}};
    if (!priv.empty()) args.strings["priv-hash"] = priv;
    args.flags = {"raw-secret"};
    return args;
}

Args Files(const std::string& auth, const std::string& priv = "") {
    Args args;
    args.strings = {{"auth-hash", auth}};
    if (!priv.empty()) args.strings["priv-hash"] = priv;
    return args;
}

std::vector<std::string> Trace() {
    std::vector<std::string> ops;
    for (const std::string& op : simhost::trace::TakeOperations())
        ops.push_back(op.rfind(kOps, 0) == 0 ? op.substr(kOps.size()) : op);
    return ops;
}

class SnmpHash : public ::testing::Test {
protected:
    void SetUp() override { simhost::trace::Enable(); }
    void TearDown() override { simhost::trace::Disable(); }
    TempDir dir_;
};

// ---- keys ------------------------------------------------------------------------------------------

TEST_F(SnmpHash, LocalizedKeysMatchThePublishedTestVectors) {
    // The vectors of the user-based security model's appendix: secret "maplesyrup", engine id
    // 00 00 00 00 00 00 00 00 00 00 00 02.
    const struct {
        const char* protocol;
        const char* auth;
        const char* priv;
    } vectors[] = {{"MD5", "526f5eed9fcce26f8964c2930787d82b", "526f5eed9fcce26f8964c2930787d82b"},
                   {"SHA1", "6695febc9288e36282235fc7151f128497b38f3f", "6695febc9288e36282235fc7151f1284"}};
    for (const auto& vector : vectors) {
        simhost::TempHost host(Agent("000000000000000000000002", vector.protocol, "AES128"));
        plugintest::Run run = Invoke("system snmp hash", Raw("maplesyrup", "maplesyrup"));
        ASSERT_TRUE(Errors(run).empty()) << Errors(run)[0];
        EXPECT_EQ(ResultJson(run), (ordered_json{{"auth-hash", vector.auth}, {"priv-hash", vector.priv}}))
            << vector.protocol;
        EXPECT_TRUE(run.output->IsComplete());
    }
}

TEST_F(SnmpHash, WithoutAStoredEngineIdTheHostsSystemUuidIsTheEngine) {
    // The default host's user was made from documented secrets with that engine.
    simhost::TempHost host;
    plugintest::Run run = Invoke("system snmp hash", Raw("monitor-auth-secret", "monitor-priv-secret"));
    ASSERT_TRUE(Errors(run).empty());
    EXPECT_EQ(ResultJson(run)["auth-hash"], "77e5edeff79a010bbf458158627592a28e82720e");
    EXPECT_EQ(ResultJson(run)["priv-hash"], "2b0b71b0985a548fe65428b1b4ae4cd9");
    EXPECT_NE(snmptest::ConfigText().find("77e5edeff79a010bbf458158627592a28e82720e"), std::string::npos);
    // The same secret on a host with another UUID gives another key; with the UUID as engine id
    // written out, the same one.
    nlohmann::json other = nlohmann::json::parse(Agent("", "SHA1", ""));
    other["identity"]["system_uuid"] = "00000000-1111-2222-3333-444444444444";
    simhost::TempHost elsewhere(other.dump());
    std::string derived = ResultJson(Invoke("system snmp hash", Raw("monitor-auth-secret")))["auth-hash"];
    EXPECT_NE(derived, "77e5edeff79a010bbf458158627592a28e82720e");
    simhost::TempHost explicit_engine(Agent("00000000111122223333444444444444", "SHA1", ""));
    EXPECT_EQ(ResultJson(Invoke("system snmp hash", Raw("monitor-auth-secret")))["auth-hash"], derived);
    // Without a privacy secret the privacy hash is empty.
    EXPECT_EQ(ResultJson(Invoke("system snmp hash", Raw("monitor-auth-secret")))["priv-hash"], "");
}

TEST_F(SnmpHash, AHashIsWhatSetUsersTakesAndTestUserConfirms) {
    simhost::TempHost host(Agent("80001234567890", "MD5", "AES128"));
    ordered_json hashes = ResultJson(Invoke("system snmp hash", Raw("first-secret", "second-secret")));
    Args set;
    set.strings = {{"users", "dana/" + hashes["auth-hash"].get<std::string>() + "/" +
                                 hashes["priv-hash"].get<std::string>() + "/priv"}};
    ASSERT_TRUE(Errors(Invoke("system snmp set", set)).empty());
    Args test = Raw("first-secret", "second-secret");
    test.strings["user"] = "dana";
    EXPECT_EQ(ResultJson(Invoke("system snmp test", test))["comments"],
              ordered_json::array({"Testing SNMPv3 user 'dana'",
                                   "User 'dana' exists (security model priv); the authentication secret matches "
                                   "its hash; the privacy secret matches its hash."}));
    test.strings["priv-hash"] = "another-secret";
    EXPECT_EQ(ResultJson(Invoke("system snmp test", test))["comments"][1],
              "User 'dana' exists (security model priv); the authentication secret matches its hash; the privacy "
              "secret does not match its hash.");
}

// ---- secrets from files ----------------------------------------------------------------------------

TEST_F(SnmpHash, OnlyTheTrimmedFirstLineOfASecretFileCounts) {
    simhost::TempHost host(Agent("000000000000000000000002", "MD5", "AES128"));
    WriteFile(dir_ / "auth", "  maplesyrup \t\nsecond line ignored\n");
    WriteFile(dir_ / "priv", "maplesyrup");  // no newline at all
    plugintest::Run run = Invoke("system snmp hash", Files(dir_ / "auth", dir_ / "priv"));
    ASSERT_TRUE(Errors(run).empty()) << Errors(run)[0];
    EXPECT_EQ(ResultJson(run)["auth-hash"], "526f5eed9fcce26f8964c2930787d82b");
    EXPECT_EQ(ResultJson(run)["priv-hash"], "526f5eed9fcce26f8964c2930787d82b");
}

TEST_F(SnmpHash, ASecretReadFromAPipeWorks) {
    simhost::TempHost host(Agent("000000000000000000000002", "SHA1", ""));
    int ends[2];
    ASSERT_EQ(pipe(ends), 0);
    ASSERT_EQ(write(ends[1], "maplesyrup\n", 11), 11);
    plugintest::Run run = Invoke("system snmp hash", Files("/dev/fd/" + std::to_string(ends[0])));
    close(ends[0]);
    close(ends[1]);
    EXPECT_EQ(ResultJson(run)["auth-hash"], "6695febc9288e36282235fc7151f128497b38f3f");
}

TEST_F(SnmpHash, UnreadableSecretFilesAreOneMessageAndNeverAHang) {
    simhost::TempHost host;
    WriteFile(dir_ / "empty", "");
    std::filesystem::create_directory(dir_ / "directory");
    ASSERT_EQ(mkfifo((dir_ / "fifo").c_str(), 0600), 0);
    WriteFile(dir_ / "huge", std::string(10 << 20, 's'));
    WriteFile(dir_ / "file", "x");
    const std::pair<std::string, std::string> cases[] = {
        {dir_ / "missing", "No such file or directory"},
        {dir_ / "empty", "Success"},
        {dir_ / "directory", "Is a directory"},
        {dir_ / "fifo", "Success"},  // no writer: no line
        {dir_ / "huge", "File too large"},
        {"/dev/zero", "File too large"},
        {dir_ / "file/below", "Not a directory"}};
    for (const auto& [name, reason] : cases) {
        auto start = std::chrono::steady_clock::now();
        plugintest::Run run = Invoke("system snmp hash", Files(name));
        EXPECT_EQ(Errors(run), std::vector<std::string>{"File name '" + name + "' could not be read, " + reason});
        EXPECT_FALSE(run.output->GetResult());
        EXPECT_LT(std::chrono::steady_clock::now() - start, std::chrono::seconds(5)) << name;
    }
    // The privacy file is read after the authentication one, and fails the same way.
    WriteFile(dir_ / "good", "a-good-secret\n");
    EXPECT_EQ(Errors(Invoke("system snmp hash", Files(dir_ / "good", dir_ / "missing"))),
              std::vector<std::string>{"File name '" + dir_ / "missing" + "' could not be read, No such file or directory"});
}

// ---- the order of the checks ------------------------------------------------------------------------

TEST_F(SnmpHash, APrivacySecretNeedsAnAuthenticationSecretFirst) {
    simhost::TempHost host;
    Args args;
    args.strings = {{"auth-hash", ""}, {"priv-hash", dir_ / "missing"}};
    EXPECT_EQ(Errors(Invoke("system snmp hash", args)),
              std::vector<std::string>{"Must specify --auth-hash when using --priv-hash"});
}

TEST_F(SnmpHash, SecretLengthsAreCheckedBeforeTheStoredProtocols) {
    simhost::TempHost host(Agent("", "", ""));
    simhost::trace::Take();
    EXPECT_EQ(Errors(Invoke("system snmp hash", Raw("1234567"))), std::vector<std::string>{kShortAuth});
    EXPECT_EQ(Trace(), std::vector<std::string>{"SnmpAgentConfigImpl"}) << "no protocol was read";
    EXPECT_EQ(Errors(Invoke("system snmp hash", Raw("12345678", "1234567"))),
              std::vector<std::string>{"Privacy secret must be at least eight(8) characters in length"});
    // Eight characters pass; a raw secret keeps its blanks and they count.
    EXPECT_EQ(Errors(Invoke("system snmp hash", Raw("12345678"))),
              std::vector<std::string>{"Must specify set authentication protocol via set --authentication"});
    EXPECT_EQ(Errors(Invoke("system snmp hash", Raw("1234567 "))),
              std::vector<std::string>{"Must specify set authentication protocol via set --authentication"});
}

TEST_F(SnmpHash, AnEmptySecretGetsTheLengthMessage) {
    simhost::TempHost host;
    WriteFile(dir_ / "blank", "   \nsecond-line-secret\n");
    EXPECT_EQ(Errors(Invoke("system snmp hash", Raw(""))), std::vector<std::string>{kShortAuth});
    EXPECT_EQ(Errors(Invoke("system snmp hash", Files(dir_ / "blank"))), std::vector<std::string>{kShortAuth});
}

TEST_F(SnmpHash, TheStoredProtocolsMustBeUsable) {
    simhost::TempHost host(Agent("", "SHA1", ""));
    EXPECT_EQ(Errors(Invoke("system snmp hash", Raw("12345678", "87654321"))),
              std::vector<std::string>{"Must first set privacy protocol via set --privacy"});
    simhost::TempHost none(Agent("", "none", "none"));
    EXPECT_EQ(Errors(Invoke("system snmp hash", Raw("12345678"))),
              std::vector<std::string>{"The authentication protocol 'none' makes no hash; set --authentication MD5 or SHA1"});
    EXPECT_EQ(Errors(Invoke("system snmp hash", Raw("12345678", "87654321"))),
              std::vector<std::string>{"The authentication protocol 'none' makes no hash; set --authentication MD5 or SHA1"});
    simhost::TempHost noPrivacy(Agent("", "MD5", "none"));
    EXPECT_EQ(Errors(Invoke("system snmp hash", Raw("12345678", "87654321"))),
              std::vector<std::string>{"The privacy protocol 'none' makes no key; set --privacy AES128"});
}

TEST_F(SnmpHash, SecretsNeverReachTheJournalOrTheTrace) {
    simhost::TempHost host;
    simhost::trace::Enable(true);
    Invoke("system snmp hash", Raw("very-secret-auth", "very-secret-priv"));
    Args test = Raw("very-secret-auth");
    test.strings["user"] = "monitor";
    Invoke("system snmp test", test);
    for (const auto& entry : simhost::trace::Take()) {
        EXPECT_EQ(entry.arguments.find("very-secret"), std::string::npos) << entry.operation;
    }
    for (const auto& entry : host.host().Journal()) EXPECT_EQ(entry.arguments.find("very-secret"), std::string::npos);
}

// ---- system snmp test --------------------------------------------------------------------------------

TEST_F(SnmpHash, TestCountsTargetsWithTheAgentsWording) {
    const std::string v1 = "<trapTargets><target host=\"127.0.0.1\" port=\"16299\" community=\"c\"/></trapTargets>";
    const std::string remote =
        "<remoteUsers><remoteUser name=\"r\" authProtocol=\"none\" privProtocol=\"none\" engineId=\"8000000001\"/>"
        "</remoteUsers>";
    const std::string v3 = "<v3Targets><target host=\"127.0.0.1\" port=\"16299\" user=\"r\" securityLevel=\"none\" "
                           "type=\"trap\"/></v3Targets>";
    const std::pair<std::string, std::string> cases[] = {{"", "There are 0 target configured"},
                                                         {v1, "There is 1 target configured"},
                                                         {remote + v3, "There is 1 target configured"},
                                                         {v1 + remote + v3, "There are 2 targets configured"}};
    for (const auto& [body, line] : cases) {
        simhost::TempHost host(ScenarioWithConfig(AgentXml(body)));
        simhost::trace::Take();
        plugintest::Run run = Invoke("system snmp test");
        ASSERT_TRUE(Errors(run).empty()) << Errors(run)[0];
        EXPECT_EQ(ResultJson(run)["comments"],
                  ordered_json::array({line, "send warmStart requested", "test completed normally."}));
        EXPECT_EQ(Trace(), (std::vector<std::string>{"SnmpAgentConfigImpl", "GetTrapTargets", "GetV3Traps", "TestTrap"}));
    }
}

TEST_F(SnmpHash, TestOfAUserAloneReadsNoFile) {
    simhost::TempHost host;
    simhost::trace::Take();
    Args args;
    args.strings = {{"user", "monitor"}};
    plugintest::Run run = Invoke("system snmp test", args);
    EXPECT_EQ(ResultJson(run)["comments"],
              ordered_json::array({"Testing SNMPv3 user 'monitor'", "User 'monitor' exists (security model priv)."}));
    EXPECT_EQ(Trace(), (std::vector<std::string>{"SnmpAgentConfigImpl", "TestUser"}));
    // A name with a quote is shown as given.
    args.strings = {{"user", "o'brien"}};
    EXPECT_EQ(ResultJson(Invoke("system snmp test", args))["comments"],
              ordered_json::array({"Testing SNMPv3 user 'o'brien'", "User 'o'brien' is not configured."}));
}

TEST_F(SnmpHash, TestOfSecretsWithoutAUserFailsBeforeAnyFile) {
    simhost::TempHost host;
    Args args;
    args.strings = {{"auth-hash", dir_ / "missing"}};
    plugintest::Run run = Invoke("system snmp test", args);
    EXPECT_EQ(Errors(run), std::vector<std::string>{"auth/priv secret requires a user name to be specified."});
    EXPECT_FALSE(run.output->GetResult());
    args.strings = {{"user", "monitor"}, {"priv-hash", dir_ / "missing"}};
    EXPECT_EQ(Errors(Invoke("system snmp test", args)),
              std::vector<std::string>{"File name '" + dir_ / "missing" + "' could not be read, No such file or directory"});
}

TEST_F(SnmpHash, TestUserReadsSecretsFromFiles) {
    simhost::TempHost host;
    WriteFile(dir_ / "auth", "monitor-auth-secret\n");
    WriteFile(dir_ / "priv", "  monitor-priv-secret  \n");
    Args args = Files(dir_ / "auth", dir_ / "priv");
    args.strings["user"] = "monitor";
    EXPECT_EQ(ResultJson(Invoke("system snmp test", args))["comments"][1],
              "User 'monitor' exists (security model priv); the authentication secret matches its hash; the "
              "privacy secret matches its hash.");
}

TEST_F(SnmpHash, AnUndeliveredNotificationIsAnErrorNotANormalEnd) {
    // An inform nobody acknowledges, beside a trap that leaves as a datagram.
    const std::string hash(40, 'a');
    simhost::TempHost host(ScenarioWithConfig(AgentXml(
        "<trapTargets><target host=\"127.0.0.1\" port=\"16298\" community=\"c\"/></trapTargets>"
        "<remoteUsers><remoteUser name=\"relay\" authProtocol=\"SHA1\" authHash=\"" + hash +
        "\" privProtocol=\"none\" engineId=\"8000000001\"/></remoteUsers>"
        "<v3Targets><target host=\"127.0.0.1\" port=\"16299\" user=\"relay\" securityLevel=\"auth\" "
        "type=\"inform\"/></v3Targets>")));
    auto start = std::chrono::steady_clock::now();
    plugintest::Run run = Invoke("system snmp test");
    EXPECT_LT(std::chrono::steady_clock::now() - start, std::chrono::seconds(6));
    EXPECT_EQ(Errors(run), std::vector<std::string>{"The warmStart notification was not delivered to 127.0.0.1@16299 "
                                                    "(SNMPv3 inform as 'relay'): no answer within 3 seconds"});
    EXPECT_FALSE(run.output->GetResult());
    EXPECT_EQ(run.leaked, 0);
}

}  // namespace
