#include <simhost/Records.h>

#include <simhost/domains/Identity.h>

namespace simhost {
namespace {

std::vector<unsigned char> ReadProductVersion(Db& db, const std::vector<std::string>&) {
    auto record = identity::EncodeProductVersion(identity::Read(db));
    return {record.begin(), record.end()};
}

const SysinfoNode kNodes[] = {
    {identity::kProductVersionNode, "product version", identity::kProductVersionSize,
     ReadProductVersion, nullptr},
};

}  // namespace

const SysinfoNode* FindSysinfoNode(int id) {
    for (const SysinfoNode& node : kNodes)
        if (node.id == id) return &node;
    return nullptr;
}

std::vector<std::string> SysinfoOperationNames() {
    const std::string prefix = "NorlithCtl::Util::Sysinfo::";
    return {prefix + "Sysinfo", prefix + "Get", prefix + "List", prefix + "AddInstancePath",
            prefix + "ResetInstance"};
}

}  // namespace simhost
