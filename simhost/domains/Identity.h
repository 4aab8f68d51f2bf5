// The identity domain: what the host is (product, version, build, update) and which machine it
// is (system UUID, boot NIC, boot file system, stateless boot NIC).
//
// Scenario section "identity" (all members required):
//   product, version   text of 1..31 bytes (product) and 0..31 bytes (version)
//   build              text of at most 95 bytes
//   update             text of at most 151 bytes
//   system_uuid        canonical UUID, 8-4-4-4-12 hexadecimal digits
//   boot_nic_mac, stateless_boot_nic_mac   "" or six two-digit hexadecimal groups joined by ':'
//   boot_fs_uuid       "" or at most 63 hexadecimal digits and '-'
// The limits are those of the product version record, so encoding never truncates.
#pragma once

#include <simhost/Export.h>

#include <simhost/Domain.h>

#include <array>
#include <string>

namespace simhost {
namespace identity {

constexpr std::size_t kProductMax = 31;
constexpr std::size_t kVersionMax = 31;
constexpr std::size_t kBuildMax = 95;
constexpr std::size_t kUpdateMax = 151;
constexpr std::size_t kBootFsUuidMax = 63;

struct Identity {
    std::string product;
    std::string version;
    std::string build;
    std::string update;
    std::string system_uuid;
    std::string boot_nic_mac;
    std::string boot_fs_uuid;
    std::string stateless_boot_nic_mac;
};

// Kernel information node 1238: NUL-terminated text at offsets 0 (product), 32 (version),
// 64 (build) and 160 (update); every other byte zero.
constexpr int kProductVersionNode = 1238;
constexpr std::size_t kProductVersionSize = 312;
constexpr std::size_t kProductOffset = 0;
constexpr std::size_t kVersionOffset = 32;
constexpr std::size_t kBuildOffset = 64;
constexpr std::size_t kUpdateOffset = 160;

// Encodes the record; the fields must be within their limits (checked by Check/Parse).
SIMHOST_API std::array<unsigned char, kProductVersionSize> EncodeProductVersion(const Identity& identity);

// "" when every field is acceptable, else "MEMBER: reason" for the first one that is not.
SIMHOST_API std::string Check(const Identity& identity);

// The host's current identity.
SIMHOST_API Identity Read(Db& db);

SIMHOST_API const Domain& TheDomain();

}  // namespace identity
}  // namespace simhost
