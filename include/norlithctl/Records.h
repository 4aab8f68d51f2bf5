// The layouts of the kernel information records that NorlithCtl::Util::Sysinfo returns: for each
// node, its identifier, its record size and the offset and width of every field. Records are
// packed and little-endian; a text field is NUL-terminated within its width (its last byte is
// always NUL). The host layer encodes records from these layouts and commands read them with
// the same ones, so a layout is written exactly once.
#pragma once

#include <cstddef>

namespace NorlithCtl {
namespace Util {
namespace Records {

// A field of a record: its byte offset and its width in bytes.
struct Field {
    std::size_t offset;
    std::size_t width;
};

// Node 1238: the product version record.
struct ProductVersion {
    static constexpr int kNode = 1238;
    static constexpr std::size_t kSize = 312;
    static constexpr Field kProduct{0, 32};
    static constexpr Field kVersion{32, 32};
    static constexpr Field kBuild{64, 96};
    static constexpr Field kUpdate{160, 152};
};

}  // namespace Records
}  // namespace Util
}  // namespace NorlithCtl
