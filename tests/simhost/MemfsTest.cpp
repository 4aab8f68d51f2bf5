// The memory file system on the simulated host: the mount option string as the kernel reads it,
// ramdisks beside the mount table (shared mount points, refusals that change nothing, a reboot),
// what a ramdisk's files take, the records' bytes, and the sections' scenario rules.
#include "TestSupport.h"

#include <norlithctl/Env.h>
#include <norlithctl/RavelException.h>
#include <norlithctl/Records.h>
#include <norlithctl/Sysinfo.h>

#include <simhost/Host.h>
#include <simhost/Mirafs.h>
#include <simhost/Scenario.h>
#include <simhost/Store.h>

#include <gtest/gtest.h>

#include <algorithm>
#include <cerrno>
#include <csignal>
#include <filesystem>
#include <string>
#include <vector>

namespace {

using NorlithCtl::Os::Env;
namespace Records = NorlithCtl::Util::Records;
using simhost::mirafs::MountOptions;

nlohmann::json Section(simhost::TempHost& host, const char* name) {
    return nlohmann::json::parse(host.host().Export())[name];
}

std::string RejectionOf(const std::string& text) {
    try {
        simhost::ParseScenario(text);
    } catch (const simhost::HostError& error) {
        return error.what();
    }
    return "(accepted)";
}

std::uint32_t U32At(const std::vector<unsigned char>& record, std::size_t offset) {
    return record[offset] | record[offset + 1] << 8 | record[offset + 2] << 16 |
           static_cast<std::uint32_t>(record[offset + 3]) << 24;
}

TEST(MirafsOptions, TheSevenFieldsAreReadAsTheKernelReadsThem) {
    MountOptions options;
    ASSERT_EQ(simhost::mirafs::ParseMountOptions("16,32,0,0,0,755,foo", &options), 0);
    EXPECT_EQ(options.minimum_mib, 16u);
    EXPECT_EQ(options.maximum_mib, 32u);
    EXPECT_EQ(options.maximum_inodes, 8192u) << "0 is the default maximum";
    EXPECT_EQ(options.permissions, "0755");
    EXPECT_EQ(options.name, "foo");
    ASSERT_EQ(simhost::mirafs::ParseMountOptions("0,4294967295,7,7,1,01777,a.b-c_d", &options), 0);
    EXPECT_EQ(options.maximum_mib, 4294967295u);
    EXPECT_TRUE(options.coredump);
    EXPECT_EQ(options.permissions, "1777");

    struct Case {
        const char* text;
        int error;
    } refused[] = {
        {"16,32,0,0,0,0755", EINVAL},              // six fields
        {"16,32,0,0,0,0755,foo,bar", EINVAL},      // a comma in the name shifts the fields
        {"16,32,0,0,0,,foo", EINVAL},              // no mode
        {",32,0,0,0,0755,foo", EINVAL},            // no minimum
        {"-1,32,0,0,0,0755,foo", EINVAL},
        {"+1,32,0,0,0,0755,foo", EINVAL},
        {"1,4294967296,0,0,0,0755,foo", EINVAL},   // above 32 bits
        {"1,99999999999999999999,0,0,0,0755,foo", EINVAL},
        {"33,32,0,0,0,0755,foo", EINVAL},          // minimum above maximum
        {"1,2,9,8,0,0755,foo", EINVAL},            // reserved inodes above the maximum
        {"1,2,8193,0,0,0755,foo", EINVAL},         // ... above the default maximum
        {"1,2,0,0,2,0755,foo", EINVAL},            // core dump is 0 or 1
        {"1,2,0,0,0,0855,foo", EINVAL},
        {"1,2,0,0,0,17777,foo", EINVAL},           // five digits need a leading 0
        {"1,2,0,0,0,u+rwx,foo", EINVAL},
        {"1,2,0,0,0,0755,a/b", EINVAL},
        {"1,2,0,0,0,0755,..", EINVAL},
        {"1,2,0,0,0,0755,two words", EINVAL},
        {"1,2,0,0,0,0755,", EINVAL},
        {"1,2,0,0,0,0755,0123456789012345678901234567890x", ENAMETOOLONG},
    };
    for (const Case& c : refused) {
        SCOPED_TRACE(c.text);
        MountOptions untouched;
        untouched.name = "kept";
        EXPECT_EQ(simhost::mirafs::ParseMountOptions(c.text, &untouched), c.error);
        EXPECT_EQ(untouched.name, "kept");
    }
}

class MirafsKernel : public ::testing::Test {
protected:
    Env* env_ = Env::Default();
    simhost::TempHost host_{R"({"format": 1,
      "files": [{"path": "/mnt/a", "type": "directory"}, {"path": "/mnt/b", "type": "directory"},
                {"path": "/sys/files/f", "text": "x"}],
      "ramdisks": [{"name": "core", "mount_point": "/sys/files", "maximum_mib": 4, "system": true}]})"};

