#include <simhost/Call.h>

#include <simhost/Faults.h>
#include <simhost/Trace.h>

namespace simhost {

std::string Args::Text() const {
    // Arguments are recorded, never parsed back: bytes that are not UTF-8 become U+FFFD.
    return json_.dump(-1, ' ', false, nlohmann::ordered_json::error_handler_t::replace);
}

Call::Call(Op operation, Args args)
    : operation_(operation), args_(std::move(args)), session_(Begin(operation_, args_)) {
    BeginReading();
    RaiseFault();
}

Call::~Call() { EndReading(); }

void Call::BeginReading() {
    db().BeginReading();
    reading_ = true;
}

void Call::EndReading() {
    if (!reading_) return;
    reading_ = false;
    db().EndReading();
}

std::string Call::Root() const { return RootPath(StateDir()); }

const char* Call::OperationName() const { return simhost::OperationName(operation_); }

Session Call::Begin(Op operation, const Args& args) {
    if (trace::Enabled())
        trace::Record(simhost::OperationName(operation), trace::WithArguments() ? args.Text() : "");
    return Session::OpenCurrent();
}

void Call::RaiseFault() {
    const std::string name = OperationName();
    {
        // The common path: one indexed look-up, no transaction of our own.
        Query probe = db().Cached("SELECT 1 FROM faults WHERE operation = ?1");
        probe->Bind(1, name);
        if (!probe->Step()) return;
    }
    // Consume the fault in a write transaction, so that concurrent processes consume a counted
    // fault exactly once per remaining call.
    EndReading();
    std::optional<Fault> fault;
    {
        WriteTxn txn(db());
        fault = ConsumeFault(db(), name);
        if (!fault) return;  // consumed by another process meanwhile
        AppendJournal(db(), "fault", name, args_.Text());
        txn.Commit();
    }
    throw HostError(fault->message, HostError::Code::kFailed, fault->event);
}

}  // namespace simhost
