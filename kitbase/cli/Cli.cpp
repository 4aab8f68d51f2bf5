// quarncli: from the command line to an exit status.
#include "cli/Cli.h"

#include "cli/PluginSet.h"
#include "engine/Format.h"
#include "engine/Help.h"
#include "engine/OptionParser.h"
#include "engine/Schema.h"
#include "engine/Text.h"
#include "engine/Writer.h"

#include <kitbase/AutoCli.h>
#include <kitbase/CallSpec.h>
#include <norlithctl/RavelException.h>

#include <cerrno>
#include <cstdlib>
#include <cstring>
#include <exception>
#include <unistd.h>

namespace Kitbase {
namespace Cli {

const char kProgramName[] = "quarncli";
const char kVersion[] = "1.0.0";

namespace {

using Engine::Quote;
typedef boost::shared_ptr<AutoCli::NamespaceNode> NodePtr;

const char kHostStateVariable[] = "QUARN_HOST_STATE";
const char kDefaultFormatter[] = "simple";

struct GlobalOptions {
    std::string formatter;
    std::vector<Engine::FormatParams::KeyValue> formatParams;
    std::string hostState;
    std::string pluginDir;
    bool formatterSet = false;
    bool hostStateSet = false;
    bool pluginDirSet = false;
    bool schema = false;
    bool help = false;
    bool version = false;
};

const std::vector<std::string>& GlobalOptionNames() {
    static const std::vector<std::string> names = {
        "--formatter", "--format-param", "--host-state", "--plugin-dir",
        "--schema",    "--help",         "-h",           "--version"};
    return names;
}

// The plug-in directory next to the running program:
// <directory of /proc/self/exe>/../lib/quarncli/plugins.
std::string DefaultPluginDir() {
    char path[4096];
    ssize_t size = readlink("/proc/self/exe", path, sizeof path - 1);
    std::string exe = size > 0 ? std::string(path, static_cast<std::size_t>(size)) : ".";
    std::string::size_type slash = exe.rfind('/');
    std::string dir = slash == std::string::npos ? "." : exe.substr(0, slash);
    return dir + "/../lib/quarncli/plugins";
}

class Session {
public:
    Session(const std::vector<std::string>& args, int outFd, int errFd)
        : args_(args), out_(outFd), err_(errFd, 4096), outFd_(outFd) {}

    int Run() {
        std::size_t next = 0;
        if (!ParseGlobalOptions(&next)) return kExitUsage;
        if (options_.version) {
            out_.PutText(kProgramName);
            out_.PutText(" (Kitbase) ");
            out_.PutText(kVersion);
            out_.Put('\n');
            return Finish(kExitOk);
        }
        if (options_.hostStateSet) setenv(kHostStateVariable, options_.hostState.c_str(), 1);
        if (!LoadPlugins()) return options_.pluginDirSet ? kExitUsage : kExitFailed;

        // The command words lead from the root down to a namespace or a command.
        NodePtr node = root_;
        while (next < args_.size() && !node->IsCommand() && !IsOptionWord(args_[next])) {
            NodePtr child = node->GetChild(args_[next]);
            if (!child) return UnknownWord(*node, args_[next]);
            path_.push_back(args_[next]);
            node = child;
            ++next;
        }
        std::vector<std::string> rest(args_.begin() + static_cast<std::ptrdiff_t>(next),
                                      args_.end());
        if (options_.schema) return Schema(node, rest);
        if (!node->IsCommand()) return Namespace(*node, rest);
        boost::shared_ptr<AutoCli::Command> command =
            boost::dynamic_pointer_cast<AutoCli::Command>(node);
        if (!command) {
            Error("internal error: '" + Engine::JoinWords(path_) +
                  "' claims to be a command but is not one");
            return Finish(kExitFailed);
        }
        return Command(*command, rest);
    }

private:
    static bool IsOptionWord(const std::string& word) { return !word.empty() && word[0] == '-'; }

    // ---- messages ----

    void Error(const std::string& line) {
        out_.Flush();
        err_.PutText(kProgramName);
        err_.Put(": ", 2);
        err_.Put(line);
        err_.Put('\n');
        err_.Flush();
    }