    std::vector<std::string> Names() {
        std::vector<std::string> names;
        for (const auto& ramdisk : Section(host_, "ramdisks")) names.push_back(ramdisk["name"]);
        return names;
    }
};

TEST_F(MirafsKernel, RamdisksAndTheMountTableShareMountPoints) {
    ASSERT_EQ(env_->Mount("", "/mnt/a", "mirafs", 0, "1,2,0,0,0,0755,ra"), 0);
    EXPECT_EQ(env_->Mount("", "/mnt/a", "tmpfs", 0, ""), -1);
    EXPECT_EQ(errno, EBUSY);
    ASSERT_EQ(env_->Mount("", "/mnt/b", "tmpfs", 0, ""), 0);
    EXPECT_EQ(env_->Mount("", "/mnt/b/", "mirafs", 0, "1,2,0,0,0,0755,rb"), -1);
    EXPECT_EQ(errno, EBUSY);
    EXPECT_TRUE(Section(host_, "mounts").size() == 1u) << "ramdisks are not in the mount table";
    EXPECT_EQ(Names(), (std::vector<std::string>{"core", "ra"}));

    // Each umount finds its own kind.
    EXPECT_EQ(env_->Umount("/mnt/b"), 0);
    EXPECT_EQ(env_->Umount("/mnt/a"), 0);
    EXPECT_TRUE(Section(host_, "mounts").empty());
    EXPECT_EQ(Names(), std::vector<std::string>{"core"});
    EXPECT_EQ(env_->Umount("/sys/files"), -1);
    EXPECT_EQ(errno, EBUSY);
    EXPECT_EQ(env_->Umount("/mnt/a"), -1);
    EXPECT_EQ(errno, EINVAL);
}

TEST_F(MirafsKernel, RefusalsChangeNothingAndAreNotJournaled) {
    const std::string before = host_.host().Export();
    const std::size_t journal = host_.host().Journal().size();
    struct Case {
        const char* target;
        const char* options;
        int error;
    } refused[] = {
        {"/mnt/a", "1,2,0,0,0,0755,core", EEXIST},
        {"/mnt/a", "2,1,0,0,0,0755,new", EINVAL},
        {"/sys/files", "1,2,0,0,0,0755,new", EBUSY},
        {"/mnt/none", "1,2,0,0,0,0755,new", ENOENT},
        {"/sys/files/f", "1,2,0,0,0,0755,new", ENOTDIR},
        {"/mnt/a", "1,2,524289,524289,0,0755,new", ENOSPC},
    };
    for (const Case& c : refused) {
        SCOPED_TRACE(c.options);
        EXPECT_EQ(env_->Mount("", c.target, "mirafs", 0, c.options), -1);
        EXPECT_EQ(errno, c.error);
    }
    EXPECT_EQ(env_->Umount("/sys/files"), -1);
    EXPECT_EQ(host_.host().Export(), before);
    EXPECT_EQ(host_.host().Journal().size(), journal);

    ASSERT_EQ(env_->Mount("", "/mnt/a", "mirafs", 0, "1,2,0,0,0,0755,new"), 0);
    ASSERT_EQ(host_.host().Journal().size(), journal + 1);
    EXPECT_EQ(host_.host().Journal().back().operation, "NorlithCtl::Os::Env::Mount");
}

