// quarncli as a user runs it for the host name, welcome message, process and security domain
// commands: values set in one process are there in the next, an error beside the result true
// exits 1, and the journal and the export show the changes.
#include "support/Files.h"
#include "support/Process.h"
#include "HostFixture.h"

#include <gtest/gtest.h>
#include <nlohmann/json.hpp>

#include <string>
#include <vector>

namespace {

using nlohmann::ordered_json;
using Result = testsupport::ProcessResult;
using testsupport::RunProgram;
using testsupport::TempDir;

class ProcessEndToEnd : public e2e::HostFixture {
protected:
    void SetUp() override { Host({"init"}); }
};

TEST_F(ProcessEndToEnd, AHostNameSetInOneProcessIsReadInTheNext) {
    Result set = Cli({"system", "hostname", "set", "--fqdn", "esx-lab-3.corp.example.org"});
    EXPECT_EQ(set.status, 0) << set.err;
    EXPECT_EQ(set.out, "true\n");
    Result get = Json({"system", "hostname", "get"});
    ASSERT_EQ(get.status, 0) << get.err;
    EXPECT_EQ(ordered_json::parse(get.out),
              ordered_json::parse(R"({"Host Name": "esx-lab-3", "Domain Name": "corp.example.org",
                                      "Fully Qualified Domain Name": "esx-lab-3.corp.example.org"})"));
    EXPECT_NE(Host({"journal"}).out.find("NorlithCtl::Network::DnsConfigImpl::SaveConfig"),
              std::string::npos);
}

TEST_F(ProcessEndToEnd, ARefusedHostNameBesideASavedDomainExitsOneWithTheResultTrue) {
    Result set = Cli({"system", "hostname", "set", "-H", "bad host", "-d", "ex.org"});
    EXPECT_EQ(set.status, 1);
    EXPECT_EQ(set.out, "true\n");
    EXPECT_EQ(set.err.rfind("Invalid host name 'bad host': it contains a blank;", 0), 0u) << set.err;
    EXPECT_EQ(ordered_json::parse(Json({"system", "hostname", "get"}).out)["Domain Name"], "ex.org");
    Result none = Cli({"system", "hostname", "set"});
    EXPECT_EQ(none.status, 1);
    EXPECT_EQ(none.err, "You must specify at least one of: --host, --domain, --fqdn\n");
    EXPECT_EQ(none.out, "");
}

TEST_F(ProcessEndToEnd, TheWelcomeMessageKeepsItsLineBreaksAndBlanks) {
    const std::string banner = " Rack B4\n\n  ask before rebooting \n";
    ASSERT_EQ(Cli({"system", "welcomemsg", "set", "--message", banner}).status, 0);
    Result get = Json({"system", "welcomemsg", "get"});
    ASSERT_EQ(get.status, 0) << get.err;
    EXPECT_EQ(ordered_json::parse(get.out), banner);
    Result empty = Cli({"system", "welcomemsg", "set", "-m", ""});
    EXPECT_EQ(empty.status, 1);
    EXPECT_EQ(empty.err.rfind("The welcome message is empty;", 0), 0u) << empty.err;
    EXPECT_EQ(ordered_json::parse(Json({"system", "welcomemsg", "get"}).out), banner);
}

TEST_F(ProcessEndToEnd, TheDefaultHostListsItsWorldsAndDomains) {
    Result list = Json({"system", "process", "list"});
    ASSERT_EQ(list.status, 0) << list.err;
    ordered_json worlds = ordered_json::parse(list.out);
    ASSERT_GE(worlds.size(), 55u);
    EXPECT_EQ(worlds[0]["Name"], "init");
    EXPECT_EQ(worlds[0]["Security Domain"], "system");
    Result table = Cli({"system", "process", "list"});
    ASSERT_EQ(table.status, 0);
    EXPECT_EQ(table.out.rfind("Id ", 0), 0u) << table.out.substr(0, 200);

    ASSERT_EQ(Cli({"system", "secpolicy", "domain", "set", "--name", "shell", "--level", "enforcing"}).status, 0);
    ordered_json domains = ordered_json::parse(Json({"system", "secpolicy", "domain", "list"}).out);
    ASSERT_EQ(domains.size(), 12u);
    EXPECT_EQ(domains[6], ordered_json::parse(R"({"Domain Name": "shell", "Enforcement Level": "enforcing"})"));
    Result bad = Cli({"system", "secpolicy", "domain", "set", "-a", "-l", "strict"});
    EXPECT_EQ(bad.status, 1);
    EXPECT_EQ(bad.err, "Unknown enforcement level 'strict'; the levels are: disabled, audit, enforcing\n");
}

}  // namespace
