// Faults: a host operation set to fail with a given message, always or a number of times.
//
// Faults live in the host's database so that they hold across processes; a counted fault is
// consumed inside a write transaction, so with N remaining and many concurrent callers exactly N
// calls fail. Call (Call.h) checks and consumes them; these functions store and list them.
// Operation names are checked against the registry in Operations.h.
#pragma once

#include <simhost/Export.h>

#include <cstddef>
#include <cstdint>
#include <optional>
#include <string>
#include <vector>

namespace simhost {

class Db;

struct Fault {
    std::string operation;                  // fully qualified, e.g. "NorlithCtl::...::GetSystemUuid"
    std::string message;                    // the RavelException text the operation raises
    std::optional<std::int64_t> remaining;  // calls left to fail; empty: every call fails

    bool operator==(const Fault& other) const {
        return operation == other.operation && message == other.message &&
               remaining == other.remaining;
    }
};

constexpr std::int64_t kMaxFaultTimes = 1000000000;
constexpr std::size_t kMaxFaultMessage = 4096;

// "" when the fault can be set, else the reason (unknown operation with its nearest known names,
// message too long or not UTF-8, count out of range).
SIMHOST_API std::string CheckFault(const Fault& fault);

// Store access; the caller provides the transaction.
SIMHOST_API void StoreFault(Db& db, const Fault& fault);  // replaces any fault on the same operation
SIMHOST_API std::vector<Fault> ReadFaults(Db& db);         // sorted by operation
SIMHOST_API void DeleteFaults(Db& db);
// Removes the fault on operation; false when none was set.
SIMHOST_API bool DeleteFault(Db& db, const std::string& operation);

}  // namespace simhost
