#include <simhost/cli/Quarnhost.h>

#include <simhost/Host.h>
#include <simhost/Store.h>

#include <nlohmann/json.hpp>

#include <algorithm>
#include <cerrno>
#include <cstring>
#include <fstream>
#include <iostream>
#include <map>
#include <optional>
#include <sstream>
#include <string>
#include <vector>

namespace simhost {
namespace {

const char kUsage[] =
    "Usage: quarnhost [--state DIR] COMMAND [ARGUMENTS]\n"
    "\n"
    "Administers a simulated host. The host is DIR, else $QUARN_HOST_STATE, else\n"
    "${XDG_STATE_HOME:-$HOME/.local/state}/quarncli/host.\n"
    "\n"
    "Commands:\n"
    "  init [--scenario FILE] [--force]   create the host from the default scenario or FILE;\n"
    "                                     --force replaces an existing host\n"
    "  export                             print the host's state as a scenario\n"
    "  fault add OPERATION MESSAGE [--times N]\n"
    "                                     make OPERATION fail with MESSAGE, always or N times\n"
    "  fault list                         show the faults: operation, message, calls left\n"
    "  fault clear                        remove every fault\n"
    "  journal [--clear]                  print the journal of changes and faults, or empty it\n"
    "\n"
    "Options:\n"
    "  --state DIR   the host's state directory\n"
    "  -h, --help    show this help\n";

// A refusal: its one-line message and exit status.
struct Refusal {
    int status;
    std::string message;
};

[[noreturn]] void Usage(const std::string& message, bool point_to_help = true) {
    throw Refusal{2, point_to_help ? message + " (see quarnhost --help)" : message};
}

[[noreturn]] void Failure(const std::string& message) { throw Refusal{1, message}; }

// The words of one command: positional arguments and --name [VALUE] options.
class Words {
public:
    Words(std::vector<std::string> words, std::string command)
        : words_(std::move(words)), command_(std::move(command)) {}

    // Splits the words against the options this command accepts; flags take no value.
    void Parse(const std::vector<std::string>& valued, const std::vector<std::string>& flags) {
        bool options_done = false;
        for (std::size_t i = 0; i < words_.size(); ++i) {
            const std::string& word = words_[i];
            if (options_done || word.size() < 2 || word[0] != '-') {
                positional_.push_back(word);
                continue;
            }
            if (word == "--") {
                options_done = true;
                continue;
            }
            std::string name = word;
            std::optional<std::string> value;
            if (auto eq = word.find('='); eq != std::string::npos && word.rfind("--", 0) == 0) {
                name = word.substr(0, eq);
                value = word.substr(eq + 1);
            }
            bool takes_value = std::find(valued.begin(), valued.end(), name) != valued.end();
            bool is_flag = std::find(flags.begin(), flags.end(), name) != flags.end();
            if (!takes_value && !is_flag) Usage("unknown option '" + name + "' for " + command_);
            if (options_.count(name)) Usage("option '" + name + "' given twice");
            if (is_flag) {
                if (value) Usage("option '" + name + "' takes no value");
                options_[name] = "";
                continue;
            }
            if (!value) {
                if (i + 1 >= words_.size()) Usage("option '" + name + "' needs a value");
                value = words_[++i];
            }
            options_[name] = *value;
        }
    }

    void ExpectPositional(std::size_t count, const std::string& what) const {
        if (positional_.size() < count) Usage(command_ + " needs " + what);
        if (positional_.size() > count)
            Usage("unexpected argument '" + positional_[count] + "' for " + command_);
    }

