// RunCommand: runs one external program with its standard input fed from a caller's buffer and
// its standard output and standard error captured into two caller buffers, and returns its wait
// status. Exported from the plug-in as a standalone utility; no command calls it.
//
//   path             the program, used as given (no search of PATH)
//   argv             its argument vector, argv[0] included, ending with a null pointer
//   outBuf, outLen   standard output: *outLen holds the capacity on entry and the number of
//                    bytes stored on return (-1 when reading failed); a null outBuf discards
//                    the stream and leaves *outLen alone
//   errBuf, errLen   the same for standard error
//   input, inputLen  bytes written to the program's standard input (null: none); either way
//                    its standard input is then closed, so it sees end of file
//
// Returns the wait status as waitpid reports it (not decoded), or -1 when a pipe or the child
// process cannot be created (every descriptor made so far is closed). A program that cannot be
// started ends with exit status 1; a failed redirection in the child with 255. The buffers are
// not terminated with a zero byte.
//
// The input is fed and both output streams are drained together, so neither side blocks the
// other whatever the sizes: each stream stores at most its capacity and the rest is read and
// discarded, and input the program does not read is dropped when it ends or closes its input.
// The pipes are close-on-exec (so no other call's pipes reach this child), and a program that
// closes its input early does not raise SIGPIPE in the caller. Safe to call from several
// threads at once.
#pragma once

#include "frame/Export.h"

namespace TarselCli {
namespace System {

SYSTEM_EXPORT int RunCommand(char const* path, char const** argv, char* outBuf, int* outLen,
                             char* errBuf, int* errLen, char const* input, int inputLen);

}  // namespace System
}  // namespace TarselCli
