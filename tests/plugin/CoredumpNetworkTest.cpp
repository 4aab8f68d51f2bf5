// The network dump commands against throw-away hosts: get with the switch off and on, every
// option rule of set (ports that are not ports included), the host's refusals, and check's
// outcomes for real over UDP on loopback: a responder that answers, one that stays silent, a
// port nobody listens on, an address off this machine, a down interface, and host failures.
#include "CoredumpTestSupport.h"

#include <simhost/Host.h>
#include <simhost/NetDump.h>

#include <gtest/gtest.h>
#include <nlohmann/json.hpp>

#include <atomic>
#include <string>
#include <thread>
#include <vector>

namespace {

using namespace coredumptest;

const std::string kNetwork = "NorlithCtl::Network::NetworkInfoImpl::";
const std::string kVerified = "Verified the configured netdump server is running";

// A responder on a free loopback port; it answers only once Start was called, and stops when
// the process ends (or after five minutes at most).
struct Responder {
    simhost::netdump::Server server{"127.0.0.1", 0};
    std::atomic<bool> stop{false};
    std::thread thread;
    void Start() {
        if (!thread.joinable()) thread = std::thread([this] { server.Serve(300, &stop); });
    }
    ~Responder() {
        stop = true;
        if (thread.joinable()) thread.join();
    }
};
Responder& Shared() {
    static Responder responder;
    return responder;
}

std::string Scenario(bool enabled, const std::string& interface, const std::string& server, int port) {
    return R"({"format": 1, "network_interfaces": [{"name": "hvn0"}, {"name": "hvn1"}, {"name": "hvn9", "up": false}],
        "network_dump": {"enabled": )" + std::string(enabled ? "true" : "false") + R"(, "interface": ")" + interface +
           R"(", "server": ")" + server + R"(", "port": )" + std::to_string(port) + R"(, "check_timeout_seconds": 1}})";
}

class NetworkCommands : public ::testing::Test {
protected:
    void SetUp() override { simhost::trace::Enable(); }
    void TearDown() override { simhost::trace::Disable(); }

    plugintest::Run Do(const std::string& verb, const std::function<void(Input&)>& fill = {}) {
        simhost::trace::Take();
        return RunCommand("system coredump network " + verb, fill);
    }
    nlohmann::json State() { return nlohmann::json::parse(host_->host().Export())["network_dump"]; }
    // The old host restores the environment it found, so it goes first.
    void Use(const std::string& scenario) {
        host_.reset();
        host_.reset(new simhost::TempHost(scenario));
    }
    // The check's outcome: its text, and whether it was also the error.
    std::pair<std::string, bool> Check() {
        plugintest::Run run = Do("check");
        auto text = boost::dynamic_pointer_cast<MetaString>(run.output->GetResult());
        EXPECT_TRUE(text && run.output->IsComplete());
        const std::string outcome = text ? text->GetValue() : "";
        if (!Errors(run).empty()) {
            EXPECT_EQ(Errors(run), std::vector<std::string>{outcome});
        }
        return {outcome, !Errors(run).empty()};
    }

    std::unique_ptr<simhost::TempHost> host_{new simhost::TempHost(Scenario(false, "hvn0", "10.0.0.9", 6500))};
};

TEST_F(NetworkCommands, GetShowsOnlyTheSwitchWhenOff) {
    plugintest::Run run = Do("get");
    auto result = Struct(run.output->GetResult());
    ASSERT_TRUE(result);
    EXPECT_EQ(result->GetName(), "NetworkCoredump");
    EXPECT_FALSE(Flag(result, "Enabled"));
    EXPECT_FALSE(result->GetField("Host VNic")->HasValue());
    EXPECT_FALSE(result->GetField("Network Server IP")->HasValue());
    EXPECT_FALSE(result->GetField("Network Server Port")->HasValue());
    EXPECT_EQ(simhost::trace::TakeOperations().size(), 2u) << "the parameters are not read";

    ASSERT_TRUE(Succeeded(Do("set", [](Input& in) { in.SetBool("enable", true); })));
    result = Struct(Do("get").output->GetResult());
    EXPECT_TRUE(Flag(result, "Enabled"));
    EXPECT_EQ(Text(result, "Host VNic"), "hvn0");
    EXPECT_EQ(Text(result, "Network Server IP"), "10.0.0.9");
    EXPECT_EQ(Number(result, "Network Server Port"), 6500);
}