    void Message(const std::string& line) {
        out_.Flush();
        err_.Put(line);
        err_.Put('\n');
        err_.Flush();
    }

    // Flushes standard output; a failed write turns a success into status 1.
    int Finish(int status) {
        if (!out_.Flush()) {
            Error(std::string("cannot write the output: ") + std::strerror(out_.ErrorCode()));
            return status == kExitOk ? kExitFailed : status;
        }
        return status;
    }

    // ---- global options ----

    bool ParseGlobalOptions(std::size_t* next) {
        std::size_t i = 0;
        for (; i < args_.size() && IsOptionWord(args_[i]); ++i) {
            const std::string& word = args_[i];
            std::string name = word;
            std::string value;
            bool hasValue = false;
            std::string::size_type eq = word.find('=');
            if (word.compare(0, 2, "--") == 0 && eq != std::string::npos) {
                name = word.substr(0, eq);
                value = word.substr(eq + 1);
                hasValue = true;
            }
            if (name == "--schema" || name == "--help" || name == "-h" || name == "--version") {
                if (hasValue) return UsageError("global option '" + name + "' takes no value");
                bool& flag = name == "--schema" ? options_.schema
                             : name == "--version" ? options_.version
                                                   : options_.help;
                flag = true;
                continue;
            }
            if (name != "--formatter" && name != "--format-param" && name != "--host-state" &&
                name != "--plugin-dir") {
                std::vector<std::string> near = Engine::NearestNames(name, GlobalOptionNames());
                std::string message = "unknown global option " + Quote(name);
                if (!near.empty()) {
                    message += "; did you mean " +
                               Engine::JoinNames(Engine::QuoteEach(near), " or ") + "?";
                } else {
                    message += "; global options are " +
                               Engine::JoinNames(GlobalOptionNames(), " and ") +
                               ", and go before the command words";
                }
                return UsageError(message);
            }
            if (!hasValue) {
                if (i + 1 >= args_.size() || args_[i + 1].compare(0, 2, "--") == 0) {
                    return UsageError("global option '" + name + "' needs a value" +
                                      (i + 1 < args_.size()
                                           ? "; write " + name + "=VALUE for one starting with '--'"
                                           : std::string()));
                }
                value = args_[++i];
            }
            if (!SetGlobalOption(name, value)) return false;
        }
        *next = i;
        return true;
    }

    bool SetGlobalOption(const std::string& name, const std::string& value) {
        if (name == "--format-param") {
            std::string::size_type eq = value.find('=');
            if (eq == std::string::npos || eq == 0) {
                return UsageError("global option '--format-param' takes KEY=VALUE (for example "
                                  "fields:Module=Name), got " + Quote(value));
            }
            options_.formatParams.push_back(
                Engine::FormatParams::KeyValue(value.substr(0, eq), value.substr(eq + 1)));
            return true;
        }
        bool* set;
        std::string* target;
        if (name == "--formatter") {
            set = &options_.formatterSet;
            target = &options_.formatter;
        } else if (name == "--host-state") {
            set = &options_.hostStateSet;
            target = &options_.hostState;
        } else {
            set = &options_.pluginDirSet;
            target = &options_.pluginDir;
        }
        if (*set) return UsageError("global option '" + name + "' is given more than once");
        if (value.empty()) {
            return UsageError("global option '" + name + "' needs a non-empty value");
        }
        if (name == "--formatter" && !Engine::IsFormatter(value)) {
            return UsageError("unknown formatter " + Quote(value) + "; choose " +
                              Engine::JoinNames(Engine::FormatterNames(), " or "));
        }
        *set = true;
        *target = value;
        return true;
    }

    bool UsageError(const std::string& message) {
        Error(message);
        return false;
    }

    // ---- plug-ins ----

