#include <simhost/Db.h>

#include <sqlite3.h>

#include <sys/stat.h>

#include <mutex>
#include <stdexcept>

namespace simhost {
namespace {

// SQLite is set up for what every user of this library is: a short-lived process that opens one
// small database, reads a few rows and exits. Memory statistics cost a mutex and bookkeeping on
// every allocation; lookaside and the page cache's initial bulk allocation are buffers that such
// a process never amortises. Must run before SQLite initialises itself; this library links
// SQLite privately, so nothing else in the process can have initialised it first.
void ConfigureLibrary() {
    static std::once_flag once;
    std::call_once(once, [] {
        sqlite3_config(SQLITE_CONFIG_MEMSTATUS, 0);
        sqlite3_config(SQLITE_CONFIG_LOOKASIDE, 0, 0);
        sqlite3_config(SQLITE_CONFIG_PAGECACHE, nullptr, 0, 0);
        sqlite3_initialize();
    });
}

// Keeps a handful of pages per connection: hosts are small and each process does little.
constexpr const char* kConnectionSettings = "PRAGMA cache_size=-256";

}  // namespace

Stmt::Stmt(Db& db, const std::string& sql) : db_(db) {
    if (sqlite3_prepare_v3(db.Handle(), sql.c_str(), static_cast<int>(sql.size()),
                           SQLITE_PREPARE_PERSISTENT, &stmt_, nullptr) != SQLITE_OK) {
        sqlite3_finalize(stmt_);
        stmt_ = nullptr;
        db.Fail("cannot read");
    }
}

Stmt::~Stmt() { sqlite3_finalize(stmt_); }

Stmt& Stmt::Bind(int index, const std::string& value) {
    if (sqlite3_bind_text(stmt_, index, value.data(), static_cast<int>(value.size()),
                          SQLITE_TRANSIENT) != SQLITE_OK)
        db_.Fail("cannot bind a value");
    return *this;
}

Stmt& Stmt::Bind(int index, std::int64_t value) {
    if (sqlite3_bind_int64(stmt_, index, value) != SQLITE_OK) db_.Fail("cannot bind a value");
    return *this;
}

Stmt& Stmt::BindNull(int index) {
    if (sqlite3_bind_null(stmt_, index) != SQLITE_OK) db_.Fail("cannot bind a value");
    return *this;
}

bool Stmt::Step() {
    int rc = sqlite3_step(stmt_);
    if (rc == SQLITE_ROW) return true;
    if (rc == SQLITE_DONE) return false;
    sqlite3_reset(stmt_);
    db_.Fail(sqlite3_stmt_readonly(stmt_) ? "cannot read" : "cannot write");
}

void Stmt::Run() {
    while (Step()) {
    }
    Reset();
}

void Stmt::Reset() {
    sqlite3_reset(stmt_);
    sqlite3_clear_bindings(stmt_);
}

std::string Stmt::Text(int column) const {
    const unsigned char* text = sqlite3_column_text(stmt_, column);
    int size = sqlite3_column_bytes(stmt_, column);
    return text ? std::string(reinterpret_cast<const char*>(text), static_cast<size_t>(size))
                : std::string();
}

std::int64_t Stmt::Int(int column) const { return sqlite3_column_int64(stmt_, column); }

bool Stmt::IsNull(int column) const { return sqlite3_column_type(stmt_, column) == SQLITE_NULL; }

Db::Db(const std::string& path, Mode mode, bool no_follow, std::string shown_as)
    : path_(path), mode_(mode), no_follow_(no_follow),
      shown_as_(shown_as.empty() ? path : std::move(shown_as)) {
    ConfigureLibrary();
    Open();
}

Db::~Db() {
    cache_.clear();  // statements are finalized before their connection closes
    sqlite3_close_v2(db_);
    if (mode_ == Mode::ReadOnly) EmptyWal();
}

void Db::EmptyWal() const noexcept {
    struct stat info {};
    if (lstat((path_ + "-wal").c_str(), &info) != 0 || info.st_size == 0) return;
    // Best effort: another connection still reading, or a host this user cannot write, leaves
    // the WAL for a later writer to empty.
    sqlite3* db = nullptr;
    int flags = SQLITE_OPEN_READWRITE | SQLITE_OPEN_NOMUTEX | (no_follow_ ? SQLITE_OPEN_NOFOLLOW : 0);
    if (sqlite3_open_v2(path_.c_str(), &db, flags, nullptr) == SQLITE_OK) {
        int persist = 1;
        sqlite3_file_control(db, "main", SQLITE_FCNTL_PERSIST_WAL, &persist);
        sqlite3_exec(db, "PRAGMA journal_size_limit=0; PRAGMA wal_checkpoint(TRUNCATE)", nullptr,
                     nullptr, nullptr);
    }
    sqlite3_close_v2(db);
}

void Db::Open() {
    // A writer killed in the middle of a change leaves a hot journal, which only a read-write
    // connection can roll back: such a host is opened read-write, and its first read puts it
    // back to its last committed state.
    if (mode_ == Mode::ReadOnly && HasJournal()) mode_ = Mode::ReadWrite;
    int flags = SQLITE_OPEN_NOMUTEX | (no_follow_ ? SQLITE_OPEN_NOFOLLOW : 0);
    if (mode_ == Mode::ReadOnly)
        flags |= SQLITE_OPEN_READONLY;
    else
        flags |= SQLITE_OPEN_READWRITE | (mode_ == Mode::Create ? SQLITE_OPEN_CREATE : 0);
    int rc = sqlite3_open_v2(path_.c_str(), &db_, flags, nullptr);
    if (rc != SQLITE_OK) {
        std::string reason = db_ ? sqlite3_errmsg(db_) : sqlite3_errstr(rc);
        sqlite3_close_v2(db_);
        db_ = nullptr;
        throw HostError("'" + shown_as_ + "': " + reason);
    }
    sqlite3_extended_result_codes(db_, 1);
    // Writers queue for each other, and readers for a committing writer, instead of failing.
    sqlite3_busy_timeout(db_, 10000);
    // Hosts use a rollback journal: a process that only reads then takes one shared lock on the
    // file and opens nothing else. (Hosts made by earlier builds are in WAL mode; they keep it,
    // with their WAL file kept between processes but emptied by the last connection to close.)
    int persist = 1;
    sqlite3_file_control(db_, "main", SQLITE_FCNTL_PERSIST_WAL, &persist);
    try {
        Exec(kConnectionSettings, "cannot open");
        if (mode_ != Mode::ReadOnly) {
            // A WAL host loses nothing committed with NORMAL; a rollback journal keeps the
            // default, FULL, which syncs the journal before the file is changed.
            Query mode = Cached("PRAGMA journal_mode");
            if (mode->Step() && mode->Text(0) == "wal")
                Exec("PRAGMA synchronous=NORMAL;PRAGMA journal_size_limit=0", "cannot open");
        }
    } catch (...) {
        cache_.clear();
        sqlite3_close_v2(db_);
        db_ = nullptr;
        throw;
    }
}

bool Db::HasJournal() const {
    struct stat info {};
    return lstat((path_ + "-journal").c_str(), &info) == 0 && info.st_size > 0;
}

void Db::MakeWritable() {
    if (mode_ != Mode::ReadOnly) return;
    if (live_queries_ != 0 || !sqlite3_get_autocommit(db_))
        throw std::logic_error("a read-only host connection cannot be made writable while in use");
    cache_.clear();
    sqlite3_close_v2(db_);
    db_ = nullptr;
    mode_ = Mode::ReadWrite;
    Open();
}

void Db::Fail(const std::string& what) const {
    int code = db_ ? sqlite3_extended_errcode(db_) : SQLITE_NOMEM;
    std::string reason = db_ ? sqlite3_errmsg(db_) : sqlite3_errstr(SQLITE_NOMEM);
    int primary = code & 0xff;
    if (primary == SQLITE_CORRUPT || primary == SQLITE_NOTADB) Damaged(reason);
    throw HostError("'" + shown_as_ + "': " + what + ": " + reason);
}

void Db::Damaged(const std::string& reason) const {
    std::string line = reason;
    for (char& c : line)
        if (c == '\n' || c == '\r') c = ' ';
    throw HostDamaged("'" + shown_as_ + "' is damaged (" + line +
                      "); replace it with 'quarnhost init --force'");
}

void Db::Exec(const std::string& sql, const std::string& what) {
    char* error = nullptr;
    int rc = sqlite3_exec(db_, sql.c_str(), nullptr, nullptr, &error);
    sqlite3_free(error);  // the same text as sqlite3_errmsg, which Fail reports
    if (rc != SQLITE_OK) Fail(what);
}

Query Db::Cached(const std::string& sql) {
    auto it = cache_.find(sql);
    if (it == cache_.end()) it = cache_.emplace(sql, std::make_unique<Stmt>(*this, sql)).first;
    return Query(*it->second, live_queries_);
}

std::int64_t Db::QueryInt(const std::string& sql) {
    Query query = Cached(sql);
    return query->Step() ? query->Int(0) : 0;
}

std::int64_t Db::LastInsertRowid() const { return sqlite3_last_insert_rowid(db_); }

int Db::Changes() const { return sqlite3_changes(db_); }

void Db::BeginReading() {
    if (readers_ > 0) {
        ++readers_;
        return;
    }
    if (!sqlite3_get_autocommit(db_)) return;  // inside a transaction of another kind
    Cached("BEGIN")->Run();
    readers_ = 1;
}

void Db::EndReading() {
    if (readers_ == 0) return;
    if (--readers_ == 0) StopReading();
}

void Db::StopReading() {
    readers_ = 0;
    if (sqlite3_get_autocommit(db_)) return;
    // COMMIT only releases the snapshot: a failure of its own loses nothing.
    if (sqlite3_exec(db_, "COMMIT", nullptr, nullptr, nullptr) != SQLITE_OK)
        sqlite3_exec(db_, "ROLLBACK", nullptr, nullptr, nullptr);
}

WriteTxn::WriteTxn(Db& db) : db_(db) {
    if (db_.readers_ > 0) db_.StopReading();
    db_.MakeWritable();
    db_.Exec("BEGIN IMMEDIATE");
}

WriteTxn::~WriteTxn() {
    if (open_) sqlite3_exec(db_.Handle(), "ROLLBACK", nullptr, nullptr, nullptr);
}

void WriteTxn::Commit() {
    db_.Exec("COMMIT");
    open_ = false;
}

ReadTxn::ReadTxn(Db& db) : db_(db) {
    if (db_.readers_ > 0) db_.StopReading();
    db_.Exec("BEGIN", "cannot read");
}

ReadTxn::~ReadTxn() { sqlite3_exec(db_.Handle(), "COMMIT", nullptr, nullptr, nullptr); }

}  // namespace simhost
