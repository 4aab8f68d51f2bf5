// A thin RAII layer over one SQLite connection: the connection, prepared statements (cached by
// their SQL text for the connection's lifetime) and transactions.
//
// Db owns its sqlite3 handle and every statement it prepared; a Stmt reference returned by
// Cached() stays valid while the Db lives. WriteTxn starts with BEGIN IMMEDIATE so that writers
// queue on the busy timeout instead of failing on a lock upgrade; a transaction that is not
// committed is rolled back by its destructor. Every SQLite failure is thrown as HostError.
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

class SIMHOST_API Stmt {
public:
    Stmt(sqlite3* db, const std::string& sql);
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
    sqlite3* db_;
    sqlite3_stmt* stmt_ = nullptr;
};

// A cached statement in use: bound and stepped through ->, reset when it goes out of scope so
// that no statement keeps a read snapshot open after its caller is done with it.
class SIMHOST_API Query {
public:
    explicit Query(Stmt& stmt) : stmt_(stmt) {}
    ~Query() { stmt_.Reset(); }
    Query(const Query&) = delete;
    Query& operator=(const Query&) = delete;
    Stmt* operator->() const { return &stmt_; }

private:
    Stmt& stmt_;
};

class SIMHOST_API Db {
public:
    // Opens an existing database file read-write. Never creates one.
    explicit Db(const std::string& path, bool create = false);
    ~Db();
    Db(const Db&) = delete;
    Db& operator=(const Db&) = delete;

    // Runs one or more statements without results.
    void Exec(const std::string& sql);
    // The prepared statement for this SQL (prepared once per connection), ready for binding.
    Query Cached(const std::string& sql);
    // One integer read by a query returning a single row and column (e.g. a pragma).
    std::int64_t QueryInt(const std::string& sql);
    std::int64_t LastInsertRowid() const;
    // Rows changed by the last INSERT, UPDATE or DELETE.
    std::int64_t Changes() const;

    sqlite3* Handle() const { return db_; }
    const std::string& Path() const { return path_; }

private:
    sqlite3* db_ = nullptr;
    std::string path_;
    std::unordered_map<std::string, std::unique_ptr<Stmt>> cache_;
};

// BEGIN IMMEDIATE ... COMMIT; rolled back on destruction unless committed.
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
