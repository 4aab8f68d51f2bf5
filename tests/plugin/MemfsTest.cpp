// The memory file system commands against throw-away hosts: the status figures and their
// percentages, adding, listing and removing ramdisks through the kernel seam (option string,
// refusals as the kernel's errno text, nothing changed after one), the ramdisk and tardisk rows
// from their records, and host failures.
#include "Harness.h"
#include "support/Files.h"
#include "memfs/MirafsGet.h"
#include "memfs/MirafsRamdiskAdd.h"
#include "memfs/MirafsRamdiskList.h"
#include "memfs/MirafsRamdiskRemove.h"
#include "memfs/MirafsTardiskList.h"

#include <simhost/Host.h>
#include <simhost/Trace.h>

#include <gtest/gtest.h>
#include <nlohmann/json.hpp>

#include <filesystem>
#include <fstream>
#include <map>
#include <string>
#include <vector>

namespace {

using namespace TarselCli::System;
using plugintest::Outcome;
using Kitbase::MetaObj::MetaBool;
using Kitbase::MetaObj::MetaInt;
using Kitbase::MetaObj::MetaList;
using Kitbase::MetaObj::MetaObject;
using Kitbase::MetaObj::MetaString;
using Kitbase::MetaObj::MetaStruct;

const std::string kMount = "NorlithCtl::Os::Env::Mount";
const std::string kUmount = "NorlithCtl::Os::Env::Umount";

// A host with one ordinary ramdisk "work" at /mnt/work and an empty directory /mnt/new.
const char kWorkHost[] = R"({"format": 1,
  "files": [{"path": "/mnt/new", "type": "directory"}, {"path": "/mnt/work/a.log", "text": "x"}],
  "ramdisks": [{"name": "work", "mount_point": "/mnt/work", "maximum_mib": 8}]})";

void FillAdd(Kitbase::CallSpec::Input& input) {
    input.SetInt("min-size", 16);
    input.SetInt("max-size", 32);
    input.SetString("permissions", "0755");
    input.SetString("name", "foo");
    input.SetString("target", "/mnt/new");
}

REGISTER_FAULT_CASE(plugintest::FaultCase("MirafsGet", "system mirafs get").Form(1));
REGISTER_FAULT_CASE(plugintest::FaultCase("MirafsRamdiskList", "system mirafs ramdisk list").Form(1));
REGISTER_FAULT_CASE(plugintest::FaultCase("MirafsTardiskList", "system mirafs tardisk list").Form(1));
// The kernel calls fail as system calls do: a fault naming no errno is EIO.
REGISTER_FAULT_CASE(plugintest::FaultCase("MirafsRamdiskAdd", "system mirafs ramdisk add")
                        .Scenario(kWorkHost)
                        .Input(FillAdd)
                        .On(kMount, Outcome::Reported({"Input/output error"})));
REGISTER_FAULT_CASE(plugintest::FaultCase("MirafsRamdiskRemove", "system mirafs ramdisk remove")
                        .Scenario(kWorkHost)
                        .Input([](Kitbase::CallSpec::Input& input) { input.SetString("target", "/mnt/work"); })
                        .On(kUmount, Outcome::Reported({"Input/output error"})));

// "name=value" of every field of a structure, in its own order.
std::string Text(const boost::shared_ptr<MetaObject>& value) {
    if (auto text = boost::dynamic_pointer_cast<MetaString>(value)) return text->HasValue() ? text->GetValue() : "<none>";
    if (auto number = boost::dynamic_pointer_cast<MetaInt>(value))
        return number->HasValue() ? std::to_string(number->GetValue()) : "<none>";
    if (auto flag = boost::dynamic_pointer_cast<MetaBool>(value))
        return flag->HasValue() ? (flag->GetValue() ? "true" : "false") : "<none>";
    return "?";
}

std::vector<std::string> Fields(const boost::shared_ptr<MetaObject>& result) {
    std::vector<std::string> fields;
    auto structure = boost::dynamic_pointer_cast<MetaStruct>(result);
    if (!structure) return fields;
    for (const MetaStruct::Field& field : structure->GetFields()) fields.push_back(field.first + "=" + Text(field.second));
    return fields;
}

