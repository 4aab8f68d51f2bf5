// NorlithCtl::Util: the host-control library's free helpers.
#pragma once

#include <norlithctl/Export.h>

#include <string>
#include <vector>

namespace NorlithCtl {
namespace Util {

// Runs a command line on the host and returns 0 exactly when the program succeeded.
//
// The command line is split at blanks (spaces and tabs; no shell, no quoting); its first word is
// the program, a host path (/bin/kelp-cmd is the host's root/bin/kelp-cmd, resolved inside the
// host's root/), the rest its arguments. The program runs with the host's state directory in
// QUARN_HOST_STATE and standard input from /dev/null. The result is the program's exit status,
// 128 plus the signal number when a signal ended it, 127 when the program does not exist, 126
// when it cannot be run, and 127 for an empty command line.
//
//   background  true: start the program and return 0 at once, without waiting for it
//   quiet       true: the program's standard output is discarded and each line of its
//               standard error goes to the host's system log; false: both pass to the caller's
//               streams
//   trace       true: the command line is written to the host's system log before it runs
//
// Throws Ravel::Lib::RavelException when the host cannot be reached, a fault is set on the
// operation, or no process can be created.
NORLITHCTL_API int NorlithCtl_Exec(const std::string& command, bool background, bool quiet,
                                   bool trace);

// Splits value into the components between separators and appends them, in order, to tokens.
// Every character of separators separates ("/" splits paths, " ,;" would split lists). Empty
// components are dropped: separators at the start or end, or several in a row, yield nothing, so
// "/Net//Tcp/" gives "Net" and "Tcp", and "" or "/" gives no component at all. Pure; nothing
// throws but std::bad_alloc.
NORLITHCTL_API void StringTokenize(const std::string& value, std::vector<std::string>& tokens,
                                   const std::string& separators);

// Deletes every element of a vector of pointers the library handed out (log level records and
// the like) and leaves the vector empty. Null elements are skipped. Nothing throws.
template <class T>
void DeleteVector(std::vector<T*>& objects) {
    for (T* object : objects) delete object;
    objects.clear();
}

}  // namespace Util
}  // namespace NorlithCtl
