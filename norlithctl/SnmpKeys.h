// The SNMPv3 user-based security model's keys: a secret turned into a key (password to key) and
// that key bound to one engine (localization), for the MD5 and SHA1 authentication protocols,
// and the AES-128 privacy key derived from a secret in the same way and cut to 16 octets.
//
// Pure functions over byte strings; the digests are OpenSSL's, in the SNMP support module
// (SnmpModule.h), loaded when a key is first made. Nothing is kept. Keys and secrets are returned,
// never logged. Internal to the host-control library.
#pragma once

#include <string>

namespace norlithctl {
namespace snmpkeys {

enum class Digest { kMd5, kSha1 };

// The digest's output length in octets: 16 (MD5) or 20 (SHA1).
std::size_t DigestLength(Digest digest);

// The localized authentication key of a secret for an engine: the master key of the secret (the
// digest of one megabyte of the secret repeated; secret must not be empty), localized to the
// engine (digest of key + engine id + key). Computed by the SNMP support module (SnmpModule.h).
std::string LocalizedAuthKey(Digest digest, const std::string& secret, const std::string& engine_id);

// The AES-128 privacy key of a secret for an engine: the localized key of the authentication
// protocol's digest, cut to its first 16 octets.
std::string LocalizedAes128Key(Digest digest, const std::string& secret, const std::string& engine_id);

// Lower-case hexadecimal text of bytes, and back (false when text is not whole octets of
// hexadecimal digits, either case).
std::string ToHex(const std::string& bytes);
bool FromHex(const std::string& text, std::string* bytes);

}  // namespace snmpkeys
}  // namespace norlithctl
