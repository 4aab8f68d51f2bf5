// A thin RAII layer over one SQLite connection: the connection, prepared statements (cached by
// their SQL text for the connection's lifetime) and transactions.
//
// Db owns its sqlite3 handle and every statement it prepared; a Query returned by Cached() must
// not outlive the Db. A connection may be opened read-only for work that only reads: the first
// WriteTxn on it reopens it read-write (every cached statement is finalised then, so no Query
// and no transaction may be alive at that moment; doing so is a programming error and throws
// std::logic_error). WriteTxn starts with BEGIN IMMEDIATE so that writers queue on the busy
// timeout instead of failing on a lock upgrade; a transaction that is not committed is rolled
// back by its destructor.
//
// Every SQLite failure is thrown as HostError naming the database file, never the SQL text; a
// damaged file (SQLite reports corruption or "not a database") is thrown as HostDamaged.
// The SQLite library is configured for a short-lived process before its first use (see Db.cpp).
#pragma once

#include <simhost/Export.h>

#include <simhost/Error.h>

#include <cstdint>
#include <memory>
#include <optional>
#include <string>
#include <unordered_map>

struct sqlite3;
struct sqlite3_stmt;

namespace simhost {

class Db;

class SIMHOST_API Stmt {
public:
    Stmt(Db& db, const std::string& sql);
    ~Stmt();
    Stmt(const Stmt&) = delete;
    Stmt& operator=(const Stmt&) = delete;

    // Bind parameters by 1-based index. Returns *this for chaining.
    Stmt& Bind(int index, const std::string& value);
    Stmt& Bind(int index, std::int64_t value);
    Stmt& BindNull(int index);
    // Steps once: true while a row is available, false when done.
    bool Step();
    // Steps to completion (for statements without rows) and resets.
    void Run();
    // Clears bindings and rewinds; done automatically by Run and by the Db between uses.
    void Reset();

    std::string Text(int column) const;
    std::int64_t Int(int column) const;
    bool IsNull(int column) const;

private:
    Db& db_;
    sqlite3_stmt* stmt_ = nullptr;
};

// A cached statement in use: bound and stepped through ->, reset when it goes out of scope so
// that no statement keeps a read snapshot open after its caller is done with it.
class SIMHOST_API Query {
public:
    Query(Stmt& stmt, int& live) : stmt_(stmt), live_(live) { ++live_; }
    ~Query() {
        stmt_.Reset();
        --live_;
    }
    Query(const Query&) = delete;
    Query& operator=(const Query&) = delete;
    Stmt* operator->() const { return &stmt_; }

private:
    Stmt& stmt_;
    int& live_;
};

class SIMHOST_API Db {
public:
    enum class Mode {
        ReadOnly,   // an existing file, read-only until the first WriteTxn
        ReadWrite,  // an existing file
        Create,     // read-write, creating the file when missing
    };

    // Opens the database file at path. With no_follow, the open is refused when path or any of
    // its components is a symbolic link (give it a resolved path), and so are the journal, -wal
    // and -shm files. shown_as is the name used in messages (default: path).
    Db(const std::string& path, Mode mode, bool no_follow = false, std::string shown_as = {});
    ~Db();
    Db(const Db&) = delete;
    Db& operator=(const Db&) = delete;

    // Runs one or more statements without results; a failure says `what` failed.
    void Exec(const std::string& sql, const std::string& what = "cannot write");
    // The prepared statement for this SQL (prepared once per connection), ready for binding.
    Query Cached(const std::string& sql);
    // One integer read by a query returning a single row and column (e.g. a pragma).
    std::int64_t QueryInt(const std::string& sql);
    std::int64_t LastInsertRowid() const;
    // Rows changed by the last completed statement.
    int Changes() const;

    // Host calls read in a shared read transaction: BeginReading opens it (when no transaction
    // is open; calls nest), EndReading closes it when the outermost call ends. A WriteTxn (or a
    // ReadTxn of its own) ends it first, whichever call opened it: a call's snapshot lasts until
    // its first change.
    void BeginReading();
    void EndReading();

    bool ReadOnly() const { return mode_ == Mode::ReadOnly; }
    // Reopens a read-only connection read-write (nothing to do otherwise). Throws
    // std::logic_error when a Query or a transaction is alive.
    void MakeWritable();

    sqlite3* Handle() const { return db_; }
    const std::string& Path() const { return shown_as_; }

    // Throws the HostError (or HostDamaged) for the connection's last error; `what` says what
    // failed, e.g. "cannot read".
    [[noreturn]] void Fail(const std::string& what) const;
    // Throws HostDamaged for this file, with the reason (one line).
    [[noreturn]] void Damaged(const std::string& reason) const;

private:
    void Open();
    // Whether a journal with content lies beside the file (a change in progress, or one a
    // killed writer left to roll back).
    bool HasJournal() const;

    sqlite3* db_ = nullptr;
    std::string path_;
    Mode mode_;
    bool no_follow_;
    std::string shown_as_;
    int live_queries_ = 0;
    int readers_ = 0;  // calls inside the shared read transaction; 0 when none is open
    // Ends the shared read transaction, if one is open (nothing in it can be lost).
    void StopReading();
    // A writer that closed while this read-only connection was open (a tool the command ran,
    // say) could not empty the WAL, and every later process would read it again when it first
    // opens the host: the last connection to close empties it.
    void EmptyWal() const noexcept;
    friend class WriteTxn;
    friend class ReadTxn;
    std::unordered_map<std::string, std::unique_ptr<Stmt>> cache_;
};

// BEGIN IMMEDIATE ... COMMIT; rolled back on destruction unless committed. A read-only
// connection is made writable first.
class SIMHOST_API WriteTxn {
public:
    explicit WriteTxn(Db& db);
    ~WriteTxn();
    WriteTxn(const WriteTxn&) = delete;
    WriteTxn& operator=(const WriteTxn&) = delete;
    void Commit();

private:
    Db& db_;
    bool open_ = true;
};

// A deferred read transaction, so that several reads see one snapshot.
class SIMHOST_API ReadTxn {
public:
    explicit ReadTxn(Db& db);
    ~ReadTxn();
    ReadTxn(const ReadTxn&) = delete;
    ReadTxn& operator=(const ReadTxn&) = delete;

private:
    Db& db_;
};

}  // namespace simhost
