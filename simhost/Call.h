// Call: one invocation of a host operation, as the host-control and event libraries make it.
//
// Constructing a Call records it in the call trace, opens the current host (QUARN_HOST_STATE
// or the default location) and raises a fault set on the operation: the fault is consumed and
// journaled in one transaction and HostError carries its message and event. The Call then gives
// the operation exclusive use of the host's connection until it is destroyed.
//
// Reads go through Read<T>() and Items<T>(); they see one snapshot of the host until the call
// makes its first change. Every change goes through Change() or Update<T>(), which run it in one
// write transaction together with its journal entry, so a change and its record commit or
// vanish together.
//
// Args are the operation's arguments as they are recorded (journal, trace); an argument added
// with Secret() is recorded as "***" and its value never reaches the record.
#pragma once

#include <simhost/Export.h>

#include <simhost/Db.h>
#include <simhost/Journal.h>
#include <simhost/Operations.h>
#include <simhost/State.h>
#include <simhost/Store.h>

#include <nlohmann/json.hpp>

#include <string>
#include <utility>

namespace simhost {

class SIMHOST_API Args {
public:
    Args() : json_(nlohmann::ordered_json::object()) {}
    Args& Add(const std::string& name, nlohmann::ordered_json value) {
        json_[name] = std::move(value);
        return *this;
    }
    Args& Secret(const std::string& name) {
        json_[name] = "***";
        return *this;
    }
    std::string Text() const;  // compact JSON object

private:
    nlohmann::ordered_json json_;
};

class SIMHOST_API Call {
public:
    explicit Call(Op operation, Args args = Args());
    ~Call();
    Call(const Call&) = delete;
    Call& operator=(const Call&) = delete;

    Db& db() { return session_.db(); }
    const std::string& StateDir() const { return session_.dir(); }
    // The host's own file system: StateDir()/root.
    std::string Root() const;
    Op Operation() const { return operation_; }
    const char* OperationName() const;

    // Runs change(db) in a write transaction and journals the call (with its own arguments, or
    // with journal_args) in the same transaction.
    template <class Fn>
    void Change(Fn&& change) {
        Change(std::forward<Fn>(change), args_);
    }
    template <class Fn>
    void Change(Fn&& change, const Args& journal_args) {
        EndReading();
        WriteTxn txn(db());
        change(db());
        AppendJournal(db(), "change", OperationName(), journal_args.Text());
        txn.Commit();
    }

    // The singleton domain T's current value.
    template <class T>
    T Read() {
        return Load<T>(db());
    }
    // Changes the singleton domain T: update(T&) on its current value, checked against its
    // rules and stored in one journaled transaction.
    template <class T, class Fn>
    void Update(Fn&& update) {
        Change([&](Db& db) {
            T state = Load<T>(db);
            update(state);
            Save(db, state);
        });
    }
    // The collection or log domain T (use inside Change to modify it).
    template <class T>
    simhost::Items<T> Items() {
        return simhost::Items<T>(db());
    }

private:
    static Session Begin(Op operation, const Args& args);
    void RaiseFault();
    // The call's reads, the fault check among them, share one read transaction from the call's
    // start to its first change or its end: one snapshot, and the host's locks taken once.
    void BeginReading();
    void EndReading();

    Op operation_;
    Args args_;
    Session session_;
    bool reading_ = false;
};

}  // namespace simhost
