// The core dump commands as a user runs them: partitions and dump files changed through quarncli
// and kept by the host (the dump file a real sparse file under the host's root/), refusals with
// status 1 that change nothing, and the network dump check against a `quarnhost netdump-server`
// process on a free loopback port: verified while it runs, port unreachable once it is gone.
#include "support/Files.h"
#include "support/Process.h"
#include "HostFixture.h"

#include <gtest/gtest.h>
#include <nlohmann/json.hpp>

#include <fcntl.h>
#include <signal.h>
#include <sys/stat.h>
#include <unistd.h>

#include <chrono>
#include <string>
#include <thread>
#include <vector>

namespace {

using nlohmann::json;
using Result = testsupport::ProcessResult;

class CoredumpEndToEnd : public e2e::HostFixture {
protected:
    void SetUp() override { ASSERT_EQ(Host({"init"}).status, 0); }
    json Json(std::vector<std::string> args) {
        args.insert(args.begin(), {"--formatter", "json"});
        Result result = Cli(args);
        EXPECT_EQ(result.status, 0) << result.err;
        return json::parse(result.out);
    }
};

TEST_F(CoredumpEndToEnd, PartitionsAreListedAndConfigured) {
    json listed = Json({"system", "coredump", "partition", "list"});
    ASSERT_EQ(listed.size(), 2u);
    const std::string second = listed[1]["Name"];
    Result set = Cli({"system", "coredump", "partition", "set", "--partition", second});
    ASSERT_EQ(set.status, 0) << set.err;
    EXPECT_EQ(set.out, "true\n");
    json got = Json({"system", "coredump", "partition", "get"});
    EXPECT_EQ(got["Active"], second);
    EXPECT_EQ(got["Configured"], second);
    Result refused = Cli({"system", "coredump", "partition", "set", "--smart"});
    EXPECT_EQ(refused.status, 1);
    EXPECT_EQ(refused.err, "--smart can be specified only with --enable=true.\n");
}

TEST_F(CoredumpEndToEnd, ADumpFileIsCreatedListedAndRemoved) {
    Result added = Cli({"system", "coredump", "file", "add", "--size", "300", "--datastore", "cedar-local-02",
                        "--file", "spare"});
    ASSERT_EQ(added.status, 0) << added.err;
    const std::string path = "/qrfs/volumes/cedar-local-02/norlithdump/spare.dumpfile";
    struct stat info {};
    ASSERT_EQ(stat((state_ + "/root" + path).c_str(), &info), 0);
    EXPECT_EQ(info.st_size, 300LL * 1048576);
    json listed = Json({"system", "coredump", "file", "list"});
    ASSERT_EQ(listed.size(), 2u);
    EXPECT_EQ(listed[1], json({{"Path", path}, {"Active", false}, {"Configured", false}, {"Size", 300LL * 1048576}}));

    Result refused = Cli({"system", "coredump", "file", "remove", "--file", "/etc/tarsel/snmp.xml"});
    EXPECT_EQ(refused.status, 1);
    EXPECT_NE(refused.err.find("it is not one of this host's dump files"), std::string::npos) << refused.err;
    EXPECT_EQ(stat((state_ + "/root/etc/tarsel/snmp.xml").c_str(), &info), 0);

    Result removed = Cli({"system", "coredump", "file", "remove", "-f", path});
    ASSERT_EQ(removed.status, 0) << removed.err;
    EXPECT_NE(stat((state_ + "/root" + path).c_str(), &info), 0);
    EXPECT_EQ(Json({"system", "coredump", "file", "list"}).size(), 1u);
}

// Runs quarnhost netdump-server with its output going to a file.
struct ServerArgs {
    std::string out;
    std::vector<std::string> args;
};
int RunServer(void* context) {
    ServerArgs* server = static_cast<ServerArgs*>(context);
    int fd = open(server->out.c_str(), O_WRONLY | O_CREAT | O_TRUNC, 0600);
    if (fd < 0 || dup2(fd, 1) < 0) return 126;
    std::vector<char*> argv;
    for (std::string& arg : server->args) argv.push_back(&arg[0]);
    argv.push_back(nullptr);
    execv(QUARNHOST, argv.data());
    return 127;
}

TEST_F(CoredumpEndToEnd, TheCheckVerifiesARunningDumpServerAndReportsOneThatIsGone) {
    ServerArgs server{dir_ / "server.out", {QUARNHOST, "netdump-server", "--listen", "127.0.0.1:0", "--seconds", "60"}};
    const int pid = testsupport::ForkChild(RunServer, &server);
    ASSERT_GT(pid, 0);
    const std::string prefix = "Answering network dump probes on 127.0.0.1:";
    std::string line;
    for (int i = 0; i < 200 && line.find('\n') == std::string::npos; ++i) {
        std::this_thread::sleep_for(std::chrono::milliseconds(50));
        line = testsupport::ReadFile(server.out);
    }
    ASSERT_EQ(line.compare(0, prefix.size(), prefix), 0) << line;
    const std::string port = line.substr(prefix.size(), line.find('\n') - prefix.size());

    ASSERT_EQ(Cli({"system", "coredump", "network", "set", "-v", "hvn0", "-i", "127.0.0.1", "-o", port}).status, 0);
    ASSERT_EQ(Cli({"system", "coredump", "network", "set", "--enable", "true"}).status, 0);
    Result check = Cli({"system", "coredump", "network", "check"});
    EXPECT_EQ(check.status, 0) << check.err;
    EXPECT_EQ(check.out, "Verified the configured netdump server is running\n");

    kill(pid, SIGTERM);
    EXPECT_EQ(testsupport::WaitChild(pid), 0);
    EXPECT_EQ(testsupport::ReadFile(server.out), line + "Answered 1 probe\n");
    check = Cli({"system", "coredump", "network", "check"});
    EXPECT_EQ(check.status, 1);
    const std::string unreachable = "Port " + port + " of 127.0.0.1 is unreachable: no network dump server listens there\n";
    EXPECT_EQ(check.err, unreachable);
    EXPECT_EQ(check.out, unreachable);
}

TEST_F(CoredumpEndToEnd, TheServerRefusesABadListenAddress) {
    Result bad = Host({"netdump-server", "--listen", "localhost:6500"});
    EXPECT_EQ(bad.status, 2);
    EXPECT_NE(bad.err.find("not a dotted IPv4 address"), std::string::npos) << bad.err;
    bad = Host({"netdump-server", "--listen", "127.0.0.1:70000"});
    EXPECT_EQ(bad.status, 2);
}

}  // namespace