TEST_F(NetworkCommands, SetStoresTheParametersWithTheDefaultPort) {
    ASSERT_TRUE(Succeeded(Do("set", [](Input& in) {
        in.SetString("interface-name", "hvn1");
        in.SetString("server-ipv4", "192.0.2.7");
    })));
    EXPECT_EQ(State()["interface"], "hvn1");
    EXPECT_EQ(State()["server"], "192.0.2.7");
    EXPECT_EQ(State()["port"], 6500);
    EXPECT_EQ(State()["enabled"], false) << "storing parameters does not switch it on";
    ASSERT_TRUE(Succeeded(Do("set", [](Input& in) {
        in.SetString("interface-name", "hvn0");
        in.SetString("server-ipv4", "127.0.0.1");
        in.SetInt("server-port", 65535);
    })));
    EXPECT_EQ(State()["port"], 65535);
    EXPECT_EQ(host_->host().Journal().back().arguments, R"({"interface":"hvn0","address":"127.0.0.1","port":65535})");
    // An empty interface value does not count as given next to --enable.
    ASSERT_TRUE(Succeeded(Do("set", [](Input& in) { in.SetBool("enable", true); in.SetString("interface-name", ""); })));
    EXPECT_EQ(State()["enabled"], true);
    ASSERT_TRUE(Succeeded(Do("set", [](Input& in) { in.SetBool("enable", false); })));
    EXPECT_EQ(State()["enabled"], false);
}

TEST_F(NetworkCommands, SetRefusesBadInputInOrderAndChangesNothing) {
    struct Case {
        std::function<void(Input&)> fill;
        std::string message;
    };
    const std::string port = "Invalid server port number.";
    const std::vector<Case> cases = {
        {[](Input& in) { in.SetInt("server-port", 0); in.SetBool("enable", true); }, port},
        {[](Input& in) { in.SetInt("server-port", -1); }, port},
        {[](Input& in) { in.SetInt("server-port", 70000); }, port},
        {[](Input& in) { in.SetInt("server-port", 4294967297LL); in.SetString("server-ipv4", "10.0.0.1"); }, port},
        {[](Input& in) { in.SetBool("enable", true); in.SetString("interface-name", "hvn0"); },
         "--enable cannot be combined with --interface-name, --server-ipv4, or --server-port."},
        {[](Input& in) { in.SetBool("enable", true); in.SetInt("server-port", 7000); },
         "--enable cannot be combined with --interface-name, --server-ipv4, or --server-port."},
        {[](Input& in) { in.SetString("interface-name", "hvn0"); }, "Missing parameter: network server IP address."},
        {[](Input& in) { in.SetString("server-ipv4", "10.0.0.1"); }, "Missing parameter: interface name."},
        {[](Input&) {}, "Missing parameter: network server IP address."},
        {[](Input& in) { in.SetString("interface-name", "hvn0"); in.SetString("server-ipv4", "10.0.0"); },
         "Malformed Network Server IP Address"},
        {[](Input& in) { in.SetString("interface-name", "hvn0"); in.SetString("server-ipv4", "256.0.0.1"); },
         "Malformed Network Server IP Address"},
        {[](Input& in) { in.SetString("interface-name", "hvn0"); in.SetString("server-ipv4", "010.0.0.1"); },
         "Malformed Network Server IP Address"},
        {[](Input& in) { in.SetString("interface-name", "hvn0"); in.SetString("server-ipv4", "fe80::1"); },
         "Malformed Network Server IP Address"},
        {[](Input& in) { in.SetString("interface-name", "hvn7"); in.SetString("server-ipv4", "10.0.0.1"); },
         "Unknown network interface 'hvn7' (nearest: hvn0, hvn1, hvn9)"},
        {[](Input& in) { in.SetString("interface-name", "hvn9"); in.SetString("server-ipv4", "10.0.0.1"); },
         "Interface hvn9 is down: network dump needs an interface that is up"},
    };
    const std::string before = host_->host().Export();
    for (const Case& c : cases) {
        plugintest::Run run = Do("set", c.fill);
        EXPECT_EQ(Errors(run), std::vector<std::string>{c.message});
        EXPECT_FALSE(run.output->GetResult());
    }
    EXPECT_EQ(host_->host().Export(), before);
}

