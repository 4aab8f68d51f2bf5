// The boundary between the host-control library's API and the simulated host: runs one
// operation's body and turns the host's errors (simhost::HostError, faults included) into
// Ravel::Lib::RavelException with the same text. Internal to the libraries.
#pragma once

#include <norlithctl/RavelException.h>

#include <simhost/Call.h>
#include <simhost/Error.h>

namespace norlithctl {

template <class Body>
auto HostCall(Body&& body) -> decltype(body()) {
    try {
        return body();
    } catch (const simhost::HostError& error) {
        throw Ravel::Lib::RavelException(error.what());
    }
}

}  // namespace norlithctl
