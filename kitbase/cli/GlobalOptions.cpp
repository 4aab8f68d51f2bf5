// The global option table and the two places global options are read: before the path and
// after it.
#include "cli/GlobalOptions.h"

#include "engine/Format.h"
#include "engine/Text.h"

#include <kitbase/CallSpec.h>

namespace Kitbase {
namespace Cli {

namespace {

using Engine::Quote;

bool SetOnce(const char* name, bool* set, std::string* target, const std::string& value,
             std::string* error) {
    if (*set) {
        *error = std::string("global option '") + name + "' is given more than once";
        return false;
    }
    if (value.empty()) {
        *error = std::string("global option '") + name + "' needs a non-empty value";
        return false;
    }
    *set = true;
    *target = value;
    return true;
}

bool SetFormatter(GlobalOptions& options, const std::string& value, std::string* error) {
    if (!value.empty() && !Engine::IsFormatter(value)) {
        *error = "unknown formatter " + Quote(value) + "; choose " +
                 Engine::JoinNames(Engine::FormatterNames(), " or ");
        return false;
    }
    return SetOnce("--formatter", &options.formatterSet, &options.formatter, value, error);
}

bool AddFormatParam(GlobalOptions& options, const std::string& value, std::string* error) {
    std::string::size_type eq = value.find('=');
    if (eq == std::string::npos || eq == 0) {
        *error = "global option '--format-param' takes KEY=VALUE (for example "
                 "fields:Module=Name), got " + Quote(value);
        return false;
    }
    options.formatParams.emplace_back(value.substr(0, eq), value.substr(eq + 1));
    return true;
}

bool SetHostState(GlobalOptions& options, const std::string& value, std::string* error) {
    return SetOnce("--host-state", &options.hostStateSet, &options.hostState, value, error);
}

bool SetPluginDir(GlobalOptions& options, const std::string& value, std::string* error) {
    return SetOnce("--plugin-dir", &options.pluginDirSet, &options.pluginDir, value, error);
}

bool SetSchema(GlobalOptions& options, const std::string&, std::string*) {
    options.schema = true;
    return true;
}

bool SetHelp(GlobalOptions& options, const std::string&, std::string*) {
    options.help = true;
    return true;
}

bool SetVersion(GlobalOptions& options, const std::string&, std::string*) {
    options.version = true;
    return true;
}

// Reads the option at words[*i] whose name part is name (entry found), with the value after '='
// or in the next word; advances *i past what it used.
bool ReadOne(const GlobalOptionInfo& entry, const std::string& name,
             const std::vector<std::string>& words, std::size_t* i, GlobalOptions* options,
             std::string* error) {
    const std::string& word = words[*i];
    bool inline_ = word.size() > name.size();  // "--name=value"
    std::string value = inline_ ? word.substr(name.size() + 1) : std::string();
    if (entry.placeholder == nullptr) {
        if (inline_) {
            *error = "global option '" + name + "' takes no value";
            return false;
        }
        return entry.set(*options, value, error);
    }
    if (!inline_) {
        // A separate value never starts with "--" (nor is the bare "--"): write --name=--value.
        if (*i + 1 >= words.size() || words[*i + 1].compare(0, 2, "--") == 0) {
            *error = "global option '" + name + "' needs a value";
            if (*i + 1 < words.size()) *error += "; write " + name + "=VALUE for one starting with '--'";
            return false;
        }
        value = words[++*i];
    }
    return entry.set(*options, value, error);
}

// The name part of an option word: up to '=' for "--" words, the whole word otherwise.
std::string NamePart(const std::string& word) {
    if (word.compare(0, 2, "--") != 0) return word;
    return word.substr(0, word.find('='));
}

std::string UnknownGlobalOption(const std::string& name) {
    std::vector<std::string> near = Engine::NearestNames(name, GlobalOptionNames());
    std::string message = "unknown global option " + Quote(name);
    if (!near.empty()) {
        return message + "; did you mean " + Engine::JoinNames(Engine::QuoteEach(near), " or ") +
               "?";
    }
    return message + "; global options are " + Engine::JoinNames(GlobalOptionNames(), " and ");
}

}  // namespace

const std::vector<GlobalOptionInfo>& GlobalOptionTable() {
    static const std::vector<GlobalOptionInfo> table = {
        {"--formatter", nullptr, "NAME",
         "Output formatter: simple, table, json, xml, csv or keyvalue. Default: the command's "
         "own, else simple; a namespace's listing: the help-style text.",
         true, SetFormatter},
        {"--format-param", nullptr, "KEY=VALUE",
         "Override or add an output parameter, e.g. fields:Module=Name (repeatable).", true,
         AddFormatParam},
        {"--host-state", nullptr, "DIR",
         "The simulated host to act on (sets QUARN_HOST_STATE).", true, SetHostState},
        {"--plugin-dir", nullptr, "DIR",
         "Load plug-ins from DIR instead of lib/quarncli/plugins beside the program's bin/.",
         true, SetPluginDir},
        {"--schema", nullptr, nullptr, "Print the command tree below the given words as JSON.",
         true, SetSchema},
        {"--help", "-h", nullptr, "Show help for the given words.", false, SetHelp},
        {"--version", nullptr, nullptr,
         "Show the program's version (before the command words only).", false, SetVersion},
    };
    return table;
}

std::vector<std::string> GlobalOptionNames() {
    std::vector<std::string> names;
    for (const GlobalOptionInfo& entry : GlobalOptionTable()) {
        names.push_back(entry.name);
        if (entry.alias != nullptr) names.push_back(entry.alias);
    }
    return names;
}

const GlobalOptionInfo* FindGlobalOption(const std::string& word) {
    for (const GlobalOptionInfo& entry : GlobalOptionTable()) {
        if (word == entry.name || (entry.alias != nullptr && word == entry.alias)) return &entry;
    }
    return nullptr;
}

bool ParseLeading(const std::vector<std::string>& args, std::size_t* next, GlobalOptions* options,
                  std::string* error) {
    std::size_t i = 0;
    for (; i < args.size() && !args[i].empty() && args[i][0] == '-'; ++i) {
        std::string name = NamePart(args[i]);
        const GlobalOptionInfo* entry = FindGlobalOption(name);
        if (entry == nullptr) {
            *error = UnknownGlobalOption(name);
            return false;
        }
        if (!ReadOne(*entry, name, args, &i, options, error)) return false;
    }
    *next = i;
    return true;
}

void PeekEarly(const std::vector<std::string>& words, GlobalOptions* early) {
    for (std::size_t i = 0; i < words.size(); ++i) {
        std::string name = NamePart(words[i]);
        if (name != "--plugin-dir" && name != "--host-state") continue;
        std::string ignored;
        ReadOne(*FindGlobalOption(name), name, words, &i, early, &ignored);
    }
}

bool TakeTrailing(const std::vector<std::string>& words, const CallSpec::InputSpec* spec,
                  GlobalOptions* options, std::vector<std::string>* remaining,
                  std::string* error) {
    for (std::size_t i = 0; i < words.size(); ++i) {
        std::string name = NamePart(words[i]);
        const GlobalOptionInfo* entry =
            words[i].compare(0, 2, "--") == 0 ? FindGlobalOption(name) : nullptr;
        bool global = entry != nullptr && entry->afterPath &&
                      (spec == nullptr || !spec->Find(name.substr(2)));
        if (!global) {
            remaining->push_back(words[i]);
            continue;
        }
        if (!ReadOne(*entry, name, words, &i, options, error)) return false;
    }
    return true;
}

}  // namespace Cli
}  // namespace Kitbase
