#include <simhost/cli/Quarnhost.h>

#include <simhost/Events.h>
#include <simhost/Host.h>
#include <simhost/NetDump.h>
#include <simhost/Store.h>
#include <simhost/cli/Input.h>
#include <simhost/domains/Coredump.h>

#include <CLI/CLI.hpp>
#include <nlohmann/json.hpp>

#include <algorithm>
#include <atomic>
#include <csignal>
#include <cerrno>
#include <cstring>
#include <functional>
#include <iostream>
#include <map>
#include <memory>
#include <optional>
#include <string>
#include <vector>

namespace simhost {
namespace {

const char kVersion[] = "1.0.0";

// A refusal: its one-line message and exit status.
struct Refusal {
    int status;
    std::string message;
};

[[noreturn]] void Usage(const std::string& message) { throw Refusal{2, message}; }
[[noreturn]] void Failure(const std::string& message) { throw Refusal{1, message}; }

// A whole number from min to max given to option, else a usage error.
std::int64_t WholeNumber(const std::string& option, const std::string& text, std::int64_t min,
                         std::int64_t max) {
    std::string problem = option + " expects a whole number from " + std::to_string(min) +
                          " to " + std::to_string(max) + ", not '" + text + "'";
    if (text.empty() || text.size() > 18) Usage(problem);
    for (char c : text)
        if (c < '0' || c > '9') Usage(problem);
    std::int64_t value = std::stoll(text);
    if (value < min || value > max) Usage(problem);
    return value;
}

// An operation name a fault can be set on, else a usage error naming the nearest known ones.
const std::string& KnownOperation(const std::string& operation) {
    if (IsKnownOperation(operation)) return operation;
    Usage(UnknownOperationText(operation));
}

// Display width of UTF-8 text: its code points (every text here is left-to-right and narrow).
std::size_t Width(const std::string& text) {
    std::size_t width = 0;
    for (unsigned char c : text) width += (c & 0xC0) != 0x80;
    return width;
}

// Rows under a header, each column padded to its widest cell and separated by two spaces; the
// last column is not padded. Nothing at all when there are no rows.
void PrintTable(const std::vector<std::string>& header,
                const std::vector<std::vector<std::string>>& rows) {
    if (rows.empty()) return;
    std::vector<std::size_t> widths(header.size());
    auto measure = [&](const std::vector<std::string>& row) {
        for (std::size_t i = 0; i < row.size(); ++i) widths[i] = std::max(widths[i], Width(row[i]));
    };
    measure(header);
    for (const auto& row : rows) measure(row);
    auto print = [&](const std::vector<std::string>& row) {
        for (std::size_t i = 0; i < row.size(); ++i) {
            std::cout << row[i];
            if (i + 1 < row.size()) std::cout << std::string(widths[i] - Width(row[i]) + 2, ' ');
        }
        std::cout << '\n';
    };
    print(header);
    for (const auto& row : rows) print(row);
}

std::string JsonText(const nlohmann::json& value) {
    return value.dump(-1, ' ', false, nlohmann::json::error_handler_t::replace);
}

// One JSON object per entry and line, its arguments as an object.
void PrintJsonLines(const std::vector<JournalEntry>& entries) {
    for (const JournalEntry& entry : entries) {
        nlohmann::ordered_json line = {{"sequence", entry.sequence},
                                       {"time", entry.time},
                                       {"kind", entry.kind},
                                       {"operation", entry.operation}};
        auto arguments = nlohmann::ordered_json::parse(entry.arguments, nullptr, false);
        line["arguments"] = arguments.is_discarded() ? nlohmann::ordered_json(entry.arguments) : arguments;
        std::cout << line.dump(-1, ' ', false, nlohmann::json::error_handler_t::replace) << '\n';
    }
}

// The program: its command tree (CLI11), and for each command the action that runs it.
class Program {
public:
    Program();
    int Run(int argc, char** argv);

private:
    using Action = std::function<void()>;

    // Registration: every command of quarnhost, in the order of its help. Each Add function
    // declares one command's options and its action.
    void Register();
    void AddInit(CLI::App& parent);
    void AddExport(CLI::App& parent);
    void AddFaultAdd(CLI::App& parent);
    void AddFaultList(CLI::App& parent);
    void AddFaultClear(CLI::App& parent);
    void AddJournal(CLI::App& parent);
    void AddLog(CLI::App& parent, const char* name, const char* description);
    void AddOperations(CLI::App& parent);
    void AddNetdumpServer(CLI::App& parent);