TEST_F(MirafsKernel, ARebootKeepsOnlySystemRamdisksAndFreesTheOthersMountPoints) {
    ASSERT_EQ(env_->Mount("", "/mnt/a", "mirafs", 0, "1,2,0,0,0,0755,gone"), 0);
    ASSERT_EQ(env_->Kill(1, SIGTERM), 0);
    EXPECT_EQ(Names(), std::vector<std::string>{"core"});
    // The mount point and the name are free again.
    EXPECT_EQ(env_->Mount("", "/mnt/a", "mirafs", 0, "1,2,0,0,0,0755,gone"), 0);
    EXPECT_EQ(env_->Umount("/mnt/a"), 0);
}

TEST_F(MirafsKernel, AFileSystemMountedInsideARamdiskKeepsItsFiles) {
    std::string root = host_.host().Root();
    std::filesystem::create_directories(root + "/sys/files/inner");
    testsupport::WriteFile(root + "/sys/files/inner/big", std::string(10000, 'b'));
    auto usage = [&] {
        NorlithCtl::Util::Sysinfo node(Records::MirafsRamdisk::kNode);
        node.AddInstancePath("core");
        std::vector<unsigned char> record(Records::MirafsRamdisk::kSize);
        node.Get(record.data(), record.size());
        return std::make_pair(U32At(record, 8), U32At(record, 170));
    };
    EXPECT_EQ(usage(), std::make_pair(4u, 3u));  // f (1 page) + inner/big (3 pages); f, inner, big
    ASSERT_EQ(env_->Mount("", "/sys/files/inner", "tmpfs", 0, ""), 0);
    EXPECT_EQ(usage(), std::make_pair(1u, 2u));  // inner's contents are the tmpfs's now
}

TEST(MirafsUsage, SparseFilesCountTheirLengthAndLinksAreNeverFollowed) {
    testsupport::TempDir outside;
    testsupport::WriteFile(outside / "secret", std::string(8192, 's'));
    simhost::TempHost host(R"({"format": 1, "ramdisks": [{"name": "r", "mount_point": "/r", "maximum_mib": 8}],
      "files": [{"path": "/r/sparse", "text": "", "size": 1073741825},
                {"path": "/r/link", "type": "symlink", "target": ")" + outside.Path() + R"("}]})");
    simhost::Session session = simhost::Session::OpenCurrent();
    simhost::mirafs::Usage usage = simhost::mirafs::UsageOf(session.db(), host.host().Root(), "/r");
    EXPECT_EQ(usage.pages, 262145u);  // 1 GiB and one byte
    EXPECT_EQ(usage.inodes, 2u);
    // A mount point without a directory under root/ holds nothing.
    usage = simhost::mirafs::UsageOf(session.db(), host.host().Root(), "/nowhere");
    EXPECT_EQ(usage.pages, 0u);
    EXPECT_EQ(usage.inodes, 0u);
}

