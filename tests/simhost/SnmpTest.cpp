// The SNMP agent's configuration on the simulated host: the file /etc/tarsel/snmp.xml in
// scenarios, staging until SaveConfig, atomic writes, refusals that change nothing, the file's
// own rules, and the library calls the commands do not make (target filter, stored engine ids).
#include "TestSupport.h"

#include <norlithctl/RavelException.h>
#include <norlithctl/SnmpAgentConfigImpl.h>
#include <simhost/Host.h>

#include <gtest/gtest.h>

#include <filesystem>

#include <sys/stat.h>

namespace {

using NorlithCtl::System::SnmpAgentConfigImpl;
using testsupport::ReadFile;

const char kPath[] = "/etc/tarsel/snmp.xml";

std::string Scenario(const std::string& xml) {
    nlohmann::json scenario = {{"format", 1}};
    scenario["files"] = nlohmann::json::array({{{"path", kPath}, {"text", xml}}});
    return scenario.dump();
}

std::string Agent(const std::string& body) {
    return "<?xml version=\"1.0\"?>\n<snmpAgent>\n" + body + "\n</snmpAgent>\n";
}

std::string Thrown(const std::function<void()>& body) {
    try {
        body();
    } catch (const Ravel::Lib::RavelException& error) {
        return error.GetMessage(0);
    }
    return "<nothing thrown>";
}

std::vector<std::string> Communities(const SnmpAgentConfigImpl& config) {
    std::vector<std::string> list;
    config.GetCommunities(list);
    return list;
}

class SnmpHost : public ::testing::Test {
protected:
    std::string File() { return ReadFile(host_.host().Root() + kPath); }
    simhost::TempHost host_;
};

TEST_F(SnmpHost, TheConfigurationFileRoundTripsThroughScenarios) {
    const std::string xml = Agent("<port>1161</port><options><option name=\"odd\">kept as found</option></options>");
    host_.host().Init(Scenario(xml), true);
    EXPECT_EQ(File(), xml);
    const std::string exported = host_.host().Export();
    simhost::TempHost again(exported);
    EXPECT_EQ(again.host().Export(), exported);
    EXPECT_EQ(ReadFile(again.host().Root() + kPath), xml);
}

TEST_F(SnmpHost, NothingIsWrittenBeforeSaveConfigAndGettersShowWhatIsStaged) {
    const std::string before = File();
    {
        SnmpAgentConfigImpl config;
        config.SetPort(2161);
        config.SetCommunities({"staged"});
        EXPECT_EQ(config.GetPort(), 2161);
        EXPECT_EQ(Communities(config), std::vector<std::string>{"staged"});
        EXPECT_EQ(File(), before);
    }  // dropped without saving
    EXPECT_EQ(File(), before);
    EXPECT_EQ(SnmpAgentConfigImpl().GetPort(), 161);
}

TEST_F(SnmpHost, SaveConfigReplacesTheFileAtomicallyAndOnce) {
    host_.host().ClearJournal();
    SnmpAgentConfigImpl config;
    config.SetPort(2161);
    config.SetEnabled(false);
    config.SaveConfig();
    EXPECT_NE(File().find("<port>2161</port>"), std::string::npos);
    // Only the file remains beside it: no temporary file left over.
    std::vector<std::string> names;
    for (const auto& entry : std::filesystem::directory_iterator(host_.host().Root() + "/etc/tarsel"))
        names.push_back(entry.path().filename());
    EXPECT_EQ(names, std::vector<std::string>{"snmp.xml"});
    struct stat info {};
    ASSERT_EQ(stat((host_.host().Root() + kPath).c_str(), &info), 0);
    EXPECT_EQ(info.st_mode & 0777, 0644u);
    auto journal = host_.host().Journal();
    ASSERT_EQ(journal.size(), 1u);
    EXPECT_EQ(journal[0].arguments, R"({"port":2161,"enable":false})");
    // A host without the file (or its directory) gets both.
    host_.host().Init(R"({"format": 1, "files": []})", true);
    SnmpAgentConfigImpl fresh;
    fresh.SetPort(3161);
    fresh.SaveConfig();
    EXPECT_NE(File().find("<port>3161</port>"), std::string::npos);
}

TEST_F(SnmpHost, SavesApplyToWhatIsStoredWhenTheyRunNotWhenTheObjectWasMade) {
    SnmpAgentConfigImpl first;
    SnmpAgentConfigImpl second;
    first.SetPort(2161);
    second.SetCommunities({"second"});
    first.SaveConfig();
    second.SaveConfig();
    SnmpAgentConfigImpl reader;
    EXPECT_EQ(reader.GetPort(), 2161);
    EXPECT_EQ(Communities(reader), std::vector<std::string>{"second"});
}

TEST_F(SnmpHost, ARefusalAtSaveChangesNothing) {
    const std::string before = File();
    host_.host().ClearJournal();
    SnmpAgentConfigImpl config;
    config.SetPort(2161);
    config.SetV3Targets({"127.0.0.1/ghost/auth/trap"});
    EXPECT_EQ(Thrown([&] { config.SaveConfig(); }),
              "SNMPv3 target '127.0.0.1@162' names the remote user 'ghost', which is not configured; set it "
              "with --remote-users");
    EXPECT_EQ(File(), before);
    EXPECT_TRUE(host_.host().Journal().empty());
    // A fault on the save leaves the file too.
    host_.host().AddFault("NorlithCtl::System::SnmpAgentConfigImpl::SaveConfig", "disk full", 1);
    SnmpAgentConfigImpl other;
    other.SetPort(2161);
    EXPECT_EQ(Thrown([&] { other.SaveConfig(); }), "disk full");
    EXPECT_EQ(File(), before);
}

TEST_F(SnmpHost, ResetDiscardsWhatWasStagedBefore) {
    SnmpAgentConfigImpl config;
    config.SetPort(2161);
    config.Reset();
    config.SetCommunities({"after-reset"});
    config.SaveConfig();
    SnmpAgentConfigImpl reader;
    EXPECT_EQ(reader.GetPort(), 161);
    EXPECT_FALSE(reader.GetEnabled());
    EXPECT_EQ(Communities(reader), std::vector<std::string>{"after-reset"});
    std::map<std::string, std::string> options;
    reader.GetOptions(options);
    EXPECT_EQ(options, (std::map<std::string, std::string>{{"EnvEventSource", "indications"}, {"loglevel", "info"}}));
}

TEST_F(SnmpHost, MalformedFilesAreReportedNotHalfRead) {
    const std::string cases[] = {"<snmpAgent><port>161</port>", "<?xml version=\"1.0\"?>", "<a></b>",
                                 std::string(1 << 20, ' ') + "<snmpAgent/>"};
    for (const std::string& text : cases) {
        host_.host().Init(Scenario(text), true);
        SnmpAgentConfigImpl config;
        EXPECT_FALSE(config.ValidConfigFile()) << text.substr(0, 40);
        std::string message = Thrown([&] { config.GetPort(); });
        EXPECT_EQ(message.rfind("The SNMP agent configuration /etc/tarsel/snmp.xml is not well-formed XML (", 0), 0u) << message;
        EXPECT_NE(message.find("'system snmp set --reset'"), std::string::npos);
    }
    // A symbolic link in the file's place is not followed, even to a good file.
    nlohmann::json scenario = {{"format", 1}};
    scenario["files"] = {{{"path", "/etc/tarsel/real.xml"}, {"text", Agent("")}},
                         {{"path", kPath}, {"type", "symlink"}, {"target", "real.xml"}}};
    host_.host().Init(scenario.dump(), true);
    EXPECT_FALSE(SnmpAgentConfigImpl().ValidConfigFile());
}

TEST_F(SnmpHost, AWellFormedFileMustFollowTheRules) {
    const std::pair<std::string, std::string> cases[] = {
        {"<ports>161</ports>", "unknown element <ports>"},
        {"<port>1</port><port>2</port>", "<port> is given twice"},
        {"<enable>yes</enable>", "<enable> is true or false, not 'yes'"},
        {"<users><user name=\"a\" model=\"none\" colour=\"red\"/></users>", "<user> has no attribute 'colour'"},
        {"<users><user name=\"a b\" model=\"none\"/></users>", "a user name has 1 to 32 letters, digits, '.', '_' or '-'"},
        {"<trapTargets><target host=\"h\" port=\"0\" community=\"c\"/></trapTargets>",
         "the port '0' is not a number from 1 to 65535"},
        {"<communities><community>a</community><fish/></communities>", "<communities> holds <community> elements only"},
        {"<users>" + std::string("<user name=\"u\" model=\"none\"/>") + "<user name=\"v\" model=\"none\"/>" +
             "<user name=\"w\" model=\"none\"/><user name=\"x\" model=\"none\"/><user name=\"y\" model=\"none\"/>" +
             "<user name=\"z\" model=\"none\"/></users>",
         "it holds more targets or users than the agent allows"}};
    for (const auto& [body, problem] : cases) {
        host_.host().Init(Scenario(Agent(body)), true);
        SnmpAgentConfigImpl config;
        EXPECT_TRUE(config.ValidConfigFile()) << body;
        std::string message = Thrown([&] { config.GetEnabled(); });
        EXPECT_EQ(message.rfind("The SNMP agent configuration /etc/tarsel/snmp.xml is not a valid agent configuration (line ", 0), 0u)
            << message;
        EXPECT_NE(message.find(problem), std::string::npos) << message;
    }
    // The document element must be the agent's.
    host_.host().Init(Scenario("<config/>"), true);
    EXPECT_NE(Thrown([] { SnmpAgentConfigImpl().GetPort(); }).find("the document element is <config>, not <snmpAgent>"),
              std::string::npos);
}

TEST_F(SnmpHost, GenerateHashRefusesAStoredEngineIdItCannotUse) {
    host_.host().Init(Scenario(Agent("<options><option name=\"engineid\">zz12</option></options>")), true);
    std::string auth;
    std::string priv;
    std::string error;
    EXPECT_FALSE(SnmpAgentConfigImpl().GenerateHash("12345678", "", "MD5", "", auth, priv, error));
    EXPECT_EQ(error, "No hash can be made: the stored engine id 'zz12' is not 10 to 32 hexadecimal digits; set it "
                     "again with 'system snmp set --engineid'");
}

TEST_F(SnmpHost, TestTrapCanBeLimitedToOneConfiguredTarget) {
    SnmpAgentConfigImpl config;
    std::vector<std::string> targets;
    config.GetTrapTargets(targets);
    ASSERT_EQ(targets.size(), 1u);
    EXPECT_TRUE(config.TestTrap(targets[0]));
    EXPECT_EQ(Thrown([&] { config.TestTrap("192.0.2.1@162/none"); }), "No configured target is '192.0.2.1@162/none'");
}

TEST_F(SnmpHost, TestUserSaysWhySecretsCannotBeChecked) {
    host_.host().Init(Scenario(Agent("<users><user name=\"ann\" model=\"none\"/></users><options/>")), true);
    std::string message;
    SnmpAgentConfigImpl config;
    EXPECT_FALSE(config.TestUser("ann", "12345678", "", message));
    EXPECT_EQ(message, "User 'ann' exists (security model none); its secrets cannot be checked without an "
                       "authentication protocol (set --authentication).");
    EXPECT_TRUE(config.TestUser("ann", "", "", message));
    EXPECT_FALSE(config.TestUser("an\x1bn", "", "", message));
    EXPECT_EQ(message, "User 'an\\x1bn' is not configured.");
}

}  // namespace
