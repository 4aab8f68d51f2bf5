// quarncli: from the command line to an exit status. The run's steps live in their own files:
// global options (GlobalOptions), the tree and its plug-ins (Tree, PluginSet), the command
// words (Resolve), namespace listings (Listing), running a command (CommandRun) and where output
// and messages go (Console). The session below only puts them in order.
#include "cli/Cli.h"

#include "cli/CommandRun.h"
#include "cli/Complete.h"
#include "cli/Console.h"
#include "cli/GlobalOptions.h"
#include "cli/Guard.h"
#include "cli/Listing.h"
#include "cli/Tree.h"
#include "cli/Resolve.h"
#include "engine/Schema.h"
#include "engine/Text.h"
#include "engine/Writer.h"

#include <kitbase/AutoCli.h>
#include <kitbase/CallSpec.h>

#include <memory>
#include <unistd.h>

namespace Kitbase {
namespace Cli {

const char kProgramName[] = "quarncli";
const char kVersion[] = "1.0.0";

namespace {

class Session {
public:
    Session(const std::vector<std::string>& args, int outFd, int errFd,
            const RunSettings& settings)
        : args_(args), console_(outFd, errFd), settings_(settings),
          hostStateBefore_(HostStateBefore::Read()) {}

    // The process ends after this session: its tree, and the plug-ins that made it, are left
    // for the exit to reclaim instead of being taken apart node by node (a tenth of a short
    // command's instructions).
    void KeepTreeUntilExit() {
        [[maybe_unused]] static Tree* kept = nullptr;
        if (tree_) kept = tree_.release();
    }

    int Run() {
        if (!args_.empty() && args_[0] == kCompleteWord) return Complete();
        std::size_t next = 0;
        std::string error;
        if (!ParseLeading(args_, &next, &options_, &error)) return Usage(error);
        if (options_.version) {
            console_.Out().PutText(kProgramName);
            console_.Out().PutText(" (Kitbase) ");
            console_.Out().PutText(kVersion);
            console_.Out().Put('\n');
            return console_.Finish(kExitOk);
        }
        words_.assign(args_.begin() + static_cast<std::ptrdiff_t>(next), args_.end());
        // --plugin-dir and --host-state may also follow the path; the tree is built with them
        // and built again, without, should they turn out to be the command's own options.
        GlobalOptions early = options_;
        std::size_t firstOption = 0;
        while (firstOption < words_.size() && !IsOptionWord(words_[firstOption])) ++firstOption;
        PeekEarly(std::vector<std::string>(words_.begin() + static_cast<std::ptrdiff_t>(firstOption),
                                           words_.end()),
                  &early);
        int status = kExitOk;
        if (!Load(early, &status)) return status;
        if (!Resolve(tree_->root, words_, &resolved_, &error)) return Usage(error);
        return Dispatch();
    }

private:
    static bool IsOptionWord(const std::string& word) { return !word.empty() && word[0] == '-'; }

    // The shell asks what may be typed next (cli/Complete.h): candidates only, never an error.
    int Complete() {
        std::vector<std::string> words(args_.begin() + 1, args_.end());
        for (const std::string& candidate : Completions(words, settings_.exeLink)) {
            console_.Out().Put(candidate);
            console_.Out().Put('\n');
        }
        console_.Finish(kExitOk);
        return kExitOk;
    }

    int Usage(const std::string& message) {
        console_.Error(message);
        return console_.Finish(kExitUsage);
    }

    // Builds the tree for settings; false with *status set when the run ends here.
    bool Load(const GlobalOptions& settings, int* status) {
        tree_.reset();
        tree_ = BuildTree(settings, hostStateBefore_, settings_.exeLink, console_, status);
        return tree_ != nullptr;
    }

