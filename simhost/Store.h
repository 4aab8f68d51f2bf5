// The host store: where a host lives, how it is created, opened and replaced, and the one
// process-wide connection the libraries share.
//
// A host is a directory (created private to its owner): host.db (SQLite, WAL, our application
// id and schema version) and root/ (the host's own files). host.db, host.lock and root/ must not
// be symbolic links; a host.db that is not ours is refused before SQLite sees it, so nothing is
// ever written to a foreign file. Creation and replacement happen while DIR/host.lock is held:
// everything that can fail is prepared first (the database under a temporary name or in an
// open transaction, the next root/ as DIR/root.new), then root/ and the database are switched
// together, so a failure leaves the previous host as it was. Replacement of a sound host
// happens in one write transaction on the existing database, so other processes' connections
// stay valid and see the old host or the new one; a damaged one is rebuilt and renamed over.
//
// Session grants exclusive use of the process-wide connection (a recursive mutex is held for
// the Session's lifetime). The connection is opened lazily, read-only, for the directory asked
// for (it becomes read-write on its first write transaction) and reopened when another
// directory is asked for, or after a fork. Creating a host on first use says so on standard
// error. Everything here throws HostError; opening failures read "Cannot open the simulated
// host at 'DIR': REASON", a damaged database is HostDamaged.
#pragma once

#include <simhost/Export.h>

#include <simhost/Db.h>
#include <simhost/Scenario.h>

#include <cstdint>
#include <mutex>
#include <string>

namespace simhost {

// The state directory: QUARN_HOST_STATE, else $XDG_STATE_HOME/quarncli/host (when absolute),
// else $HOME/.local/state/quarncli/host.
SIMHOST_API std::string StateDirFromEnvironment();

SIMHOST_API std::string DatabasePath(const std::string& dir);
SIMHOST_API std::string RootPath(const std::string& dir);

// The schema version stored in every host database; derived from the DDL of the core tables and
// of every domain, so any schema change makes older databases recognisably different.
// DerivedSchemaVersion() always derives it (once per process); SchemaVersion() is the version a
// program gave with UseSchemaVersion(), which a short-lived program does with the value derived
// when it was built (cli/CMakeLists.txt), and otherwise the derived one.
SIMHOST_API std::int32_t SchemaVersion();
SIMHOST_API std::int32_t DerivedSchemaVersion();
SIMHOST_API void UseSchemaVersion(std::int32_t version);

enum class InitMode {
    OpenOrCreate,  // create from the scenario unless a host exists (first use)
    CreateOnly,    // create; throw HostExists when a host exists
    Replace,       // create, or replace an existing host's whole state
};

// Creates or replaces the host in dir from a validated scenario. Returns true when it created
// or replaced the host, false when OpenOrCreate found one.
SIMHOST_API bool InitHost(const std::string& dir, const Scenario& scenario, InitMode mode);

// Verifies the whole database file (SQLite's quick check); throws HostDamaged when it is damaged.
// Costs a read of every page, so it is for administration, not for every operation.
SIMHOST_API void CheckIntegrity(Db& db);

class SIMHOST_API Session {
public:
    // The connection to the host in dir, created from the default scenario on first use.
    static Session Open(const std::string& dir);
    // The same for StateDirFromEnvironment().
    static Session OpenCurrent();

    Db& db() { return *db_; }
    const std::string& dir() const { return *dir_; }

private:
    Session(std::unique_lock<std::recursive_mutex> lock, Db* db, const std::string* dir)
        : lock_(std::move(lock)), db_(db), dir_(dir) {}

    std::unique_lock<std::recursive_mutex> lock_;
    Db* db_;
    const std::string* dir_;
};

// Closes the process-wide connection (if any); the next Session opens again.
SIMHOST_API void CloseHost();

}  // namespace simhost
