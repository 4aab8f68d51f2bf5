// SnmpAgentConfigImpl's keys and tests: GenerateHash, TestUser and TestTrap.
#include <norlithctl/SnmpAgentConfigImpl.h>

#include "HostCall.h"
#include "SnmpConfig.h"
#include "SnmpKeys.h"
#include "SnmpNotify.h"
#include "SnmpPending.h"

#include <simhost/Time.h>
#include <simhost/domains/Clock.h>
#include <simhost/domains/Identity.h>

#include <algorithm>

namespace NorlithCtl {
namespace System {
namespace {

namespace snmp = norlithctl::snmp;
namespace keys = norlithctl::snmpkeys;
using simhost::HostError;
using simhost::Op;

struct Engine {
    std::string id;       // bytes
    std::string problem;  // why there is none
};

// The agent's engine id: the stored one, else the host's default, the 16 octets of its system
// UUID (so every host has its own).
Engine EngineOf(simhost::Call& call, const snmp::AgentConfig& config) {
    Engine engine;
    auto stored = config.options.find("engineid");
    if (stored != config.options.end() && !stored->second.empty()) {
        const std::string& text = stored->second;
        if (text.size() < 10 || text.size() > 32 || !keys::FromHex(text, &engine.id))
            engine.problem = "the stored engine id '" + snmp::Shown(text) +
                             "' is not 10 to 32 hexadecimal digits; set it again with 'system snmp set --engineid'";
        return engine;
    }
    std::string uuid = call.Read<simhost::identity::Identity>().system_uuid;
    uuid.erase(std::remove(uuid.begin(), uuid.end(), '-'), uuid.end());
    if (!keys::FromHex(uuid, &engine.id)) engine.problem = "the host's system UUID is not hexadecimal";
    return engine;
}

// The digest of an authentication protocol name; false when it has none.
bool DigestOf(const std::string& protocol, keys::Digest* digest) {
    if (protocol == "MD5") *digest = keys::Digest::kMd5;
    else if (protocol == "SHA1") *digest = keys::Digest::kSha1;
    else return false;
    return true;
}

bool SameHex(const std::string& a, const std::string& b) {
    return a.size() == b.size() &&
           std::equal(a.begin(), a.end(), b.begin(), [](char x, char y) { return std::tolower(x) == std::tolower(y); });
}

// How long the host has been up, in hundredths of a second (wrapping as TimeTicks do).
unsigned long UptimeTicks(simhost::Call& call) {
    std::optional<std::int64_t> booted = simhost::ParseUtc(call.Read<simhost::boot::Boot>().booted_at);
    std::int64_t micros = booted ? simhost::MachineNowMicros() - *booted : 0;
    if (micros < 0) micros = 0;
    return static_cast<unsigned long>((micros / 10000) % 4294967296LL);
}

struct Delivery {
    std::string shown;  // the target as a message names it
    norlithctl::snmpnotify::Destination destination;
    std::string problem;  // set when it cannot even be tried
};

std::vector<Delivery> Deliveries(const snmp::AgentConfig& config, const std::string& only) {
    std::vector<Delivery> deliveries;
    for (const snmp::TrapTarget& target : config.targets) {
        if (!only.empty() && only != snmp::TargetText(target)) continue;
        Delivery delivery;
        delivery.shown = target.host + "@" + std::to_string(target.port) + " (SNMPv1 trap)";
        delivery.destination.host = target.host;
        delivery.destination.port = target.port;
        delivery.destination.community = target.community;
        deliveries.push_back(delivery);
    }
    for (const snmp::V3Target& target : config.v3_targets) {
        if (!only.empty() && only != snmp::V3TargetText(target)) continue;
        Delivery delivery;
        delivery.shown = target.host + "@" + std::to_string(target.port) + " (SNMPv3 " + target.type +
                         " as '" + target.user + "')";
        norlithctl::snmpnotify::Destination& to = delivery.destination;
        to.host = target.host;
        to.port = target.port;
        to.v3 = true;
        to.inform = target.type == "inform";
        to.user = target.user;
        to.level = target.level;
        auto user = std::find_if(config.remote_users.begin(), config.remote_users.end(),
                                 [&](const snmp::RemoteUser& u) { return u.name == target.user; });
        if (user == config.remote_users.end()) {
            delivery.problem = "its remote user is not configured";
        } else {
            to.auth_protocol = user->auth_protocol;
            keys::FromHex(user->engine_id, &to.engine_id);
            keys::FromHex(user->auth_hash, &to.auth_key);
            keys::FromHex(user->priv_hash, &to.priv_key);
            if ((to.level != "none" && to.auth_key.empty()) || (to.level == "priv" && to.priv_key.empty()))
                delivery.problem = "its remote user has no keys for level " + to.level;
        }
        deliveries.push_back(delivery);
    }
    return deliveries;
}

}  // namespace

bool SnmpAgentConfigImpl::GenerateHash(const std::string& auth_secret, const std::string& priv_secret,
                                       const std::string& auth_proto, const std::string& priv_proto,
                                       std::string& auth_hash, std::string& priv_hash,
                                       std::string& error) const {
    simhost::Args args;
    args.Secret("auth_secret").Secret("priv_secret").Add("auth_proto", auth_proto).Add("priv_proto", priv_proto);
    return norlithctl::HostCall([&] {
        simhost::Call call(Op::SnmpAgentConfigImpl_GenerateHash, args);
        keys::Digest digest;
        if (!DigestOf(auth_proto, &digest)) {
            error = "The authentication protocol '" + snmp::Shown(auth_proto) +
                    "' makes no hash; set --authentication MD5 or SHA1";
            return false;
        }
        if (!priv_secret.empty() && priv_proto != "AES128") {
            error = "The privacy protocol '" + snmp::Shown(priv_proto) + "' makes no key; set --privacy AES128";
            return false;
        }
        if (auth_secret.empty()) {
            error = "An authentication secret is needed to make a hash";
            return false;
        }
        Engine engine = EngineOf(call, pending_->View(call.Root()));
        if (!engine.problem.empty()) {
            error = "No hash can be made: " + engine.problem;
            return false;
        }
        auth_hash = keys::ToHex(keys::LocalizedAuthKey(digest, auth_secret, engine.id));
        priv_hash = priv_secret.empty() ? "" : keys::ToHex(keys::LocalizedAes128Key(digest, priv_secret, engine.id));
        return true;
    });
}

bool SnmpAgentConfigImpl::TestUser(const std::string& user, const std::string& auth_secret,
                                   const std::string& priv_secret, std::string& message) const {
    simhost::Args args;
    args.Add("user", user).Secret("auth_secret").Secret("priv_secret");
    return norlithctl::HostCall([&] {
        simhost::Call call(Op::SnmpAgentConfigImpl_TestUser, args);
        const snmp::AgentConfig config = pending_->View(call.Root());
        const std::string name = "User '" + snmp::Shown(user) + "'";
        auto found = std::find_if(config.users.begin(), config.users.end(),
                                  [&](const snmp::User& u) { return u.name == user; });
        if (found == config.users.end()) {
            message = name + " is not configured.";
            return false;
        }
        message = name + " exists (security model " + found->model + ")";
        if (auth_secret.empty() && priv_secret.empty()) {
            message += ".";
            return true;
        }
        auto option = config.options.find("authentication");
        keys::Digest digest;
        if (option == config.options.end() || !DigestOf(option->second, &digest)) {
            message += "; its secrets cannot be checked without an authentication protocol (set --authentication).";
            return false;
        }
        Engine engine = EngineOf(call, config);
        if (!engine.problem.empty()) {
            message += "; its secrets cannot be checked: " + engine.problem + ".";
            return false;
        }
        bool all = true;
        auto check = [&](const std::string& secret, const std::string& stored, const char* what, bool privacy) {
            if (secret.empty()) return;
            std::string key = privacy ? keys::LocalizedAes128Key(digest, secret, engine.id)
                                      : keys::LocalizedAuthKey(digest, secret, engine.id);
            bool match = !stored.empty() && SameHex(keys::ToHex(key), stored);
            all = all && match;
            message += std::string("; the ") + what + " secret " +
                       (stored.empty() ? "has no stored hash to match" : match ? "matches its hash" : "does not match its hash");
        };
        check(auth_secret, found->auth_hash, "authentication", false);
        check(priv_secret, found->priv_hash, "privacy", true);
        message += ".";
        return all;
    });
}

bool SnmpAgentConfigImpl::TestTrap(std::string target) {
    std::vector<Delivery> deliveries;
    unsigned long uptime = 0;
    norlithctl::HostCall([&] {
        simhost::Call call(Op::SnmpAgentConfigImpl_TestTrap, simhost::Args().Add("target", target));
        const snmp::AgentConfig config = pending_->View(call.Root());
        deliveries = Deliveries(config, target);
        if (!target.empty() && deliveries.empty())
            throw HostError("No configured target is '" + snmp::Shown(target) + "'");
        uptime = UptimeTicks(call);
    });
    std::string failures;
    for (Delivery& delivery : deliveries) {
        std::string problem = delivery.problem;
        if (problem.empty()) problem = norlithctl::snmpnotify::SendWarmStart(delivery.destination, uptime);
        if (!problem.empty()) failures += (failures.empty() ? "" : "; ") + delivery.shown + ": " + problem;
    }
    if (!failures.empty())
        throw Ravel::Lib::RavelException("The warmStart notification was not delivered to " + failures);
    return true;
}

}  // namespace System
}  // namespace NorlithCtl
