#include <simhost/Faults.h>

#include <simhost/Db.h>
#include <simhost/Events.h>
#include <simhost/Mapping.h>
#include <simhost/Operations.h>

#include <nlohmann/json.hpp>

namespace simhost {
namespace {

std::string EventText(const Event& event) {
    if (event.Empty()) return std::string();
    return nlohmann::json{{"id", event.id}, {"args", event.args}}.dump();
}

Event EventFrom(const std::string& text) {
    Event event;
    if (text.empty()) return event;
    nlohmann::json json = nlohmann::json::parse(text, nullptr, false);
    if (json.is_object()) {
        event.id = json.value("id", "");
        if (json.contains("args") && json["args"].is_array())
            for (const auto& arg : json["args"])
                if (arg.is_string()) event.args.push_back(arg.get<std::string>());
    }
    return event;
}

Fault FaultFrom(Stmt& row) {
    Fault fault{row.Text(0), row.Text(1), std::nullopt, EventFrom(row.Text(3))};
    if (!row.IsNull(2)) fault.remaining = row.Int(2);
    return fault;
}

}  // namespace

std::string CheckFault(const Fault& fault) {
    if (!IsKnownOperation(fault.operation)) return UnknownOperationText(fault.operation);
    std::string problem = CheckText(fault.message, kMaxFaultMessage);
    if (!problem.empty()) return "fault message: " + problem;
    if (fault.remaining && (*fault.remaining < 1 || *fault.remaining > kMaxFaultTimes))
        return "fault count must be from 1 to " + std::to_string(kMaxFaultTimes);
    if (!fault.event.Empty()) {
        problem = CheckEvent(fault.event);
        if (!problem.empty()) return "fault event: " + problem;
    }
    return "";
}

void StoreFault(Db& db, const Fault& fault) {
    Query insert = db.Cached(
        "INSERT OR REPLACE INTO faults(operation, message, remaining, event) "
        "VALUES (?1, ?2, ?3, ?4)");
    insert->Bind(1, fault.operation).Bind(2, fault.message);
    if (fault.remaining)
        insert->Bind(3, *fault.remaining);
    else
        insert->BindNull(3);
    insert->Bind(4, EventText(fault.event));
    insert->Run();
}

std::vector<Fault> ReadFaults(Db& db) {
    std::vector<Fault> faults;
    Query select =
        db.Cached("SELECT operation, message, remaining, event FROM faults ORDER BY operation");
    while (select->Step()) faults.push_back(FaultFrom(*select.operator->()));
    return faults;
}

void DeleteFaults(Db& db) { db.Cached("DELETE FROM faults")->Run(); }

bool DeleteFault(Db& db, const std::string& operation) {
    db.Cached("DELETE FROM faults WHERE operation = ?1")->Bind(1, operation).Run();
    return db.Changes() > 0;
}

std::optional<Fault> ConsumeFault(Db& db, const std::string& operation) {
    std::optional<Fault> fault;
    {
        Query select = db.Cached(
            "SELECT operation, message, remaining, event FROM faults WHERE operation = ?1");
        select->Bind(1, operation);
        if (!select->Step()) return std::nullopt;
        fault = FaultFrom(*select.operator->());
    }
    if (fault->remaining && *fault->remaining <= 1)
        DeleteFault(db, operation);
    else if (fault->remaining)
        db.Cached("UPDATE faults SET remaining = remaining - 1 WHERE operation = ?1")
            ->Bind(1, operation)
            .Run();
    return fault;
}

}  // namespace simhost
