#include <simhost/Records.h>

#include <simhost/Call.h>
#include <simhost/Mirafs.h>
#include <simhost/State.h>

#include <norlithctl/Records.h>

#include <algorithm>
#include <cstring>

namespace simhost {
namespace {

using NorlithCtl::Util::Records::Field;

// Copies text into its field, leaving at least the field's last byte zero.
void PutText(std::vector<unsigned char>& record, const Field& field, const std::string& text) {
    std::memcpy(record.data() + field.offset, text.data(), std::min(text.size(), field.width - 1));
}

std::vector<unsigned char> ReadProductVersion(Call& call, const std::vector<std::string>&) {
    return EncodeProductVersion(call.Read<identity::Identity>());
}

const SysinfoNode kNodes[] = {
    {NorlithCtl::Util::Records::ProductVersion::kNode, "product version",
     NorlithCtl::Util::Records::ProductVersion::kSize, ReadProductVersion, nullptr},
    // memory file system
    {NorlithCtl::Util::Records::MirafsStatus::kNode, "memory file system status",
     NorlithCtl::Util::Records::MirafsStatus::kSize, mirafs::ReadStatus, nullptr},
    {NorlithCtl::Util::Records::MirafsTardiskList::kNode, "tardisk list",
     NorlithCtl::Util::Records::MirafsTardiskList::kSize, mirafs::ReadTardiskCount, mirafs::ListTardisks},
    {NorlithCtl::Util::Records::MirafsTardisk::kNode, "tardisk",
     NorlithCtl::Util::Records::MirafsTardisk::kSize, mirafs::ReadTardisk, mirafs::ListTardisks},
    {NorlithCtl::Util::Records::MirafsRamdiskList::kNode, "ramdisk list",
     NorlithCtl::Util::Records::MirafsRamdiskList::kSize, mirafs::ReadRamdiskCount, mirafs::ListRamdisks},
    {NorlithCtl::Util::Records::MirafsRamdisk::kNode, "ramdisk",
     NorlithCtl::Util::Records::MirafsRamdisk::kSize, mirafs::ReadRamdisk, mirafs::ListRamdisks},
};

}  // namespace

const SysinfoNode* FindSysinfoNode(int id) {
    for (const SysinfoNode& node : kNodes)
        if (node.id == id) return &node;
    return nullptr;
}

std::vector<unsigned char> EncodeProductVersion(const identity::Identity& identity) {
    using Layout = NorlithCtl::Util::Records::ProductVersion;
    std::vector<unsigned char> record(Layout::kSize, 0);
    PutText(record, Layout::kProduct, identity.product);
    PutText(record, Layout::kVersion, identity.version);
    PutText(record, Layout::kBuild, identity.build);
    PutText(record, Layout::kUpdate, identity.update);
    return record;
}

}  // namespace simhost
