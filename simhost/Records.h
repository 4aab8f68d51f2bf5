// The kernel information nodes the simulated host serves (NorlithCtl::Util::Sysinfo) and their
// fixed-size binary records.
//
// Each node names its record size, whether it has instances, and how its record is produced:
// read the owning domain's state, then encode it with a pure encoder (state in, bytes out) that
// follows the node's layout in <norlithctl/Records.h>, so encoders can be tested and fuzzed
// without a host. A node with instances also lists them. Adding a node is one entry in the table
// in Records.cpp.
#pragma once

#include <simhost/Export.h>

#include <simhost/domains/Identity.h>

#include <cstddef>
#include <string>
#include <vector>

namespace simhost {

class Call;

struct SysinfoNode {
    int id;
    const char* name;
    std::size_t record_size;
    // The record for an instance path (empty for nodes without instances), record_size bytes,
    // read inside the call of the operation (its database and the host's root/). Throws
    // HostError for an instance that does not exist.
    std::vector<unsigned char> (*read)(Call& call, const std::vector<std::string>& instance_path);
    // The instance names; nullptr for a node without instances.
    std::vector<std::string> (*list)(Call& call);
};

// The node with this identifier, or nullptr.
SIMHOST_API const SysinfoNode* FindSysinfoNode(int id);

// Node 1238 of an identity. The texts must be within the identity's limits (which leave room
// for each field's terminating NUL).
SIMHOST_API std::vector<unsigned char> EncodeProductVersion(const identity::Identity& identity);

}  // namespace simhost
