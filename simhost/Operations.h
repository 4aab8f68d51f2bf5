// The registry of host operations: every operation the host-control and event libraries serve,
// constructors and the operating-system binding included, declared once in Registry.def.
// Faults can be set only on these names; the journal and the call trace record them.
//
// Everything returned points into static tables owned by the library.
#pragma once

#include <simhost/Export.h>

#include <cstddef>
#include <cstdint>
#include <optional>
#include <string>
#include <vector>

namespace simhost {

enum class Op : std::uint16_t {
#define OPERATION(Id, name, doc) Id,
#include <simhost/Registry.def>
};

struct OperationInfo {
    Op op;
    const char* name;  // fully qualified, e.g. "NorlithCtl::System::SystemInfoImpl::GetSystemUuid"
    const char* doc;   // what the operation does, for the operation list
};

// Every operation, in the order of Registry.def.
SIMHOST_API const std::vector<OperationInfo>& Operations();
SIMHOST_API const char* OperationName(Op op);
// The operation of that qualified name, if any.
SIMHOST_API std::optional<Op> FindOperation(const std::string& name);

SIMHOST_API const std::vector<std::string>& KnownOperations();  // sorted, unique
SIMHOST_API bool IsKnownOperation(const std::string& name);
// The known names closest to name (a name given without its namespaces finds its qualified
// form), at most count of them.
SIMHOST_API std::vector<std::string> NearestOperations(const std::string& name, std::size_t count = 3);
// "unknown operation 'NAME' (nearest: A, B, C)", for refusals.
SIMHOST_API std::string UnknownOperationText(const std::string& name);

// The operation list and the event catalog as Markdown: one section per class, one row per
// operation, then the events. quarnhost prints it and docs/operations.md is this text.
SIMHOST_API std::string OperationsMarkdown();

}  // namespace simhost