TEST_F(NetworkCommands, CheckReportsASwitchedOffOrUnusableConfiguration) {
    EXPECT_EQ(Check(), std::make_pair(std::string("Network coredump not enabled"), true));
    EXPECT_EQ(simhost::trace::TakeOperations(),
              (std::vector<std::string>{kNetwork + "NetworkInfoImpl", kNetwork + "GetNetDumperEnabled",
                                        kNetwork + "GetNetDumperParams"}));
    Use(Scenario(true, "hvn0", "", 0));
    EXPECT_EQ(Check(), std::make_pair(std::string("Invalid IP address configured"), true));
    Use(Scenario(true, "hvn9", "127.0.0.1", 6500));
    EXPECT_EQ(Check(), std::make_pair(std::string("Interface hvn9 is down: the dump server cannot be reached through it"), true));
    Use(Scenario(true, "hvn4", "127.0.0.1", 6500));
    EXPECT_EQ(Check(), std::make_pair(std::string("Interface 'hvn4' is not a network interface of this host"), true));
    Use(Scenario(true, "hvn0", "198.51.100.20", 6500));
    EXPECT_EQ(Check(), std::make_pair(std::string("No route to the network dump server at 198.51.100.20:6500: this "
                                                  "host's network reaches only 127.0.0.0/8"),
                                      true));
}

TEST_F(NetworkCommands, CheckVerifiesAServerThatAnswers) {
    Shared().Start();
    Use(Scenario(true, "hvn0", "127.0.0.1", Shared().server.Port()));
    EXPECT_EQ(Check(), std::make_pair(kVerified, false));
}

TEST_F(NetworkCommands, CheckReportsASilentServerAndAnUnreachablePort) {
    simhost::netdump::Server silent("127.0.0.1", 0);  // bound, never answers
    Use(Scenario(true, "hvn0", "127.0.0.1", silent.Port()));
    EXPECT_EQ(Check(), std::make_pair("No answer from the network dump server at 127.0.0.1:" +
                                          std::to_string(silent.Port()) + " within 1 second",
                                      true));
    int closed = 0;
    {
        simhost::netdump::Server gone("127.0.0.1", 0);
        closed = gone.Port();
    }
    Use(Scenario(true, "hvn0", "127.0.0.1", closed));
    EXPECT_EQ(Check(), std::make_pair("Port " + std::to_string(closed) +
                                          " of 127.0.0.1 is unreachable: no network dump server listens there",
                                      true));
}

TEST_F(NetworkCommands, AFailingCheckOperationIsAnOutcomeLikeTheOthers) {
    Use(Scenario(true, "hvn0", "127.0.0.1", 6500));
    host_->host().AddFault(kNetwork + "RunNetDumperCheck", "probe machinery unavailable");
    EXPECT_EQ(Check(), std::make_pair(std::string("probe machinery unavailable"), true));
}

TEST_F(NetworkCommands, TheDefaultHostHasNetworkDumpConfiguredButOff) {
    Use(simhost::DefaultScenario());
    EXPECT_EQ(State()["enabled"], false);
    EXPECT_FALSE(State()["server"].get<std::string>().empty());
    EXPECT_EQ(State()["port"], 6500);
    EXPECT_EQ(Check(), std::make_pair(std::string("Network coredump not enabled"), true));
}

REGISTER_FAULT_CASE(plugintest::FaultCase("KernelDumpGetNetwork", "system coredump network get"));
REGISTER_FAULT_CASE(plugintest::FaultCase("KernelDumpGetNetworkOn", "system coredump network get")
                        .Scenario(Scenario(true, "hvn0", "192.0.2.1", 6500)));
REGISTER_FAULT_CASE(plugintest::FaultCase("KernelDumpSetNetworkEnable", "system coredump network set")
                        .Input([](Input& in) { in.SetBool("enable", true); }));
REGISTER_FAULT_CASE(plugintest::FaultCase("KernelDumpSetNetworkParams", "system coredump network set")
                        .Input([](Input& in) {
                            in.SetString("interface-name", "hvn0");
                            in.SetString("server-ipv4", "192.0.2.1");
                        }));
REGISTER_FAULT_CASE(plugintest::FaultCase("KernelDumpCheckNetwork", "system coredump network check")
                        .Scenario(Scenario(true, "hvn0", "127.0.0.1", Shared().server.Port()))
                        .Before([] { Shared().Start(); })
                        .On(kNetwork + "NetworkInfoImpl", plugintest::Outcome::Reported({"{message}"}, true))
                        .On(kNetwork + "GetNetDumperEnabled", plugintest::Outcome::Reported({"{message}"}, true))
                        .On(kNetwork + "GetNetDumperParams", plugintest::Outcome::Reported({"{message}"}, true))
                        .On(kNetwork + "RunNetDumperCheck", plugintest::Outcome::Reported({"{message}"}, true)));

}  // namespace
