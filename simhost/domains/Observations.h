// The observation log domain: the host's event log, where the event library
// (QuillUserLib_AddQuill) posts one entry per call.
//
// Scenario section "observations" (optional, default []): an array of
// {"time": "YYYY-MM-DDTHH:MM:SS.mmmZ", "message": text of 1..4096 bytes}, oldest first.
#pragma once

#include <simhost/Export.h>

#include <simhost/Domain.h>

#include <string>
#include <vector>

namespace simhost {

class Call;

namespace observations {

constexpr std::size_t kMessageMax = 4096;

struct Entry {
    std::string time;
    std::string message;
};

// Appends an entry stamped with the host's current time; journaled. Throws HostError for a
// message the log refuses (empty, too long, NUL, not UTF-8).
SIMHOST_API void Post(Call& call, const std::string& message);

SIMHOST_API std::vector<Entry> Read(Db& db);

SIMHOST_API const Domain& TheDomain();

}  // namespace observations
}  // namespace simhost
