#include <simhost/Db.h>

#include <sqlite3.h>

namespace simhost {
namespace {

[[noreturn]] void Fail(sqlite3* db, const std::string& what) {
    std::string reason = db ? sqlite3_errmsg(db) : "out of memory";
    throw HostError("simulated host database: " + what + ": " + reason);
}

}  // namespace

Stmt::Stmt(sqlite3* db, const std::string& sql) : db_(db) {
    if (sqlite3_prepare_v3(db, sql.c_str(), static_cast<int>(sql.size()), SQLITE_PREPARE_PERSISTENT,
                           &stmt_, nullptr) != SQLITE_OK) {
        sqlite3_finalize(stmt_);
        stmt_ = nullptr;
        Fail(db, "cannot prepare '" + sql + "'");
    }
}

Stmt::~Stmt() { sqlite3_finalize(stmt_); }

Stmt& Stmt::Bind(int index, const std::string& value) {
    if (sqlite3_bind_text(stmt_, index, value.data(), static_cast<int>(value.size()),
                          SQLITE_TRANSIENT) != SQLITE_OK)
        Fail(db_, "cannot bind a value");
    return *this;
}

Stmt& Stmt::Bind(int index, std::int64_t value) {
    if (sqlite3_bind_int64(stmt_, index, value) != SQLITE_OK) Fail(db_, "cannot bind a value");
    return *this;
}

Stmt& Stmt::BindNull(int index) {
    if (sqlite3_bind_null(stmt_, index) != SQLITE_OK) Fail(db_, "cannot bind a value");
    return *this;
}

bool Stmt::Step() {
    int rc = sqlite3_step(stmt_);
    if (rc == SQLITE_ROW) return true;
    if (rc == SQLITE_DONE) return false;
    std::string sql = sqlite3_sql(stmt_);
    sqlite3_reset(stmt_);
    Fail(db_, "'" + sql + "' failed");
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

Db::Db(const std::string& path, bool create) : path_(path) {
    int flags = SQLITE_OPEN_READWRITE | SQLITE_OPEN_NOMUTEX | (create ? SQLITE_OPEN_CREATE : 0);
    int rc = sqlite3_open_v2(path.c_str(), &db_, flags, nullptr);
    if (rc != SQLITE_OK) {
        std::string reason = db_ ? sqlite3_errmsg(db_) : sqlite3_errstr(rc);
        sqlite3_close_v2(db_);
        db_ = nullptr;
        throw HostError(reason);
    }
    sqlite3_extended_result_codes(db_, 1);
}

Db::~Db() {
    cache_.clear();  // statements are finalized before their connection closes
    sqlite3_close_v2(db_);
}

void Db::Exec(const std::string& sql) {
    char* error = nullptr;
    if (sqlite3_exec(db_, sql.c_str(), nullptr, nullptr, &error) != SQLITE_OK) {
        std::string reason = error ? error : sqlite3_errmsg(db_);
        sqlite3_free(error);
        throw HostError("simulated host database: " + reason);
    }
}

Query Db::Cached(const std::string& sql) {
    auto it = cache_.find(sql);
    if (it == cache_.end()) it = cache_.emplace(sql, std::make_unique<Stmt>(db_, sql)).first;
    return Query(*it->second);
}

std::int64_t Db::QueryInt(const std::string& sql) {
    Query query = Cached(sql);
    return query->Step() ? query->Int(0) : 0;
}

std::int64_t Db::LastInsertRowid() const { return sqlite3_last_insert_rowid(db_); }

std::int64_t Db::Changes() const { return sqlite3_changes(db_); }

WriteTxn::WriteTxn(Db& db) : db_(db) { db_.Exec("BEGIN IMMEDIATE"); }

WriteTxn::~WriteTxn() {
    if (open_) sqlite3_exec(db_.Handle(), "ROLLBACK", nullptr, nullptr, nullptr);
}

void WriteTxn::Commit() {
    db_.Exec("COMMIT");
    open_ = false;
}

ReadTxn::ReadTxn(Db& db) : db_(db) { db_.Exec("BEGIN"); }

ReadTxn::~ReadTxn() { sqlite3_exec(db_.Handle(), "COMMIT", nullptr, nullptr, nullptr); }

}  // namespace simhost
