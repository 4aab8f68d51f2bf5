// Completion: the words typed so far are read the way a run reads them (leading global options,
// command words, the command's options), leniently, and the candidates for the last word come
// from where that reading stops.
#include "cli/Complete.h"

#include "cli/Console.h"
#include "cli/GlobalOptions.h"
#include "cli/Guard.h"
#include "cli/Resolve.h"
#include "cli/Tree.h"
#include "engine/Format.h"

#include <kitbase/AutoCli.h>
#include <kitbase/CallSpec.h>

#include <fcntl.h>
#include <unistd.h>

#include <memory>

namespace Kitbase {
namespace Cli {

const char kCompleteWord[] = "__complete";

namespace {

const char* const kBoolValues[] = {"true", "false", "yes", "no", "1", "0"};

bool IsOptionWord(const std::string& word) { return !word.empty() && word[0] == '-'; }

bool StartsWith(const std::string& text, const std::string& prefix) {
    return text.compare(0, prefix.size(), prefix) == 0;
}

// The option name of word: "--formatter" of "--formatter=json".
std::string OptionName(const std::string& word) {
    return StartsWith(word, "--") ? word.substr(0, word.find('=')) : word;
}

bool TakesValue(const GlobalOptionInfo* global) {
    return global != nullptr && global->placeholder != nullptr;
}

// The command's parameter a word names ("--name", "-n"), or null.
boost::shared_ptr<CallSpec::ParameterSpec> FindParameter(const CallSpec::InputSpec* spec,
                                                         const std::string& name) {
    if (spec == nullptr) return {};
    if (StartsWith(name, "--")) return spec->Find(name.substr(2));
    if (name.size() == 2 && name[0] == '-') return spec->FindShort(name.substr(1));
    return {};
}

bool ParameterTakesValue(const boost::shared_ptr<CallSpec::ParameterSpec>& parameter) {
    return parameter && parameter->GetType() != CallSpec::ParameterTypeFlag;
}

class Completer {
public:
    Completer(const std::vector<std::string>& words, const char* exeLink)
        : before_(words.begin(), words.empty() ? words.end() : words.end() - 1),
          current_(words.empty() ? std::string() : words.back()),
          exeLink_(exeLink) {}

    std::vector<std::string> Run() {
        std::size_t next = ReadLeading();
        // A value of a leading global option is being typed.
        if (pendingGlobal_ != nullptr) {
            ValuesOf(pendingGlobal_, "");
            return out_;
        }
        if (!LoadTree()) return out_;
        Resolved resolved;
        std::string error;
        std::vector<std::string> words(before_.begin() + static_cast<std::ptrdiff_t>(next),
                                       before_.end());
        if (!Resolve(tree_->root, words, &resolved, &error)) return out_;
        boost::shared_ptr<CallSpec::InputSpec> spec;
        if (resolved.node->IsCommand()) {
            boost::shared_ptr<AutoCli::Command> command =
                boost::dynamic_pointer_cast<AutoCli::Command>(resolved.node);
            std::string failure;
            if (!command || !Guard("", [&] { spec = command->GetInputSpec(); }, &failure)) {
                return out_;
            }
        }
        bool atLeading = words.empty();  // no command word yet: every global option may come
        if (InValueOf(resolved.rest, spec.get())) return out_;
        if (IsOptionWord(current_)) {
            OptionsAfter(spec.get(), atLeading);
        } else if (resolved.rest.empty() && !resolved.node->IsCommand()) {
            for (const AutoCli::NamespaceNode::Child& child : resolved.node->GetChildren()) {
                Offer(child.first);
            }
        }
        return out_;
    }

private:
    void Offer(const std::string& candidate) {
        if (StartsWith(candidate, current_)) out_.push_back(candidate);
    }

    // Reads the leading global options of before_ (as far as they go); returns the index of the
    // first other word. A value still missing at the end leaves pendingGlobal_ set.
    std::size_t ReadLeading() {
        std::size_t i = 0;
        while (i < before_.size() && IsOptionWord(before_[i])) {
            const std::string& word = before_[i];
            const GlobalOptionInfo* global = FindGlobalOption(OptionName(word));
            ++i;
            if (!TakesValue(global) || word.find('=') != std::string::npos) {
                if (global != nullptr) Note(global, word.substr(word.find('=') + 1));
                continue;
            }
            if (i == before_.size()) {
                pendingGlobal_ = global;
                break;
            }
            Note(global, before_[i]);
            ++i;
        }
        return i;
    }

