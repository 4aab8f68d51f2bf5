// Call: one invocation of a host operation, as the host-control and event libraries make it.
//
// Constructing a Call records it in the call trace, opens the current host (QUARN_HOST_STATE
// or the default location) and raises a fault set on the operation: the fault is consumed and
// journaled in one transaction and HostError carries its message. The Call then gives the
// operation exclusive use of the host's connection until it is destroyed. Change() runs a
// modification in a write transaction together with its journal entry.
//
// Args are the operation's arguments as they are recorded (journal, trace); an argument added
// with Secret() is recorded as "***" and its value never reaches the record.
#pragma once

#include <simhost/Export.h>

#include <simhost/Db.h>
#include <simhost/Journal.h>
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
    explicit Call(std::string operation, Args args = Args());
    Call(const Call&) = delete;
    Call& operator=(const Call&) = delete;

    Db& db() { return session_.db(); }
    const std::string& StateDir() const { return session_.dir(); }
    const std::string& Operation() const { return operation_; }

    // Runs change(db) in a write transaction and journals the call in the same transaction.
    template <class Fn>
    void Change(Fn&& change) {
        WriteTxn txn(db());
        change(db());
        AppendJournal(db(), "change", operation_, args_.Text());
        txn.Commit();
    }

private:
    static Session Begin(const std::string& operation, const Args& args);
    void RaiseFault();

    std::string operation_;
    Args args_;
    Session session_;
};

}  // namespace simhost
