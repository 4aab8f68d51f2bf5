#include <simhost/State.h>

#include <simhost/Call.h>

#include <cstdio>

namespace simhost {
namespace store {

const char* Schema() {
    return "CREATE TABLE state (domain TEXT PRIMARY KEY, value TEXT NOT NULL) WITHOUT ROWID;"
           "CREATE TABLE items ("
           " id INTEGER PRIMARY KEY, domain TEXT NOT NULL, key TEXT NOT NULL, value TEXT NOT NULL);"
           "CREATE UNIQUE INDEX items_key ON items(domain, key);"
           "CREATE INDEX items_order ON items(domain, id);";
}

std::optional<std::string> LoadState(Db& db, const char* domain) {
    Query select = db.Cached("SELECT value FROM state WHERE domain = ?1");
    select->Bind(1, std::string(domain));
    if (!select->Step()) return std::nullopt;
    return select->Text(0);
}

void SaveState(Db& db, const char* domain, const std::string& json) {
    db.Cached("INSERT INTO state(domain, value) VALUES (?1, ?2) "
              "ON CONFLICT(domain) DO UPDATE SET value = excluded.value")
        ->Bind(1, std::string(domain))
        .Bind(2, json)
        .Run();
}

std::optional<std::string> FindItem(Db& db, const char* domain, const std::string& key) {
    Query select = db.Cached("SELECT value FROM items WHERE domain = ?1 AND key = ?2");
    select->Bind(1, std::string(domain)).Bind(2, key);
    if (!select->Step()) return std::nullopt;
    return select->Text(0);
}

void ForEachItem(Db& db, const char* domain,
                 const std::function<void(const std::string&, const std::string&)>& fn) {
    Query select = db.Cached("SELECT key, value FROM items WHERE domain = ?1 ORDER BY id");
    select->Bind(1, std::string(domain));
    while (select->Step()) fn(select->Text(0), select->Text(1));
}

void ForEachItemWithPrefix(Db& db, const char* domain, const std::string& prefix,
                           const std::function<void(const std::string&, const std::string&)>& fn) {
    if (prefix.empty()) return ForEachItem(db, domain, fn);
    // Keys starting with prefix lie in [prefix, prefix with its last byte raised by one).
    std::string end = prefix;
    while (!end.empty() && static_cast<unsigned char>(end.back()) == 0xFF) end.pop_back();
    // Two statements rather than one with "(?3 = '' OR key < ?3)": SQLite cannot use a bound
    // hidden in an OR, and would read every key from the prefix to the end of the domain.
    Query select = end.empty()
                       ? db.Cached("SELECT key, value FROM items WHERE domain = ?1 AND key >= ?2 "
                                   "ORDER BY id")
                       : db.Cached("SELECT key, value FROM items WHERE domain = ?1 AND key >= ?2 "
                                   "AND key < ?3 ORDER BY id");
    if (!end.empty()) end.back() = static_cast<char>(static_cast<unsigned char>(end.back()) + 1);
    select->Bind(1, std::string(domain)).Bind(2, prefix);
    if (!end.empty()) select->Bind(3, end);
    while (select->Step()) fn(select->Text(0), select->Text(1));
}

std::int64_t CountItems(Db& db, const char* domain) {
    Query count = db.Cached("SELECT count(*) FROM items WHERE domain = ?1");
    count->Bind(1, std::string(domain));
    return count->Step() ? count->Int(0) : 0;
}

std::int64_t CountItemsWhere(Db& db, const char* domain, const char* member,
                             const std::string& value) {
    Query count = db.Cached(
        "SELECT count(*) FROM items WHERE domain = ?1 AND json_extract(value, ?2) = ?3");
    count->Bind(1, std::string(domain)).Bind(2, std::string("$.") + member).Bind(3, value);
    return count->Step() ? count->Int(0) : 0;
}

void PutItem(Db& db, const char* domain, const std::string& key, const std::string& json) {
    db.Cached("INSERT INTO items(domain, key, value) VALUES (?1, ?2, ?3) "
              "ON CONFLICT(domain, key) DO UPDATE SET value = excluded.value")
        ->Bind(1, std::string(domain))
        .Bind(2, key)
        .Bind(3, json)
        .Run();
}

bool EraseItem(Db& db, const char* domain, const std::string& key) {
    db.Cached("DELETE FROM items WHERE domain = ?1 AND key = ?2")
        ->Bind(1, std::string(domain))
        .Bind(2, key)
        .Run();
    return db.Changes() > 0;
}

void ClearItems(Db& db, const char* domain) {
    db.Cached("DELETE FROM items WHERE domain = ?1")->Bind(1, std::string(domain)).Run();
}

void AppendEntry(Db& db, const char* domain, const std::string& json) {
    // Entries are keyed by a zero-padded sequence number, so keys sort as entries do.
    std::int64_t next = 1;
    {
        Query last = db.Cached("SELECT max(id) FROM items");
        if (last->Step() && !last->IsNull(0)) next = last->Int(0) + 1;
    }
    char key[24];
    std::snprintf(key, sizeof key, "%020lld", static_cast<long long>(next));
    PutItem(db, domain, key, json);
}

}  // namespace store

namespace state_detail {

std::string Missing(const char* domain) {
    return std::string("The simulated host's state is damaged: the ") + domain +
           " state is missing; recreate the host with 'quarnhost init --force'";
}

}  // namespace state_detail

void BootAllDomains(Db& db) {
    for (const Domain* domain : Domains()) domain->Boot(db);
}

void Stage::Add(const std::string& name, nlohmann::ordered_json value,
                std::function<void(Db&)> apply) {
    journal_[name] = std::move(value);
    changes_.push_back(std::move(apply));
}

void Stage::AddSecret(const std::string& name, std::function<void(Db&)> apply) {
    Add(name, "***", std::move(apply));
}

void Stage::Commit(Call& call) {
    std::vector<std::function<void(Db&)>> changes;
    changes.swap(changes_);
    nlohmann::ordered_json journal = nlohmann::ordered_json::object();
    journal.swap(journal_);
    Args args;
    for (auto it = journal.begin(); it != journal.end(); ++it) args.Add(it.key(), it.value());
    call.Change(
        [&](Db& db) {
            for (const auto& change : changes) change(db);
        },
        args);
}

void Stage::Discard() {
    changes_.clear();
    journal_ = nlohmann::ordered_json::object();
}

void Stage::ApplyTo(Db& db) const {
    for (const auto& change : changes_) change(db);
}

}  // namespace simhost
