// The dump file commands against throw-away hosts whose dump files are real sparse files under
// root/: get and list (the active and configured files listed even when the host's list lacks
// them, invalid files left out), add with its defaults, --auto and every refusal, remove (never
// a file that is not a dump file of the host), set's option rules, and the next boot.
#include "CoredumpTestSupport.h"

#include <norlithctl/Env.h>
#include <simhost/Host.h>

#include <gtest/gtest.h>
#include <nlohmann/json.hpp>

#include <sys/stat.h>

#include <csignal>
#include <fstream>
#include <sstream>
#include <string>
#include <vector>

namespace {

using namespace coredumptest;

const std::string kStorage = "NorlithCtl::Storage::StorageInfoImpl::";
const std::string kA = "/qrfs/volumes/ds1/norlithdump/a.dumpfile";
const std::string kB = "/qrfs/volumes/ds1/norlithdump/b.dumpfile";
const std::string kGone = "/qrfs/volumes/ds1/norlithdump/gone.dumpfile";
const std::string kStray = "/qrfs/volumes/ds2/norlithdump/stray.dumpfile";
const long long kMiB = 1048576;

std::string Scenario(const std::string& active, const std::string& configured, const std::string& extra = "") {
    return R"({"format": 1,
  "files": [
    {"path": "/etc/tarsel/snmp.xml", "text": "<config/>\n"},
    {"path": ")" + kA + R"(", "text": "NORLITHDUMPFILE\nversion: 1\nsize-mb: 100\n", "size": 104857600},
    {"path": ")" + kB + R"(", "text": "NORLITHDUMPFILE\nversion: 1\nsize-mb: 200\n", "size": 209715200},
    {"path": ")" + kStray + R"(", "text": "NORLITHDUMPFILE\nversion: 1\nsize-mb: 150\n", "size": 157286400},
    {"path": "/qrfs/volumes/ds1/notes.txt", "text": "not a dump file\n"}],
  "dump_files": {
    "datastores": [{"name": "ds1", "mount": "/qrfs/volumes/ds1", "capacity_mb": 10000, "free_mb": 5000},
                   {"name": "ds2", "mount": "/qrfs/volumes/ds2", "capacity_mb": 2000, "free_mb": 150}],
    "files": [{"path": ")" + kA + R"(", "datastore": "ds1", "size_mb": 100},
              {"path": ")" + kB + R"(", "datastore": "ds1", "size_mb": 200},
              {"path": ")" + kGone + R"(", "datastore": "ds1", "size_mb": 100}],
    "active": ")" + active + R"(", "configured": ")" + configured + R"("})" + extra + "}";
}

class FileCommands : public ::testing::Test {
protected:
    void SetUp() override { simhost::trace::Enable(); }
    void TearDown() override { simhost::trace::Disable(); }

    plugintest::Run Do(const std::string& verb, const std::function<void(Input&)>& fill = {}) {
        simhost::trace::Take();
        return RunCommand("system coredump file " + verb, fill);
    }
    nlohmann::json State() { return nlohmann::json::parse(host_->host().Export())["dump_files"]; }
    std::vector<std::string> Calls() {
        std::vector<std::string> calls;
        for (const std::string& name : simhost::trace::TakeOperations())
            calls.push_back(name.substr(name.rfind("::") + 2));
        return calls;
    }
    std::vector<std::string> Listed() {
        std::vector<std::string> lines;
        for (const auto& row : Rows(Do("list")))
            lines.push_back(Text(row, "Path") + " " + std::to_string(Flag(row, "Active")) +
                            std::to_string(Flag(row, "Configured")) + " " + std::to_string(Number(row, "Size")));
        return lines;
    }
    bool OnDisk(const std::string& path, struct stat* info = nullptr) {
        struct stat local {};
        return lstat((host_->host().Root() + path).c_str(), info ? info : &local) == 0;
    }
    // The old host restores the environment it found, so it goes first.
    void Use(const std::string& scenario) {
        host_.reset();
        host_.reset(new simhost::TempHost(scenario));
    }

    std::unique_ptr<simhost::TempHost> host_{new simhost::TempHost(Scenario(kA, kB))};
};

TEST_F(FileCommands, GetShowsBothPathsAndALookUpThatFailsCountsAsNone) {
    plugintest::Run run = Do("get");
    auto result = Struct(run.output->GetResult());
    ASSERT_TRUE(result);
    EXPECT_EQ(result->GetName(), "KernelDumpFile");
    EXPECT_EQ(Text(result, "Active"), kA);
    EXPECT_EQ(Text(result, "Configured"), kB);
    host_->host().AddFault(kStorage + "GetConfiguredDiagnosticFile", "storage stack busy");
    run = Do("get");
    EXPECT_TRUE(Errors(run).empty());
    EXPECT_EQ(Text(Struct(run.output->GetResult()), "Active"), kA);
    EXPECT_EQ(Text(Struct(run.output->GetResult()), "Configured"), "");
}

