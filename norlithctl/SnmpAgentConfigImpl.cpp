#include <norlithctl/SnmpAgentConfigImpl.h>

#include "HostCall.h"
#include "SnmpConfig.h"
#include "SnmpPending.h"

#include <simhost/domains/Identity.h>


namespace NorlithCtl {
namespace System {

namespace snmp = norlithctl::snmp;
using simhost::Op;

namespace {

// Runs one operation: body(call) inside its Call, host errors as RavelException.
template <class Body>
auto Operation(Op op, Body&& body, simhost::Args args = simhost::Args()) {
    return norlithctl::HostCall([&] {
        simhost::Call call(op, std::move(args));
        return body(call);
    });
}

template <class T>
void Append(std::vector<std::string>& out, const std::vector<T>& items, std::string (*text)(const T&)) {
    for (const T& item : items) out.push_back(text(item));
}

}  // namespace

SnmpAgentConfigImpl::SnmpAgentConfigImpl() : pending_(new Pending) {
    Operation(Op::SnmpAgentConfigImpl_New, [](simhost::Call&) {});
}

SnmpAgentConfigImpl::~SnmpAgentConfigImpl() {}

// ---- reading -------------------------------------------------------------------------------------

bool SnmpAgentConfigImpl::ValidConfigFile() const {
    return Operation(Op::SnmpAgentConfigImpl_ValidConfigFile, [](simhost::Call& call) {
        return snmp::ReadConfigFile(call.Root(), false).state != snmp::ConfigFile::State::kMalformed;
    });
}

bool SnmpAgentConfigImpl::GetEnabled() const {
    return Operation(Op::SnmpAgentConfigImpl_GetEnabled,
                     [&](simhost::Call& call) { return pending_->View(call.Root()).enabled; });
}

int SnmpAgentConfigImpl::GetPort() const {
    return Operation(Op::SnmpAgentConfigImpl_GetPort, [&](simhost::Call& call) {
        return static_cast<int>(pending_->View(call.Root()).port);
    });
}

void SnmpAgentConfigImpl::GetCommunities(std::vector<std::string>& communities) const {
    Operation(Op::SnmpAgentConfigImpl_GetCommunities, [&](simhost::Call& call) {
        const snmp::AgentConfig config = pending_->View(call.Root());
        communities.insert(communities.end(), config.communities.begin(), config.communities.end());
    });
}

void SnmpAgentConfigImpl::GetTrapTargets(std::vector<std::string>& targets) const {
    Operation(Op::SnmpAgentConfigImpl_GetTrapTargets, [&](simhost::Call& call) {
        Append(targets, pending_->View(call.Root()).targets, &snmp::TargetText);
    });
}

void SnmpAgentConfigImpl::GetUsers(std::vector<std::string>& users) const {
    Operation(Op::SnmpAgentConfigImpl_GetUsers, [&](simhost::Call& call) {
        Append(users, pending_->View(call.Root()).users, &snmp::UserText);
    });
}

void SnmpAgentConfigImpl::GetRemoteUsers(std::vector<std::string>& users) const {
    Operation(Op::SnmpAgentConfigImpl_GetRemoteUsers, [&](simhost::Call& call) {
        Append(users, pending_->View(call.Root()).remote_users, &snmp::RemoteUserText);
    });
}

void SnmpAgentConfigImpl::GetV3Traps(std::vector<std::string>& targets) const {
    Operation(Op::SnmpAgentConfigImpl_GetV3Traps, [&](simhost::Call& call) {
        Append(targets, pending_->View(call.Root()).v3_targets, &snmp::V3TargetText);
    });
}

void SnmpAgentConfigImpl::GetOptions(std::map<std::string, std::string>& options) const {
    Operation(Op::SnmpAgentConfigImpl_GetOptions, [&](simhost::Call& call) {
        for (const auto& [key, value] : pending_->View(call.Root()).options) options[key] = value;
    });
}

bool SnmpAgentConfigImpl::IsLargeStorageSupported() const {
    return Operation(Op::SnmpAgentConfigImpl_IsLargeStorageSupported,
                     [&](simhost::Call& call) { return pending_->View(call.Root()).large_storage; });
}

// ---- staging ----------------------------------------------------------------------------------------

void SnmpAgentConfigImpl::Reset() {
    Operation(Op::SnmpAgentConfigImpl_Reset, [&](simhost::Call&) {
        pending_->changes.clear();
        pending_->reset = true;
        pending_->changes.push_back({"reset", true, [](snmp::AgentConfig&) {}});
    });
}

void SnmpAgentConfigImpl::SetEnabled(bool enabled) {
    Operation(
        Op::SnmpAgentConfigImpl_SetEnabled,
        [&](simhost::Call&) {
            pending_->changes.push_back({"enable", enabled, [enabled](snmp::AgentConfig& c) { c.enabled = enabled; }});
        },
        simhost::Args().Add("enable", enabled));
}

void SnmpAgentConfigImpl::SetPort(unsigned short port) {
    Operation(
        Op::SnmpAgentConfigImpl_SetPort,
        [&](simhost::Call&) {
            pending_->changes.push_back({"port", port, [port](snmp::AgentConfig& c) { c.port = port; }});
        },
        simhost::Args().Add("port", port));
}

void SnmpAgentConfigImpl::SetCommunities(const std::vector<std::string>& communities) {
    Operation(Op::SnmpAgentConfigImpl_SetCommunities, [&](simhost::Call&) {
        std::vector<std::string> parsed = snmp::ParseCommunities(communities);
        // Community strings are credentials: the journal records how many, not which.
        nlohmann::ordered_json shown = nlohmann::ordered_json::array();
        for (std::size_t i = 0; i < parsed.size(); ++i) shown.push_back("***");
        pending_->changes.push_back({"communities", shown, [parsed](snmp::AgentConfig& c) { c.communities = parsed; }});
    });
}

void SnmpAgentConfigImpl::SetTrapTargets(const std::vector<std::string>& targets) {
    Operation(Op::SnmpAgentConfigImpl_SetTrapTargets, [&](simhost::Call&) {
        std::vector<snmp::TrapTarget> parsed = snmp::ParseTargets(targets);
        pending_->changes.push_back({"targets", snmp::MaskedTargets(parsed),
                                     [parsed](snmp::AgentConfig& c) { c.targets = parsed; }});
    });
}

void SnmpAgentConfigImpl::SetUsers(const std::vector<std::string>& users) {
    Operation(Op::SnmpAgentConfigImpl_SetUsers, [&](simhost::Call&) {
        std::vector<snmp::User> parsed = snmp::ParseUsers(users);
        pending_->changes.push_back({"users", snmp::MaskedUsers(parsed),
                                     [parsed](snmp::AgentConfig& c) { c.users = parsed; }});
    });
}

void SnmpAgentConfigImpl::SetRemoteUsers(const std::vector<std::string>& users) {
    Operation(Op::SnmpAgentConfigImpl_SetRemoteUsers, [&](simhost::Call&) {
        std::vector<snmp::RemoteUser> parsed = snmp::ParseRemoteUsers(users);
        pending_->changes.push_back({"remote-users", snmp::MaskedRemoteUsers(parsed),
                                     [parsed](snmp::AgentConfig& c) { c.remote_users = parsed; }});
    });
}

void SnmpAgentConfigImpl::SetV3Targets(const std::vector<std::string>& targets) {
    Operation(Op::SnmpAgentConfigImpl_SetV3Targets, [&](simhost::Call&) {
        std::vector<snmp::V3Target> parsed = snmp::ParseV3Targets(targets);
        nlohmann::ordered_json shown = nlohmann::ordered_json::array();
        for (const snmp::V3Target& target : parsed) shown.push_back(snmp::V3TargetText(target));
        pending_->changes.push_back({"v3targets", shown, [parsed](snmp::AgentConfig& c) { c.v3_targets = parsed; }});
    });
}

void SnmpAgentConfigImpl::SetLargeStorageSupport(bool supported) {
    Operation(
        Op::SnmpAgentConfigImpl_SetLargeStorageSupport,
        [&](simhost::Call&) {
            pending_->changes.push_back(
                {"largestorage", supported, [supported](snmp::AgentConfig& c) { c.large_storage = supported; }});
        },
        simhost::Args().Add("largestorage", supported));
}

void SnmpAgentConfigImpl::SetOptions(const std::map<std::string, std::string>& options) {
    Operation(Op::SnmpAgentConfigImpl_SetOptions, [&](simhost::Call&) {
        // Checked now against an empty map, so a bad value is refused by this call; applied to
        // the stored options when saved.
        std::map<std::string, std::string> scratch;
        snmp::ApplyOptions(options, scratch);
        nlohmann::ordered_json shown = nlohmann::ordered_json::object();
        for (const auto& [key, value] : options) shown[key] = value;
        pending_->changes.push_back(
            {"options", shown, [options](snmp::AgentConfig& c) { snmp::ApplyOptions(options, c.options); }});
    });
}

void SnmpAgentConfigImpl::SaveConfig() {
    simhost::Args journal;
    for (const Pending::Change& change : pending_->changes) journal.Add(change.name, change.shown);
    Operation(Op::SnmpAgentConfigImpl_SaveConfig, [&](simhost::Call& call) {
        // Read, changed and written inside the write transaction, so that concurrent saves
        // apply one after the other.
        call.Change(
            [&](simhost::Db&) {
                const snmp::AgentConfig config = pending_->View(call.Root());
                snmp::CheckWhole(config);
                snmp::WriteConfig(call.Root(), config);
            },
            journal);
        pending_->changes.clear();
        pending_->reset = false;
    });
}

}  // namespace System
}  // namespace NorlithCtl
