// The digests of the SNMPv3 keys (SnmpKeys.h), computed with OpenSSL. Part of the SNMP support
// module, so that programs that never make a key never load OpenSSL.
#include "../SnmpKeys.h"
#include "../SnmpModule.h"

#include <openssl/evp.h>

#include <memory>
#include <stdexcept>

namespace norlithctl {
namespace snmpmodule {
namespace {

using snmpkeys::Digest;

// The secret is stretched over this many octets before hashing, which makes guessing a secret
// from a key expensive.
constexpr std::size_t kStretch = 1048576;

const EVP_MD* Md(Digest digest) { return digest == Digest::kMd5 ? EVP_md5() : EVP_sha1(); }

struct CtxFree {
    void operator()(EVP_MD_CTX* ctx) const { EVP_MD_CTX_free(ctx); }
};

// One digest computation fed in pieces.
class Hasher {
public:
    explicit Hasher(Digest digest) : ctx_(EVP_MD_CTX_new()) {
        if (!ctx_ || EVP_DigestInit_ex(ctx_.get(), Md(digest), nullptr) != 1)
            throw std::runtime_error("the SNMP key digest is not available");
    }
    void Update(const void* data, std::size_t size) {
        if (EVP_DigestUpdate(ctx_.get(), data, size) != 1)
            throw std::runtime_error("the SNMP key digest failed");
    }
    std::string Final() {
        unsigned char out[EVP_MAX_MD_SIZE];
        unsigned int length = 0;
        if (EVP_DigestFinal_ex(ctx_.get(), out, &length) != 1)
            throw std::runtime_error("the SNMP key digest failed");
        return std::string(reinterpret_cast<const char*>(out), length);
    }

private:
    std::unique_ptr<EVP_MD_CTX, CtxFree> ctx_;
};

}  // namespace

std::string PasswordToKey(Digest digest, const std::string& secret) {
    if (secret.empty()) throw std::invalid_argument("an SNMP key needs a secret");
    Hasher hasher(digest);
    // Fed in blocks of 64 octets, the secret repeated across block boundaries.
    char block[64];
    std::size_t at = 0;
    for (std::size_t done = 0; done < kStretch; done += sizeof block) {
        for (char& c : block) {
            c = secret[at];
            if (++at == secret.size()) at = 0;
        }
        hasher.Update(block, sizeof block);
    }
    return hasher.Final();
}

std::string LocalizeKey(Digest digest, const std::string& key, const std::string& engine_id) {
    Hasher hasher(digest);
    hasher.Update(key.data(), key.size());
    hasher.Update(engine_id.data(), engine_id.size());
    hasher.Update(key.data(), key.size());
    return hasher.Final();
}

std::string LocalizedAuthKey(Digest digest, const std::string& secret, const std::string& engine_id) {
    return LocalizeKey(digest, PasswordToKey(digest, secret), engine_id);
}

std::string LocalizedAes128Key(Digest digest, const std::string& secret,
                               const std::string& engine_id) {
    return snmpmodule::LocalizedAuthKey(digest, secret, engine_id).substr(0, 16);
}

}  // namespace snmpmodule
}  // namespace norlithctl
