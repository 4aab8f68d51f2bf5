// Errors raised by the simulated host.
//
// HostError is what every host operation throws: a host that cannot be opened, a database error,
// a value a rule refuses, or a fault set on the operation. Its text is the complete message a
// user sees; the host-control library turns it into Ravel::Lib::RavelException at its boundary.
// ScenarioError is a HostError raised while a scenario is parsed or validated; its text starts
// with "scenario: " and the JSON location of the first problem. HostExists refuses to create a
// host over an existing one. HostDamaged says that a host's database file is damaged (truncated,
// pages overwritten): the file is ours, but its contents cannot be trusted.
#pragma once

#include <simhost/Export.h>

#include <stdexcept>
#include <string>

namespace simhost {

class SIMHOST_API HostError : public std::runtime_error {
public:
    explicit HostError(const std::string& message) : std::runtime_error(message) {}
};

class SIMHOST_API ScenarioError : public HostError {
public:
    explicit ScenarioError(const std::string& message) : HostError(message) {}
};

// Raised when a host is to be created where one already exists.
class SIMHOST_API HostExists : public HostError {
public:
    explicit HostExists(const std::string& message) : HostError(message) {}
};

// Raised when a host's database file is damaged.
class SIMHOST_API HostDamaged : public HostError {
public:
    explicit HostDamaged(const std::string& message) : HostError(message) {}
};

}  // namespace simhost
