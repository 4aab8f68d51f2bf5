// The files domain: the host's own files under root/, as a scenario section.
//
// Scenario section "files" (default: the files below simhost/defaults/root/ of the source tree
// and the files simhost/defaults/root.manifest lists, embedded at build time): an array of
// entries, each naming a path the host sees
// (absolute, normalised: no "." or ".." components, no doubled or trailing "/", components of at
// most 255 bytes, the whole at most 4095 bytes):
//   {"path": "/etc/motd", "text": "...", "mode": "0644"}      a regular file with UTF-8 text
//   {"path": "/x.bin", "base64": "...", "size": 1048576}      a file with any bytes
//   {"path": "/mnt/data", "type": "directory", "mode": "0755"}
//   {"path": "/lib/link", "type": "symlink", "target": "../x"}
// "mode" is an octal text of at most 4 digits (default 0644 for files, 0755 for directories);
// "size", when given, is the file's length (at least its content's; the rest reads as zeros and
// is not stored, so pre-allocated files stay sparse). Directories above an entry are created as
// needed. An export lists every file and symbolic link, and the empty directories, sorted by
// path, with text when the content is UTF-8 without NUL and base64 otherwise; a file's content
// ends at its last nonzero byte and "size" gives the rest. The programs of the host's image
// (Image.h) are installed with the section's files when a host is made, unless the section
// gives their paths, and exports leave them out.
#pragma once

#include <simhost/State.h>

#include <cstdint>

#include <cstddef>

namespace simhost {
namespace files {

// Marks the custom domain in Registry.def; its state lives in root/, not in the database.
struct Tree {
    static constexpr char kSection[] = "files";
    static constexpr StateKind kKind = StateKind::kCustom;
    static const Domain& TheDomain();
};

// One file of the default host, embedded from simhost/defaults/root/ (the path is the host's).
struct DefaultFile {
    const char* path;
    const unsigned char* bytes;  // the content
    std::size_t size;            // of the content
    std::uint64_t length;        // of the file (>= size; zeros beyond the content)
    unsigned mode;
};
SIMHOST_API extern const DefaultFile kDefaultFiles[];
SIMHOST_API extern const std::size_t kDefaultFileCount;

// Whether path is a normalised absolute host path as the section requires.
SIMHOST_API bool IsNormalPath(const std::string& path);

}  // namespace files
}  // namespace simhost