    // Keeps what building the tree depends on.
    void Note(const GlobalOptionInfo* global, const std::string& value) {
        std::string ignored;
        std::string name = global->name;
        if (name == "--plugin-dir" || name == "--host-state") {
            GlobalOptions copy = options_;
            if (global->set(copy, value, &ignored)) options_ = copy;
        }
    }

    bool LoadTree() {
        // A broken plug-in or an unreadable directory says why on standard error in a run; here
        // it says nothing at all.
        int quiet = open("/dev/null", O_WRONLY | O_CLOEXEC);
        if (quiet < 0) return false;
        Console console(quiet, quiet);
        int status = 0;
        try {
            tree_ = BuildTree(options_, HostStateBefore::Read(), exeLink_, console, &status);
        } catch (...) {
            tree_.reset();
        }
        close(quiet);
        return tree_ != nullptr;
    }

    // When the word before current_ is an option that wants a value, offers its values and
    // returns true.
    bool InValueOf(const std::vector<std::string>& rest, const CallSpec::InputSpec* spec) {
        if (rest.empty()) return false;
        const std::string& previous = rest.back();
        if (!IsOptionWord(previous) || previous.find('=') != std::string::npos) return false;
        // The previous word may itself be a value (--name -x): count from the start.
        bool wanted = false;
        for (std::size_t i = 0; i < rest.size(); ++i) {
            wanted = false;
            const std::string& word = rest[i];
            if (!IsOptionWord(word) || word.find('=') != std::string::npos) continue;
            boost::shared_ptr<CallSpec::ParameterSpec> parameter = FindParameter(spec, word);
            const GlobalOptionInfo* global = parameter ? nullptr : FindGlobalOption(word);
            if (ParameterTakesValue(parameter) || (TakesValue(global) && global->afterPath)) {
                if (i + 1 == rest.size()) {
                    wanted = true;
                    if (parameter) {
                        if (parameter->GetType() == CallSpec::ParameterTypeBool) {
                            for (const char* value : kBoolValues) Offer(value);
                        }
                    } else {
                        ValuesOf(global, "");
                    }
                }
                ++i;  // its value
            }
        }
        return wanted;
    }

    // The values of a global option that takes one, as words beginning with prefix.
    void ValuesOf(const GlobalOptionInfo* global, const std::string& prefix) {
        if (std::string(global->name) == "--formatter") {
            for (const std::string& name : Engine::FormatterNames()) Offer(prefix + name);
        }
        // Directories (--host-state, --plugin-dir) are the shell's to complete; --format-param
        // values are free text.
    }

    // Option names at this point: the command's, then the global ones that may stand here.
    void OptionsAfter(const CallSpec::InputSpec* spec, bool leading) {
        std::string::size_type eq = current_.find('=');
        if (StartsWith(current_, "--") && eq != std::string::npos) {
            // --name=partial: the values of that option, spelled with the name.
            std::string name = current_.substr(0, eq);
            boost::shared_ptr<CallSpec::ParameterSpec> parameter = FindParameter(spec, name);
            if (parameter && parameter->GetType() == CallSpec::ParameterTypeBool) {
                for (const char* value : kBoolValues) Offer(name + "=" + value);
            } else if (!parameter) {
                const GlobalOptionInfo* global = FindGlobalOption(name);
                if (TakesValue(global)) ValuesOf(global, name + "=");
            }
            return;
        }
        if (spec != nullptr) {
            for (const boost::shared_ptr<CallSpec::ParameterSpec>& parameter :
                 spec->GetParameters()) {
                Offer("--" + parameter->GetName());
            }
        }
        for (const GlobalOptionInfo& global : GlobalOptionTable()) {
            if (!leading && !global.afterPath) continue;
            if (spec != nullptr && spec->Find(std::string(global.name).substr(2))) continue;
            Offer(global.name);
        }
    }

    std::vector<std::string> before_;
    std::string current_;
    const char* exeLink_;
    GlobalOptions options_;
    const GlobalOptionInfo* pendingGlobal_ = nullptr;
    std::unique_ptr<Tree> tree_;
    std::vector<std::string> out_;
};

}  // namespace

std::vector<std::string> Completions(const std::vector<std::string>& words, const char* exeLink) {
    try {
        return Completer(words, exeLink).Run();
    } catch (...) {
        return {};
    }
}

}  // namespace Cli
}  // namespace Kitbase
