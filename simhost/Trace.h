// The call trace, for in-process tests: when enabled, every host operation invoked through the
// host-control and event libraries (reads and constructors included, also those that fail) is
// appended in order to a process-wide in-memory list. Thread-safe. Disabled by default; when
// disabled a call costs one atomic load.
#pragma once

#include <simhost/Export.h>

#include <string>
#include <vector>

namespace simhost {

struct TraceEntry {
    std::string operation;  // fully qualified name
    std::string arguments;  // compact JSON object, "" unless arguments are traced
};

namespace trace {

// Starts tracing (clearing anything recorded before); with_arguments also records arguments.
SIMHOST_API void Enable(bool with_arguments = false);
// Stops tracing; what was recorded stays until Take().
SIMHOST_API void Disable();
SIMHOST_API bool Enabled();
// Returns what was recorded and empties the list.
SIMHOST_API std::vector<TraceEntry> Take();
// Only the operation names of Take().
SIMHOST_API std::vector<std::string> TakeOperations();

// Appends one call; used by Call.
SIMHOST_API void Record(const std::string& operation, const std::string& arguments_json);
SIMHOST_API bool WithArguments();

}  // namespace trace
}  // namespace simhost
