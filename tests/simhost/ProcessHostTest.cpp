// The host rules of the DNS configuration, the welcome message, the worlds, the server
// statistics and the security domains: what is refused (naming the value and the rule, and
// changing nothing), staging and its boolean, scenario round trips of these sections, and what a
// reboot brings back.
#include "TestSupport.h"

#include <norlithctl/DnsConfigImpl.h>
#include <norlithctl/Env.h>
#include <norlithctl/NorlithAccessInterfaceImpl.h>
#include <norlithctl/RavelException.h>
#include <norlithctl/ResourceInfoImpl.h>
#include <norlithctl/ServerStats.h>
#include <norlithctl/SystemInfoImpl.h>
#include <simhost/Host.h>
#include <simhost/Time.h>

#include <gtest/gtest.h>

#include <csignal>
#include <memory>
#include <set>
#include <string>
#include <vector>

namespace {

using NorlithCtl::Network::DnsConfigImpl;
using NorlithCtl::Security::NorlithAccessInterfaceImpl;
using nlohmann::json;

// The message a host operation threw, or "" when it succeeded.
template <class Fn>
std::string Refusal(Fn fn) {
    try {
        fn();
    } catch (const Ravel::Lib::RavelException& e) {
        return e.GetMessage(0);
    }
    return "";
}

json Section(simhost::TempHost& host, const char* name) {
    return json::parse(host.host().Export())[name];
}

class ProcessHostTest : public ::testing::Test {
protected:
    simhost::TempHost host_;
};

TEST_F(ProcessHostTest, HostNamesFollowRfc1123AndRefusalsNameValueAndRule) {
    const std::string rule =
        "; a host name is 1 to 63 letters, digits and '-', not starting or ending with '-' (RFC 1123)";
    const std::vector<std::pair<std::string, std::string>> bad = {
        {"", "Invalid host name '': it is empty" + rule},
        {"esx.lab", "Invalid host name 'esx.lab': it contains a dot; a host name is a single label, "
                    "without its domain" + rule},
        {"my host", "Invalid host name 'my host': it contains a blank" + rule},
        {"tab\there", "Invalid host name 'tab\\there': it contains the control character \\x09" + rule},
        {"h\xc3\xb6st", "Invalid host name 'h\xc3\xb6st': it contains a character that is not ASCII" + rule},
        {"host_1", "Invalid host name 'host_1': it contains '_'" + rule},
        {"edge-", "Invalid host name 'edge-': it ends with '-'" + rule},
        {std::string(64, 'h'), "Invalid host name '" + std::string(64, 'h') + "': it is 64 characters long" + rule},
    };
    DnsConfigImpl dns("defaultTcpipStack");
    for (const auto& entry : bad) {
        const std::string& name = entry.first;
        const std::string& message = entry.second;
        SCOPED_TRACE(name);
        EXPECT_EQ(Refusal([&] { dns.SetHostname(name, true); }), message);
        EXPECT_EQ(Refusal([&] { dns.SetHostname(name, false); }), message);
    }
    EXPECT_EQ(dns.GetHostname(), "qhost-07");
    EXPECT_TRUE(host_.host().Journal().empty());
    // A huge value is never echoed whole.
    std::string huge = Refusal([&] { dns.SetHostname(std::string(100000, 'x'), false); });
    EXPECT_LT(huge.size(), 400u);
    for (const std::string& good : std::vector<std::string>{"a", "0", "esx-01", std::string(63, 'z'), "A-b-C"})
        EXPECT_EQ(Refusal([&] { dns.SetHostname(good, false); }), "") << good;
}

TEST_F(ProcessHostTest, DomainsAndFqdnsAreLabelsJoinedByDots) {
    DnsConfigImpl dns("defaultTcpipStack");
    const std::string label63(63, 'd');
    const std::string longest = label63 + "." + label63 + "." + label63 + "." + std::string(61, 'e');
    ASSERT_EQ(longest.size(), 253u);
    EXPECT_EQ(Refusal([&] { dns.SetDomain(longest, false); }), "");
    EXPECT_EQ(Refusal([&] { dns.SetDomain("corp", false); }), "");  // one label is a domain
    const std::vector<std::pair<std::string, std::string>> bad = {
        {longest + "e", "it is 254 characters long"},
        {".lab.net", "it has an empty label (a dot at the start or the end, or two dots in a row)"},
        {"lab.net.", "it has an empty label (a dot at the start or the end, or two dots in a row)"},
        {"lab.-x.net", "its label '-x' starts with '-'"},
        {"lab." + std::string(64, 'q') + ".net", "its label '" + std::string(20, 'q') + "...' is 64 characters long"},
        {"lab net", "it contains a blank"},
        {"lab\nnet", "it contains the control character \\x0a"},
    };
    for (const auto& entry : bad) {
        const std::string& domain = entry.first;
        const std::string& problem = entry.second;
        SCOPED_TRACE(domain);
        std::string message = Refusal([&] { dns.SetDomain(domain, false); });
        EXPECT_NE(message.find(problem), std::string::npos) << message;
        EXPECT_EQ(message.rfind("Invalid domain name '", 0), 0u) << message;
    }
    EXPECT_NE(Refusal([&] { dns.SetFqdn("esx01", false); }).find("it has no domain part"), std::string::npos);
    EXPECT_NE(Refusal([&] { dns.SetFqdn("-a.b", false); }).find("its label '-a' starts with '-'"),
              std::string::npos);
    EXPECT_EQ(dns.GetFqdn(), "qhost-07.corp");  // the last accepted, staged domain
}

TEST_F(ProcessHostTest, ChangesAreStagedUntilSaveConfigAndTheBooleanAppliesAtOnce) {
    {
        DnsConfigImpl dns("defaultTcpipStack");
        dns.SetFqdn("store-9.backup.example.net", false);
        EXPECT_EQ(dns.GetHostname(), "store-9");  // the object answers as it would be saved
        EXPECT_EQ(dns.GetDomain(), "backup.example.net");
        EXPECT_EQ(Section(host_, "dns")["host_name"], "qhost-07");  // the host: not yet
    }
    // Destroyed without SaveConfig: nothing changed, nothing journaled.
    EXPECT_EQ(Section(host_, "dns")["host_name"], "qhost-07");
    EXPECT_TRUE(host_.host().Journal().empty());

    DnsConfigImpl dns("defaultTcpipStack");
    dns.SaveConfig();  // nothing staged: no change, no journal entry
    EXPECT_TRUE(host_.host().Journal().empty());
    dns.SetHostname("now-1", true);
    EXPECT_EQ(Section(host_, "dns")["host_name"], "now-1");
    dns.SetDomain("later.org", false);
    EXPECT_EQ(Section(host_, "dns")["domain"], "lab.corvane.net");
    dns.SaveConfig();
    EXPECT_EQ(Section(host_, "dns"), json({{"host_name", "now-1"}, {"domain", "later.org"}}));
    auto journal = host_.host().Journal();
    ASSERT_EQ(journal.size(), 2u);
    EXPECT_EQ(journal[0].arguments, R"({"host_name":"now-1","apply_now":true})");
    EXPECT_EQ(journal[1].operation, "NorlithCtl::Network::DnsConfigImpl::SaveConfig");
    EXPECT_EQ(journal[1].arguments, R"({"domain":"later.org"})");
}

TEST_F(ProcessHostTest, OnlyTheDefaultStackExists) {
    EXPECT_EQ(Refusal([] { DnsConfigImpl dns("vmotionStack"); }),
              "Unknown network stack 'vmotionStack'; the host has one network stack, 'defaultTcpipStack'");
}

TEST_F(ProcessHostTest, WelcomeMessageRefusalsKeepTheOldMessage) {
    NorlithCtl::System::SystemInfoImpl info;
    const std::string before = info.GetWelcomeMessage();
    EXPECT_FALSE(before.empty());
    for (const std::string& bad : {std::string(), std::string(5000, 'w'), std::string("\xff\xfe"),
                                  std::string("esc\x1b[2J")})
        EXPECT_NE(Refusal([&] { info.SetWelcomeMessage(bad); }), "");
    EXPECT_EQ(info.GetWelcomeMessage(), before);
    EXPECT_TRUE(host_.host().Journal().empty());
    info.SetWelcomeMessage("line one\r\nline\ttwo\n");
    EXPECT_EQ(Section(host_, "console")["welcome_message"], "line one\r\nline\ttwo\n");
}

TEST_F(ProcessHostTest, SecurityDomainsRefuseUnknownTypesIdsNamesAndLevels) {
    NorlithAccessInterfaceImpl access;
    EXPECT_EQ(access.GetLabel(7, 0), "shell");
    EXPECT_EQ(Refusal([&] { access.GetLabel(7, 1); }),
              "Unknown label type 1; label type 0 (the security domain's name) is the only one");
    EXPECT_EQ(Refusal([&] { access.GetLabel(999, 0); }),
              "Security domain id 999 has no label: no security domain of the host has that id");
    EXPECT_EQ(Refusal([&] { access.GetKeywordsMap(2); }),
              "Unknown keyword type 2; keyword type 0 (the security domains) is the only one");
    EXPECT_EQ(access.GetKeywordsMap(0).size(), 12u);
    EXPECT_EQ(access.GetKeywordsMap(0).at("vmm"), 8);
    EXPECT_NE(Refusal([&] { access.GetStatus("nope"); }).find("Unknown security domain 'nope'"),
              std::string::npos);
    EXPECT_NE(Refusal([&] { access.EnableDomain("shell", "strict"); }).find("Unknown enforcement level 'strict'"),
              std::string::npos);
    EXPECT_NE(Refusal([&] { access.Enable("off"); }), "");
    EXPECT_EQ(access.GetStatus("shell"), "disabled");
    EXPECT_TRUE(host_.host().Journal().empty());
}

TEST_F(ProcessHostTest, LevelsSetNowReturnToTheirBootLevelsAtAReboot) {
    NorlithAccessInterfaceImpl access;
    access.EnableDomain("console", "enforcing");
    access.EnableDomain("shell", "audit");
    json domains = Section(host_, "secpolicy");
    EXPECT_EQ(domains[2], json({{"name", "console"}, {"id", 3}, {"boot_level", "audit"}, {"level", "enforcing"}}));
    ASSERT_EQ(NorlithCtl::Os::Env::Default()->Kill(1, SIGTERM), 0);
    EXPECT_EQ(access.GetStatus("console"), "audit");
    EXPECT_EQ(access.GetStatus("shell"), "disabled");
    EXPECT_EQ(Section(host_, "secpolicy"), json::parse(simhost::TempHost().host().Export())["secpolicy"]);
}

TEST_F(ProcessHostTest, ServerStatsReadLoadRunningWorldsAndUptimeTogether) {
    const std::int64_t hour = 3600LL * 1000000;
    json scenario = {{"format", 1},
                     {"boot", {{"booted_at", simhost::FormatUtc(simhost::MachineNowMicros() - hour, false)}}},
                     {"load", {{"scale", 4}, {"one_minute", 10}, {"five_minutes", 20}, {"fifteen_minutes", 30}}},
                     {"clock", {{"offset_us", -5 * hour}}},
                     {"worlds", json::array({json{{"id", 1}, {"name", "a"}, {"state", "running"}},
                                             json{{"id", 2}, {"name", "b"}, {"state", "ready"}},
                                             json{{"id", 3}, {"name", "c"}, {"state", "running"}}})}};
    host_.host().Init(scenario.dump(), true);
    Ravel::AdvStats::ServerStats stats;
    EXPECT_EQ(stats.GetRunningProcesses(), 0);  // nothing before the first fetch
    stats.FetchAllStats();
    EXPECT_EQ(stats.GetRunningProcesses(), 2);
    EXPECT_EQ(stats.GetCpuStats().GetPcpuCount(), 4);
    EXPECT_EQ(stats.GetLoadStats().GetOneMinute(), 10u);
    EXPECT_EQ(stats.GetLoadStats().GetFiveMinutes(), 20u);
    EXPECT_EQ(stats.GetLoadStats().GetFifteenMinutes(), 30u);
    // Counted on the machine's clock: the host clock's offset does not shorten it.
    EXPECT_GE(stats.GetUptimeMicros(), hour);
    EXPECT_LT(stats.GetUptimeMicros(), hour + 60LL * 1000000);

    ASSERT_EQ(NorlithCtl::Os::Env::Default()->Kill(1, SIGTERM), 0);
    stats.FetchAllStats();
    EXPECT_LT(stats.GetUptimeMicros(), 60LL * 1000000);
}

TEST_F(ProcessHostTest, WorldsComeOutInTheHostsOrderAndTheCallerOwnsThem) {
    NorlithCtl::Resource::ResourceInfoImpl info;
    const long live = NorlithCtl::Testing::LiveObjects();
    std::vector<Ravel::Resource::World*> worlds = info.GetAllWorlds();
    std::vector<std::unique_ptr<Ravel::Resource::World>> owned(worlds.begin(), worlds.end());
    EXPECT_EQ(NorlithCtl::Testing::LiveObjects(), live + static_cast<long>(worlds.size()));
    ASSERT_FALSE(owned.empty());
    EXPECT_EQ(owned[0]->GetName(), "init");
    EXPECT_EQ(owned[0]->GetId(), 1);
    // Every cartel's parent is a listed cartel, and every label resolves.
    auto access = std::make_unique<NorlithAccessInterfaceImpl>();
    std::set<long long> cartels;
    for (const auto& w : owned) cartels.insert(w->GetCartelId());
    for (const auto& w : owned) {
        SCOPED_TRACE(w->GetName());
        if (w->GetParentCartelId() != 0) {
            EXPECT_TRUE(cartels.count(w->GetParentCartelId()));
        }
        EXPECT_TRUE(cartels.count(w->GetCartelId()));
        EXPECT_FALSE(access->GetLabel(w->GetSecurityDomainId(), 0).empty());
    }
    access.reset();
    owned.clear();
    EXPECT_EQ(NorlithCtl::Testing::LiveObjects(), live);
}

TEST_F(ProcessHostTest, AWorldIsAReadOnlySnapshotThatRefreshReadsAgain) {
    host_.host().Init(R"({"format": 1, "worlds": [
        {"id": 7, "cartel_id": 7, "name": "ntpd", "state": "running"}]})", true);
    std::vector<Ravel::Resource::World*> worlds = NorlithCtl::Resource::ResourceInfoImpl().GetAllWorlds();
    ASSERT_EQ(worlds.size(), 1u);
    std::unique_ptr<Ravel::Lib::RavelObject> object(worlds[0]);
    auto* world = static_cast<Ravel::Resource::World*>(object.get());
    EXPECT_EQ(object->GetName(), "ntpd");
    EXPECT_EQ(object->ToString(), "world 7 (ntpd)");
    EXPECT_FALSE(object->HasPendingChanges());
    object->Commit();  // nothing staged: nothing happens
    EXPECT_TRUE(host_.host().Journal().empty());
    host_.host().Init(R"({"format": 1, "worlds": [
        {"id": 7, "cartel_id": 7, "name": "ntpd", "state": "sleeping"}]})", true);
    EXPECT_EQ(world->GetWorldState(), "running");
    object->Refresh();
    EXPECT_EQ(world->GetWorldState(), "sleeping");
    host_.host().Init(R"({"format": 1, "worlds": []})", true);
    EXPECT_THROW(object->Refresh(), Ravel::Lib::RavelException);
}