    Host OpenHost() const;
    // OpenHost, after verifying the whole database file.
    Host CheckedHost() const;
    void Parse(int argc, char** argv);
    void Execute(int argc, char** argv);
    const CLI::App& Selected() const;
    void RefuseLeftovers() const;

    CLI::App app_;
    std::string state_;
    std::map<const CLI::App*, Action> actions_;
};

Program::Program() : app_("Administers a simulated host.", "quarnhost") {
    app_.set_help_flag("-h,--help", "Show this help and exit");
    app_.set_version_flag("--version", std::string("quarnhost ") + kVersion, "Show the version and exit");
    // Leftover words are reported by RefuseLeftovers, in this program's words.
    app_.allow_extras();
    app_.option_defaults()->disable_flag_override();
    app_.add_option("--state,--host-state", state_,
                    "The host's state directory (default: $QUARN_HOST_STATE, else "
                    "${XDG_STATE_HOME:-$HOME/.local/state}/quarncli/host)")
        ->type_name("DIR");
    Register();
    // After Register, so that the commands do not inherit it.
    app_.footer("A missing host is created from the default scenario when a command other than "
                "init first uses it.\nRun 'quarnhost COMMAND --help' for a command's options.");
}

void Program::Register() {
    AddInit(app_);
    AddExport(app_);
    CLI::App* fault = app_.add_subcommand("fault", "Set, list and clear faults");
    AddFaultAdd(*fault);
    AddFaultList(*fault);
    AddFaultClear(*fault);
    AddJournal(app_);
    AddLog(app_, "syslog", "Print the host's system log");
    AddLog(app_, "observations", "Print the host's observation log");
    AddOperations(app_);
    AddNetdumpServer(app_);
}

void Program::AddInit(CLI::App& parent) {
    struct Options {
        std::string scenario;
        bool force = false;
    };
    auto options = std::make_shared<Options>();
    CLI::App* command = parent.add_subcommand("init", "Create the host from a scenario");
    actions_[command] = [this, command, options] {
        bool from_file = command->count("--scenario") != 0;
        if (from_file && options->scenario.empty())
            Usage("--scenario needs a file, or - for standard input");
        std::string text;
        try {
            text = from_file ? ReadScenarioSource(options->scenario) : DefaultScenario();
        } catch (const InputError& error) {
            Failure(error.what());
        }
        std::string source = from_file ? SourceName(options->scenario) : "the default scenario";
        Host host = OpenHost();
        bool existed = host.Exists();
        try {
            host.Init(text, options->force);
        } catch (const HostError& error) {
            if (error.code() == HostError::Code::kScenario)
                Failure((from_file ? source : "default scenario") + ": " + error.what());
            if (error.code() == HostError::Code::kExists)
                Failure(std::string(error.what()) + "; use --force to replace it");
            throw;
        }
        std::cout << (existed ? "Replaced" : "Created") << " the simulated host at '" << host.Dir()
                  << "' from " << source << "\n";
    };
    command->add_option("--scenario", options->scenario,
                        "Import this scenario file (- reads standard input; at most " +
                            std::to_string(kMaxScenarioBytes >> 20) +
                            " MiB) instead of the default scenario")
        ->type_name("FILE");
    command->add_flag("--force", options->force,
                      "Replace an existing host (its state, faults, journal and files)")
        ->multi_option_policy(CLI::MultiOptionPolicy::Throw);
}

void Program::AddExport(CLI::App& parent) {
    CLI::App* command = parent.add_subcommand("export", "Print the host's state as a scenario");
    actions_[command] = [this] { std::cout << CheckedHost().Export(); };
}

void Program::AddFaultAdd(CLI::App& parent) {
    struct Options {
        std::string operation, message, times;
        Event event;
    };
    auto options = std::make_shared<Options>();
    CLI::App* command = parent.add_subcommand(
        "add", "Make an operation fail with a message, always or the next N times");
    actions_[command] = [this, command, options] {
        if (options->message.empty() && command->count("MESSAGE") == 0)
            Usage("fault add needs an OPERATION and a MESSAGE");
        std::optional<std::int64_t> times;
        if (command->count("--times"))
            times = WholeNumber("--times", options->times, 1, kMaxFaultTimes);
        if (!options->event.args.empty() && options->event.id.empty())
            Usage("--arg needs --event");
        if (!options->event.Empty()) {
            std::string problem = CheckEvent(options->event);
            if (!problem.empty()) Usage("--event: " + problem);
        }
        const std::string& operation = KnownOperation(options->operation);
        CheckedHost().AddFault(operation, options->message, times, options->event);
    };
    // Required, but checked by the action: an unknown option is the better message.
    command->add_option("OPERATION", options->operation, "Fully qualified operation name");
    command->add_option("MESSAGE", options->message, "The error message the operation raises");
    command->add_option("--times", options->times, "Fail the next N calls only (1 to 1000000000)")
        ->type_name("N");
    command->add_option("--event", options->event.id,
                        "Attach this event of the catalog (see 'quarnhost operations') to the error")
        ->type_name("ID");
    command->add_option("--arg", options->event.args, "An argument of the event, in order (repeatable)")
        ->type_name("TEXT")
        ->multi_option_policy(CLI::MultiOptionPolicy::TakeAll);
}

void Program::AddFaultList(CLI::App& parent) {
    CLI::App* command =
        parent.add_subcommand("list", "List the faults: operation, message, calls left to fail");
    actions_[command] = [this] {
        std::vector<Fault> faults = CheckedHost().Faults();
        // The event column only when a fault carries an event record.
        bool events = std::any_of(faults.begin(), faults.end(),
                                  [](const Fault& fault) { return !fault.event.Empty(); });
        std::vector<std::vector<std::string>> rows;
        for (const Fault& fault : faults) {
            rows.push_back({fault.operation, JsonText(fault.message),
                            fault.remaining ? std::to_string(*fault.remaining) + " left" : "always"});
            if (events) rows.back().push_back(fault.event.Empty() ? "" : JsonText(FormatEvent(fault.event)));
        }
        std::vector<std::string> header{"OPERATION", "MESSAGE", "TIMES"};
        if (events) header.push_back("EVENT");
        PrintTable(header, rows);
    };
}

void Program::AddFaultClear(CLI::App& parent) {
    auto operation = std::make_shared<std::string>();
    CLI::App* command = parent.add_subcommand("clear", "Remove the fault on OPERATION, or every fault");
    actions_[command] = [this, operation] {
        if (!operation->empty()) KnownOperation(*operation);
        Host host = CheckedHost();
        if (operation->empty()) return host.ClearFaults();
        try {
            host.ClearFault(*operation);
        } catch (const HostError& error) {
            if (error.code() == HostError::Code::kDamaged) throw;
            Failure(error.what());
        }
    };
    command->add_option("OPERATION", *operation, "Clear only this operation's fault");
}

void Program::AddJournal(CLI::App& parent) {
    struct Options {
        bool clear = false, json = false;
        std::string limit;
    };
    auto options = std::make_shared<Options>();
    CLI::App* command =
        parent.add_subcommand("journal", "Print the journal of changes and faults, or empty it");
    actions_[command] = [this, command, options] {
        bool limited = command->count("--limit") != 0;
        if (options->clear && (options->json || limited))
            Usage("--clear takes neither --json nor --limit");
        std::optional<std::int64_t> limit;
        if (limited) limit = WholeNumber("--limit", options->limit, 0, kMaxFaultTimes);
        Host host = CheckedHost();
        if (options->clear) return host.ClearJournal();
        std::vector<JournalEntry> entries = host.Journal(limit);
        if (options->json) return PrintJsonLines(entries);
        std::vector<std::vector<std::string>> rows;
        for (const JournalEntry& entry : entries)
            rows.push_back({std::to_string(entry.sequence), entry.time, entry.kind, entry.operation,
                            entry.arguments});
        PrintTable({"SEQUENCE", "TIME", "KIND", "OPERATION", "ARGUMENTS"}, rows);
    };
    command->add_option("--limit", options->limit, "Only the last N entries")->type_name("N");
    command->add_flag("--json", options->json, "One JSON object per entry and line (JSON Lines)")
        ->multi_option_policy(CLI::MultiOptionPolicy::Throw);
    command->add_flag("--clear", options->clear, "Empty the journal")
        ->multi_option_policy(CLI::MultiOptionPolicy::Throw);
}

void Program::AddLog(CLI::App& parent, const char* name, const char* description) {
    struct Options {
        bool json = false;
        std::string limit;
    };
    auto options = std::make_shared<Options>();
    bool system = std::string(name) == "syslog";
    CLI::App* command = parent.add_subcommand(name, description);
    actions_[command] = [this, command, options, system] {
        std::optional<std::int64_t> limit;
        if (command->count("--limit")) limit = WholeNumber("--limit", options->limit, 0, kMaxFaultTimes);
        Host host = CheckedHost();
        std::vector<std::vector<std::string>> rows;
        if (system) {
            for (const syslog::Entry& entry : host.SystemLog(limit)) {
                if (options->json)
                    std::cout << JsonText(nlohmann::ordered_json{{"time", entry.time},
                                                                  {"priority", entry.priority},
                                                                  {"message", entry.message}})
                              << '\n';
                else
                    rows.push_back({entry.time, std::to_string(entry.priority), JsonText(entry.message)});
            }
            PrintTable({"TIME", "PRIORITY", "MESSAGE"}, rows);
        } else {
            for (const observations::Entry& entry : host.ObservationLog(limit)) {
                if (options->json)
                    std::cout << JsonText(nlohmann::ordered_json{{"time", entry.time},
                                                                  {"event", entry.event},
                                                                  {"message", entry.message}})
                              << '\n';
                else
                    rows.push_back({entry.time, entry.event.empty() ? "-" : entry.event,
                                    JsonText(entry.message)});
            }
            PrintTable({"TIME", "EVENT", "MESSAGE"}, rows);
        }
    };
    command->add_option("--limit", options->limit, "Only the last N entries")->type_name("N");
    command->add_flag("--json", options->json, "One JSON object per entry and line (JSON Lines)")
        ->multi_option_policy(CLI::MultiOptionPolicy::Throw);
}

void Program::AddOperations(CLI::App& parent) {
    auto markdown = std::make_shared<bool>(false);
    CLI::App* command = parent.add_subcommand(
        "operations", "List the host operations faults can be set on, and the event catalog");
    actions_[command] = [markdown] {
        if (*markdown) {
            std::cout << OperationsMarkdown();
            return;
        }
        std::vector<std::vector<std::string>> rows;
        for (const OperationInfo& info : Operations()) rows.push_back({info.name, info.doc});
        PrintTable({"OPERATION", "WHAT IT DOES"}, rows);
        rows.clear();
        for (const EventInfo& event : EventCatalog()) rows.push_back({event.id, event.text});
        std::cout << '\n';
        PrintTable({"EVENT", "TEXT"}, rows);
    };
    command->add_flag("--markdown", *markdown, "Print the page docs/operations.md is");
}

namespace {
std::atomic<bool> g_stop_serving{false};
void StopServing(int) { g_stop_serving = true; }
}  // namespace

void Program::AddNetdumpServer(CLI::App& parent) {
    struct Options {
        std::string listen, seconds = "600";
    };
    auto options = std::make_shared<Options>();
    CLI::App* command = parent.add_subcommand(
        "netdump-server", "Answer the network dump server probes of 'system coredump network check'");
    command->add_option("--listen", options->listen, "The IPv4 address and UDP port to answer on (port 0: a free one)")
        ->type_name("ADDRESS:PORT");
    command->add_option("--seconds", options->seconds, "Stop after this many seconds (default 600)")
        ->type_name("N");
    actions_[command] = [options] {
        const std::string& listen = options->listen;
        const std::string::size_type colon = listen.rfind(':');
        if (listen.empty() || colon == std::string::npos)
            Usage("--listen needs ADDRESS:PORT, e.g. 127.0.0.1:6500");
        const std::string address = listen.substr(0, colon);
        if (!coredump::IsIpv4(address)) Usage("--listen: '" + address + "' is not a dotted IPv4 address");
        const int port = static_cast<int>(WholeNumber("--listen port", listen.substr(colon + 1), 0, 65535));
        const std::int64_t seconds = WholeNumber("--seconds", options->seconds, 1, 86400);
        netdump::Server server(address, port);
        std::signal(SIGTERM, StopServing);
        std::signal(SIGINT, StopServing);
        std::cout << "Answering network dump probes on " << address << ":" << server.Port() << std::endl;
        std::size_t answered = server.Serve(static_cast<double>(seconds), &g_stop_serving);
        std::cout << "Answered " << answered << (answered == 1 ? " probe" : " probes") << std::endl;
    };
}

Host Program::OpenHost() const {
    if (app_.count("--state") && state_.empty()) Usage("--state needs a directory");
    return Host(state_.empty() ? StateDirFromEnvironment() : state_);
}

Host Program::CheckedHost() const {
    Host host = OpenHost();
    host.Check();
    return host;
}

// The deepest command selected on the command line (the program itself when none).
const CLI::App& Program::Selected() const {
    const CLI::App* app = &app_;
    while (!app->get_subcommands().empty()) app = app->get_subcommands().front();
    return *app;
}

// A command's words without the program's name, e.g. "fault add".
std::string CommandName(const CLI::App& app) {
    if (!app.get_parent()) return "";
    std::string parent = CommandName(*app.get_parent());
    return parent.empty() ? app.get_name() : parent + " " + app.get_name();
}

// "a, b or c": the commands below app.
std::string Choices(const CLI::App& app) {
    std::vector<const CLI::App*> subs = app.get_subcommands({});
    std::string text;
    for (std::size_t i = 0; i < subs.size(); ++i)
        text += (i == 0 ? "" : i + 1 == subs.size() ? " or " : ", ") + subs[i]->get_name();
    return text;
}

// Words no command took: an unknown option, command or argument, or a missing command.
void Program::RefuseLeftovers() const {
    for (const CLI::App* app = &app_;; app = app->get_subcommands().front()) {
        // CLI11 keeps the "--" that ended the options among the leftovers.
        std::vector<std::string> left = app->remaining();
        auto end_of_options = std::find(left.begin(), left.end(), "--");
        bool option = end_of_options != left.begin() && !left.empty() && left.front().size() > 1 &&
                      left.front()[0] == '-';
        if (end_of_options != left.end()) left.erase(end_of_options);
        bool is_group = !app->get_subcommands({}).empty();
        std::string name = CommandName(*app);
        std::string where = name.empty() ? "" : " for " + name;
        if (option) Usage("unknown option '" + left.front() + "'" + where);
        if (!left.empty() && is_group)
            Usage("unknown " + (name.empty() ? std::string("command") : name + " action") + " '" +
                  left.front() + "' (expected " + Choices(*app) + ")");
        if (!left.empty()) Usage("unexpected argument '" + left.front() + "'" + where);
        if (!app->get_subcommands().empty()) continue;
        if (is_group && name.empty()) Usage("missing command (" + Choices(*app) + ")");
        if (is_group) Usage(name + " needs an action (" + Choices(*app) + ")");
        return;
    }
}

void Program::Parse(int argc, char** argv) {
    try {
        app_.parse(argc, argv);
    } catch (const CLI::CallForHelp&) {
        std::cout << app_.help();  // the help of the command selected
        throw;
    } catch (const CLI::CallForVersion&) {
        std::cout << "quarnhost " << kVersion << "\n";
        throw;
    } catch (const CLI::ParseError& error) {
        std::string message = error.what();
        std::replace(message.begin(), message.end(), '\n', ' ');
        Usage(message);
    }
    RefuseLeftovers();
}

void Program::Execute(int argc, char** argv) {
    try {
        Parse(argc, argv);
        actions_.at(&Selected())();
    } catch (const CLI::Success&) {
        // --help or --version, printed
    }
    std::cout.flush();
    if (!std::cout) Failure(std::string("cannot write the output: ") + std::strerror(errno));
}

int Program::Run(int argc, char** argv) {
    try {
        Execute(argc, argv);
        return 0;
    } catch (const Refusal& refusal) {
        std::string help = CommandName(Selected());
        std::cerr << "quarnhost: " << refusal.message;
        if (refusal.status == 2)
            std::cerr << " (see 'quarnhost " << (help.empty() ? "" : help + " ") << "--help')";
        std::cerr << "\n";
        return refusal.status;
    } catch (const std::exception& error) {
        std::cerr << "quarnhost: " << error.what() << "\n";
        return 1;
    }
}

}  // namespace

int QuarnhostMain(int argc, char** argv) {
    try {
        return Program().Run(argc, argv);
    } catch (const std::exception& error) {
        std::cerr << "quarnhost: " << error.what() << "\n";
        return 1;
    }
}

}  // namespace simhost