TEST_F(FileCommands, ListShowsValidFilesWithStatesAndSizesInBytes) {
    EXPECT_EQ(Listed(), (std::vector<std::string>{kA + " 10 " + std::to_string(100 * kMiB),
                                                  kB + " 01 " + std::to_string(200 * kMiB)}))
        << "the vanished file is not listed";
}

TEST_F(FileCommands, ListAddsTheActiveAndConfiguredFilesTheHostDoesNotKnowOnce) {
    Use(Scenario(kStray, kStray));
    EXPECT_EQ(Listed(), (std::vector<std::string>{kA + " 00 " + std::to_string(100 * kMiB),
                                                  kB + " 00 " + std::to_string(200 * kMiB),
                                                  kStray + " 11 " + std::to_string(150 * kMiB)}));
    Use(Scenario(kStray, "/qrfs/volumes/ds1/notes.txt"));
    EXPECT_EQ(Listed().back(), kStray + " 10 " + std::to_string(150 * kMiB)) << "a file without header is skipped";
}

TEST_F(FileCommands, AddWithoutOptionsCreatesADefaultSparseFileWithAHeader) {
    plugintest::Run run = Do("add");
    ASSERT_TRUE(Succeeded(run)) << (Errors(run).empty() ? "" : Errors(run)[0]);
    EXPECT_EQ(Calls(), (std::vector<std::string>{"StorageInfoImpl", "CreateDiagnosticFile"}));
    const std::string made = "/qrfs/volumes/ds1/norlithdump/dumpfile-1.dumpfile";
    struct stat info {};
    ASSERT_TRUE(OnDisk(made, &info));
    EXPECT_EQ(info.st_size, 2560 * kMiB);
    EXPECT_LT(info.st_blocks * 512, 1024 * 1024) << "pre-allocated in length only";
    std::ifstream file(host_->host().Root() + made);
    std::string header(41, '\0');
    file.read(&header[0], 41);
    EXPECT_EQ(header, "NORLITHDUMPFILE\nversion: 1\nsize-mb: 2560\n");
    EXPECT_EQ(State()["datastores"][0]["free_mb"], 5000 - 2560);
    EXPECT_EQ(State()["files"].back()["path"], made);
    EXPECT_EQ(Listed().back(), made + " 00 " + std::to_string(2560 * kMiB));
    ASSERT_TRUE(Succeeded(Do("add", [](Input& in) { in.SetInt("size", 100); })));
    EXPECT_TRUE(OnDisk("/qrfs/volumes/ds1/norlithdump/dumpfile-2.dumpfile")) << "a unique name each time";
    plugintest::Run run2 = Do("add");
    EXPECT_EQ(Errors(run2), (std::vector<std::string>{"No datastore has 2560 MB free for a dump file"}));
}

TEST_F(FileCommands, AddTakesSizeDatastoreAndName) {
    ASSERT_TRUE(Succeeded(Do("add", [](Input& in) {
        in.SetInt("size", 150);
        in.SetString("datastore", "ds2");
        in.SetString("file", "crash");
    })));
    EXPECT_EQ(host_->host().Journal().back().arguments, R"({"size":150,"datastore":"ds2","file":"crash"})");
    struct stat info {};
    ASSERT_TRUE(OnDisk("/qrfs/volumes/ds2/norlithdump/crash.dumpfile", &info));
    EXPECT_EQ(info.st_size, 150 * kMiB);
    EXPECT_EQ(State()["datastores"][1]["free_mb"], 0);
}

