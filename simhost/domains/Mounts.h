// The host's mount table: the file systems mounted on the host's root/, as the simulated kernel
// keeps it. Mount and umount through the operating-system binding change it (simhost/Kernel.h).
//
// Scenario section "mounts" (default []): an array of
//   {"target": absolute path of the mount point (key), "type": file system type of 1..31 bytes,
//    "source": text of at most 255 bytes, "options": the mount's option text, at most 4096 bytes,
//    "system": whether the host mounts it at every boot (default false)}.
// At a reboot, mounts that are not system mounts are gone.
#pragma once

#include <simhost/Mapping.h>
#include <simhost/State.h>

#include <string>
#include <vector>

namespace simhost {
namespace mounts {

inline bool IsMountPath(const std::string& text) {
    return !text.empty() && text[0] == '/' && text.size() <= 4095;
}

struct Mount {
    static constexpr char kSection[] = "mounts";
    static constexpr StateKind kKind = StateKind::kCollection;

    std::string target;
    std::string type;
    std::string source;
    std::string options;
    bool system = false;

    std::string Key() const { return target; }
    static std::vector<Mount> Default() { return {}; }
    static bool Boot(Mount& mount) { return mount.system; }
};

template <class V>
void Describe(V& v, Mount& s) {
    v("target", s.target, Required(), Pattern{IsMountPath, "expected an absolute path"});
    v("type", s.type, Required(), Text(31, false));
    v("source", s.source, Text(255));
    v("options", s.options, Text(4096));
    v("system", s.system);
}

}  // namespace mounts
}  // namespace simhost