TEST(MirafsRecords, EncodersWriteTheLayoutsFieldsAndNothingElse) {
    simhost::mirafs::Ramdisk ramdisk;
    ramdisk.name = "r";
    ramdisk.mount_point = "/var/" + std::string(126, 'm');  // 131 bytes
    ramdisk.reserved_mib = 0x01020304;
    ramdisk.maximum_mib = 0xFFFFFFFF;
    ramdisk.reserved_inodes = 10;
    ramdisk.maximum_inodes = 0xA1B2C3D4;
    ramdisk.coredump = true;
    ramdisk.system = true;
    ramdisk.peak_used_kib = 4 * 0x11223344ull + 1;  // rounds up to a whole page
    simhost::mirafs::Usage usage{0x1000000000ull, 0x55667788};  // pages beyond 32 bits are held at the top
    std::vector<unsigned char> record = simhost::mirafs::EncodeRamdisk(ramdisk, usage);
    ASSERT_EQ(record.size(), 180u);
    EXPECT_EQ(U32At(record, 0), 0x01020304u);
    EXPECT_EQ(U32At(record, 4), 0xFFFFFFFFu);
    EXPECT_EQ(U32At(record, 8), 0xFFFFFFFFu);
    EXPECT_EQ(U32At(record, 12), 0xFFFFFFFFu);
    EXPECT_EQ(record[24], 1);
    EXPECT_EQ(record[25], 1);
    EXPECT_EQ(std::string(reinterpret_cast<const char*>(&record[30])), ramdisk.mount_point);
    EXPECT_EQ(record[161], 0) << "the mount point's field ends with its NUL";
    EXPECT_EQ(U32At(record, 162), 0xA1B2C3D4u);
    EXPECT_EQ(U32At(record, 166), 0x55667788u);  // allocated: the larger of reserved and used
    EXPECT_EQ(U32At(record, 170), 0x55667788u);
    for (std::size_t at : {16u, 20u, 26u, 174u, 176u}) EXPECT_EQ(U32At(record, at) & 0xFFFF, 0u) << at;

    usage = {3, 1};
    ramdisk.peak_used_kib = 4 * 0x11223344ull + 1;
    record = simhost::mirafs::EncodeRamdisk(ramdisk, usage);
    EXPECT_EQ(U32At(record, 12), 0x11223345u);
    EXPECT_EQ(U32At(record, 166), 10u);

    std::vector<unsigned char> tardisk = simhost::mirafs::EncodeTardisk({"t", 0xFEDCBA98, true});
    ASSERT_EQ(tardisk.size(), 20u);
    EXPECT_EQ(U32At(tardisk, 0), 0xFEDCBA98u);
    EXPECT_EQ(tardisk[8], 1);
    EXPECT_EQ(std::count(tardisk.begin(), tardisk.end(), 0), 15);

    simhost::mirafs::Status status{100, 4294967290u, 2, 5, 50, 1, 9};
    simhost::mirafs::StatusFigures figures = simhost::mirafs::FiguresOf(status, 10, 7);
    EXPECT_EQ(figures.used, 4294967295u) << "sums stop at 32 bits";
    EXPECT_EQ(figures.peak_used, 4294967295u);
    EXPECT_EQ(figures.reserved, 12u);
    EXPECT_EQ(figures.peak_reserved, 12u);
    EXPECT_EQ(figures.peak_unlinked, 2u);
    std::vector<unsigned char> encoded = simhost::mirafs::EncodeStatus(figures);
    ASSERT_EQ(encoded.size(), 1128u);
    const std::uint32_t expected[] = {100, 4294967295u, 4294967295u, 2, 2, 12, 12};
    for (std::size_t i = 0; i < 7; ++i) EXPECT_EQ(U32At(encoded, 8 + 4 * i), expected[i]) << i;
    EXPECT_EQ(std::count(encoded.begin() + 36, encoded.end(), 0), 1128 - 36);
}

TEST(MirafsRecords, InstanceNodesNeedOneKnownName) {
    simhost::TempHost host(R"({"format": 1, "ramdisks": [{"name": "r", "mount_point": "/r", "maximum_mib": 8}]})");
    auto failure = [](int node, std::vector<std::string> path, std::size_t size) -> std::string {
        try {
            NorlithCtl::Util::Sysinfo info(node);
            for (const std::string& part : path) info.AddInstancePath(part);
            std::vector<char> buffer(size);
            info.Get(buffer.data(), size);
        } catch (const Ravel::Lib::RavelException& e) {
            return e.GetMessage(0);
        }
        return "(read)";
    };
    EXPECT_EQ(failure(1586, {}, 180),
              "Cannot read kernel information node 1586: select one ramdisk by its name first (AddInstancePath)");
    EXPECT_EQ(failure(1586, {"x"}, 180), "There is no ramdisk named 'x'");
    EXPECT_EQ(failure(1586, {"r", "r"}, 180),
              "Cannot read kernel information node 1586: select one ramdisk by its name first (AddInstancePath)");
    EXPECT_EQ(failure(1583, {"r"}, 20), "There is no tardisk named 'r'");
    EXPECT_EQ(failure(1586, {"r"}, 180), "(read)");
    NorlithCtl::Util::Sysinfo count(1585);
    unsigned char record[4];
    count.Get(record, 4);
    EXPECT_EQ(record[0], 1);
    EXPECT_EQ(failure(1582, {}, 4), "(read)");
}