std::vector<std::vector<std::string>> Rows(const boost::shared_ptr<MetaObject>& result) {
    std::vector<std::vector<std::string>> rows;
    auto list = boost::dynamic_pointer_cast<MetaList>(result);
    if (!list) return rows;
    for (const auto& element : list->GetElements()) rows.push_back(Fields(element));
    return rows;
}

nlohmann::json Exported(simhost::TempHost& host, const char* section) {
    return nlohmann::json::parse(host.host().Export())[section];
}

class Memfs : public ::testing::Test {
protected:
    void SetUp() override { simhost::trace::Enable(); }
    void TearDown() override { simhost::trace::Disable(); }

    plugintest::Run Add(std::map<std::string, std::string> text, std::map<std::string, long long> numbers = {},
                        bool withInodeOptions = false, bool coredump = false) {
        plugintest::InputPtr input = Kitbase::CallSpec::Input::New();
        for (const auto& [name, value] : text) input->SetString(name, value);
        for (const auto& [name, value] : numbers) input->SetInt(name, value);
        if (coredump) input->SetFlag("coredump");
        return plugintest::Execute(MirafsRamdiskAdd::New(withInodeOptions), input);
    }
    plugintest::Run Remove(const std::string& target) {
        plugintest::InputPtr input = Kitbase::CallSpec::Input::New();
        input->SetString("target", target);
        return plugintest::Execute(MirafsRamdiskRemove::New(), input);
    }
};

// ---- system mirafs get --------------------------------------------------------------------------

std::string StatusHost(long long total, long long used, long long peak_used) {
    nlohmann::json scenario = {{"format", 1}, {"ramdisks", nlohmann::json::array()}};
    scenario["mirafs"] = {{"total_inodes", total},     {"used_inodes", used},     {"unlinked_inodes", 7},
                          {"reserved_inodes", 300},    {"peak_used_inodes", peak_used},
                          {"peak_unlinked_inodes", 9}, {"peak_reserved_inodes", 500}};
    return scenario.dump();
}

TEST_F(Memfs, StatusShowsTheSevenCountersAndTwoPercentagesInTemplateOrder) {
    simhost::TempHost host(StatusHost(1000, 333, 400));
    simhost::trace::Take();
    plugintest::Run run = plugintest::Execute(MirafsGet::New());
    ASSERT_TRUE(run.output->GetErrors().empty()) << run.output->GetErrors().front();
    EXPECT_TRUE(run.output->IsComplete());
    EXPECT_EQ(Fields(run.output->GetResult()),
              (std::vector<std::string>{"Total Inodes=1000", "Used Inodes=333", "Unlinked Inodes=7",
                                        "Reserved Inodes=300", "Peak Used Inodes=400",
                                        "Peak Unlinked Inodes=9", "Peak Reserved Inodes=500",
                                        "Free Inode Percent=66", "Lowest Free Inode Percent=60"}));
    EXPECT_EQ(simhost::trace::TakeOperations(),
              (std::vector<std::string>{"NorlithCtl::Util::Sysinfo::Sysinfo", "NorlithCtl::Util::Sysinfo::Get"}));
}

TEST_F(Memfs, StatusPercentagesAtTheirEdges) {
    struct Case {
        long long total, used, peak;
        std::string free, lowest;
    } cases[] = {
        {1000, 1000, 1000, "0", "0"},          // all used
        {1000, 0, 0, "100", "100"},            // none used
        {1000, 1500, 1500, "-50", "-50"},      // more used than there is: negative, not clamped
        {0, 12, 12, "0", "0"},                 // no inodes at all: 0 rather than a division by zero
        {4294967295, 1, 1, "99", "99"},        // 32-bit counters are unsigned
    };
    for (const Case& c : cases) {
        SCOPED_TRACE(std::to_string(c.total) + "/" + std::to_string(c.used));
        simhost::TempHost host(StatusHost(c.total, c.used, c.peak));
        std::vector<std::string> fields = Fields(plugintest::Execute(MirafsGet::New()).output->GetResult());
        ASSERT_EQ(fields.size(), 9u);
        EXPECT_EQ(fields[0], "Total Inodes=" + std::to_string(c.total));
        EXPECT_EQ(fields[7], "Free Inode Percent=" + c.free);
        EXPECT_EQ(fields[8], "Lowest Free Inode Percent=" + c.lowest);
    }
}

