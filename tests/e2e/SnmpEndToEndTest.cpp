// The SNMP agent commands as a user runs them: quarncli against a host made by quarnhost, the
// configuration surviving between processes, a malformed file from a scenario, and the
// framework's own refusal of an engine id with odd characters.
#include "support/Files.h"
#include "support/Process.h"
#include "HostFixture.h"

#include <gtest/gtest.h>
#include <nlohmann/json.hpp>

#include <string>
#include <vector>

namespace {

using ordered_json = nlohmann::ordered_json;
using Result = testsupport::ProcessResult;
using testsupport::RunProgram;
using testsupport::TempDir;
using testsupport::WriteFile;

class SnmpEndToEnd : public e2e::HostFixture {
protected:
};

TEST_F(SnmpEndToEnd, SetInOneProcessIsWhatGetShowsInTheNext) {
    ASSERT_EQ(Host({"init"}).status, 0);
    Result set = Cli({"system", "snmp", "set", "--port", "1161", "-c", "lab-ro,lab-rw", "--notraps",
                      "1.3.6.1.6.3.1.1.5.3,1.3.6.1.6.3.1.1.5.4", "-L", "Lab 3, rack 7"});
    ASSERT_EQ(set.status, 0) << set.err;
    EXPECT_EQ(set.out, "true\n");
    Result get = Cli({"--formatter", "json", "system", "snmp", "get"});
    ASSERT_EQ(get.status, 0) << get.err;
    ordered_json config = ordered_json::parse(get.out);
    EXPECT_EQ(config["port"], 1161);
    EXPECT_EQ(config["communities"], ordered_json::array({"lab-ro", "lab-rw"}));
    EXPECT_EQ(config["notraps"], ordered_json::array({"1.3.6.1.6.3.1.1.5.3", "1.3.6.1.6.3.1.1.5.4"}));
    EXPECT_EQ(config["syslocation"], "Lab 3, rack 7");
    // The change is one journal entry, and the file is XML a user can read.
    Result journal = Host({"journal", "--json"});
    EXPECT_NE(journal.out.find("\"operation\":\"NorlithCtl::System::SnmpAgentConfigImpl::SaveConfig\""),
              std::string::npos) << journal.out;
    EXPECT_NE(testsupport::ReadFile(state_ + "/root/etc/tarsel/snmp.xml").find("<port>1161</port>"), std::string::npos);
}

TEST_F(SnmpEndToEnd, TheDefaultHostsAgentInTheSimpleFormat) {
    Result get = Cli({"system", "snmp", "get"});
    ASSERT_EQ(get.status, 0) << get.err;
    for (const char* line : {"   enable: true\n", "   port: 161\n", "   communities: nordvik-ro, ops-monitor-7q2\n",
                             "   authentication: SHA1\n"})
        EXPECT_NE(get.out.find(line), std::string::npos) << line << get.out;
    Result test = Cli({"system", "snmp", "test"});
    ASSERT_EQ(test.status, 0) << test.err;
    EXPECT_NE(test.out.find("There is 1 target configured, send warmStart requested, test completed normally."),
              std::string::npos) << test.out;
}

TEST_F(SnmpEndToEnd, AMalformedFileFromAScenarioIsReported) {
    ordered_json scenario = {{"format", 1}};
    scenario["files"] = ordered_json::array({{{"path", "/etc/tarsel/snmp.xml"}, {"text", "<snmpAgent><port>1"}}});
    WriteFile(dir_ / "broken.json", scenario.dump());
    ASSERT_EQ(Host({"init", "--scenario", dir_ / "broken.json"}).status, 0);
    Result get = Cli({"system", "snmp", "get"});
    EXPECT_EQ(get.status, 1);
    EXPECT_EQ(get.out, "");
    EXPECT_EQ(get.err, "Configuration file, /etc/tarsel/snmp.xml, is not valid xml. Repair or replace it.\n");
    EXPECT_EQ(Cli({"system", "snmp", "set", "--reset"}).status, 0);
    EXPECT_EQ(Cli({"system", "snmp", "get"}).status, 0);
}

TEST_F(SnmpEndToEnd, AnEngineIdWithOddCharactersIsAUsageError) {
    Result set = Cli({"system", "snmp", "set", "--engineid", "0x80:00:zz"});
    EXPECT_EQ(set.status, 2);
    EXPECT_NE(set.err.find("engineid"), std::string::npos) << set.err;
    EXPECT_EQ(Cli({"system", "snmp", "set", "--engineid", "0x8000:00:00:01:02"}).status, 0);
}

}  // namespace
