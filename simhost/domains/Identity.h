// The identity domain: what the host is (product, version, build, update) and which machine it
// is (system UUID, boot NIC, boot file system, stateless boot NIC).
//
// Scenario section "identity" (every member optional; the default host's identity otherwise):
//   product            text of 1..31 bytes        version   text of at most 31 bytes
//   build              text of at most 95 bytes   update    text of at most 151 bytes
//   system_uuid        canonical UUID, 8-4-4-4-12 hexadecimal digits
//   boot_nic_mac, stateless_boot_nic_mac   "" or six two-digit hexadecimal groups joined by ':'
//   boot_fs_uuid       "" or at most 63 hexadecimal digits and '-'
// The text limits are those of the product version record (node 1238), so encoding never
// truncates.
#pragma once

#include <simhost/Mapping.h>
#include <simhost/State.h>

#include <string>

namespace simhost {
namespace identity {

bool IsUuid(const std::string& text);
bool IsMacOrEmpty(const std::string& text);
bool IsFsUuidOrEmpty(const std::string& text);

struct Identity {
    static constexpr char kSection[] = "identity";
    static constexpr StateKind kKind = StateKind::kSingleton;

    std::string product;
    std::string version;
    std::string build;
    std::string update;
    std::string system_uuid;
    std::string boot_nic_mac;
    std::string boot_fs_uuid;
    std::string stateless_boot_nic_mac;

    static Identity Default() {
        return {"Quarn", "8.0.2", "Build 22380479", "1", "6523a1f4-8c1e-4d2b-9f3a-0050569a2b3c",
                "00:50:56:a1:2b:3c", "6523a1f4-5e2d9b70-7c41-0050569a2b3c", ""};
    }
};

template <class V>
void Describe(V& v, Identity& s) {
    const Pattern uuid{IsUuid, "expected a UUID of the form xxxxxxxx-xxxx-xxxx-xxxx-xxxxxxxxxxxx"};
    const Pattern mac{IsMacOrEmpty, "expected \"\" or a MAC address of the form xx:xx:xx:xx:xx:xx"};
    v("product", s.product, Text(31, false));
    v("version", s.version, Text(31));
    v("build", s.build, Text(95));
    v("update", s.update, Text(151));
    v("system_uuid", s.system_uuid, uuid);
    v("boot_nic_mac", s.boot_nic_mac, mac);
    v("boot_fs_uuid", s.boot_fs_uuid,
      Pattern{IsFsUuidOrEmpty, "expected \"\" or at most 63 hexadecimal digits and '-'"});
    v("stateless_boot_nic_mac", s.stateless_boot_nic_mac, mac);
}

inline bool IsHexDigit(char c) {
    return (c >= '0' && c <= '9') || (c >= 'a' && c <= 'f') || (c >= 'A' && c <= 'F');
}

inline bool IsUuid(const std::string& text) {
    if (text.size() != 36) return false;
    for (std::size_t i = 0; i < text.size(); ++i) {
        bool dash = i == 8 || i == 13 || i == 18 || i == 23;
        if (dash ? text[i] != '-' : !IsHexDigit(text[i])) return false;
    }
    return true;
}

inline bool IsMacOrEmpty(const std::string& text) {
    if (text.empty()) return true;
    if (text.size() != 17) return false;
    for (std::size_t i = 0; i < text.size(); ++i)
        if (i % 3 == 2 ? text[i] != ':' : !IsHexDigit(text[i])) return false;
    return true;
}

inline bool IsFsUuidOrEmpty(const std::string& text) {
    if (text.size() > 63) return false;
    for (char c : text)
        if (!IsHexDigit(c) && c != '-') return false;
    return true;
}

}  // namespace identity
}  // namespace simhost
