// The one error type of the simulated host.
//
// HostError is what every part of the host throws: a host that cannot be opened or is damaged, a
// scenario that is refused, a value a rule refuses, or a fault set on an operation. Its text is
// the complete one-line message a user sees; its code tells callers what kind of failure it is,
// and its event, when not empty, is the structured event record a fault or a rule attached (the
// host-control library hands it on as the exception's Ravel::Lib::QuillMessage). The libraries
// turn it into Ravel::Lib::RavelException in one place (norlithctl/HostCall.h).
#pragma once

#include <simhost/Export.h>

#include <stdexcept>
#include <string>
#include <vector>

namespace simhost {

// A structured event record: an identifier of the event catalog (Events.h) and its arguments.
struct Event {
    std::string id;
    std::vector<std::string> args;

    bool Empty() const { return id.empty() && args.empty(); }
    bool operator==(const Event& other) const { return id == other.id && args == other.args; }
};

class SIMHOST_API HostError : public std::runtime_error {
public:
    enum class Code {
        kFailed,    // an operation or a rule refused (faults included)
        kScenario,  // a scenario was refused; the text starts with "scenario: " and a location
        kExists,    // a host was to be created where one exists
        kDamaged,   // the state directory holds something that is not a usable host
    };

    explicit HostError(const std::string& message, Code code = Code::kFailed, Event event = {})
        : std::runtime_error(message), code_(code), event_(std::move(event)) {}

    Code code() const { return code_; }
    const Event& event() const { return event_; }

private:
    Code code_;
    Event event_;
};

// Helpers for the special kinds, so call sites read as what they mean.
inline HostError ScenarioError(const std::string& message) {
    return HostError(message, HostError::Code::kScenario);
}
inline HostError HostExists(const std::string& message) {
    return HostError(message, HostError::Code::kExists);
}

inline HostError HostDamaged(const std::string& message) {
    return HostError(message, HostError::Code::kDamaged);
}

}  // namespace simhost
