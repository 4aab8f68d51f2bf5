// The host's image: the programs every simulated host has under its root/, which come with the
// build rather than with the host's state. Today one: /bin/kelp-cmd, the host management tool
// (simhost/kelp/).
//
// When a host is created or replaced, InstallImage puts each image program into the new root/
// (a hard link to the built program where the file systems allow it, else a copy), unless the
// scenario's own files already give that path: a scenario may bring its own program there (a
// script that fails, say). The built program is looked for, in this order:
//   1. beside the running program (build/bin/ holds quarncli, quarnhost, the tests and
//      kelp-cmd alike);
//   2. where an installation puts it (LIBEXECDIR/quarn/kelp-cmd);
//   3. in the build tree this library was configured for (its bin/kelp-cmd).
// When it is found nowhere the host is made without it, and running it fails as a missing
// program does.
//
// An export leaves an image program out (IsImageFile): it is part of the host as built, not of
// its state, and would otherwise put megabytes of one build's binary into every scenario.
//
// Nothing here throws; InstallImage reports a failure as an errno value.
#pragma once

#include <simhost/RootFs.h>

#include <string>

namespace simhost {
namespace image {

// The host paths of the image's programs.
const char* const kPrograms[] = {"/bin/kelp-cmd"};

// The built program that provides host path `program`, or "" when none is found.
std::string BuiltProgram(const std::string& program);

// Installs every image program that root lacks; returns 0 or the errno of the first failure.
int InstallImage(const RootFs& root);

// Whether a file of an export, at host path `path` and starting with `head` (its first four
// bytes are enough), is an image program: a compiled program (ELF) at one of the image's paths.
bool IsImageFile(const std::string& path, const std::string& head);

}  // namespace image
}  // namespace simhost
