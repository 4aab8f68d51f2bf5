// The rules of the SNMP agent's configuration: items of the setters' lists, the scalar options
// and the rules across items (SnmpConfig.h).
#include "SnmpConfig.h"

#include "SnmpKeys.h"

#include <simhost/Error.h>

#include <arpa/inet.h>

#include <algorithm>
#include <cctype>
#include <cstdio>
#include <strings.h>
#include <set>

namespace norlithctl {
namespace snmp {
namespace {

using simhost::HostError;

constexpr std::size_t kMaxCommunities = 10;
constexpr std::size_t kMaxCommunityLength = 64;
constexpr std::size_t kMaxTargets = 3;
constexpr std::size_t kMaxUsers = 5;
constexpr std::size_t kMaxRemoteUsers = 5;
constexpr std::size_t kMaxV3Targets = 3;
constexpr std::size_t kMaxUserName = 32;
constexpr std::size_t kMaxText = 255;
constexpr std::size_t kMaxFilterOids = 64;
constexpr std::size_t kMaxOidComponents = 128;

}  // namespace

std::string Shown(const std::string& text) {
    std::string shown;
    for (unsigned char c : text) {
        if (c < 0x20 || c == 0x7f) {
            char escaped[8];
            std::snprintf(escaped, sizeof escaped, "\\x%02x", c);
            shown += escaped;
        } else {
            shown += static_cast<char>(c);
        }
        if (shown.size() > 80) return shown.substr(0, 77) + "...";
    }
    return shown;
}

namespace {

std::vector<std::string> Split(const std::string& text, char separator) {
    std::vector<std::string> parts;
    std::size_t start = 0;
    for (;;) {
        std::size_t at = text.find(separator, start);
        parts.push_back(text.substr(start, at == std::string::npos ? std::string::npos : at - start));
        if (at == std::string::npos) return parts;
        start = at + 1;
    }
}

std::string Trimmed(const std::string& text) {
    std::size_t begin = text.find_first_not_of(" \t\r\n\f\v");
    if (begin == std::string::npos) return "";
    std::size_t end = text.find_last_not_of(" \t\r\n\f\v");
    return text.substr(begin, end - begin + 1);
}

bool IsHex(const std::string& text) {
    return !text.empty() && std::all_of(text.begin(), text.end(), [](unsigned char c) {
        return std::isxdigit(c) != 0;
    });
}

bool IsPrintableAscii(const std::string& text) {
    return std::all_of(text.begin(), text.end(),
                       [](unsigned char c) { return c >= 0x20 && c < 0x7f; });
}

// Counts UTF-8 characters; -1 when text is not UTF-8 or holds a control character.
long TextCharacters(const std::string& text) {
    long count = 0;
    for (std::size_t i = 0; i < text.size();) {
        unsigned char c = static_cast<unsigned char>(text[i]);
        std::size_t length = c < 0x80 ? 1 : (c >> 5) == 6 ? 2 : (c >> 4) == 14 ? 3 : (c >> 3) == 30 ? 4 : 0;
        if (length == 0 || i + length > text.size()) return -1;
        if (length == 1 && (c < 0x20 || c == 0x7f)) return -1;
        for (std::size_t k = 1; k < length; ++k)
            if ((static_cast<unsigned char>(text[i + k]) >> 6) != 2) return -1;
        i += length;
        ++count;
    }
    return count;
}

bool IsHostName(const std::string& host) {
    unsigned char address[16];
    if (inet_pton(AF_INET, host.c_str(), address) == 1) return true;
    if (inet_pton(AF_INET6, host.c_str(), address) == 1) return true;
    if (host.empty() || host.size() > 253) return false;
    for (const std::string& label : Split(host, '.')) {
        if (label.empty() || label.size() > 63 || label.front() == '-' || label.back() == '-') return false;
        for (unsigned char c : label)
            if (!std::isalnum(c) && c != '-') return false;
    }
    // All-numeric names are mistyped addresses, not host names.
    return !std::all_of(host.begin(), host.end(), [](unsigned char c) { return std::isdigit(c) || c == '.'; });
}

bool IsUserName(const std::string& name) {
    return !name.empty() && name.size() <= kMaxUserName &&
           std::all_of(name.begin(), name.end(), [](unsigned char c) {
               return std::isalnum(c) || c == '.' || c == '_' || c == '-';
           });
}

const char kUserNameRule[] = "a user name has 1 to 32 letters, digits, '.', '_' or '-'";

// "host[@port]" into host and port; "" or the problem.
std::string ParseHostPort(const std::string& text, std::string& host, unsigned& port) {
    std::size_t at = text.rfind('@');
    host = text.substr(0, at);
    if (at != std::string::npos) {
        std::string digits = text.substr(at + 1);
        if (digits.empty() || digits.size() > 5 ||
            !std::all_of(digits.begin(), digits.end(), [](unsigned char c) { return std::isdigit(c); }))
            return "the port '" + Shown(digits) + "' is not a number from 1 to 65535";
        port = static_cast<unsigned>(std::stoul(digits));
    }
    return "";
}

std::string CheckHostPort(const std::string& host, unsigned port) {
    if (!IsHostName(host)) return "'" + Shown(host) + "' is not an IP address or host name";
    if (port < 1 || port > 65535) return "the port " + std::to_string(port) + " is not from 1 to 65535";
    return "";
}

std::string CheckCommunity(const std::string& community) {
    if (community.empty() || community.size() > kMaxCommunityLength)
        return "a community has 1 to 64 characters, not " + std::to_string(community.size());
    if (!IsPrintableAscii(community)) return "a community holds printable ASCII characters only";
    return "";
}

// The hash of an item: "-" for none, else hexadecimal digits of one of the allowed lengths.
std::string ParseHash(const std::string& text, std::string& hash, const char* what,
                      std::initializer_list<std::size_t> lengths) {
    hash.clear();
    if (text == "-") return "";
    std::string digits = text.size() > 2 && text[0] == '0' && (text[1] == 'x' || text[1] == 'X') ? text.substr(2) : text;
    bool length_ok = std::find(lengths.begin(), lengths.end(), digits.size()) != lengths.end();
    if (!IsHex(digits) || !length_ok) {
        std::string allowed;
        for (std::size_t length : lengths) allowed += (allowed.empty() ? "" : " or ") + std::to_string(length);
        return std::string("the ") + what + " is not '-' or " + allowed + " hexadecimal digits";
    }
    hash = digits;
    std::transform(hash.begin(), hash.end(), hash.begin(), [](unsigned char c) { return std::tolower(c); });
    return "";
}

// A protocol name in any case, as its canonical spelling; "" when it is none of them.
std::string Canonical(const std::string& text, std::initializer_list<const char*> names) {
    for (const char* name : names)
        if (strcasecmp(text.c_str(), name) == 0) return name;
    return "";
}

std::string List(std::initializer_list<const char*> names) {
    std::string text;
    for (const char* name : names) text += (text.empty() ? "" : ", ") + std::string(name);
    return text;
}

// A list of exactly one empty item clears the setting.
bool MeansNone(const std::vector<std::string>& items) { return items.size() == 1 && items[0].empty(); }

void CheckCount(const std::vector<std::string>& items, std::size_t most, const char* what) {
    if (items.size() > most)
        throw HostError("At most " + std::to_string(most) + " " + what + " may be set, not " +
                        std::to_string(items.size()));
}

[[noreturn]] void Refuse(const char* kind, std::size_t index, const std::string& shown,
                         const std::string& problem) {
    throw HostError(std::string(kind) + " " + std::to_string(index + 1) +
                    (shown.empty() ? "" : " '" + Shown(shown) + "'") + ": " + problem);
}

std::string CheckOid(const std::string& oid) {
    std::string digits = !oid.empty() && oid[0] == '.' ? oid.substr(1) : oid;
    std::vector<std::string> components = Split(digits, '.');
    if (components.size() < 2 || components.size() > kMaxOidComponents)
        return "'" + Shown(oid) + "' is not an object identifier such as 1.3.6.1.6.3.1.1.5.1";
    for (const std::string& component : components) {
        if (component.empty() || component.size() > 10 ||
            !std::all_of(component.begin(), component.end(), [](unsigned char c) { return std::isdigit(c); }) ||
            std::stoull(component) > 4294967295ULL)
            return "'" + Shown(oid) + "' is not an object identifier such as 1.3.6.1.6.3.1.1.5.1";
    }
    return "";
}

std::string EventFilter(const std::string& value) {
    std::vector<std::string> oids = Split(value, ',');
    if (oids.size() > kMaxFilterOids)
        throw HostError("Option notraps: at most " + std::to_string(kMaxFilterOids) +
                        " object identifiers may be filtered, not " + std::to_string(oids.size()));
    std::string joined;
    for (const std::string& item : oids) {
        std::string oid = Trimmed(item);
        std::string problem = CheckOid(oid);
        if (!problem.empty())
            throw HostError("Option notraps: " + problem + "; give object identifiers separated by commas, or 'reset'");
        joined += (joined.empty() ? "" : ";") + oid;
    }
    return joined;
}

std::string OneOf(const std::string& key, const std::string& value, std::initializer_list<const char*> names) {
    std::string canonical = Canonical(value, names);
    if (canonical.empty())
        throw HostError("Option " + key + ": '" + Shown(value) + "' is not one of " + List(names));
    return canonical;
}

std::string FreeText(const std::string& key, const std::string& value) {
    long characters = TextCharacters(value);
    if (characters < 0)
        throw HostError("Option " + key + ": the text must be UTF-8 without control characters");
    if (static_cast<std::size_t>(characters) > kMaxText)
        throw HostError("Option " + key + ": at most 255 characters are allowed, not " + std::to_string(characters));
    return value;
}

std::string EngineId(const std::string& value) {
    if (!IsHex(value) || value.size() < 10 || value.size() > 32 || value.size() % 2)
        throw HostError("Option engineid: '" + Shown(value) +
                        "' is not an engine id of 10 to 32 hexadecimal digits in whole octets (an even count)");
    return value;
}

}  // namespace

// ---- item checks shared by the setters and the file -------------------------------------------

std::string CheckTargetItem(const TrapTarget& target) {
    std::string problem = CheckHostPort(target.host, target.port);
    return problem.empty() ? CheckCommunity(target.community) : problem;
}

std::string CheckUserItem(const User& user) {
    if (!IsUserName(user.name)) return kUserNameRule;
    if (user.model != "none" && user.model != "auth" && user.model != "priv")
        return "the model '" + Shown(user.model) + "' is not one of none, auth, priv";
    bool auth = !user.auth_hash.empty();
    bool priv = !user.priv_hash.empty();
    if (user.model == "none" && (auth || priv)) return "model none takes '-' for both hashes";
    if (user.model == "auth" && (!auth || priv)) return "model auth takes an authentication hash and '-' for the privacy hash";
    if (user.model == "priv" && (!auth || !priv)) return "model priv takes both hashes";
    return "";
}

std::string CheckRemoteUserItem(const RemoteUser& user) {
    if (!IsUserName(user.name)) return kUserNameRule;
    if (user.auth_protocol.empty()) return "the authentication protocol is not one of none, MD5, SHA1";
    if (user.priv_protocol.empty()) return "the privacy protocol is not one of none, AES";
    const std::size_t auth_digits = user.auth_protocol == "MD5" ? 32 : user.auth_protocol == "SHA1" ? 40 : 0;
    if (user.auth_hash.size() != auth_digits)
        return auth_digits ? "protocol " + user.auth_protocol + " takes an authentication hash of " +
                                 std::to_string(auth_digits) + " hexadecimal digits"
                           : "protocol none takes '-' for the authentication hash";
    const std::size_t priv_digits = user.priv_protocol == "AES" ? 32 : 0;
    if (user.priv_hash.size() != priv_digits)
        return priv_digits ? "protocol AES takes a privacy hash of 32 hexadecimal digits"
                           : "privacy protocol none takes '-' for the privacy hash";
    if (priv_digits && !auth_digits) return "privacy needs an authentication protocol too";
    std::string id = user.engine_id;
    if (!IsHex(id) || id.size() < 10 || id.size() > 32 || id.size() % 2)
        return "the engine id is not 10 to 32 hexadecimal digits in whole octets";
    return "";
}

std::string CheckV3TargetItem(const V3Target& target) {
    std::string problem = CheckHostPort(target.host, target.port);
    if (!problem.empty()) return problem;
    if (!IsUserName(target.user)) return kUserNameRule;
    if (target.level != "none" && target.level != "auth" && target.level != "priv")
        return "the security level '" + Shown(target.level) + "' is not one of none, auth, priv";
    if (target.type != "trap" && target.type != "inform")
        return "the type '" + Shown(target.type) + "' is not trap or inform";
    return "";
}

// ---- the setters' lists ---------------------------------------------------------------------------

std::vector<std::string> ParseCommunities(const std::vector<std::string>& items) {
    if (MeansNone(items)) return {};
    CheckCount(items, kMaxCommunities, "communities");
    std::set<std::string> seen;
    for (std::size_t i = 0; i < items.size(); ++i) {
        std::string problem = CheckCommunity(items[i]);
        if (!problem.empty()) Refuse("Community", i, "", problem);
        if (!seen.insert(items[i]).second) Refuse("Community", i, "", "the same community is given twice");
    }
    return items;
}

std::vector<TrapTarget> ParseTargets(const std::vector<std::string>& items) {
    if (MeansNone(items)) return {};
    CheckCount(items, kMaxTargets, "trap targets");
    std::vector<TrapTarget> targets;
    for (std::size_t i = 0; i < items.size(); ++i) {
        const std::string& item = items[i];
        std::size_t slash = item.find('/');
        std::string address = item.substr(0, slash);
        if (slash == std::string::npos)
            Refuse("Trap target", i, address, "expected ip-or-hostname[@port]/community");
        TrapTarget target;
        target.community = item.substr(slash + 1);
        std::string problem = ParseHostPort(address, target.host, target.port);
        if (problem.empty()) problem = CheckTargetItem(target);
        if (!problem.empty()) Refuse("Trap target", i, address, problem);
        targets.push_back(target);
    }
    return targets;
}

std::vector<User> ParseUsers(const std::vector<std::string>& items) {
    if (MeansNone(items)) return {};
    CheckCount(items, kMaxUsers, "users");
    std::vector<User> users;
    for (std::size_t i = 0; i < items.size(); ++i) {
        std::vector<std::string> parts = Split(items[i], '/');
        std::string name = parts[0];
        if (parts.size() != 4) Refuse("User", i, name, "expected user/-|auth-hash/-|priv-hash/model");
        User user{name, "", "", parts[3]};
        std::string problem = ParseHash(parts[1], user.auth_hash, "authentication hash", {32, 40});
        if (problem.empty()) problem = ParseHash(parts[2], user.priv_hash, "privacy hash", {32});
        if (problem.empty()) problem = CheckUserItem(user);
        if (!problem.empty()) Refuse("User", i, name, problem);
        users.push_back(user);
    }
    return users;
}

std::vector<RemoteUser> ParseRemoteUsers(const std::vector<std::string>& items) {
    if (MeansNone(items)) return {};
    CheckCount(items, kMaxRemoteUsers, "remote users");
    std::vector<RemoteUser> users;
    for (std::size_t i = 0; i < items.size(); ++i) {
        std::vector<std::string> parts = Split(items[i], '/');
        std::string name = parts[0];
        if (parts.size() != 6)
            Refuse("Remote user", i, name,
                   "expected user/auth-proto/-|auth-hash/priv-proto/-|priv-hash/engine-id");
        RemoteUser user;
        user.name = name;
        user.auth_protocol = Canonical(parts[1], {"none", "MD5", "SHA1"});
        user.priv_protocol = Canonical(parts[3], {"none", "AES"});
        std::string problem = ParseHash(parts[2], user.auth_hash, "authentication hash", {32, 40});
        if (problem.empty()) problem = ParseHash(parts[4], user.priv_hash, "privacy hash", {32});
        std::string id = parts[5];
        if (id.size() > 2 && id[0] == '0' && (id[1] == 'x' || id[1] == 'X')) id = id.substr(2);
        std::transform(id.begin(), id.end(), id.begin(), [](unsigned char c) { return std::tolower(c); });
        user.engine_id = id;
        if (problem.empty()) problem = CheckRemoteUserItem(user);
        if (!problem.empty()) Refuse("Remote user", i, name, problem);
        users.push_back(user);
    }
    return users;
}

std::vector<V3Target> ParseV3Targets(const std::vector<std::string>& items) {
    if (MeansNone(items)) return {};
    CheckCount(items, kMaxV3Targets, "SNMPv3 targets");
    std::vector<V3Target> targets;
    for (std::size_t i = 0; i < items.size(); ++i) {
        std::vector<std::string> parts = Split(items[i], '/');
        if (parts.size() != 4)
            Refuse("SNMPv3 target", i, parts[0],
                   "expected ip-or-hostname[@port]/remote-user/security-level/trap|inform");
        V3Target target;
        target.user = parts[1];
        target.level = parts[2];
        target.type = parts[3];
        std::string problem = ParseHostPort(parts[0], target.host, target.port);
        if (problem.empty()) problem = CheckV3TargetItem(target);
        if (!problem.empty()) Refuse("SNMPv3 target", i, parts[0], problem);
        targets.push_back(target);
    }
    return targets;
}

void ApplyOptions(const std::map<std::string, std::string>& given,
                  std::map<std::string, std::string>& options) {
    std::map<std::string, std::string> result = options;
    for (const auto& [key, value] : given) {
        if (key == "EventFilter") {
            if (value == "reset")
                result.erase(key);
            else
                result[key] = EventFilter(value);
        } else if (key == "EnvEventSource") {
            result[key] = OneOf("hwsrc", value, {"indications", "sensors"});
        } else if (key == "authentication") {
            result[key] = OneOf(key, value, {"none", "MD5", "SHA1"});
        } else if (key == "privacy") {
            result[key] = OneOf(key, value, {"none", "AES128"});
        } else if (key == "loglevel") {
            result[key] = OneOf(key, value, {"debug", "info", "warning", "error"});
        } else if (key == "engineid") {
            result[key] = EngineId(value);
        } else if (key == "syslocation" || key == "syscontact") {
            result[key] = FreeText(key, value);
        } else {
            throw HostError("Unknown SNMP agent option '" + Shown(key) +
                            "'; the options are EnvEventSource, EventFilter, authentication, engineid, "
                            "loglevel, privacy, syscontact and syslocation");
        }
    }
    options.swap(result);
}

void CheckWhole(const AgentConfig& config) {
    auto option = [&](const char* key) {
        auto found = config.options.find(key);
        return found == config.options.end() ? std::string() : found->second;
    };
    const std::string auth = option("authentication");
    const std::string priv = option("privacy");
    std::set<std::string> names;
    for (const User& user : config.users) {
        if (!names.insert(user.name).second) throw HostError("User '" + user.name + "' is given twice");
        if (user.model == "none") continue;
        if (auth != "MD5" && auth != "SHA1")
            throw HostError("User '" + user.name + "' has security model " + user.model +
                            ", but the authentication protocol is " + (auth.empty() ? "not set" : "'" + Shown(auth) + "'") +
                            "; set --authentication MD5 or SHA1");
        std::size_t digits = 2 * snmpkeys::DigestLength(auth == "MD5" ? snmpkeys::Digest::kMd5 : snmpkeys::Digest::kSha1);
        if (user.auth_hash.size() != digits)
            throw HostError("User '" + user.name + "': the authentication protocol " + auth + " takes a hash of " +
                            std::to_string(digits) + " hexadecimal digits, not " +
                            std::to_string(user.auth_hash.size()) + "; make it with 'system snmp hash'");
        if (user.model == "priv" && priv != "AES128")
            throw HostError("User '" + user.name + "' has security model priv, but the privacy protocol is " +
                            (priv.empty() ? "not set" : "'" + Shown(priv) + "'") + "; set --privacy AES128");
    }
    std::map<std::string, const RemoteUser*> remote;
    for (const RemoteUser& user : config.remote_users)
        if (!remote.emplace(user.name, &user).second)
            throw HostError("Remote user '" + user.name + "' is given twice");
    for (const V3Target& target : config.v3_targets) {
        const std::string shown = "SNMPv3 target '" + target.host + "@" + std::to_string(target.port) + "'";
        auto found = remote.find(target.user);
        if (found == remote.end())
            throw HostError(shown + " names the remote user '" + target.user +
                            "', which is not configured; set it with --remote-users");
        const RemoteUser& user = *found->second;
        if (target.level != "none" && user.auth_protocol == "none")
            throw HostError(shown + " asks for level " + target.level + ", but remote user '" + user.name +
                            "' has no authentication protocol");
        if (target.level == "priv" && user.priv_protocol == "none")
            throw HostError(shown + " asks for level priv, but remote user '" + user.name +
                            "' has no privacy protocol");
    }
}

AgentConfig FactoryConfig() {
    AgentConfig config;
    config.options = {{"EnvEventSource", "indications"}, {"loglevel", "info"}};
    return config;
}

// ---- texts ------------------------------------------------------------------------------------------

namespace {
std::string Address(const std::string& host, unsigned port) { return host + "@" + std::to_string(port); }
std::string HashText(const std::string& hash) { return hash.empty() ? "-" : hash; }
}  // namespace

std::string TargetText(const TrapTarget& target) {
    return Address(target.host, target.port) + "/" + target.community;
}

std::string UserText(const User& user) {
    return user.name + "/" + HashText(user.auth_hash) + "/" + HashText(user.priv_hash) + "/" + user.model;
}

std::string RemoteUserText(const RemoteUser& user) {
    return user.name + "/" + user.auth_protocol + "/" + HashText(user.auth_hash) + "/" +
           user.priv_protocol + "/" + HashText(user.priv_hash) + "/" + user.engine_id;
}

std::string V3TargetText(const V3Target& target) {
    return Address(target.host, target.port) + "/" + target.user + "/" + target.level + "/" + target.type;
}

nlohmann::ordered_json MaskedTargets(const std::vector<TrapTarget>& targets) {
    nlohmann::ordered_json list = nlohmann::ordered_json::array();
    for (const TrapTarget& target : targets) list.push_back(Address(target.host, target.port) + "/***");
    return list;
}

nlohmann::ordered_json MaskedUsers(const std::vector<User>& users) {
    nlohmann::ordered_json list = nlohmann::ordered_json::array();
    for (User user : users) {
        if (!user.auth_hash.empty()) user.auth_hash = "***";
        if (!user.priv_hash.empty()) user.priv_hash = "***";
        list.push_back(UserText(user));
    }
    return list;
}

nlohmann::ordered_json MaskedRemoteUsers(const std::vector<RemoteUser>& users) {
    nlohmann::ordered_json list = nlohmann::ordered_json::array();
    for (RemoteUser user : users) {
        if (!user.auth_hash.empty()) user.auth_hash = "***";
        if (!user.priv_hash.empty()) user.priv_hash = "***";
        list.push_back(RemoteUserText(user));
    }
    return list;
}

}  // namespace snmp
}  // namespace norlithctl