TEST_F(Memfs, StatusCountsEveryRamdisksInodes) {
    simhost::TempHost host(R"({"format": 1,
      "mirafs": {"total_inodes": 1000, "used_inodes": 100, "reserved_inodes": 10, "peak_used_inodes": 0,
                 "peak_reserved_inodes": 0},
      "ramdisks": [{"name": "a", "mount_point": "/a", "maximum_mib": 1, "reserved_inodes": 5},
                   {"name": "b", "mount_point": "/b", "maximum_mib": 1, "reserved_inodes": 7}],
      "files": [{"path": "/a/x", "text": "1"}, {"path": "/a/d/y", "text": "2"}, {"path": "/b/z", "text": "3"},
                {"path": "/elsewhere", "text": "not on a ramdisk"}]})");
    std::vector<std::string> fields = Fields(plugintest::Execute(MirafsGet::New()).output->GetResult());
    EXPECT_EQ(fields[1], "Used Inodes=104");      // 100 + a's x, d, d/y + b's z
    EXPECT_EQ(fields[3], "Reserved Inodes=22");   // 10 + 5 + 7
    EXPECT_EQ(fields[4], "Peak Used Inodes=104"); // a peak is never below the current figure
    EXPECT_EQ(fields[6], "Peak Reserved Inodes=22");
}

// ---- system mirafs ramdisk add -----------------------------------------------------------------

TEST_F(Memfs, AddMountsAtTheTargetWithTheSevenFieldOptionString) {
    simhost::TempHost host(kWorkHost);
    simhost::trace::Enable(true);
    plugintest::Run run = Add({{"target", "/mnt/new"}, {"permissions", "0755"}, {"name", "foo"}},
                              {{"min-size", 16}, {"max-size", 32}});
    ASSERT_TRUE(run.output->GetErrors().empty()) << run.output->GetErrors().front();
    EXPECT_EQ(Text(run.output->GetResult()), "true");
    EXPECT_TRUE(run.output->IsComplete());
    std::vector<simhost::TraceEntry> calls = simhost::trace::Take();
    ASSERT_EQ(calls.size(), 1u);
    EXPECT_EQ(calls[0].operation, kMount);
    EXPECT_EQ(nlohmann::json::parse(calls[0].arguments),
              nlohmann::json::parse(R"({"source": "", "target": "/mnt/new", "type": "mirafs", "flags": 0,
                                        "options": "16,32,0,0,0,0755,foo"})"));
    nlohmann::json ramdisks = Exported(host, "ramdisks");
    ASSERT_EQ(ramdisks.size(), 2u);
    EXPECT_EQ(ramdisks[1]["name"], "foo");
    EXPECT_EQ(ramdisks[1]["mount_point"], "/mnt/new");
    EXPECT_EQ(ramdisks[1]["reserved_mib"], 16);
    EXPECT_EQ(ramdisks[1]["maximum_inodes"], 8192);  // 0 in the string: the default
    EXPECT_EQ(ramdisks[1]["system"], false);
}