TEST_F(ProcessHostTest, TheSectionsRoundTripAndBadOnesAreRefusedWithTheirLocation) {
    json scenario = {{"format", 1},
                     {"dns", {{"host_name", "rt-1"}, {"domain", ""}}},
                     {"console", {{"welcome_message", "x\ty\n"}}},
                     {"secpolicy", json::array({json{{"name", "a_b"}, {"id", 9}, {"boot_level", "audit"},
                                                     {"level", "disabled"}}})},
                     {"worlds", json::array({json{{"id", 77}, {"name", "w"}, {"type", "helper"},
                                                  {"state", "stopped"}, {"flags", 12},
                                                  {"security_domain_id", 9}}})},
                     {"load", {{"scale", 0}, {"one_minute", 0}, {"five_minutes", 1}, {"fifteen_minutes", 2}}}};
    host_.host().Init(scenario.dump(), true);
    const std::string exported = host_.host().Export();
    const json back = json::parse(exported);
    EXPECT_EQ(back["dns"], scenario["dns"]);
    EXPECT_EQ(back["console"], scenario["console"]);
    EXPECT_EQ(back["secpolicy"], scenario["secpolicy"]);
    EXPECT_EQ(back["load"], scenario["load"]);
    EXPECT_EQ(back["worlds"][0]["flags"], 12);
    EXPECT_EQ(back["worlds"][0]["type"], "helper");
    EXPECT_EQ(back["worlds"][0]["command_line"], "");
    simhost::TempHost again(exported);
    EXPECT_EQ(again.host().Export(), exported);

    const std::vector<std::pair<std::string, std::string>> bad = {
        {R"("dns": {"host_name": "a.b"})", "scenario: dns.host_name: expected a host name"},
        {R"("dns": {"domain": "a..b"})", "scenario: dns.domain: expected \"\" or labels"},
        {R"("console": {"welcome_message": "\u001b"})", "scenario: console.welcome_message: expected UTF-8 text"},
        {R"("secpolicy": [{"name": "x", "id": 1, "level": "strict"}])", "scenario: secpolicy[0].level:"},
        {R"("worlds": [{"id": 1, "name": "a"}, {"id": 1, "name": "b"}])", "scenario: worlds[1]: '1' appears twice"},
        {R"("worlds": [{"id": 1, "name": "a", "state": "dead"}])", "scenario: worlds[0].state:"},
        {R"("worlds": [{"id": 0, "name": "a"}])", "scenario: worlds[0].id:"},
        {R"("load": {"scale": 5000})", "scenario: load.scale: expected an integer from 0 to 4096"},
    };
    for (const auto& [section, start] : bad) {
        const std::string text = R"({"format": 1, )" + section + "}";
        SCOPED_TRACE(text);
        try {
            host_.host().Init(text, true);
            ADD_FAILURE() << "accepted";
        } catch (const std::exception& e) {
            EXPECT_EQ(std::string(e.what()).rfind(start, 0), 0u) << e.what();
        }
        EXPECT_EQ(host_.host().Export(), exported);
    }
}

}  // namespace
