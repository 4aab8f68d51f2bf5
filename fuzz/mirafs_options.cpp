// Fuzzes the memory file system's mount option parser with arbitrary option strings: it never
// fails other than with an errno, leaves its output alone when it refuses, and what it accepts
// reads back the same once written out in its canonical form.
#include <simhost/Mirafs.h>

#include <cerrno>
#include <cstddef>
#include <cstdint>
#include <cstdlib>
#include <string>

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
    const std::string text(reinterpret_cast<const char*>(data), size);
    simhost::mirafs::MountOptions options;
    options.name = "untouched";
    const int error = simhost::mirafs::ParseMountOptions(text, &options);
    if (error != 0) {
        if ((error != EINVAL && error != ENAMETOOLONG) || options.name != "untouched") std::abort();
        return 0;
    }
    const std::string canonical =
        std::to_string(options.minimum_mib) + "," + std::to_string(options.maximum_mib) + "," +
        std::to_string(options.reserved_inodes) + "," + std::to_string(options.maximum_inodes) + "," +
        (options.coredump ? "1" : "0") + "," + options.permissions + "," + options.name;
    simhost::mirafs::MountOptions again;
    if (simhost::mirafs::ParseMountOptions(canonical, &again) != 0) std::abort();
    if (again.minimum_mib != options.minimum_mib || again.maximum_mib != options.maximum_mib ||
        again.reserved_inodes != options.reserved_inodes || again.maximum_inodes != options.maximum_inodes ||
        again.coredump != options.coredump || again.permissions != options.permissions ||
        again.name != options.name || options.minimum_mib > options.maximum_mib ||
        options.reserved_inodes > options.maximum_inodes || options.permissions.size() != 4)
        std::abort();
    return 0;
}
