#include <simhost/domains/Observations.h>

#include <simhost/Call.h>

#include <cctype>

namespace simhost {
namespace observations {
namespace {

// "YYYY-MM-DDTHH:MM:SS.mmmZ", the form UtcNow() writes.
bool IsTimestamp(const std::string& text) {
    const char* pattern = "dddd-dd-ddTdd:dd:dd.dddZ";
    if (text.size() != std::char_traits<char>::length(pattern)) return false;
    for (std::size_t i = 0; i < text.size(); ++i) {
        if (pattern[i] == 'd' ? !std::isdigit(static_cast<unsigned char>(text[i]))
                              : text[i] != pattern[i])
            return false;
    }
    return true;
}

void Insert(Db& db, const Entry& entry) {
    db.Cached("INSERT INTO observations(time, message) VALUES (?1, ?2)")
        ->Bind(1, entry.time)
        .Bind(2, entry.message)
        .Run();
}

class ObservationsSection : public Section {
public:
    explicit ObservationsSection(std::vector<Entry> entries) : entries_(std::move(entries)) {}

    nlohmann::ordered_json ToJson() const override {
        nlohmann::ordered_json list = nlohmann::ordered_json::array();
        for (const Entry& entry : entries_)
            list.push_back({{"time", entry.time}, {"message", entry.message}});
        return list;
    }

    void Write(Db& db) const override {
        for (const Entry& entry : entries_) Insert(db, entry);
    }

private:
    std::vector<Entry> entries_;
};

class ObservationsDomain : public Domain {
public:
    std::string Name() const override { return "observations"; }

    std::string Schema() const override {
        return "CREATE TABLE observations ("
               " sequence INTEGER PRIMARY KEY AUTOINCREMENT,"
               " time TEXT NOT NULL, message TEXT NOT NULL);";
    }

    std::vector<std::string> OperationNames() const override { return {"QuillUserLib_AddQuill"}; }

    std::unique_ptr<Section> Parse(const nlohmann::json* value, const Location& at) const override {
        std::vector<Entry> entries;
        if (value) {
            if (!value->is_array()) at.Fail("expected an array");
            for (std::size_t i = 0; i < value->size(); ++i) {
                ObjectReader reader((*value)[i], at.Index(i));
                Entry entry;
                entry.time = reader.Text("time", 24);
                if (!IsTimestamp(entry.time))
                    reader.At("time").Fail("expected a UTC time of the form YYYY-MM-DDTHH:MM:SS.mmmZ");
                entry.message = reader.Text("message", kMessageMax, false);
                reader.Done();
                entries.push_back(std::move(entry));
            }
        }
        return std::make_unique<ObservationsSection>(std::move(entries));
    }

    std::unique_ptr<Section> Read(Db& db) const override {
        return std::make_unique<ObservationsSection>(observations::Read(db));
    }
};

}  // namespace

void Post(Call& call, const std::string& message) {
    std::string problem = CheckText(message, kMessageMax, false);
    if (!problem.empty()) throw HostError("observation log entry: " + problem);
    call.Change([&](Db& db) { Insert(db, {UtcNow(), message}); });
}

std::vector<Entry> Read(Db& db) {
    std::vector<Entry> entries;
    Query select = db.Cached("SELECT time, message FROM observations ORDER BY sequence");
    while (select->Step()) entries.push_back({select->Text(0), select->Text(1)});
    return entries;
}

const Domain& TheDomain() {
    static const ObservationsDomain domain;
    return domain;
}

}  // namespace observations
}  // namespace simhost