TEST_F(FileCommands, AddRefusesBadSizesDatastoresAndNamesAndChangesNothing) {
    struct Case {
        std::function<void(Input&)> fill;
        std::string message;
    };
    const std::vector<Case> cases = {
        {[](Input& in) { in.SetInt("size", -5); },
         "Dump file size -5 MB is negative: give a size in MB from 100 to 32768, or 0 for the default"},
        {[](Input& in) { in.SetInt("size", 99); },
         "Dump file size 99 MB is out of range: give a size in MB from 100 to 32768, or 0 for the default"},
        {[](Input& in) { in.SetInt("size", 40000); },
         "Dump file size 40000 MB is out of range: give a size in MB from 100 to 32768, or 0 for the default"},
        {[](Input& in) { in.SetInt("size", 151); in.SetString("datastore", "ds2"); },
         "Datastore ds2 has 150 MB free: a dump file of 151 MB does not fit"},
        {[](Input& in) { in.SetString("datastore", "ds2"); },
         "Datastore ds2 has 150 MB free: a dump file of 2560 MB does not fit"},
        {[](Input& in) { in.SetInt("size", 6000); }, "No datastore has 6000 MB free for a dump file"},
        {[](Input& in) { in.SetString("datastore", "ds3"); }, "Unknown datastore 'ds3' (nearest: ds1, ds2)"},
        {[](Input& in) { in.SetString("datastore", "../ds1"); }, "Datastore name '../ds1' holds '/': a name is not a path"},
        {[](Input& in) { in.SetString("file", "../../etc/passwd"); },
         "Dump file name '../../etc/passwd' holds '/': a name is not a path"},
        {[](Input& in) { in.SetString("file", ".."); }, "Dump file name '..' holds '..'"},
        {[](Input& in) { in.SetString("file", "a\tb"); }, "Dump file name 'a\\tb' holds a control character"},
        {[](Input& in) { in.SetString("file", std::string(65, 'x')); },
         "Dump file name '" + std::string(40, 'x') + "...' is 65 bytes long: at most 64 bytes"},
        {[](Input& in) { in.SetString("file", "a"); in.SetString("datastore", "ds1"); in.SetInt("size", 100); },
         "Dump file " + kA + " already exists"},
    };
    const std::string before = host_->host().Export();
    for (const Case& c : cases) {
        plugintest::Run run = Do("add", c.fill);
        EXPECT_EQ(Errors(run), std::vector<std::string>{c.message});
        EXPECT_FALSE(run.output->GetResult());
    }
    EXPECT_EQ(host_->host().Export(), before);
    EXPECT_FALSE(OnDisk("/etc/passwd.dumpfile"));
}

TEST_F(FileCommands, AutoAddCreatesOnlyWhenTheHostHasNoValidFileAndTheSettingAllows) {
    ASSERT_TRUE(Succeeded(Do("add", [](Input& in) { in.SetFlag("auto"); })));
    EXPECT_EQ(Calls(), (std::vector<std::string>{"StorageInfoImpl", "AutoAddDiagnosticFile"}));
    EXPECT_EQ(State()["files"].size(), 3u) << "the host has valid dump files";

    const std::string none = R"({"format": 1, "dump_files": {"datastores": [
        {"name": "ds1", "mount": "/qrfs/volumes/ds1", "capacity_mb": 9000, "free_mb": 9000}],
        "files": [], "active": "", "configured": ""})";
    Use(none + R"(, "kernel_settings": [{"name": "autoCreateDumpFile", "type": 1, "default": "TRUE",
        "configured": "TRUE", "runtime": "FALSE"}]})");
    ASSERT_TRUE(Succeeded(Do("add", [](Input& in) { in.SetFlag("auto"); })));
    EXPECT_TRUE(State()["files"].empty()) << "the running kernel's setting is FALSE";

    Use(none + "}");
    ASSERT_TRUE(Succeeded(Do("add", [](Input& in) { in.SetFlag("auto"); in.SetInt("size", 300); })));
    const std::string made = "/qrfs/volumes/ds1/norlithdump/dumpfile-1.dumpfile";
    EXPECT_EQ(State()["active"], made);
    EXPECT_EQ(State()["configured"], made);
    EXPECT_EQ(Listed(), (std::vector<std::string>{made + " 11 " + std::to_string(300 * kMiB)}));
}

TEST_F(FileCommands, RemoveTakesTheFileOutOfUseThenUnlinksIt) {
    plugintest::Run run = Do("remove", [](Input& in) { in.SetString("file", kA); });
    EXPECT_EQ(Errors(run), (std::vector<std::string>{"Dump file " + kA + " currently active, --force is required."}));
    EXPECT_TRUE(OnDisk(kA));
    EXPECT_EQ(State()["active"], kA);

    ASSERT_TRUE(Succeeded(Do("remove", [](Input& in) { in.SetString("file", kA); in.SetFlag("force"); })));
    EXPECT_EQ(Calls(), (std::vector<std::string>{"StorageInfoImpl", "GetActiveDiagnosticFile",
                                                 "GetConfiguredDiagnosticFile", "DeactivateDiagnosticFile",
                                                 "Unlink"}));
    EXPECT_FALSE(OnDisk(kA));
    EXPECT_EQ(State()["active"], "");
    EXPECT_EQ(State()["datastores"][0]["free_mb"], 5100) << "its space goes back to the datastore";
    EXPECT_EQ(State()["files"].size(), 2u);

    // The configured file by default; no --force needed when it is not active.
    ASSERT_TRUE(Succeeded(Do("remove")));
    EXPECT_EQ(Calls(), (std::vector<std::string>{"StorageInfoImpl", "GetActiveDiagnosticFile",
                                                 "GetConfiguredDiagnosticFile", "UnconfigureDiagnosticFile",
                                                 "Unlink"}));
    EXPECT_FALSE(OnDisk(kB));
    EXPECT_EQ(State()["configured"], "");
    run = Do("remove");
    EXPECT_EQ(Errors(run), (std::vector<std::string>{"No configured file to remove."}));
}

