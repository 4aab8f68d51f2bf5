// The boundary between the host-control library's API and the simulated host: runs one
// operation's body and turns the host's one error type (simhost::HostError, faults included)
// into Ravel::Lib::RavelException with the same text and, when the error carries an event
// record, the same record as its QuillMessage. Internal to the libraries.
#pragma once

#include <norlithctl/RavelException.h>

#include <simhost/Call.h>
#include <simhost/Error.h>

namespace norlithctl {

inline Ravel::Lib::RavelException ToRavel(const simhost::HostError& error) {
    const simhost::Event& event = error.event();
    if (event.Empty()) return Ravel::Lib::RavelException(error.what());
    return Ravel::Lib::RavelException(error.what(), Ravel::Lib::QuillMessage(event.id, event.args));
}

template <class Body>
auto HostCall(Body&& body) -> decltype(body()) {
    try {
        return body();
    } catch (const simhost::HostError& error) {
        throw ToRavel(error);
    }
}

}  // namespace norlithctl
