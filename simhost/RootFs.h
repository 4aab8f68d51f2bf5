// The host's own file system: files under the state directory's root/, addressed by the paths
// the host sees ("/etc/tarsel/snmp.xml" is DIR/root/etc/tarsel/snmp.xml).
//
// Every path is resolved inside root/ by the kernel (openat2 with RESOLVE_IN_ROOT): ".." stops
// at root/ and a symbolic link, absolute or relative, is resolved as if root/ were "/", so no
// path ever leads out of it. Operations return 0 or an errno value, as the system calls they
// stand for report it; they never throw. A RootFs owns a descriptor of root/ for its lifetime.
#pragma once

#include <simhost/Export.h>

#include <sys/stat.h>
#include <sys/types.h>

#include <cstddef>
#include <cstdint>
#include <string>

namespace simhost {

class SIMHOST_API RootFs {
public:
    // Opens root (a directory that must not be a symbolic link); check Error() afterwards.
    explicit RootFs(const std::string& root);
    ~RootFs();
    RootFs(const RootFs&) = delete;
    RootFs& operator=(const RootFs&) = delete;

    // 0 when root/ was opened, else its errno.
    int Error() const { return error_; }

    // open(2) of path inside root/ (flags as for open; O_NOFOLLOW applies to the last component
    // only). On success *fd is a new descriptor the caller closes.
    int Open(const std::string& path, int flags, mode_t mode, int* fd) const;
    int Stat(const std::string& path, struct stat* info) const;  // lstat(2) of the last component
    int Unlink(const std::string& path) const;
    int MakeDirectory(const std::string& path, mode_t mode) const;
    // Creates path and every missing directory above it (mode for each one created).
    int MakeDirectories(const std::string& path, mode_t mode) const;
    int Symlink(const std::string& target, const std::string& path) const;

    // Reads a regular file whole; E2BIG when it is longer than limit.
    int ReadFile(const std::string& path, std::string* content, std::size_t limit) const;
    // Replaces a file so that readers see the old or the new content, never a mixture: the
    // content goes to a temporary file beside it, is synced, and renamed over path.
    int WriteFileAtomic(const std::string& path, const std::string& content, mode_t mode) const;

private:
    // The descriptor of path's parent directory and path's last component.
    int OpenParent(const std::string& path, int* dirfd, std::string* name) const;

    int root_ = -1;
    int error_ = 0;
};

// Whether path is a host path: absolute, shorter than 4096 bytes, without NUL.
SIMHOST_API bool IsHostPath(const std::string& path);

}  // namespace simhost
