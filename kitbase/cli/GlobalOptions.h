// quarncli's global options: one table (name, value or flag, help, setter) that parsing, the
// root listing's help rows and suggestions all read, and the values a run collected.
//
// Global options come before the command words; all but --version are also taken after the
// path, unless the command declares an option of that name (then the command's wins). --help
// and -h after the path are left to the namespace or command, which read them as help anyway.
// --plugin-dir and --host-state act before the tree exists, so the words after the path are
// first scanned for them (PeekEarly); whether they really were global is known only once the
// command's options are (TakeTrailing).
//
// Nothing here throws but std::bad_alloc; refusals are one line in *error.
#pragma once

#include <string>
#include <utility>
#include <vector>

namespace Kitbase {
namespace CallSpec {
class InputSpec;
}
namespace Cli {

struct GlobalOptions {
    std::string formatter;
    std::vector<std::pair<std::string, std::string> > formatParams;
    std::string hostState;
    std::string pluginDir;
    bool formatterSet = false;
    bool hostStateSet = false;
    bool pluginDirSet = false;
    bool schema = false;
    bool help = false;
    bool version = false;
};

struct GlobalOptionInfo {
    const char* name;         // "--formatter"
    const char* alias;        // "-h" or null
    const char* placeholder;  // "NAME" for an option taking a value, null for a flag
    const char* help;         // one line of help
    bool afterPath;           // also taken after the command words
    // Stores the value (flags get ""); false with *error set when the value is refused.
    bool (*set)(GlobalOptions& options, const std::string& value, std::string* error);
};

// The table, in the order help lists it.
const std::vector<GlobalOptionInfo>& GlobalOptionTable();
// Every name and alias, for suggestions.
std::vector<std::string> GlobalOptionNames();
// The entry whose name or alias is word ("--formatter", "-h"), or null.
const GlobalOptionInfo* FindGlobalOption(const std::string& word);

// Parses the leading global options of args into options; *next is the index of the first word
// that is no option. False with *error set on a refusal.
bool ParseLeading(const std::vector<std::string>& args, std::size_t* next, GlobalOptions* options,
                  std::string* error);

// The values of --plugin-dir and --host-state among words (the words after the path), as they
// would be read if global, into *early (only those two fields and their flags are set). Words
// that are refused are skipped here; TakeTrailing reports them.
void PeekEarly(const std::vector<std::string>& words, GlobalOptions* early);

// Takes the global options out of words (the words after the path) into options, leaving the
// rest in *remaining. spec: the command's options (an option it declares stays its own), or null
// after a namespace or with --schema. False with *error set on a refusal.
bool TakeTrailing(const std::vector<std::string>& words, const CallSpec::InputSpec* spec,
                  GlobalOptions* options, std::vector<std::string>* remaining,
                  std::string* error);

}  // namespace Cli
}  // namespace Kitbase
