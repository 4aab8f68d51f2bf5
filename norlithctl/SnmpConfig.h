// The SNMP agent's configuration as the host keeps it: the file /etc/tarsel/snmp.xml under the
// host's root/, its model, and every rule a value must follow to be stored.
//
// The model (AgentConfig) is a plain value. The rules are those the agent's command help
// announces: counts and lengths of communities, targets and users, the formats of targets and
// users, and the values of the scalar options (docs/host/snmp.md lists them all). Each refusal is
// a simhost::HostError whose text names the item and what is accepted; secrets (hashes,
// community strings inside targets) never appear in one.
//
// The file is XML, read and written with pugixml: a file that is not well-formed (or not a
// regular file, or too large) is reported as malformed, never half-read; a well-formed file whose
// content breaks a rule is refused with the rule's message. Writing replaces the file atomically
// (a temporary file, fsync, rename). Internal to the host-control library.
#pragma once

#include <simhost/RootFs.h>

#include <nlohmann/json.hpp>

#include <map>
#include <string>
#include <vector>

namespace norlithctl {
namespace snmp {

constexpr char kConfigPath[] = "/etc/tarsel/snmp.xml";

// A version 1 trap destination: host[@port]/community.
struct TrapTarget {
    std::string host;
    unsigned port = 162;
    std::string community;
};

// A local SNMPv3 user: name/auth-hash/priv-hash/model, a hash "" when there is none ("-").
struct User {
    std::string name;
    std::string auth_hash;
    std::string priv_hash;
    std::string model;  // "none", "auth" or "priv"
};

// A user of a notification receiver, with its keys localized to the receiver's engine.
struct RemoteUser {
    std::string name;
    std::string auth_protocol;  // "none", "MD5" or "SHA1"
    std::string auth_hash;      // "" when none
    std::string priv_protocol;  // "none" or "AES"
    std::string priv_hash;      // "" when none
    std::string engine_id;      // hexadecimal digits, without "0x"
};

// A version 3 notification destination: host[@port]/remote-user/level/type.
struct V3Target {
    std::string host;
    unsigned port = 162;
    std::string user;
    std::string level;  // "none", "auth" or "priv"
    std::string type;   // "trap" or "inform"
};

struct AgentConfig {
    bool enabled = false;
    unsigned port = 161;
    bool large_storage = true;
    std::vector<std::string> communities;
    std::vector<TrapTarget> targets;
    std::vector<User> users;
    std::vector<RemoteUser> remote_users;
    std::vector<V3Target> v3_targets;
    std::map<std::string, std::string> options;  // unknown keys are kept as found
};

// The documented factory configuration that a reset restores.
AgentConfig FactoryConfig();

// A value as a message may show it: control characters escaped, cut when long.
std::string Shown(const std::string& text);

// ---- items as the agent's commands write and show them ---------------------------------------

std::string TargetText(const TrapTarget& target);
std::string UserText(const User& user);
std::string RemoteUserText(const RemoteUser& user);
std::string V3TargetText(const V3Target& target);

// The same items with their secrets (community, hashes) masked, for the journal.
nlohmann::ordered_json MaskedTargets(const std::vector<TrapTarget>& targets);
nlohmann::ordered_json MaskedUsers(const std::vector<User>& users);
nlohmann::ordered_json MaskedRemoteUsers(const std::vector<RemoteUser>& users);

// ---- the setters' lists, checked item by item (HostError naming the first bad item) ----------
// A list of exactly one empty item means "none".

std::vector<std::string> ParseCommunities(const std::vector<std::string>& items);
std::vector<TrapTarget> ParseTargets(const std::vector<std::string>& items);
std::vector<User> ParseUsers(const std::vector<std::string>& items);
std::vector<RemoteUser> ParseRemoteUsers(const std::vector<std::string>& items);
std::vector<V3Target> ParseV3Targets(const std::vector<std::string>& items);

// The problem with one item ("" when it follows the rules), for items read from the file.
std::string CheckTargetItem(const TrapTarget& target);
std::string CheckUserItem(const User& user);
std::string CheckRemoteUserItem(const RemoteUser& user);
std::string CheckV3TargetItem(const V3Target& target);

// Checks the options a command sets and applies them to options: every key must be a known
// one; EventFilter takes a comma-separated list of OIDs, stored joined by ";", or "reset", which
// removes the filter.
void ApplyOptions(const std::map<std::string, std::string>& given,
                  std::map<std::string, std::string>& options);

// The rules across items of a whole configuration (hash lengths against the protocols, v3
// targets against the remote users, names given twice); HostError when one is broken.
void CheckWhole(const AgentConfig& config);

// ---- the file ----------------------------------------------------------------------------------

// What reading the file found.
struct ConfigFile {
    enum class State { kMissing, kWellFormed, kMalformed };
    State state = State::kMissing;
    std::string problem;  // kMalformed: why, for a message
    AgentConfig config;   // kWellFormed: the content; kMissing: the factory configuration
};

// Reads and parses the file under root. A well-formed file whose content breaks a rule, or a
// file that cannot be read for another reason, throws HostError.
// With interpret false, a well-formed file is only parsed, not read as a configuration.
ConfigFile ReadConfigFile(const std::string& root, bool interpret = true);
// As ReadConfigFile, but a malformed file throws HostError too.
AgentConfig LoadConfig(const std::string& root);

// The file's text for a configuration, and a configuration from a text (HostError when the text
// is not well-formed or breaks a rule).
std::string ToXml(const AgentConfig& config);
AgentConfig FromXml(const std::string& text);

// Replaces the file under root atomically with the configuration's text.
void WriteConfig(const std::string& root, const AgentConfig& config);

}  // namespace snmp
}  // namespace norlithctl
