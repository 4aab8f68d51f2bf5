// The simulated host's administration API: create a host in a directory, export it, set and
// list faults, read and clear the journal. quarnhost is built on it, and tests use it (with
// TempHost and the call trace of Trace.h) to run code against a fresh host.
//
// A Host names a state directory; each method opens that host through the process-wide
// connection (creating it from the default scenario on first use, except Init) and works in
// its own transaction. Everything throws HostError with a one-line message; Init's has code
// kScenario for a bad scenario and kExists when a host is there and replace is false; a damaged
// database gives code kDamaged (Check finds damage anywhere in the file, the others only where
// they read).
#pragma once

#include <simhost/Export.h>

#include <simhost/Error.h>
#include <simhost/Faults.h>
#include <simhost/Journal.h>
#include <simhost/Operations.h>
#include <simhost/Trace.h>
#include <simhost/domains/Logs.h>

#include <cstdint>
#include <optional>
#include <string>
#include <vector>

namespace simhost {

// The default scenario, embedded in the library at build time.
SIMHOST_API const std::string& DefaultScenario();

class SIMHOST_API Host {
public:
    explicit Host(std::string dir) : dir_(std::move(dir)) {}
    // The host the libraries use: QUARN_HOST_STATE or the default location.
    static Host FromEnvironment();

    const std::string& Dir() const { return dir_; }
    // DIR/root: the host's own file system.
    std::string Root() const;
    bool Exists() const;

    // Creates the host from a scenario (validated first; nothing changes when it is refused).
    // With replace, an existing host's whole state (faults and journal included) is replaced.
    void Init(const std::string& scenario_text = DefaultScenario(), bool replace = false);
    // Verifies the whole database file; throws HostDamaged when any part of it is damaged.
    void Check();
    // The host's whole state as scenario text (faults included).
    std::string Export();

    // Sets a fault; times empty: every call fails; else the next `times` calls fail.
    // Replaces a fault already set on the operation.
    // With an event, the operation's exception carries that event record too.
    void AddFault(const std::string& operation, const std::string& message,
                  std::optional<std::int64_t> times = std::nullopt, Event event = {});
    std::vector<Fault> Faults();
    void ClearFaults();
    // Removes the fault set on operation; throws HostError when operation is unknown or has no
    // fault.
    void ClearFault(const std::string& operation);

    // The journal, oldest first; with last, only the last `last` entries.
    std::vector<JournalEntry> Journal(std::optional<std::int64_t> last = std::nullopt);
    void ClearJournal();

    // The host's system log and observation log, oldest first; with last, only the last
    // `last` entries.
    std::vector<syslog::Entry> SystemLog(std::optional<std::int64_t> last = std::nullopt);
    std::vector<observations::Entry> ObservationLog(std::optional<std::int64_t> last = std::nullopt);

private:
    std::string dir_;
};

// A fresh host in a new temporary directory for one test: QUARN_HOST_STATE points at it while
// the TempHost lives and is restored afterwards, when the directory is removed too.
class SIMHOST_API TempHost {
public:
    explicit TempHost(const std::string& scenario_text = DefaultScenario());
    ~TempHost();
    TempHost(const TempHost&) = delete;
    TempHost& operator=(const TempHost&) = delete;

    Host& host() { return host_; }
    const std::string& Dir() const { return host_.Dir(); }

private:
    std::string base_;  // the temporary directory; the host is base_/host
    std::optional<std::string> saved_env_;
    Host host_;
};

}  // namespace simhost