TEST_F(Memfs, AddWithInodeOptionsChecksReservedAgainstMaximumFirst) {
    simhost::TempHost host(kWorkHost);
    const std::map<std::string, std::string> text = {{"target", "/mnt/new"}, {"permissions", "750"}, {"name", "foo"}};
    // Reserved without a maximum: the maximum stays 0. A negative value is a huge unsigned one.
    for (const auto& numbers : std::vector<std::map<std::string, long long>>{
             {{"min-size", 1}, {"max-size", 2}, {"reserved-inodes", 5}},
             {{"min-size", 1}, {"max-size", 2}, {"reserved-inodes", -1}, {"max-inodes", 2147483647}},
             {{"min-size", 1}, {"max-size", 2}, {"reserved-inodes", 101}, {"max-inodes", 100}}}) {
        simhost::trace::Take();
        plugintest::Run run = Add(text, numbers, true);
        EXPECT_EQ(run.output->GetErrors(), std::vector<std::string>{"reserved-inodes cannot be greater than max-inodes"});
        EXPECT_FALSE(run.output->GetResult());
        EXPECT_TRUE(simhost::trace::TakeOperations().empty()) << "nothing is mounted";
    }
    simhost::trace::Enable(true);
    plugintest::Run run = Add(text, {{"min-size", 1}, {"max-size", 2}, {"reserved-inodes", 100}, {"max-inodes", 100}},
                              true, true);
    ASSERT_TRUE(run.output->GetErrors().empty()) << run.output->GetErrors().front();
    std::vector<simhost::TraceEntry> calls = simhost::trace::Take();
    ASSERT_EQ(calls.size(), 1u);
    EXPECT_EQ(nlohmann::json::parse(calls[0].arguments)["options"], "1,2,100,100,1,750,foo");
    nlohmann::json added = Exported(host, "ramdisks")[1];
    EXPECT_EQ(added["coredump"], true);
    EXPECT_EQ(added["permissions"], "0750");
    EXPECT_EQ(added["reserved_inodes"], 100);
}

TEST_F(Memfs, AddRefusesACommaInNameOrPermissionsBeforeMounting) {
    simhost::TempHost host(kWorkHost);
    const std::string before = host.host().Export();
    struct Case {
        const char* name;
        const char* permissions;
        const char* error;
    } cases[] = {
        {"a,b", "0755", "Invalid name 'a,b': a ramdisk name cannot contain ','"},
        {"x", "0755,y", "Invalid permissions '0755,y': permissions cannot contain ','"},
        {",", "07,55", "Invalid name ',': a ramdisk name cannot contain ','"},
    };
    for (const Case& c : cases) {
        simhost::trace::Take();
        plugintest::Run run = Add({{"target", "/mnt/new"}, {"permissions", c.permissions}, {"name", c.name}},
                                  {{"min-size", 1}, {"max-size", 2}});
        EXPECT_EQ(run.output->GetErrors(), std::vector<std::string>{c.error});
        EXPECT_FALSE(run.output->GetResult());
        EXPECT_TRUE(simhost::trace::TakeOperations().empty());
    }
    EXPECT_EQ(host.host().Export(), before);
}