    bool LoadPlugins() {
        std::string directory = options_.pluginDirSet ? options_.pluginDir : DefaultPluginDir();
        std::vector<std::string> problems;
        std::string error;
        root_ = AutoCli::Namespace::New();
        bool loaded = plugins_.LoadDirectory(directory, root_, &problems, &error);
        for (std::size_t i = 0; i < problems.size(); ++i) Error(problems[i]);
        if (!loaded) Error(error);
        return loaded;
    }

    // ---- namespaces ----

    int UnknownWord(const AutoCli::NamespaceNode& node, const std::string& word) {
        std::vector<std::string> names;
        const std::vector<AutoCli::NamespaceNode::Child>& children = node.GetChildren();
        for (std::size_t i = 0; i < children.size(); ++i) names.push_back(children[i].first);
        std::string where =
            path_.empty() ? std::string() : " under '" + Engine::JoinWords(path_) + "'";
        std::string message = "unknown command " + Quote(word) + where;
        if (names.empty()) {
            message += path_.empty() ? "; no plug-in has registered any command" : "; it is empty";
        } else {
            std::vector<std::string> near = Engine::NearestNames(word, names);
            if (!near.empty()) {
                message +=
                    "; did you mean " + Engine::JoinNames(Engine::QuoteEach(near), " or ") + "?";
            } else {
                message += "; valid: " + Engine::JoinNames(names, " and ");
            }
        }
        Error(message);
        return Finish(kExitUsage);
    }

    std::string Usage(bool command) const {
        std::string usage = std::string(kProgramName) + " [global options]";
        if (!path_.empty()) usage += " " + Engine::JoinWords(path_);
        usage += command ? " [options]" : " <namespace|command> ... [options]";
        return usage;
    }

    void WriteGlobalOptions(std::size_t width) {
        std::vector<Engine::HelpRow> rows = {
            {"--formatter NAME",
             "Output formatter: " + Engine::JoinNames(Engine::FormatterNames(), " or ") +
                 ". Default: the command's own, else simple."},
            {"--format-param KEY=VALUE",
             "Override or add an output parameter, e.g. fields:Module=Name (repeatable)."},
            {"--host-state DIR",
             std::string("The simulated host to act on (sets ") + kHostStateVariable + ")."},
            {"--plugin-dir DIR", "Load plug-ins from DIR instead of " + DefaultPluginDir() + "."},
            {"--schema", "Print the command tree below the given words as JSON."},
            {"-h, --help", "Show help for the given words."},
            {"--version", "Show the program's version."},
        };
        out_.PutText("\nGlobal options (before the command words):\n");
        Engine::WriteRows(out_, rows, width);
    }

    int Namespace(const AutoCli::NamespaceNode& node, const std::vector<std::string>& rest) {
        // A namespace's help is its listing.
        for (std::size_t i = 0; i < rest.size(); ++i) {
            if (rest[i] == "--help" || rest[i] == "-h") continue;
            // Only reached below the root: global option parsing takes every leading option.
            Error("unexpected " + Quote(rest[i]) + " after '" + Engine::JoinWords(path_) +
                  "', which is a namespace: name one of its commands (run '" + kProgramName +
                  " " + Engine::JoinWords(path_) + "' to list them)");
            return Finish(kExitUsage);
        }
        std::size_t width = Engine::TerminalWidth(outFd_);
        Engine::WriteNamespaceHelp(out_, node, Usage(false), width);
        if (path_.empty()) WriteGlobalOptions(width);
        return Finish(kExitOk);
    }

    int Schema(const NodePtr& node, const std::vector<std::string>& rest) {
        if (!rest.empty()) {
            Error("--schema takes command words only, got " + Quote(rest[0]));
            return Finish(kExitUsage);
        }
        // Built in memory first, so that a failing command leaves no half document behind.
        std::string document;
        if (!GuardOrReport("--schema", [&] {
                Engine::Writer writer(&document);
                Engine::WriteSchema(writer, node, path_);
            })) {
            return Finish(kExitFailed);
        }
        out_.Put(document);
        return Finish(kExitOk);
    }

    // ---- commands ----

