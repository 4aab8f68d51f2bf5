// Fuzzes the bounded record readers with arbitrary records, offsets and widths, as the version,
// ramdisk and tardisk commands use them: no read may leave the record, and a text never holds a
// NUL or runs past the record's end.
#include "frame/Record.h"

#include <cstddef>
#include <cstdint>
#include <cstdlib>
#include <vector>

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
    if (size < 2) return 0;
    const std::size_t offset = data[0];
    const std::size_t width = data[1] % 10;
    // A heap copy of exactly the record's size, so that the sanitizer sees any overrun.
    std::vector<char> record(data + 2, data + size);
    const char* bytes = record.empty() ? nullptr : record.data();
    const std::size_t length = record.size();
    if (!bytes) return 0;

    const std::string text = TarselCli::System::RecordText(bytes, length, offset);
    if (text.find('\0') != std::string::npos) std::abort();
    if (offset < length ? text.size() > length - offset : !text.empty()) std::abort();

    const std::uint64_t number = TarselCli::System::RecordUnsigned(bytes, length, offset, width);
    if (width < 8 && (number >> (8 * width)) != 0) std::abort();
    return 0;
}