TEST_F(Memfs, AddReportsTheKernelsRefusalAndChangesNothing) {
    testsupport::TempDir outside;
    std::filesystem::create_directory(outside / "victim");
    simhost::TempHost host(R"({"format": 1,
      "files": [{"path": "/mnt/new", "type": "directory"}, {"path": "/mnt/file", "text": "f"},
                {"path": "/mnt/work/a.log", "text": "x"}],
      "ramdisks": [{"name": "work", "mount_point": "/mnt/work", "maximum_mib": 8}],
      "mirafs": {"total_inodes": 1000, "reserved_inodes": 900}})");
    const std::string before = host.host().Export();
    const std::size_t journal = host.host().Journal().size();
    struct Case {
        std::string target, name, permissions, min, max;
        const char* error;
    } cases[] = {
        {"/mnt/new", "work", "0755", "1", "2", "File exists"},                 // the name is taken
        {"/mnt/work", "other", "0755", "1", "2", "Device or resource busy"},   // mounted already
        {"/mnt/missing", "other", "0755", "1", "2", "No such file or directory"},
        {"mnt/new", "other", "0755", "1", "2", "No such file or directory"},   // relative
        {"/mnt/file", "other", "0755", "1", "2", "Not a directory"},
        {"/mnt/new", "other", "0755", "3", "2", "Invalid argument"},           // minimum above maximum
        {"/mnt/new", "other", "0755", "-1", "2", "Invalid argument"},
        {"/mnt/new", "other", "0755", "1", "4294967296", "Invalid argument"},  // above 32 bits
        {"/mnt/new", "other", "0955", "1", "2", "Invalid argument"},           // not octal
        {"/mnt/new", "other", "rwxr-x", "1", "2", "Invalid argument"},
        {"/mnt/new", "", "0755", "1", "2", "Invalid argument"},
        {"/mnt/new", "a/b", "0755", "1", "2", "Invalid argument"},
        {"/mnt/new", std::string(32, 'n'), "0755", "1", "2", "File name too long"},
        {"/../../../../../../.." + outside.Path() + "/victim", "other", "0755", "1", "2",
         "No such file or directory"},                                         // never outside root/
    };
    for (const Case& c : cases) {
        SCOPED_TRACE(c.target + " " + c.name);
        plugintest::InputPtr input = Kitbase::CallSpec::Input::New();
        input->SetString("target", c.target);
        input->SetString("name", c.name);
        input->SetString("permissions", c.permissions);
        input->SetInt("min-size", std::stoll(c.min));
        input->SetInt("max-size", std::stoll(c.max));
        plugintest::Run run = plugintest::Execute(MirafsRamdiskAdd::New(false), input);
        EXPECT_EQ(run.output->GetErrors(), std::vector<std::string>{c.error});
        EXPECT_FALSE(run.output->GetResult());
    }
    EXPECT_EQ(host.host().Export(), before);
    EXPECT_EQ(host.host().Journal().size(), journal) << "a refused mount is no change";
    EXPECT_TRUE(std::filesystem::is_empty(outside / "victim"));
}

TEST_F(Memfs, AddRefusesAMountPointLongerThanTheRecordHolds) {
    std::string long_path = "/" + std::string(130, 'p');  // 131 bytes: the most a record holds
    simhost::TempHost host(R"({"format": 1, "files": [{"path": ")" + long_path +
                           R"(/deeper", "type": "directory"}]})");
    EXPECT_EQ(Add({{"target", long_path + "/deeper"}, {"permissions", "0755"}, {"name", "deep"}},
                  {{"min-size", 0}, {"max-size", 1}})
                  .output->GetErrors(),
              std::vector<std::string>{"File name too long"});
    ASSERT_TRUE(Add({{"target", long_path}, {"permissions", "0755"}, {"name", "edge"}},
                    {{"min-size", 0}, {"max-size", 1}}).output->GetErrors().empty());
    std::vector<std::vector<std::string>> rows =
        Rows(plugintest::Execute(MirafsRamdiskList::New()).output->GetResult());
    EXPECT_EQ(rows.back().back(), "Mount Point=" + long_path);
}

TEST_F(Memfs, AddRefusesReservingMoreInodesThanTheFileSystemHas) {
    simhost::TempHost host(R"({"format": 1, "ramdisks": [], "files": [{"path": "/r", "type": "directory"}],
                               "mirafs": {"total_inodes": 1000, "reserved_inodes": 900}})");
    plugintest::Run run = Add({{"target", "/r"}, {"permissions", "0755"}, {"name", "r"}},
                              {{"min-size", 0}, {"max-size", 1}, {"reserved-inodes", 101}, {"max-inodes", 200}}, true);
    EXPECT_EQ(run.output->GetErrors(), std::vector<std::string>{"No space left on device"});
    run = Add({{"target", "/r"}, {"permissions", "0755"}, {"name", "r"}},
              {{"min-size", 0}, {"max-size", 1}, {"reserved-inodes", 100}, {"max-inodes", 200}}, true);
    EXPECT_TRUE(run.output->GetErrors().empty());
}

// ---- system mirafs ramdisk remove --------------------------------------------------------------