    // Runs work; an exception escaping it becomes one line in *failure (a RavelException its
    // GetMessage(0) text, anything else an internal-error line naming what()).
    template <class Work>
    bool Guard(const std::string& what, Work work, std::string* failure) {
        try {
            work();
            return true;
        } catch (const Ravel::Lib::RavelException& e) {
            *failure = e.GetMessage(0);
        } catch (const std::bad_alloc&) {
            *failure = std::string(kProgramName) + ": out of memory in " + what;
        } catch (const std::exception& e) {
            *failure = std::string(kProgramName) + ": internal error in " + what + ": " + e.what();
        } catch (...) {
            *failure = std::string(kProgramName) + ": internal error in " + what +
                       ": an exception of unknown type";
        }
        return false;
    }

    // Guard for work whose failure ends the run with status 1.
    template <class Work>
    bool GuardOrReport(const std::string& what, Work work) {
        std::string failure;
        if (Guard(what, work, &failure)) return true;
        Message(failure);
        return false;
    }

    int Command(AutoCli::Command& command, const std::vector<std::string>& rest) {
        const std::string where = "'" + Engine::JoinWords(path_) + "'";
        bool help = options_.help;
        boost::shared_ptr<CallSpec::InputSpec> inputSpec;
        Engine::ParseOutcome parsed;
        if (!GuardOrReport(where, [&] {
                inputSpec = command.GetInputSpec();
                if (!help) parsed = Engine::ParseOptions(*inputSpec, rest);
            })) {
            return Finish(kExitFailed);
        }
        if (help || parsed.status == Engine::ParseOutcome::kHelp) {
            Engine::WriteCommandHelp(out_, command, *inputSpec, Usage(true),
                                     Engine::TerminalWidth(outFd_));
            return Finish(kExitOk);
        }
        if (parsed.status == Engine::ParseOutcome::kError) {
            Error(parsed.error);
            return Finish(kExitUsage);
        }

        boost::shared_ptr<CallSpec::OutputSpec> outputSpec;
        boost::shared_ptr<CallSpec::Output> output = CallSpec::Output::New();
        std::string failure;
        bool ran = Guard(
            where,
            [&] {
                outputSpec = command.GetOutputSpec();
                command.Execute(parsed.input, output);
            },
            &failure);
        int status = kExitOk;
        if (ran && output->GetResult()) {
            Engine::FormatParams params(command.GetDefaultOutputParameters());
            for (std::size_t i = 0; i < options_.formatParams.size(); ++i) {
                params.Set(options_.formatParams[i].first, options_.formatParams[i].second);
            }
            std::string formatter = options_.formatterSet ? options_.formatter
                                                          : command.GetDefaultOutputFormatter();
            if (!Engine::IsFormatter(formatter)) formatter = kDefaultFormatter;
            Engine::RenderRequest request;
            request.result = output->GetResult().get();
            request.resultTemplate = outputSpec ? outputSpec->GetResultTemplate().get() : nullptr;
            request.params = &params;
            request.width = Engine::TerminalWidth(outFd_);
            Engine::Render(formatter, request, out_);
        }
        // The result first, then the messages; a failed write of the result still lets them out.
        const std::vector<std::string>& errors = output->GetErrors();
        out_.Flush();
        for (std::size_t i = 0; i < errors.size(); ++i) Message(errors[i]);
        if (!ran) Message(failure);
        if (!ran || !errors.empty()) status = kExitFailed;
        return Finish(status);
    }

    const std::vector<std::string>& args_;
    GlobalOptions options_;
    // Declared before the tree: destroyed after it, so no node outlives its plug-in's code.
    PluginSet plugins_;
    NodePtr root_;
    std::vector<std::string> path_;
    Engine::Writer out_;
    Engine::Writer err_;
    int outFd_;
};

}  // namespace

int Run(const std::vector<std::string>& args, int outFd, int errFd) {
    return Session(args, outFd, errFd).Run();
}

int Main(int argc, char** argv) {
    std::vector<std::string> args;
    for (int i = 1; i < argc; ++i) args.push_back(argv[i]);
    return Run(args, STDOUT_FILENO, STDERR_FILENO);
}

}  // namespace Cli
}  // namespace Kitbase