    // mayReload: whether the tree may still be built again (once at most).
    int Dispatch(bool mayReload = true) {
        std::string error;
        if (!resolved_.node->IsCommand()) {
            std::vector<std::string> remaining;
            if (!TakeTrailing(resolved_.rest, nullptr, &options_, &remaining, &error)) {
                return Usage(error);
            }
            if (options_.schema) return Schema(remaining);
            return Namespace(remaining);
        }
        boost::shared_ptr<AutoCli::Command> command =
            boost::dynamic_pointer_cast<AutoCli::Command>(resolved_.node);
        if (!command) {
            console_.Error("internal error: '" + Engine::JoinWords(resolved_.path) +
                           "' claims to be a command but is not one");
            return console_.Finish(kExitFailed);
        }
        if (options_.schema && resolved_.rest.empty()) return Schema(resolved_.rest);
        std::string where = "'" + Engine::JoinWords(resolved_.path) + "'";
        boost::shared_ptr<CallSpec::InputSpec> spec;
        std::string failure;
        if (!Guard(where, [&] { spec = command->GetInputSpec(); }, &failure)) {
            console_.Message(failure);
            return console_.Finish(kExitFailed);
        }
        GlobalOptions leading = options_;
        std::vector<std::string> remaining;
        if (!TakeTrailing(resolved_.rest, spec.get(), &options_, &remaining, &error)) {
            return Usage(error);
        }
        if (mayReload && !tree_->BuiltFor(options_)) {
            // The command declares --plugin-dir or --host-state itself: the tree is built
            // again without the values read for them after the path.
            options_ = leading;
            spec.reset();  // plug-in objects go before their plug-in does
            command.reset();
            resolved_ = Resolved();
            int status = kExitOk;
            if (!Load(options_, &status)) return status;
            if (!Resolve(tree_->root, words_, &resolved_, &error)) return Usage(error);
            return Dispatch(false);
        }
        if (options_.schema) return Schema(remaining);
        return RunCommand(console_, *command, resolved_.path, *spec, remaining, options_);
    }

    int Namespace(const std::vector<std::string>& rest) {
        // A namespace's help is its listing.
        for (const std::string& word : rest) {
            if (word == "--help" || word == "-h") continue;
            std::string path = Engine::JoinWords(resolved_.path);
            return Usage("unexpected " + Engine::Quote(word) + " after '" + path +
                         "', which is a namespace: name one of its commands (run '" +
                         kProgramName + " " + path + "' to list them)");
        }
        return ListNamespace(console_, *resolved_.node, resolved_.path, options_);
    }

    int Schema(const std::vector<std::string>& rest) {
        if (!rest.empty()) return Usage("--schema takes command words only, got " +
                                        Engine::Quote(rest[0]));
        // Built in memory first, so that a failing command leaves no half document behind.
        std::string document;
        std::string failure;
        if (!Guard("--schema",
                   [&] {
                       Engine::Writer writer(&document);
                       Engine::WriteSchema(writer, resolved_.node, resolved_.path);
                   },
                   &failure)) {
            console_.Message(failure);
            return console_.Finish(kExitFailed);
        }
        console_.Out().Put(document);
        return console_.Finish(kExitOk);
    }

    const std::vector<std::string>& args_;
    Console console_;
    RunSettings settings_;
    HostStateBefore hostStateBefore_;
    GlobalOptions options_;
    std::vector<std::string> words_;  // the arguments after the leading global options
    std::unique_ptr<Tree> tree_;
    Resolved resolved_;
};

}  // namespace

int Run(const std::vector<std::string>& args, int outFd, int errFd) {
    return Run(args, outFd, errFd, RunSettings());
}

int Run(const std::vector<std::string>& args, int outFd, int errFd,
        const RunSettings& settings) {
    return Session(args, outFd, errFd, settings).Run();
}

int Main(int argc, char** argv) {
    std::vector<std::string> args;
    for (int i = 1; i < argc; ++i) args.push_back(argv[i]);
    Session session(args, STDOUT_FILENO, STDERR_FILENO, RunSettings());
    int status = session.Run();
    session.KeepTreeUntilExit();
    return status;
}

}  // namespace Cli
}  // namespace Kitbase