TEST_F(Memfs, RemoveUnmountsAnOrdinaryRamdiskAndKeepsSystemOnes) {
    simhost::TempHost host(R"({"format": 1,
      "files": [{"path": "/mnt/work/a.log", "text": "x"}, {"path": "/plain", "type": "directory"},
                {"path": "/sys1/f", "text": "y"}],
      "ramdisks": [{"name": "work", "mount_point": "/mnt/work", "maximum_mib": 8},
                   {"name": "core", "mount_point": "/sys1", "maximum_mib": 8, "system": true},
                   {"name": "ghost", "mount_point": "/nowhere/here", "maximum_mib": 8}]})");
    simhost::trace::Take();
    plugintest::Run run = Remove("/mnt/work/");
    ASSERT_TRUE(run.output->GetErrors().empty()) << run.output->GetErrors().front();
    EXPECT_EQ(Text(run.output->GetResult()), "true");
    EXPECT_EQ(simhost::trace::TakeOperations(), std::vector<std::string>{kUmount});
    EXPECT_TRUE(std::filesystem::exists(host.host().Root() + "/mnt/work/a.log")) << "the host's files stay";

    const std::string before = host.host().Export();
    EXPECT_EQ(Remove("/sys1").output->GetErrors(), std::vector<std::string>{"Device or resource busy"});
    EXPECT_EQ(Remove("/mnt/work").output->GetErrors(), std::vector<std::string>{"Invalid argument"});
    EXPECT_EQ(Remove("/plain").output->GetErrors(), std::vector<std::string>{"Invalid argument"});
    EXPECT_EQ(Remove("/missing").output->GetErrors(), std::vector<std::string>{"No such file or directory"});
    EXPECT_EQ(Remove("").output->GetErrors(), std::vector<std::string>{"No such file or directory"});
    EXPECT_EQ(host.host().Export(), before);

    // A ramdisk whose mount point has no directory under root/ is still found by its path.
    EXPECT_TRUE(Remove("/nowhere/./here").output->GetErrors().empty());
    nlohmann::json ramdisks = Exported(host, "ramdisks");
    ASSERT_EQ(ramdisks.size(), 1u);
    EXPECT_EQ(ramdisks[0]["name"], "core");
}

// ---- system mirafs ramdisk list ----------------------------------------------------------------

TEST_F(Memfs, ListShowsEachRamdiskFromItsRecordInKernelOrder) {
    simhost::TempHost host(R"({"format": 1,
      "files": [{"path": "/data/big.bin", "text": "", "size": 5000},
                {"path": "/data/empty", "text": ""},
                {"path": "/data/sub/page", "text": "", "size": 4096},
                {"path": "/data/inner/hidden", "text": "", "size": 40960},
                {"path": "/logs/x", "text": "", "size": 1}],
      "ramdisks": [{"name": "zdata", "mount_point": "/data", "reserved_mib": 2, "maximum_mib": 8,
                    "reserved_inodes": 3, "maximum_inodes": 64, "coredump": true, "peak_used_kib": 100},
                   {"name": "inner", "mount_point": "/data/inner", "maximum_mib": 1, "system": true},
                   {"name": "alogs", "mount_point": "/logs", "reserved_mib": 0, "maximum_mib": 0}]})");
    simhost::trace::Take();
    plugintest::Run run = plugintest::Execute(MirafsRamdiskList::New());
    ASSERT_TRUE(run.output->GetErrors().empty()) << run.output->GetErrors().front();
    EXPECT_TRUE(run.output->IsComplete());
    const std::vector<std::vector<std::string>> expected = {
        // 5000 bytes take 8 KiB, the empty file none, sub/page 4 KiB: 12 KiB in 5 inodes (big.bin,
        // empty, sub, sub/page, and the mount point inner, whose own file is inner's).
        {"Ramdisk Name=zdata", "System=false", "Include in Coredumps=true", "Reserved=2048",
         "Maximum=8192", "Used=12", "Peak Used=100", "Free=99", "Reserved Free=99",
         "Maximum Inodes=64", "Allocated Inodes=5", "Used Inodes=5", "Mount Point=/data"},
        {"Ramdisk Name=inner", "System=true", "Include in Coredumps=false", "Reserved=0",
         "Maximum=1024", "Used=40", "Peak Used=40", "Free=96", "Reserved Free=0",
         "Maximum Inodes=8192", "Allocated Inodes=1", "Used Inodes=1", "Mount Point=/data/inner"},
        // A maximum of 0 shows Free 0 instead of dividing by zero; used above reserved: 0.
        {"Ramdisk Name=alogs", "System=false", "Include in Coredumps=false", "Reserved=0",
         "Maximum=0", "Used=4", "Peak Used=4", "Free=0", "Reserved Free=0",
         "Maximum Inodes=8192", "Allocated Inodes=1", "Used Inodes=1", "Mount Point=/logs"},
    };
    EXPECT_EQ(Rows(run.output->GetResult()), expected);
    const std::string kNew = "NorlithCtl::Util::Sysinfo::Sysinfo";
    const std::string kList = "NorlithCtl::Util::Sysinfo::List";
    const std::string kReset = "NorlithCtl::Util::Sysinfo::ResetInstance";
    const std::string kPath = "NorlithCtl::Util::Sysinfo::AddInstancePath";
    const std::string kGet = "NorlithCtl::Util::Sysinfo::Get";
    EXPECT_EQ(simhost::trace::TakeOperations(),
              (std::vector<std::string>{kNew, kNew, kList, kReset, kPath, kGet, kReset, kPath, kGet,
                                        kReset, kPath, kGet}));
}

