// Counting the host-control objects alive in a process, so that tests can check that code using
// the library released everything it received.
#pragma once

#include <norlithctl/Export.h>

namespace NorlithCtl {

// A member of every host-control object the library hands out (system-information and
// kernel-information objects, every Ravel::Lib::RavelObject, ...), counting it while it lives.
class NORLITHCTL_API LiveObject {
public:
    LiveObject();
    LiveObject(const LiveObject&);
    ~LiveObject();
    LiveObject& operator=(const LiveObject&) { return *this; }
};

namespace Testing {

// How many host-control objects exist right now in this process. A command that released
// everything it received leaves the count where it found it.
NORLITHCTL_API long LiveObjects();

}  // namespace Testing
}  // namespace NorlithCtl
