#include <simhost/Journal.h>

#include <simhost/Db.h>
#include <simhost/Time.h>


namespace simhost {

void AppendJournal(Db& db, const std::string& kind, const std::string& operation,
                   const std::string& arguments) {
    db.Cached("INSERT INTO journal(time, kind, operation, arguments) VALUES (?1, ?2, ?3, ?4)")
        ->Bind(1, UtcNow())
        .Bind(2, kind)
        .Bind(3, operation)
        .Bind(4, arguments)
        .Run();
}

std::vector<JournalEntry> ReadJournal(Db& db, std::optional<std::int64_t> last) {
    std::vector<JournalEntry> entries;
    Query select = db.Cached(
        "SELECT sequence, time, kind, operation, arguments FROM"
        " (SELECT * FROM journal ORDER BY sequence DESC LIMIT ?1) ORDER BY sequence");
    select->Bind(1, last ? *last : std::int64_t{-1});  // a negative limit is no limit
    while (select->Step())
        entries.push_back(
            {select->Int(0), select->Text(1), select->Text(2), select->Text(3), select->Text(4)});
    return entries;
}

void DeleteJournal(Db& db) { db.Cached("DELETE FROM journal")->Run(); }

}  // namespace simhost