TEST_F(FileCommands, RemoveRefusesAnyPathThatIsNotADumpFileOfTheHost) {
    const std::string before = host_->host().Export();
    for (const std::string& path : {std::string("/etc/tarsel/snmp.xml"), std::string("/bin/kelp-cmd"),
                                    std::string("/qrfs/volumes/ds1/norlithdump/../../../etc/tarsel/snmp.xml"),
                                    kStray, std::string("/qrfs/volumes/ds1//norlithdump/a.dumpfile")}) {
        plugintest::Run run = Do("remove", [&](Input& in) { in.SetString("file", path); in.SetFlag("force"); });
        EXPECT_EQ(Errors(run), (std::vector<std::string>{
                                   "Refusing to remove " + path +
                                   ": it is not one of this host's dump files (known, active or configured)."}));
        for (const std::string& call : Calls()) EXPECT_EQ(call.find("Unlink"), std::string::npos);
    }
    EXPECT_TRUE(OnDisk("/etc/tarsel/snmp.xml"));
    EXPECT_TRUE(OnDisk(kStray));
    EXPECT_EQ(host_->host().Export(), before);
}

TEST_F(FileCommands, AnEmptyPathIsNoDumpFileEvenWithoutAnActiveOne) {
    Use(Scenario("", kB));
    plugintest::Run run = Do("remove", [](Input& in) { in.SetString("file", ""); in.SetFlag("force"); });
    EXPECT_EQ(Errors(run), (std::vector<std::string>{
                               "Refusing to remove : it is not one of this host's dump files (known, active or configured)."}));
    EXPECT_EQ(State()["configured"], kB);
}

TEST_F(FileCommands, AKnownFileThatVanishedGetsTheUnlinkMessage) {
    plugintest::Run run = Do("remove", [](Input& in) { in.SetString("file", kGone); });
    EXPECT_EQ(Errors(run), (std::vector<std::string>{"Unlink of file " + kGone + " failed: No such file or directory"}));
    EXPECT_EQ(State()["active"], kA) << "a file neither active nor configured leaves the settings alone";
    EXPECT_EQ(State()["configured"], kB);
}

TEST_F(FileCommands, SetFollowsItsOptionRulesInOrder) {
    struct Case {
        std::function<void(Input&)> fill;
        std::string message;
    };
    const std::string smart = "--smart can be specified only with --enable=true.";
    const std::vector<Case> cases = {
        {[](Input& in) { in.SetBool("enable", true); in.SetString("path", kA); },
         "--enable cannot be combined with --path or --unconfigure."},
        {[](Input& in) { in.SetFlag("smart"); in.SetFlag("unconfigure"); }, smart},
        {[](Input&) {}, "Please specify an action. Run with --help for details."},
        {[](Input& in) { in.SetFlag("unconfigure"); in.SetString("path", kA); },
         "--unconfigure cannot be combined with --path."},
        {[](Input& in) { in.SetBool("enable", false); in.SetFlag("smart"); }, smart},
    };
    const std::string before = host_->host().Export();
    for (const Case& c : cases) {
        plugintest::Run run = Do("set", c.fill);
        EXPECT_EQ(Errors(run), std::vector<std::string>{c.message});
        EXPECT_TRUE(Calls().empty());
    }
    EXPECT_EQ(host_->host().Export(), before);
}

