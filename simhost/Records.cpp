#include <simhost/Records.h>

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

std::vector<unsigned char> ReadProductVersion(Db& db, const std::vector<std::string>&) {
    return EncodeProductVersion(Load<identity::Identity>(db));
}

const SysinfoNode kNodes[] = {
    {NorlithCtl::Util::Records::ProductVersion::kNode, "product version",
     NorlithCtl::Util::Records::ProductVersion::kSize, ReadProductVersion, nullptr},
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
