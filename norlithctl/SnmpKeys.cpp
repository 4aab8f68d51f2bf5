#include "SnmpKeys.h"

#include "SnmpModule.h"

namespace norlithctl {
namespace snmpkeys {

std::size_t DigestLength(Digest digest) { return digest == Digest::kMd5 ? 16 : 20; }

// The digests themselves live in the SNMP support module, loaded when first needed.
std::string LocalizedAuthKey(Digest digest, const std::string& secret, const std::string& engine_id) {
    return SnmpModule().localized_auth_key(digest, secret, engine_id);
}

std::string LocalizedAes128Key(Digest digest, const std::string& secret,
                               const std::string& engine_id) {
    return SnmpModule().localized_aes128_key(digest, secret, engine_id);
}

std::string ToHex(const std::string& bytes) {
    static const char kDigits[] = "0123456789abcdef";
    std::string text;
    text.reserve(bytes.size() * 2);
    for (unsigned char c : bytes) {
        text += kDigits[c >> 4];
        text += kDigits[c & 15];
    }
    return text;
}

bool FromHex(const std::string& text, std::string* bytes) {
    auto value = [](char c) -> int {
        if (c >= '0' && c <= '9') return c - '0';
        if (c >= 'a' && c <= 'f') return c - 'a' + 10;
        if (c >= 'A' && c <= 'F') return c - 'A' + 10;
        return -1;
    };
    if (text.size() % 2) return false;
    std::string out;
    out.reserve(text.size() / 2);
    for (std::size_t i = 0; i < text.size(); i += 2) {
        int high = value(text[i]);
        int low = value(text[i + 1]);
        if (high < 0 || low < 0) return false;
        out += static_cast<char>(high * 16 + low);
    }
    bytes->swap(out);
    return true;
}

}  // namespace snmpkeys
}  // namespace norlithctl
