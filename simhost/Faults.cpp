#include <simhost/Faults.h>

#include <simhost/Db.h>
#include <simhost/Operations.h>
#include <simhost/Scenario.h>

namespace simhost {

std::string CheckFault(const Fault& fault) {
    if (!IsKnownOperation(fault.operation)) {
        std::string hint;
        for (const std::string& near : NearestOperations(fault.operation))
            hint += (hint.empty() ? "" : ", ") + near;
        return "unknown operation '" + fault.operation + "'" +
               (hint.empty() ? "" : " (nearest: " + hint + ")");
    }
    std::string problem = CheckText(fault.message, kMaxFaultMessage);
    if (!problem.empty()) return "fault message: " + problem;
    if (fault.remaining && (*fault.remaining < 1 || *fault.remaining > kMaxFaultTimes))
        return "fault count must be from 1 to " + std::to_string(kMaxFaultTimes);
    return "";
}

void StoreFault(Db& db, const Fault& fault) {
    Query insert = db.Cached(
        "INSERT OR REPLACE INTO faults(operation, message, remaining) VALUES (?1, ?2, ?3)");
    insert->Bind(1, fault.operation).Bind(2, fault.message);
    if (fault.remaining)
        insert->Bind(3, *fault.remaining);
    else
        insert->BindNull(3);
    insert->Run();
}

std::vector<Fault> ReadFaults(Db& db) {
    std::vector<Fault> faults;
    Query select = db.Cached("SELECT operation, message, remaining FROM faults ORDER BY operation");
    while (select->Step()) {
        Fault fault{select->Text(0), select->Text(1), std::nullopt};
        if (!select->IsNull(2)) fault.remaining = select->Int(2);
        faults.push_back(std::move(fault));
    }
    return faults;
}

void DeleteFaults(Db& db) { db.Cached("DELETE FROM faults")->Run(); }

bool DeleteFault(Db& db, const std::string& operation) {
    db.Cached("DELETE FROM faults WHERE operation = ?1")->Bind(1, operation).Run();
    return db.Changes() > 0;
}

}  // namespace simhost
