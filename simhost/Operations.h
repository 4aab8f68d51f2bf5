// The registry of host operations: every fully qualified operation name the host-control and
// event libraries serve, constructors included. Faults can be set only on these names.
//
// The names come from the core list (constructors and the kernel information reader) and from
// each domain's OperationNames(). The returned containers are owned by the library.
#pragma once

#include <simhost/Export.h>

#include <cstddef>
#include <string>
#include <vector>

namespace simhost {

SIMHOST_API const std::vector<std::string>& KnownOperations();  // sorted, unique
SIMHOST_API bool IsKnownOperation(const std::string& name);
// The known names closest to name (edit distance, then order), at most count of them.
SIMHOST_API std::vector<std::string> NearestOperations(const std::string& name, std::size_t count = 3);

}  // namespace simhost
