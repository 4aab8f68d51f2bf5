// The journal: every change made to the host and every fault raised, in order, with the time,
// the operation and its arguments as compact JSON (secret arguments appear as "***").
//
// Entries are appended inside the transaction of the change they record, so a change and its
// entry commit or vanish together. Reads are not journaled (see Trace.h for the call trace).
#pragma once

#include <simhost/Export.h>

#include <cstdint>
#include <optional>
#include <string>
#include <vector>

namespace simhost {

class Db;

struct JournalEntry {
    std::int64_t sequence = 0;  // increasing, never reused
    std::string time;           // UTC, "YYYY-MM-DDTHH:MM:SS.mmmZ"
    std::string kind;           // "change" or "fault"
    std::string operation;      // fully qualified operation name
    std::string arguments;      // compact JSON object
};

SIMHOST_API void AppendJournal(Db& db, const std::string& kind, const std::string& operation,
                   const std::string& arguments);
// The whole journal, oldest first; with last, only its last `last` entries (still oldest first).
SIMHOST_API std::vector<JournalEntry> ReadJournal(Db& db,
                                                  std::optional<std::int64_t> last = std::nullopt);
SIMHOST_API void DeleteJournal(Db& db);

}  // namespace simhost
