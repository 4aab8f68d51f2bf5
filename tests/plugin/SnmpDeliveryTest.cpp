// system snmp test delivering for real: Debian's snmptrapd listens on a free loopback port, the
// host's targets point at it, and the notifications must arrive, SNMPv1 with the right community
// and SNMPv3 authenticated (and encrypted) with the remote users' localized keys; those sent with
// a wrong community or wrong keys must not be accepted, and an inform it refuses is an error.
#include "SnmpTestSupport.h"

#include <simhost/Host.h>

#include "support/Files.h"

#include <gtest/gtest.h>

#include <chrono>
#include <csignal>
#include <fstream>
#include <sstream>
#include <thread>

#include <arpa/inet.h>
#include <netinet/in.h>
#include <sys/socket.h>
#include <sys/wait.h>
#include <unistd.h>

namespace {

using nlohmann::ordered_json;
using snmptest::Args;
using snmptest::Errors;
using snmptest::Invoke;
using snmptest::ResultJson;
using testsupport::TempDir;
using testsupport::WriteFile;

const char kTrapd[] = "/usr/sbin/snmptrapd";
const char kTrapEngine[] = "8000000001020304050607";  // the remote users' engine for traps
// snmptrapd's own engine, for informs: its "engineID" setting is a text, which it turns into an
// engine id of the text format (its enterprise prefix, 04, the text's bytes).
const char kTrapdEngineText[] = "quarntrapd";
const char kTrapdEngine[] = "80001f8804717561726e7472617064";

std::string FileText(const std::string& path) {
    std::ifstream file(path);
    std::ostringstream text;
    text << file.rdbuf();
    return text.str();
}

// A UDP port on the loopback interface that nothing uses right now.
int FreeLoopbackPort() {
    int fd = socket(AF_INET, SOCK_DGRAM, 0);
    sockaddr_in address{};
    address.sin_family = AF_INET;
    address.sin_addr.s_addr = htonl(INADDR_LOOPBACK);
    bind(fd, reinterpret_cast<sockaddr*>(&address), sizeof address);
    socklen_t length = sizeof address;
    getsockname(fd, reinterpret_cast<sockaddr*>(&address), &length);
    close(fd);
    return ntohs(address.sin_port);
}

// snmptrapd in the foreground on 127.0.0.1:port, logging what it accepts to a file; stopped and
// waited for when the object goes.
class TrapReceiver {
public:
    TrapReceiver(const TempDir& dir, const std::string& config) : log_(dir / "traps.log"), port_(FreeLoopbackPort()) {
        WriteFile(dir / "snmptrapd.conf", config);
        std::filesystem::create_directory(dir / "state");
        const std::string conf = dir / "snmptrapd.conf";
        const std::string pidfile = dir / "snmptrapd.pid";
        const std::string state = dir / "state";
        const std::string listen = "udp:127.0.0.1:" + std::to_string(port_);
        pid_ = fork();
        if (pid_ == 0) {
            setenv("SNMP_PERSISTENT_DIR", state.c_str(), 1);
            setenv("MIBS", "", 1);
            freopen("/dev/null", "w", stderr);
            execl(kTrapd, kTrapd, "-f", "-C", "-c", conf.c_str(), "-n", "-Lf", log_.c_str(), "-p", pidfile.c_str(),
                  listen.c_str(), static_cast<char*>(nullptr));
            _exit(127);
        }
        // Ready once it has written its start line.
        for (int i = 0; i < 100 && FileText(log_).find("NET-SNMP version") == std::string::npos; ++i)
            std::this_thread::sleep_for(std::chrono::milliseconds(50));
    }
    ~TrapReceiver() {
        if (pid_ > 0) {
            kill(pid_, SIGTERM);
            int status = 0;
            waitpid(pid_, &status, 0);
        }
    }
    TrapReceiver(const TrapReceiver&) = delete;
    TrapReceiver& operator=(const TrapReceiver&) = delete;