TEST_F(FileCommands, SetActivatesConfiguresAndUnconfigures) {
    ASSERT_TRUE(Succeeded(Do("set", [](Input& in) { in.SetBool("enable", true); })));
    EXPECT_EQ(State()["active"], kB);
    ASSERT_TRUE(Succeeded(Do("set", [](Input& in) { in.SetString("path", kStray); })));
    EXPECT_EQ(Calls(), (std::vector<std::string>{"StorageInfoImpl", "SetDiagnosticFile"}));
    EXPECT_EQ(State()["active"], kStray);
    EXPECT_EQ(State()["configured"], kStray);
    plugintest::Run run = Do("set", [](Input& in) { in.SetString("path", "/qrfs/volumes/ds1/notes.txt"); });
    EXPECT_EQ(Errors(run), (std::vector<std::string>{
                               "/qrfs/volumes/ds1/notes.txt is not a dump file: it does not start with the dump-file header"}));
    run = Do("set", [](Input& in) { in.SetString("path", kGone); });
    EXPECT_EQ(Errors(run), (std::vector<std::string>{"No dump file at " + kGone + ": the file does not exist"}));
    ASSERT_TRUE(Succeeded(Do("set", [](Input& in) { in.SetFlag("unconfigure"); })));
    EXPECT_EQ(Calls(), (std::vector<std::string>{"StorageInfoImpl", "DeactivateDiagnosticFile",
                                                 "UnconfigureDiagnosticFile"}));
    EXPECT_EQ(State()["active"], "");
    EXPECT_EQ(State()["configured"], "");
    // Smart: nothing configured, so the largest valid known file.
    ASSERT_TRUE(Succeeded(Do("set", [](Input& in) { in.SetBool("enable", true); in.SetFlag("smart"); })));
    EXPECT_EQ(State()["active"], kB);
    ASSERT_TRUE(Succeeded(Do("set", [](Input& in) { in.SetBool("enable", false); })));
    EXPECT_EQ(State()["active"], "");
}

TEST_F(FileCommands, TheNextBootActivatesTheConfiguredFile) {
    ASSERT_EQ(NorlithCtl::Os::Env::Default()->Kill(1, SIGTERM), 0);
    EXPECT_EQ(State()["active"], kB);
    EXPECT_EQ(State()["configured"], kB);
}

TEST_F(FileCommands, TheDefaultHostHasADatastoreWithOneActiveDumpFile) {
    Use(simhost::DefaultScenario());
    std::vector<std::string> listed = Listed();
    ASSERT_EQ(listed.size(), 1u);
    EXPECT_EQ(listed[0].substr(listed[0].find(' ')), " 11 " + std::to_string(2560 * kMiB));
}

REGISTER_FAULT_CASE(plugintest::FaultCase("KernelDumpGetFile", "system coredump file get")
                        .On(kStorage + "GetActiveDiagnosticFile", plugintest::Outcome::Ignored())
                        .On(kStorage + "GetConfiguredDiagnosticFile", plugintest::Outcome::Ignored()));
REGISTER_FAULT_CASE(plugintest::FaultCase("KernelDumpListFiles", "system coredump file list")
                        .On(kStorage + "GetActiveDiagnosticFile", plugintest::Outcome::Ignored())
                        .On(kStorage + "GetConfiguredDiagnosticFile", plugintest::Outcome::Ignored()));
REGISTER_FAULT_CASE(plugintest::FaultCase("KernelDumpAddFile", "system coredump file add")
                        .Input([](Input& in) { in.SetInt("size", 200); }));
REGISTER_FAULT_CASE(plugintest::FaultCase("KernelDumpAddFileAuto", "system coredump file add")
                        .Input([](Input& in) { in.SetFlag("auto"); }));
REGISTER_FAULT_CASE(plugintest::FaultCase("KernelDumpRemoveFile", "system coredump file remove")
                        .Input([](Input& in) { in.SetFlag("force"); })
                        .On(kStorage + "GetActiveDiagnosticFile", plugintest::Outcome::Ignored())
                        .On(kStorage + "GetConfiguredDiagnosticFile",
                            plugintest::Outcome::Reported({"No configured file to remove."}))
                        .On("NorlithCtl::Os::Env::Unlink", plugintest::Outcome::Reported(
                                {"Unlink of file /qrfs/volumes/cedar-local-01/norlithdump/dumpfile-1.dumpfile "
                                 "failed: Input/output error"})));
REGISTER_FAULT_CASE(plugintest::FaultCase("KernelDumpSetFileEnable", "system coredump file set")
                        .Input([](Input& in) { in.SetBool("enable", true); in.SetFlag("smart"); }));
REGISTER_FAULT_CASE(plugintest::FaultCase("KernelDumpSetFileUnconfigure", "system coredump file set")
                        .Input([](Input& in) { in.SetFlag("unconfigure"); }));
REGISTER_FAULT_CASE(plugintest::FaultCase("KernelDumpSetFilePath", "system coredump file set")
                        .Input([](Input& in) {
                            in.SetString("path", "/qrfs/volumes/cedar-local-01/norlithdump/dumpfile-1.dumpfile");
                        }));

}  // namespace
