#include <simhost/Call.h>

#include <simhost/Trace.h>

namespace simhost {

std::string Args::Text() const {
    // Arguments are recorded, never parsed back: bytes that are not UTF-8 become U+FFFD.
    return json_.dump(-1, ' ', false, nlohmann::ordered_json::error_handler_t::replace);
}

Call::Call(std::string operation, Args args)
    : operation_(std::move(operation)), args_(std::move(args)), session_(Begin(operation_, args_)) {
    RaiseFault();
}

Session Call::Begin(const std::string& operation, const Args& args) {
    if (trace::Enabled()) trace::Record(operation, trace::WithArguments() ? args.Text() : "");
    return Session::OpenCurrent();
}

void Call::RaiseFault() {
    {
        // The common path: one indexed look-up, no transaction of our own.
        Query probe = db().Cached("SELECT 1 FROM faults WHERE operation = ?1");
        probe->Bind(1, operation_);
        if (!probe->Step()) return;
    }
    // Consume the fault in a write transaction, so that concurrent processes consume a counted
    // fault exactly once per remaining call.
    std::string message;
    {
        WriteTxn txn(db());
        bool counted;
        std::int64_t remaining;
        {
            Query select = db().Cached("SELECT message, remaining FROM faults WHERE operation = ?1");
            select->Bind(1, operation_);
            if (!select->Step()) return;  // consumed by another process meanwhile
            message = select->Text(0);
            counted = !select->IsNull(1);
            remaining = select->Int(1);
        }
        if (counted && remaining <= 1)
            db().Cached("DELETE FROM faults WHERE operation = ?1")->Bind(1, operation_).Run();
        else if (counted)
            db().Cached("UPDATE faults SET remaining = remaining - 1 WHERE operation = ?1")
                ->Bind(1, operation_)
                .Run();
        AppendJournal(db(), "fault", operation_, args_.Text());
        txn.Commit();
    }
    throw HostError(message);
}

}  // namespace simhost