TEST_F(Memfs, ListOfNoRamdisksIsAnEmptyResult) {
    simhost::TempHost host(R"({"format": 1, "ramdisks": []})");
    plugintest::Run run = plugintest::Execute(MirafsRamdiskList::New());
    ASSERT_TRUE(run.output->GetResult());
    EXPECT_TRUE(Rows(run.output->GetResult()).empty());
    EXPECT_TRUE(run.output->IsComplete());
}

TEST_F(Memfs, ListAfterAddAndRemoveFollowsTheKernel) {
    simhost::TempHost host(kWorkHost);
    ASSERT_TRUE(Add({{"target", "/mnt/new"}, {"permissions", "0755"}, {"name", "foo"}},
                    {{"min-size", 16}, {"max-size", 32}}).output->GetErrors().empty());
    auto names = [] {
        std::vector<std::string> found;
        for (const auto& row : Rows(plugintest::Execute(MirafsRamdiskList::New()).output->GetResult()))
            found.push_back(row[0]);
        return found;
    };
    EXPECT_EQ(names(), (std::vector<std::string>{"Ramdisk Name=work", "Ramdisk Name=foo"}));
    ASSERT_TRUE(Remove("/mnt/work").output->GetErrors().empty());
    EXPECT_EQ(names(), std::vector<std::string>{"Ramdisk Name=foo"});
}

// ---- system mirafs tardisk list ----------------------------------------------------------------

TEST_F(Memfs, TardisksShowNameSystemAndSizeInBytes) {
    simhost::TempHost host(R"({"format": 1, "tardisks": [
        {"name": "base.t00", "size": 4294967295}, {"name": "extra.t00", "size": 0, "system": false}]})");
    simhost::trace::Take();
    plugintest::Run run = plugintest::Execute(MirafsTardiskList::New());
    EXPECT_EQ(Rows(run.output->GetResult()),
              (std::vector<std::vector<std::string>>{
                  {"Tardisk Name=base.t00", "System=true", "Size=4294967295"},
                  {"Tardisk Name=extra.t00", "System=false", "Size=0"}}));
    EXPECT_EQ(simhost::trace::TakeOperations().size(), 3u + 2 * 3);

    host.host().Init(R"({"format": 1, "tardisks": []})", true);
    run = plugintest::Execute(MirafsTardiskList::New());
    ASSERT_TRUE(run.output->GetResult());
    EXPECT_TRUE(Rows(run.output->GetResult()).empty());
}

