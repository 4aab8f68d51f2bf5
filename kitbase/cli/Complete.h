// Shell completion answered by quarncli itself: `quarncli __complete WORD... CURRENT` prints the
// words that may stand where CURRENT (possibly empty) is being typed, one per line, each
// beginning with CURRENT. WORD... are the words typed before it, after the program name.
//
// Answers come from the tree the run would use (so plug-ins and --plugin-dir count): the
// children of a namespace, a command's option names and the global options, the values of a
// boolean option, formatter names. Where a directory is wanted (--host-state, --plugin-dir) or
// nothing can be said, nothing is printed: the shell's own completion takes over. Completion is
// typed while the user edits, so it never writes to standard error and always exits 0: an
// unknown word, a damaged plug-in or a missing directory give no candidates.
#pragma once

#include <string>
#include <vector>

namespace Kitbase {
namespace Cli {

// The first argument that asks for completion.
extern const char kCompleteWord[];

// words: what follows kCompleteWord (the last one is the word being typed; none means an empty
// one). exeLink names the running program, for the default plug-in directory.
std::vector<std::string> Completions(const std::vector<std::string>& words, const char* exeLink);

}  // namespace Cli
}  // namespace Kitbase
