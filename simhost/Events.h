// The event catalog: the events a structured event record (simhost::Event, handed on as a
// Ravel::Lib::QuillMessage) may name, each with the text its arguments fill in. Declared in
// Registry.def. Pure functions; nothing throws but std::bad_alloc.
#pragma once

#include <simhost/Error.h>
#include <simhost/Export.h>

#include <string>
#include <vector>

namespace simhost {

struct EventInfo {
    const char* id;    // e.g. "quill.host.operation.failed"
    const char* text;  // with {0}, {1}, ... for the arguments
};

SIMHOST_API const std::vector<EventInfo>& EventCatalog();

// "" when the event names a catalog entry and carries exactly the arguments its text uses, else
// the reason.
SIMHOST_API std::string CheckEvent(const Event& event);

// The event's text with its arguments filled in. An id the catalog lacks gives "id(arg, ...)".
SIMHOST_API std::string FormatEvent(const Event& event);

}  // namespace simhost
