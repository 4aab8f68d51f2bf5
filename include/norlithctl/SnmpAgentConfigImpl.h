// NorlithCtl::System::SnmpAgentConfigImpl: the host's SNMP agent configuration, kept in the file
// /etc/tarsel/snmp.xml of the host (docs/host/snmp.md gives its format and rules).
//
// Built per command on the stack. Getters read the file on every call (a missing file reads as
// the factory configuration) and show the staged changes on top of it; setters check what they
// are given at once and stage it; SaveConfig() applies every staged change and writes the file
// once, atomically, journaling the change (secrets masked). Nothing is written before
// SaveConfig(), and nothing at all when any rule refuses. The object hands out nothing by
// pointer; vectors and maps passed in are the caller's.
//
// Every operation, construction included, may throw Ravel::Lib::RavelException: a fault set on
// the simulated host, a value a rule refuses (the message names the item and what is accepted),
// or a configuration file that cannot be used (only ValidConfigFile() reports a malformed file
// without throwing). GenerateHash and TestUser report their own refusals in their message
// argument instead. Secrets never reach a message, the journal or a log.
#pragma once

#include <norlithctl/Export.h>

#include <norlithctl/Testing.h>

#include <map>
#include <memory>
#include <string>
#include <vector>

namespace NorlithCtl {
namespace System {

class NORLITHCTL_API SnmpAgentConfigImpl {
public:
    SnmpAgentConfigImpl();
    virtual ~SnmpAgentConfigImpl();

    // ---- reading

    // False when the configuration file exists but is not well-formed XML (or not a regular
    // file, or larger than 1 MiB).
    virtual bool ValidConfigFile() const;
    virtual bool GetEnabled() const;
    // The UDP port the agent is polled on.
    virtual int GetPort() const;
    // Each appends to the vector, in stored order: communities; v1 targets as
    // host@port/community; users as user/auth-hash/priv-hash/model ('-' for no hash); remote
    // users as user/auth-proto/auth-hash/priv-proto/priv-hash/engine-id; v3 targets as
    // host@port/remote-user/level/trap|inform.
    virtual void GetCommunities(std::vector<std::string>& communities) const;
    virtual void GetTrapTargets(std::vector<std::string>& targets) const;
    virtual void GetUsers(std::vector<std::string>& users) const;
    virtual void GetRemoteUsers(std::vector<std::string>& users) const;
    virtual void GetV3Traps(std::vector<std::string>& targets) const;
    // Adds every stored option (EnvEventSource, EventFilter, engineid, syslocation, ...; also
    // keys the agent does not know, as the file holds them).
    virtual void GetOptions(std::map<std::string, std::string>& options) const;
    virtual bool IsLargeStorageSupported() const;

    // ---- staging changes (applied by SaveConfig)

    // Discards what is stored and staged so far: the factory configuration.
    virtual void Reset();
    virtual void SetEnabled(bool enabled);
    virtual void SetPort(unsigned short port);
    // Lists replace the stored list; a list of one empty item clears it.
    virtual void SetCommunities(const std::vector<std::string>& communities);
    virtual void SetTrapTargets(const std::vector<std::string>& targets);
    virtual void SetUsers(const std::vector<std::string>& users);
    virtual void SetRemoteUsers(const std::vector<std::string>& users);
    virtual void SetV3Targets(const std::vector<std::string>& targets);
    virtual void SetLargeStorageSupport(bool supported);
    // Sets the given options; EventFilter takes comma-separated OIDs (stored joined by ";") or
    // "reset", which removes the filter.
    virtual void SetOptions(const std::map<std::string, std::string>& options);
    // Checks the whole resulting configuration and writes it, once, atomically.
    virtual void SaveConfig();

    // ---- keys and tests

    // The localized keys (lower-case hexadecimal) of the secrets for this agent's engine id (the
    // stored engineid, else the host's default, derived from its system UUID): auth_hash for
    // auth_proto (MD5 or SHA1), priv_hash the AES-128 key for priv_proto (AES128) when
    // priv_secret is not empty, else "". False with error set when a protocol cannot make one.
    virtual bool GenerateHash(const std::string& auth_secret, const std::string& priv_secret,
                              const std::string& auth_proto, const std::string& priv_proto,
                              std::string& auth_hash, std::string& priv_hash,
                              std::string& error) const;
    // Whether user exists and each secret given (not empty) produces its stored hash; message
    // says which, in one line.
    virtual bool TestUser(const std::string& user, const std::string& auth_secret,
                          const std::string& priv_secret, std::string& message) const;
    // Sends a warmStart notification to every configured v1 and v3 target (only to the one whose
    // text, as the getters show it, equals target when that is not empty). True when every one
    // was delivered; otherwise throws, naming each target that failed and why.
    virtual bool TestTrap(std::string target);

private:
    SnmpAgentConfigImpl(const SnmpAgentConfigImpl&);
    SnmpAgentConfigImpl& operator=(const SnmpAgentConfigImpl&);

    struct Pending;
    std::unique_ptr<Pending> pending_;
    LiveObject live_;
};

}  // namespace System
}  // namespace NorlithCtl