    const std::vector<std::string>& Positional() const { return positional_; }
    bool Has(const std::string& option) const { return options_.count(option) != 0; }
    const std::string& Option(const std::string& option) const { return options_.at(option); }

private:
    std::vector<std::string> words_;
    std::string command_;
    std::vector<std::string> positional_;
    std::map<std::string, std::string> options_;
};

std::string ReadFile(const std::string& path) {
    std::ifstream in(path, std::ios::binary);
    if (!in) Failure("cannot read '" + path + "': " + std::strerror(errno));
    std::ostringstream text;
    text << in.rdbuf();
    if (in.bad()) Failure("cannot read '" + path + "'");
    return text.str();
}

std::int64_t ParseTimes(const std::string& text) {
    std::string problem =
        "--times expects a whole number from 1 to " + std::to_string(kMaxFaultTimes) + ", not '" +
        text + "'";
    if (text.empty() || text.size() > 10) Usage(problem);
    for (char c : text)
        if (c < '0' || c > '9') Usage(problem);
    std::int64_t times = std::stoll(text);
    if (times < 1 || times > kMaxFaultTimes) Usage(problem);
    return times;
}

void Init(Host& host, Words& words) {
    words.Parse({"--scenario"}, {"--force"});
    words.ExpectPositional(0, "");
    std::string source = words.Has("--scenario") ? words.Option("--scenario") : "";
    std::string text = source.empty() ? DefaultScenario() : ReadFile(source);
    bool existed = host.Exists();
    try {
        host.Init(text, words.Has("--force"));
    } catch (const HostError& error) {
        if (error.code() == HostError::Code::kScenario)
            Failure((source.empty() ? "default scenario" : source) + ": " + error.what());
        if (error.code() == HostError::Code::kExists)
            Failure(std::string(error.what()) + "; use --force to replace it");
        throw;
    }
    std::cout << (existed ? "Replaced" : "Created") << " the simulated host at '" << host.Dir()
              << "' from " << (source.empty() ? "the default scenario" : "'" + source + "'")
              << "\n";
}

void FaultCommand(Host& host, const std::string& action, Words& words) {
    if (action == "add") {
        words.Parse({"--times"}, {});
        words.ExpectPositional(2, "an OPERATION and a MESSAGE");
        std::optional<std::int64_t> times;
        if (words.Has("--times")) times = ParseTimes(words.Option("--times"));
        const std::string& operation = words.Positional()[0];
        if (!IsKnownOperation(operation)) Usage(UnknownOperationText(operation), false);
        host.AddFault(operation, words.Positional()[1], times);
    } else if (action == "list") {
        words.Parse({}, {});
        words.ExpectPositional(0, "");
        for (const Fault& fault : host.Faults()) {
            std::cout << fault.operation << '\t'
                      << nlohmann::json(fault.message)
                             .dump(-1, ' ', false, nlohmann::json::error_handler_t::replace)
                      << '\t'
                      << (fault.remaining ? std::to_string(*fault.remaining) + " left" : "always")
                      << '\n';
        }
    } else if (action == "clear") {
        words.Parse({}, {});
        words.ExpectPositional(0, "");
        host.ClearFaults();
    } else {
        Usage("unknown fault action '" + action + "' (expected add, list or clear)");
    }
}

void JournalCommand(Host& host, Words& words) {
    words.Parse({}, {"--clear"});
    words.ExpectPositional(0, "");
    if (words.Has("--clear")) {
        host.ClearJournal();
        return;
    }
    for (const JournalEntry& entry : host.Journal())
        std::cout << entry.sequence << ' ' << entry.time << ' ' << entry.kind << ' '
                  << entry.operation << ' ' << entry.arguments << '\n';
}

int Run(int argc, char** argv) {
    std::vector<std::string> args(argv + 1, argv + argc);
    for (const std::string& arg : args) {
        if (arg == "--") break;
        if (arg == "--help" || arg == "-h") {
            std::cout << kUsage;
            return 0;
        }
    }
    std::optional<std::string> state;
    std::size_t i = 0;
    for (; i < args.size() && args[i].size() > 1 && args[i][0] == '-'; ++i) {
        if (args[i] == "--state") {
            if (i + 1 >= args.size()) Usage("option '--state' needs a value");
            if (state) Usage("option '--state' given twice");
            state = args[++i];
        } else if (args[i].rfind("--state=", 0) == 0) {
            if (state) Usage("option '--state' given twice");
            state = args[i].substr(8);
        } else {
            Usage("unknown option '" + args[i] + "'");
        }
    }
    if (state && state->empty()) Usage("option '--state' needs a directory");
    if (i >= args.size()) Usage("missing command (init, export, fault or journal)");
    std::string command = args[i++];
    std::string action;
    if (command == "fault") {
        if (i >= args.size()) Usage("fault needs an action (add, list or clear)");
        action = args[i++];
    } else if (command != "init" && command != "export" && command != "journal") {
        Usage("unknown command '" + command + "' (expected init, export, fault or journal)");
    }
    Words words(std::vector<std::string>(args.begin() + static_cast<std::ptrdiff_t>(i), args.end()),
                action.empty() ? command : command + " " + action);

    Host host(state ? *state : StateDirFromEnvironment());
    if (command == "init") {
        Init(host, words);
    } else if (command == "export") {
        words.Parse({}, {});
        words.ExpectPositional(0, "");
        std::cout << host.Export();
    } else if (command == "fault") {
        FaultCommand(host, action, words);
    } else {
        JournalCommand(host, words);
    }
    std::cout.flush();
    if (!std::cout) Failure("cannot write the output");
    return 0;
}

}  // namespace

int QuarnhostMain(int argc, char** argv) {
    try {
        return Run(argc, argv);
    } catch (const Refusal& refusal) {
        std::cerr << "quarnhost: " << refusal.message << "\n";
        return refusal.status;
    } catch (const HostError& error) {
        std::cerr << "quarnhost: " << error.what() << "\n";
        return 1;
    } catch (const std::exception& error) {
        std::cerr << "quarnhost: " << error.what() << "\n";
        return 1;
    }
}

}  // namespace simhost