TEST(MirafsScenario, SectionsRoundTripAndMissingOnesAreTheDefaults) {
    const std::string scenario = R"({"format": 1,
      "mirafs": {"total_inodes": 9, "used_inodes": 8, "unlinked_inodes": 7, "reserved_inodes": 6,
                 "peak_used_inodes": 5, "peak_unlinked_inodes": 4, "peak_reserved_inodes": 3},
      "ramdisks": [{"name": "b", "mount_point": "/", "reserved_mib": 1, "maximum_mib": 2, "reserved_inodes": 3,
                    "maximum_inodes": 4, "coredump": true, "permissions": "1777", "system": true,
                    "peak_used_kib": 17179869180},
                   {"name": "a", "mount_point": "/x/y", "maximum_mib": 0}],
      "tardisks": [{"name": "z.t00", "size": 4294967295, "system": false}, {"name": "a.t00", "size": 1}],
      "readcache": {"runtime_enabled": true, "configured_enabled": false}})";
    simhost::TempHost host(scenario);
    const nlohmann::json given = nlohmann::json::parse(scenario);
    EXPECT_EQ(Section(host, "mirafs"), given["mirafs"]);
    EXPECT_EQ(Section(host, "readcache"), given["readcache"]);
    EXPECT_EQ(Section(host, "tardisks")[0], given["tardisks"][0]);
    nlohmann::json ramdisks = Section(host, "ramdisks");
    EXPECT_EQ(ramdisks[0], given["ramdisks"][0]);
    EXPECT_EQ(ramdisks[1]["maximum_inodes"], 8192);
    EXPECT_EQ(ramdisks[1]["permissions"], "0755");
    EXPECT_EQ(Section(host, "tardisks")[1]["system"], true);
    simhost::TempHost again(host.host().Export());
    EXPECT_EQ(again.host().Export(), host.host().Export());

    simhost::TempHost bare(R"({"format": 1})");
    EXPECT_EQ(Section(bare, "ramdisks").size(), 6u);
    EXPECT_EQ(Section(bare, "tardisks").size(), 12u);
    EXPECT_EQ(Section(bare, "readcache"), nlohmann::json::parse(R"({"runtime_enabled": false, "configured_enabled": false})"));
    for (const auto& ramdisk : Section(bare, "ramdisks")) EXPECT_TRUE(ramdisk["system"].get<bool>());
}

TEST(MirafsScenario, RefusesRamdisksTheKernelCouldNotHave) {
    auto ramdisks = [](const std::string& items) { return R"({"format": 1, "ramdisks": [)" + items + "]}"; };
    struct Case {
        std::string text;
        std::string message;
    } cases[] = {
        {ramdisks(R"({"name": "a", "mount_point": "/a"}, {"name": "a", "mount_point": "/b"})"),
         "scenario: ramdisks[1].name: 'a' appears twice"},
        {ramdisks(R"({"name": "a", "mount_point": "/a"}, {"name": "b", "mount_point": "/a"})"),
         "scenario: ramdisks[1].mount_point: '/a' is the mount point of 'a' already"},
        {ramdisks(R"({"name": "a,b", "mount_point": "/a"})"),
         "scenario: ramdisks[0].name: expected 1 to 31 visible ASCII characters other than '/' and ','"},
        {ramdisks(R"({"name": "a", "mount_point": "/a/"})"),
         "scenario: ramdisks[0].mount_point: expected a normalised absolute path of at most 131 bytes"},
        {ramdisks(R"({"name": "a", "mount_point": "/)" + std::string(131, 'p') + R"("})"),
         "scenario: ramdisks[0].mount_point: expected a normalised absolute path of at most 131 bytes"},
        {ramdisks(R"({"name": "a", "mount_point": "/a", "reserved_mib": 3, "maximum_mib": 2})"),
         "scenario: ramdisks[0]: reserved_mib is above maximum_mib"},
        {ramdisks(R"({"name": "a", "mount_point": "/a", "permissions": "0955"})"),
         "scenario: ramdisks[0].permissions: expected an octal mode of one to four digits, e.g. \"0755\""},
        {ramdisks(R"({"name": "a", "mount_point": "/a", "maximum_inodes": 0})"),
         "scenario: ramdisks[0].maximum_inodes: expected an integer from 1 to 4294967295"},
        {ramdisks(R"({"mount_point": "/a"})"), "scenario: ramdisks[0]: missing member 'name'"},
        {R"({"format": 1, "tardisks": [{"name": "t", "size": 4294967296}]})",
         "scenario: tardisks[0].size: expected an integer from 0 to 4294967295"},
    };
    for (const Case& c : cases) EXPECT_EQ(RejectionOf(c.text), c.message) << c.text;
}

}  // namespace
