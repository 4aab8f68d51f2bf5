// The core dump domains on the simulated host: scenario rules and round trip, the default host,
// the dump-file header check, confinement of every dump-file path to root/ (.. and symbolic
// links), removal through the seam giving space back, IPv4 text, and the UDP responder.
#include "TestSupport.h"

#include <norlithctl/Env.h>
#include <norlithctl/Ipv4Address.h>
#include <norlithctl/NetworkInfoImpl.h>
#include <norlithctl/RavelException.h>
#include <norlithctl/StorageInfoImpl.h>
#include <simhost/Host.h>
#include <simhost/NetDump.h>
#include <simhost/domains/Coredump.h>

#include <gtest/gtest.h>

#include <sys/stat.h>
#include <unistd.h>

#include <atomic>
#include <fstream>
#include <memory>
#include <string>
#include <thread>
#include <vector>

namespace {

using nlohmann::json;
namespace coredump = simhost::coredump;

json Export(simhost::TempHost& host) { return json::parse(host.host().Export()); }

std::string Refusal(const json& scenario) {
    simhost::TempHost host;
    try {
        host.host().Init(scenario.dump(), true);
    } catch (const simhost::HostError& error) {
        return error.what();
    }
    return "";
}

const json kDatastore = {{"name", "ds1"}, {"mount", "/qrfs/volumes/ds1"}, {"capacity_mb", 1000}, {"free_mb", 900}};

TEST(CoredumpState, ScenariosThatBreakTheRulesAreRefused) {
    const std::vector<std::pair<std::string, json>> cases = {
        {"'dsk.a' appears twice",
         {{"dump_partitions", {{"disks", {{{"name", "dsk.a"}}, {{"name", "dsk.a"}}}}}}}},
        {"partition 1 appears twice",
         {{"dump_partitions", {{"disks", {{{"name", "dsk.a"}, {"partitions", {{{"number", 1}, {"type", "boot"}},
                                                                              {{"number", 1}, {"type", "qrfs"}}}}}}}}}}},
        {"'dsk.a:1' is not a diagnostic partition",
         {{"dump_partitions", {{"disks", {{{"name", "dsk.a"}, {"partitions", {{{"number", 1}, {"type", "boot"}}}}}}},
                               {"active", "dsk.a:1"}}}}},
        {"expected 1 to 100 characters", {{"dump_partitions", {{"disks", {{{"name", "a/b"}}}}}}}},
        {"exceeds capacity_mb",
         {{"dump_files", {{"datastores", {{{"name", "d"}, {"mount", "/d"}, {"capacity_mb", 1}, {"free_mb", 2}}}}}}}},
        {"not below the mount of datastore 'ds1'",
         {{"dump_files", {{"datastores", {kDatastore}},
                          {"files", {{{"path", "/etc/passwd"}, {"datastore", "ds1"}, {"size_mb", 100}}}}}}}},
        {"'nope' is not a datastore of the host",
         {{"dump_files", {{"datastores", {kDatastore}},
                          {"files", {{{"path", "/qrfs/volumes/ds1/x"}, {"datastore", "nope"}, {"size_mb", 100}}}}}}}},
        {"expected \"\" or a host path", {{"dump_files", {{"active", "relative/path"}}}}},
        {"expected \"\" or a dotted IPv4 address", {{"network_dump", {{"server", "1.2.3.256"}}}}},
        {"expected 1 to 15 characters a-z 0-9", {{"network_interfaces", {{{"name", "Eth0"}}}}}},
        {"expected an integer from 0 to 65535", {{"network_dump", {{"port", 70000}}}}},
    };
    for (const auto& [message, scenario] : cases) {
        json whole = scenario;
        whole["format"] = 1;
        EXPECT_NE(Refusal(whole).find(message), std::string::npos) << Refusal(whole) << "\n" << whole.dump();
    }
}

TEST(CoredumpState, TheDefaultHostRoundTripsAndItsDumpFileIsValid) {
    simhost::TempHost host;
    json exported = Export(host);
    EXPECT_EQ(exported["dump_partitions"]["disks"].size(), 2u);
    EXPECT_EQ(exported["dump_files"]["files"].size(), 1u);
    EXPECT_EQ(exported["network_dump"]["enabled"], false);
    const std::string path = exported["dump_files"]["active"];
    EXPECT_TRUE(coredump::ExamineFile(host.host().Root(), path).Valid());
    simhost::TempHost copy(exported.dump());
    EXPECT_EQ(Export(copy), exported);
}

TEST(CoredumpFiles, TheHeaderDecidesValidity) {
    simhost::TempHost host;
    const std::string root = host.host().Root();
    const auto write = [&](const std::string& name, const std::string& content, off_t length) {
        std::ofstream(root + "/" + name) << content;
        ASSERT_EQ(truncate((root + "/" + name).c_str(), length), 0);
    };
    write("good", coredump::DumpFileHeader(1), coredump::kMiB);
    write("short", coredump::DumpFileHeader(2), coredump::kMiB);
    write("plain", "hello\n", coredump::kMiB);
    EXPECT_TRUE(coredump::ExamineFile(root, "/good").Valid());
    EXPECT_TRUE(coredump::ExamineFile(root, "/short").header);
    EXPECT_FALSE(coredump::ExamineFile(root, "/short").Valid()) << "the header names 2 MB";
    EXPECT_FALSE(coredump::ExamineFile(root, "/plain").header);
    EXPECT_FALSE(coredump::ExamineFile(root, "/missing").exists);
    EXPECT_FALSE(coredump::ExamineFile(root, "relative").exists);
}

TEST(CoredumpFiles, PathsNeverLeaveRoot) {
    testsupport::TempDir outside;
    const std::string secret = outside / "secret.dumpfile";
    std::ofstream(secret) << coredump::DumpFileHeader(1);
    ASSERT_EQ(truncate(secret.c_str(), coredump::kMiB), 0);
    simhost::TempHost host;
    const std::string root = host.host().Root();
    ASSERT_EQ(symlink(secret.c_str(), (root + "/link.dumpfile").c_str()), 0);
    ASSERT_EQ(symlink(outside.Path().c_str(), (root + "/away").c_str()), 0);
    EXPECT_FALSE(coredump::ExamineFile(root, "/link.dumpfile").Valid());
    EXPECT_FALSE(coredump::ExamineFile(root, "/away/secret.dumpfile").Valid());
    EXPECT_FALSE(coredump::ExamineFile(root, "/../../../../../../" + secret).Valid());

    NorlithCtl::Storage::StorageInfoImpl storage;
    EXPECT_THROW(storage.SetDiagnosticFile("/away/secret.dumpfile", true), Ravel::Lib::RavelException);
    NorlithCtl::Os::Env* env = NorlithCtl::Os::Env::Default();
    EXPECT_NE(env->Unlink(("/../../../../../../" + secret).c_str()), 0);
    EXPECT_NE(env->Unlink("/away/secret.dumpfile"), 0);
    struct stat info {};
    EXPECT_EQ(stat(secret.c_str(), &info), 0) << "the file outside root/ is untouched";
}

TEST(CoredumpFiles, UnlinkingAKnownDumpFileGivesItsSpaceBack) {
    simhost::TempHost host;
    NorlithCtl::Storage::StorageInfoImpl storage;
    storage.CreateDiagnosticFile(100, "cedar-local-01", "extra");
    json state = Export(host)["dump_files"];
    EXPECT_EQ(state["datastores"][0]["free_mb"], 301544 - 100);
    const std::string path = "/qrfs/volumes/cedar-local-01/norlithdump/extra.dumpfile";
    EXPECT_EQ(state["files"].back()["path"], path);
    ASSERT_EQ(NorlithCtl::Os::Env::Default()->Unlink(path.c_str()), 0);
    state = Export(host)["dump_files"];
    EXPECT_EQ(state["datastores"][0]["free_mb"], 301544);
    EXPECT_EQ(state["files"].size(), 1u);
    // A refused creation leaves neither state nor file behind.
    const std::string before = host.host().Export();
    EXPECT_THROW(storage.CreateDiagnosticFile(100, "nope", "x"), Ravel::Lib::RavelException);
    EXPECT_THROW(storage.CreateDiagnosticFile(100, "cedar-local-01", "a/b"), Ravel::Lib::RavelException);
    EXPECT_EQ(host.host().Export(), before);
}

TEST(CoredumpFiles, ObjectsAnswerFromWhatTheyReadUntilAskedToReread) {
    simhost::TempHost host;
    NorlithCtl::Storage::StorageInfoImpl storage;
    std::unique_ptr<Ravel::Storage::DiagnosticFile> file(storage.GetActiveDiagnosticFile());
    ASSERT_TRUE(file);
    EXPECT_TRUE(file->IsValid(false));
    ASSERT_EQ(unlink((host.host().Root() + file->GetPath()).c_str()), 0);
    EXPECT_TRUE(file->IsValid(false));
    EXPECT_FALSE(file->IsValid(true));
    EXPECT_EQ(file->GetSize(), 0);
    EXPECT_EQ(file->GetName(), "dumpfile-1.dumpfile");
}

TEST(CoredumpNetwork, Ipv4TextIsStrict) {
    for (const char* good : {"0.0.0.0", "127.0.0.1", "255.255.255.255", "10.20.30.40"})
        EXPECT_TRUE(Ravel::Network::Ipv4Address::IsValidAddress(good)) << good;
    for (const char* bad : {"", "1.2.3", "1.2.3.4.5", "256.1.1.1", "01.2.3.4", " 1.2.3.4", "1.2.3.4 ", "1..3.4",
                            "a.b.c.d", "1.2.3.-4", "1.2.3.4/24", "::1"})
        EXPECT_FALSE(Ravel::Network::Ipv4Address::IsValidAddress(bad)) << bad;
    EXPECT_FALSE(Ravel::Network::Ipv4Address().IsValidAddress());
    EXPECT_EQ(Ravel::Network::Ipv4Address("10.0.0.1").GetStringAddress(), "10.0.0.1");
    EXPECT_TRUE(simhost::netdump::IsLoopback("127.200.0.1"));
    EXPECT_FALSE(simhost::netdump::IsLoopback("128.0.0.1"));
}

TEST(CoredumpNetwork, TheResponderAnswersProbesAndNothingElse) {
    simhost::netdump::Server server("127.0.0.1", 0);
    std::atomic<bool> stop{false};
    std::size_t answered = 0;
    std::thread serving([&] { answered = server.Serve(10, &stop); });
    EXPECT_EQ(simhost::netdump::Probe("127.0.0.1", server.Port(), 2000), "");
    EXPECT_EQ(simhost::netdump::Probe("127.0.0.1", server.Port(), 2000), "");
    stop = true;
    serving.join();
    EXPECT_EQ(answered, 2u);
    EXPECT_THROW(simhost::netdump::Server("127.0.0.1", server.Port()), simhost::HostError) << "the port is taken";
    EXPECT_THROW(simhost::netdump::Server("300.0.0.1", 0), simhost::HostError);
}

}  // namespace
