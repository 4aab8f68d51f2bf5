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

// ---- memory file system --------------------------------------------------------------------

// Node 1579: the memory file system's inode accounting. Seven 32-bit counters; the rest is 0.
struct MirafsStatus {
    static constexpr int kNode = 1579;
    static constexpr std::size_t kSize = 1128;
    static constexpr Field kTotalInodes{8, 4};
    static constexpr Field kUsedInodes{12, 4};
    static constexpr Field kPeakUsedInodes{16, 4};
    static constexpr Field kUnlinkedInodes{20, 4};
    static constexpr Field kPeakUnlinkedInodes{24, 4};
    static constexpr Field kReservedInodes{28, 4};
    static constexpr Field kPeakReservedInodes{32, 4};
};

// Node 1585: the ramdisks, one instance per ramdisk name; its record is their count.
struct MirafsRamdiskList {
    static constexpr int kNode = 1585;
    static constexpr std::size_t kSize = 4;
    static constexpr Field kCount{0, 4};
};

// Node 1586: one ramdisk, addressed by its name; packed, so the inode counters are unaligned.
struct MirafsRamdisk {
    static constexpr int kNode = 1586;
    static constexpr std::size_t kSize = 180;
    static constexpr Field kReservedMib{0, 4};
    static constexpr Field kMaximumMib{4, 4};
    static constexpr Field kUsedPages{8, 4};       // 4 KiB units
    static constexpr Field kPeakUsedPages{12, 4};  // 4 KiB units
    static constexpr Field kCoredump{24, 1};
    static constexpr Field kSystem{25, 1};
    static constexpr Field kMountPoint{30, 132};
    static constexpr Field kMaximumInodes{162, 4};
    static constexpr Field kAllocatedInodes{166, 4};
    static constexpr Field kUsedInodes{170, 4};
};

// Node 1582: the tardisks, one instance per tardisk name; its record is their count.
struct MirafsTardiskList {
    static constexpr int kNode = 1582;
    static constexpr std::size_t kSize = 4;
    static constexpr Field kCount{0, 4};
};

// Node 1583: one tardisk, addressed by its name.
struct MirafsTardisk {
    static constexpr int kNode = 1583;
    static constexpr std::size_t kSize = 20;
    static constexpr Field kSizeBytes{0, 4};
    static constexpr Field kSystem{8, 1};
};

}  // namespace Records
}  // namespace Util
}  // namespace NorlithCtl