TEST_F(Memfs, TheDefaultHostHasSystemRamdisksAndADozenTardisks) {
    simhost::TempHost host;
    std::vector<std::vector<std::string>> ramdisks =
        Rows(plugintest::Execute(MirafsRamdiskList::New()).output->GetResult());
    ASSERT_GE(ramdisks.size(), 4u);
    for (const auto& row : ramdisks) EXPECT_EQ(row[1], "System=true");
    EXPECT_EQ(Rows(plugintest::Execute(MirafsTardiskList::New()).output->GetResult()).size(), 12u);
    std::vector<std::string> status = Fields(plugintest::Execute(MirafsGet::New()).output->GetResult());
    EXPECT_NE(status[1], "Used Inodes=0");
}

// ---- the commands' shapes ----------------------------------------------------------------------

TEST(MemfsSpecs, ParametersOfAddWithAndWithoutInodeOptions) {
    auto describe = [](const boost::shared_ptr<AutoCli::Command>& command) {
        std::vector<std::string> parameters;
        const auto spec = command->GetInputSpec();
        for (const auto& p : spec->GetParameters()) {
            std::string text = p->GetName() + " -" + p->GetShortName() + " " + std::to_string(p->GetType()) +
                               (p->IsRequired() ? " required" : "") + ": " + p->GetHelp();
            for (const auto& c : p->GetConstraints())
                text += " [" + std::to_string(c->GetLow()) + ".." + std::to_string(c->GetHigh()) + "]";
            parameters.push_back(text);
        }
        return parameters;
    };
    const std::string min = "min-size -m 1 required: Minimum size (min reservation in MiB)";
    const std::string max = "max-size -M 1 required: Maximum size (max reservation in MiB)";
    const std::string perms = "permissions -p 0 required: Permissions for the root of the ramdisk (mode)";
    const std::string name = "name -n 0 required: Name for the ramdisk";
    const std::string target = "target -t 0 required: Mountpoint for the ramdisk (absolute path)";
    EXPECT_EQ(describe(plugintest::FindCommand("system mirafs ramdisk add")),
              (std::vector<std::string>{min, max, perms, name, target}));
    EXPECT_EQ(describe(MirafsRamdiskAdd::New(true)),
              (std::vector<std::string>{min, max, "reserved-inodes -i 1: Number of reserved inodes",
                                        "max-inodes -I 1: Maximum number of inodes [1..2147483647]",
                                        "coredump -d 3: Include this ramdisk as part of coredumps", perms,
                                        name, target}));
    EXPECT_EQ(describe(MirafsRamdiskRemove::New()), std::vector<std::string>{target});
}

TEST(MemfsSpecs, TypeIsSetTwiceWithFetcherLastAndTheOutputsAreSteered) {
    boost::shared_ptr<MirafsRamdiskList> list = MirafsRamdiskList::New();
    EXPECT_EQ(list->GetMetaDataField("type"), "fetcher");
    EXPECT_EQ(list->GetDefaultOutputFormatter(), "table");
    std::vector<AutoCli::Command::KeyValue> parameters = list->GetDefaultOutputParameters();
    ASSERT_EQ(parameters.size(), 7u);
    EXPECT_EQ(parameters[0].first, "table-columns");
    EXPECT_EQ(parameters[6], (AutoCli::Command::KeyValue{"units:MirafsRamdisk.Reserved Free", "%"}));
    EXPECT_EQ(MirafsGet::New()->GetMetaDataField("type"), "fetcher");
    EXPECT_EQ(MirafsTardiskList::New()->GetDefaultOutputParameters(),
              (std::vector<AutoCli::Command::KeyValue>{{"table-columns", "Tardisk Name,System,Size"},
                                                       {"units:MirafsTardisk.Size", "B"}}));
    EXPECT_EQ(MirafsRamdiskAdd::New(false)->GetMetaDataField("type"), "operation");
    EXPECT_TRUE(MirafsRamdiskAdd::New(false)->GetDefaultOutputFormatter().empty());
}

}  // namespace