    int port() const { return port_; }
    bool Started() const { return FileText(log_).find("NET-SNMP version") != std::string::npos; }
    // The log once it holds count notifications, or as it is after a bounded wait.
    std::string Received(std::size_t count) const {
        std::string text;
        for (int i = 0; i < 60; ++i) {
            text = FileText(log_);
            std::size_t lines = 0;
            for (std::size_t at = text.find("\nN "); at != std::string::npos; at = text.find("\nN ", at + 1)) ++lines;
            if (lines >= count) break;
            std::this_thread::sleep_for(std::chrono::milliseconds(50));
        }
        return text;
    }

private:
    std::string log_;
    int port_;
    pid_t pid_ = -1;
};

std::string Hash(const std::string& engine, const std::string& protocol, const std::string& auth,
                 const std::string& priv, std::string* priv_hash) {
    Args set;
    // Local users hashed for another protocol would be refused: the receiver tests need none.
    set.strings = {{"engineid", engine}, {"authentication", protocol}, {"privacy", "AES128"}, {"users", ""}};
    EXPECT_TRUE(Errors(Invoke("system snmp set", set)).empty());
    Args hash;
    hash.strings = {{"auth-hash", auth}};
    if (!priv.empty()) hash.strings["priv-hash"] = priv;
    hash.flags = {"raw-secret"};
    ordered_json keys = ResultJson(Invoke("system snmp hash", hash));
    if (priv_hash) *priv_hash = keys["priv-hash"];
    return keys["auth-hash"];
}

class SnmpDelivery : public ::testing::Test {
protected:
    TempDir dir_;
    simhost::TempHost host_;
};

TEST_F(SnmpDelivery, NotificationsArriveAuthenticatedAtARealReceiver) {
    ASSERT_TRUE(std::filesystem::exists(kTrapd)) << "snmptrapd is needed (Debian package snmptrapd)";
    TrapReceiver receiver(dir_, std::string("engineID ") + kTrapdEngineText +
                                    "\nformat1 N v1 %P %w\\n\nformat2 N v2 %P %v\\n\n"
                                    "authCommunity log trapcomm\n"
                                    "createUser -e 0x" + kTrapEngine + " trapper SHA \"trapper-auth-secret\" AES \"trapper-priv-secret\"\n"
                                    "authUser log trapper priv\n"
                                    "createUser -e 0x" + kTrapEngine + " intruder SHA \"the-real-secret\"\n"
                                    "authUser log intruder\n"
                                    "createUser -e 0x" + kTrapdEngine + " informer MD5 \"informer-auth-secret\"\n"
                                    "authUser log informer\n");
    ASSERT_TRUE(receiver.Started());
    const std::string at = "127.0.0.1@" + std::to_string(receiver.port());

    // The remote users' keys, made by the agent itself for each engine.
    std::string trapper_priv;
    const std::string trapper_auth = Hash(kTrapEngine, "SHA1", "trapper-auth-secret", "trapper-priv-secret", &trapper_priv);
    const std::string intruder_auth = Hash(kTrapEngine, "SHA1", "not-the-real-secret", "", nullptr);
    const std::string informer_auth = Hash(kTrapdEngine, "MD5", "informer-auth-secret", "", nullptr);
    Args set;
    set.strings = {
        {"targets", at + "/trapcomm," + at + "/wrongcomm"},
        {"remote-users", "trapper/SHA1/" + trapper_auth + "/AES/" + trapper_priv + "/" + kTrapEngine +
                             ",intruder/SHA1/" + intruder_auth + "/none/-/" + kTrapEngine +
                             ",informer/MD5/" + informer_auth + "/none/-/" + kTrapdEngine},
        {"v3targets", at + "/trapper/priv/trap," + at + "/intruder/auth/trap," + at + "/informer/auth/inform"}};
    plugintest::Run saved = Invoke("system snmp set", set);
    ASSERT_TRUE(Errors(saved).empty()) << Errors(saved)[0];

    plugintest::Run run = Invoke("system snmp test");
    ASSERT_TRUE(Errors(run).empty()) << Errors(run)[0];
    EXPECT_EQ(ResultJson(run)["comments"], ordered_json::array({"There are 5 targets configured",
                                                                "send warmStart requested", "test completed normally."}));

    const std::string log = receiver.Received(3);
    // Generic trap 1 is warmStart.
    EXPECT_NE(log.find("N v1 TRAP, SNMP v1, community trapcomm 1\n"), std::string::npos) << log;
    EXPECT_NE(log.find("N v2 TRAP2, SNMP v3, user trapper, context"), std::string::npos) << log;
    EXPECT_NE(log.find("N v2 INFORM, SNMP v3, user informer, context"), std::string::npos) << log;
    EXPECT_NE(log.find("= OID: iso.3.6.1.6.3.1.1.5.2"), std::string::npos) << "warmStart: " << log;
    // What came with a wrong community or wrong keys was not accepted.
    EXPECT_EQ(log.find("wrongcomm"), std::string::npos) << log;
    EXPECT_EQ(log.find("user intruder"), std::string::npos) << log;
    EXPECT_NE(log.find("Authentication failed for intruder"), std::string::npos) << log;
}

TEST_F(SnmpDelivery, AnInformTheReceiverRefusesIsAnErrorNamingTheTarget) {
    ASSERT_TRUE(std::filesystem::exists(kTrapd));
    TrapReceiver receiver(dir_, std::string("engineID ") + kTrapdEngineText +
                                    "\ncreateUser -e 0x" + kTrapdEngine + " informer MD5 \"informer-auth-secret\"\nauthUser log informer\n");
    ASSERT_TRUE(receiver.Started());
    const std::string at = "127.0.0.1@" + std::to_string(receiver.port());
    const std::string wrong = Hash(kTrapdEngine, "MD5", "a-wrong-auth-secret", "", nullptr);
    Args set;
    set.strings = {{"targets", ""},
                   {"remote-users", "informer/MD5/" + wrong + "/none/-/" + kTrapdEngine},
                   {"v3targets", at + "/informer/auth/inform"}};
    ASSERT_TRUE(Errors(Invoke("system snmp set", set)).empty());
    auto start = std::chrono::steady_clock::now();
    plugintest::Run run = Invoke("system snmp test");
    EXPECT_LT(std::chrono::steady_clock::now() - start, std::chrono::seconds(6));
    ASSERT_EQ(Errors(run).size(), 1u);
    EXPECT_EQ(Errors(run)[0].rfind("The warmStart notification was not delivered to " + at +
                                       " (SNMPv3 inform as 'informer'): ", 0),
              0u)
        << Errors(run)[0];
    EXPECT_FALSE(run.output->GetResult());
}

}  // namespace
