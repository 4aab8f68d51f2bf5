// The kernel information nodes the simulated host serves (NorlithCtl::Util::Sysinfo) and their
// fixed-size binary records.
//
// Each node names its record size, whether it has instances, and how its record is produced:
// read the owning domain's state, then encode it with that domain's pure encoder (state in, bytes
// out), so encoders can be tested and fuzzed without a host. A node with instances also lists
// them. Adding a node is one entry in the table in Records.cpp.
#pragma once

#include <simhost/Export.h>

#include <cstddef>
#include <string>
#include <vector>

namespace simhost {

class Db;

struct SysinfoNode {
    int id;
    const char* name;
    std::size_t record_size;
    // The record for an instance path (empty for nodes without instances), record_size bytes.
    // Throws HostError for an instance that does not exist.
    std::vector<unsigned char> (*read)(Db& db, const std::vector<std::string>& instance_path);
    // The instance names; nullptr for a node without instances.
    std::vector<std::string> (*list)(Db& db);
};

// The node with this identifier, or nullptr.
SIMHOST_API const SysinfoNode* FindSysinfoNode(int id);

// Operation names of the kernel information reader, for the operation registry.
SIMHOST_API std::vector<std::string> SysinfoOperationNames();

}  // namespace simhost
