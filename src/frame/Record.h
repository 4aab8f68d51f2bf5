// Reading fields of the fixed-size binary records that the kernel information reader fills, at
// the offsets and widths of their layouts (<norlithctl/Records.h>).
//
// A record is a caller-owned byte buffer of known size. Every read is bounded by that size: a text
// field ends at its first NUL or at the end of the record, whichever comes first, and a number
// that would extend past the end reads as 0. Records are little-endian.
#pragma once

#include <cstddef>
#include <cstdint>
#include <cstring>
#include <string>

#include <norlithctl/Records.h>

namespace TarselCli {
namespace System {

// The text at offset, up to the first NUL, never read past the record's end.
inline std::string RecordText(const char* record, std::size_t size, std::size_t offset) {
    if (offset >= size) return std::string();
    const char* start = record + offset;
    const void* nul = std::memchr(start, '\0', size - offset);
    std::size_t length = nul ? static_cast<const char*>(nul) - start : size - offset;
    return std::string(start, length);
}

// The text of a field: from its offset up to the first NUL, never past the record's end. (A
// well-formed record has that NUL within the field's width; the read does not rely on it.)
inline std::string RecordText(const char* record, std::size_t size,
                              const NorlithCtl::Util::Records::Field& field) {
    return RecordText(record, size, field.offset);
}

// The unsigned little-endian number of width bytes (at most 8) at offset.
inline std::uint64_t RecordUnsigned(const char* record, std::size_t size, std::size_t offset,
                                    std::size_t width) {
    if (width > 8 || offset > size || width > size - offset) return 0;
    std::uint64_t value = 0;
    for (std::size_t i = width; i-- > 0;) {
        value = (value << 8) | static_cast<unsigned char>(record[offset + i]);
    }
    return value;
}

}  // namespace System
}  // namespace TarselCli
