// quarnhost as a process: every command, its help, and every refusal as one line with its exit
// status.
#include "TestSupport.h"

#include <norlithctl/Env.h>
#include <norlithctl/QuillUserLib.h>

#include <simhost/Db.h>
#include <simhost/Host.h>
#include <simhost/Store.h>

#include <gtest/gtest.h>

#include <sys/stat.h>
#include <unistd.h>

#include <filesystem>
#include <fstream>
#include <regex>
#include <sstream>

namespace {

using testsupport::ProcessResult;
using simtest::RunQuarnhost;

const std::string kGetUuid = "NorlithCtl::System::SystemInfoImpl::GetSystemUuid";

std::vector<std::string> Lines(const std::string& text) {
    std::vector<std::string> lines;
    std::istringstream in(text);
    for (std::string line; std::getline(in, line);) lines.push_back(line);
    return lines;
}

class QuarnhostTest : public ::testing::Test {
protected:
    ProcessResult Run(std::vector<std::string> args) {
        args.insert(args.begin(), {"--state", state_});
        return RunQuarnhost(args);
    }
    // Runs a command that must succeed without a word on standard error; returns its output.
    std::string Ok(const std::vector<std::string>& args) {
        ProcessResult result = Run(args);
        EXPECT_EQ(result.status, 0) << ::testing::PrintToString(args) << result.err;
        EXPECT_EQ(result.err, "") << ::testing::PrintToString(args);
        return result.out;
    }
    // A refusal: the status, nothing on stdout, one line on stderr that contains `text`.
    void ExpectRefusal(const std::vector<std::string>& args, int status, const std::string& text) {
        ExpectOneLine(Run(args), status, text, ::testing::PrintToString(args));
    }
    static void ExpectOneLine(const ProcessResult& result, int status, const std::string& text,
                              const std::string& trace = "") {
        SCOPED_TRACE(trace);
        EXPECT_EQ(result.status, status);
        EXPECT_EQ(result.out, "");
        ASSERT_FALSE(result.err.empty());
        EXPECT_EQ(result.err.rfind("quarnhost: ", 0), 0u) << result.err;
        EXPECT_EQ(result.err.find('\n'), result.err.size() - 1) << result.err;
        EXPECT_NE(result.err.find(text), std::string::npos) << result.err;
    }
    std::string Export() { return Ok({"export"}); }
    void Init(const std::string& scenario = "default.json") {
        Ok({"init", "--scenario", simtest::ScenarioFile(scenario)});
    }
    void TearDown() override { simhost::CloseHost(); }

    testsupport::TempDir dir_;
    std::string state_ = dir_ / "host";
};

TEST_F(QuarnhostTest, EveryCommandHasItsOwnHelp) {
    ProcessResult general = RunQuarnhost({"--help"});
    EXPECT_EQ(general.status, 0);
    EXPECT_EQ(general.err, "");
    for (const char* word : {"init", "export", "fault", "journal", "--state", "--host-state",
                             "--version", "QUARN_HOST_STATE"})
        EXPECT_NE(general.out.find(word), std::string::npos) << word;
    const std::map<std::vector<std::string>, std::vector<std::string>> commands = {
        {{"init"}, {"quarnhost init", "--scenario", "--force", "standard input", "256 MiB"}},
        {{"export"}, {"quarnhost export"}},
        {{"fault"}, {"quarnhost fault", "add", "list", "clear"}},
        {{"fault", "add"}, {"quarnhost fault add", "OPERATION", "MESSAGE", "--times"}},
        {{"fault", "list"}, {"quarnhost fault list"}},
        {{"fault", "clear"}, {"quarnhost fault clear", "OPERATION"}},
        {{"journal"}, {"quarnhost journal", "--clear", "--limit", "--json"}},
    };
    for (const auto& [words, expected] : commands) {
        for (const char* flag : {"--help", "-h"}) {
            std::vector<std::string> args = words;
            args.push_back(flag);
            ProcessResult help = RunQuarnhost(args);
            SCOPED_TRACE(::testing::PrintToString(args));
            EXPECT_EQ(help.status, 0);
            EXPECT_NE(help.out, general.out);
            for (const std::string& word : expected)
                EXPECT_NE(help.out.find(word), std::string::npos) << word << "\n" << help.out;
        }
    }
    // Help asked for beside other words still helps and touches no host.
    EXPECT_EQ(Run({"fault", "add", "x", "--help"}).status, 0);
    EXPECT_FALSE(std::filesystem::exists(state_));

    ProcessResult version = RunQuarnhost({"--version"});
    EXPECT_EQ(version.status, 0);
    EXPECT_TRUE(std::regex_match(version.out, std::regex("quarnhost \\d+\\.\\d+\\.\\d+\n"))) << version.out;
}

TEST_F(QuarnhostTest, InitCreatesRefusesAndReplaces) {
    ProcessResult created = Run({"init", "--scenario", simtest::ScenarioFile("no-netboot.json")});
    EXPECT_EQ(created.status, 0) << created.err;
    EXPECT_EQ(created.out, "Created the simulated host at '" + state_ + "' from '" +
                               simtest::ScenarioFile("no-netboot.json") + "'\n");
    EXPECT_EQ(created.err, "");  // init reports on standard output, not as a first use
    EXPECT_TRUE(simtest::Holds(Export(), testsupport::ReadFile(simtest::ScenarioFile("no-netboot.json"))));

    ExpectRefusal({"init"}, 1, "already exists at '" + state_ + "'; use --force");
    EXPECT_TRUE(simtest::Holds(Export(), testsupport::ReadFile(simtest::ScenarioFile("no-netboot.json"))));

    EXPECT_EQ(Ok({"init", "--force"}),
              "Replaced the simulated host at '" + state_ + "' from the default scenario\n");
    EXPECT_TRUE(simtest::Holds(Export(), simhost::DefaultScenario()));

    // Standard input, here a file and a pipe.
    ProcessResult piped = simtest::RunQuarnhostWithInput(
        {"--host-state", state_, "init", "--force", "--scenario", "-"},
        simtest::ScenarioFile("stateless.json"));
    EXPECT_EQ(piped.status, 0) << piped.err;
    EXPECT_EQ(piped.out, "Replaced the simulated host at '" + state_ + "' from standard input\n");
    EXPECT_TRUE(simtest::Holds(Export(), testsupport::ReadFile(simtest::ScenarioFile("stateless.json"))));
    ProcessResult through_pipe = testsupport::RunProgram(
        "/bin/sh", {"-c", "cat \"$1\" | \"$0\" --state \"$2\" init --force --scenario -", QUARNHOST_PATH,
                    simtest::ScenarioFile("no-netboot.json"), state_});
    EXPECT_EQ(through_pipe.status, 0) << through_pipe.err;
    EXPECT_TRUE(simtest::Holds(Export(), testsupport::ReadFile(simtest::ScenarioFile("no-netboot.json"))));
}

TEST_F(QuarnhostTest, ABadScenarioIsRefusedWithItsLocationAndChangesNothing) {
    Init("stateless.json");
    std::string before = Export();
    std::string bad = dir_ / "bad.json";
    testsupport::WriteFile(bad, simtest::EditedDefault("/identity/product", std::string(40, 'q')));
    ExpectRefusal({"init", "--force", "--scenario", bad}, 1,
                  "'" + bad + "': scenario: identity.product: expected a string of at most 31 bytes");
    testsupport::WriteFile(bad, "{\"format\": 1,");
    ExpectRefusal({"init", "--force", "--scenario", bad}, 1, "scenario: not valid JSON");
    ExpectOneLine(simtest::RunQuarnhostWithInput({"--state", state_, "init", "--force", "--scenario", "-"}, bad),
                  1, "standard input: scenario: not valid JSON");
    ExpectRefusal({"init", "--force", "--scenario", dir_ / "missing.json"}, 1,
                  "cannot read '" + dir_ / "missing.json" + "': No such file or directory");
    EXPECT_TRUE(simtest::Holds(Export(), before));
}

TEST_F(QuarnhostTest, ScenarioSourcesAreRegularFilesOrStandardInputWithinTheLimit) {
    Init();
    std::string before = Export();
    // A FIFO would block and /dev/zero never ends: neither is read.
    std::string fifo = dir_ / "fifo";
    ASSERT_EQ(mkfifo(fifo.c_str(), 0600), 0);
    ExpectRefusal({"init", "--force", "--scenario", fifo}, 1, "'" + fifo + "' is not a regular file");
    ExpectRefusal({"init", "--force", "--scenario", "/dev/zero"}, 1, "'/dev/zero' is not a regular file");
    ExpectRefusal({"init", "--force", "--scenario", dir_.Path()}, 1, "is not a regular file");
    // One byte over 256 MiB, as a sparse file: refused from its size, and from standard input
    // once that much was read.
    std::string big = dir_ / "big.json";
    std::filesystem::resize_file((testsupport::WriteFile(big, ""), big), (std::uintmax_t{256} << 20) + 1);
    ExpectRefusal({"init", "--force", "--scenario", big}, 1,
                  "'" + big + "' is larger than the 256 MiB a scenario may have");
    ExpectOneLine(simtest::RunQuarnhostWithInput({"--state", state_, "init", "--force", "--scenario", "-"}, big),
                  1, "standard input is larger than the 256 MiB a scenario may have");
    // An empty value is no scenario at all, not the default one.
    ExpectRefusal({"init", "--force", "--scenario="}, 2, "--scenario");
    ExpectRefusal({"init", "--force", "--scenario", ""}, 2,
                  "--scenario needs a file, or - for standard input");
    EXPECT_TRUE(simtest::Holds(Export(), before));
}

TEST_F(QuarnhostTest, FirstUseCreatesTheDefaultHostAndSaysWhere) {
    ProcessResult first = Run({"export"});
    EXPECT_EQ(first.status, 0);
    EXPECT_TRUE(simtest::Holds(first.out, simhost::DefaultScenario()));
    EXPECT_EQ(first.err,
              "quarnhost: created a new simulated host at '" + state_ + "' from the default scenario\n");
    EXPECT_TRUE(std::filesystem::is_directory(state_ + "/root"));
    EXPECT_TRUE(simtest::Holds(Export(), simhost::DefaultScenario()));  // said once only
}

TEST_F(QuarnhostTest, FaultsAreAddedListedAndCleared) {
    Init();
    Ok({"fault", "add", kGetUuid, "UUID unavailable", "--times", "3"});
    Ok({"fault", "add", "--times=2", "QuillUserLib_Init", "two\tparts"});
    ExpectRefusal({"fault", "add", "NorlithCtl::Util::Sysinfo::Get", "-x"}, 2,
                  "unknown option '-x' for fault add");
    Ok({"fault", "add", "--", "NorlithCtl::Util::Sysinfo::Get", "-- always"});
    Ok({"fault", "add", "QuillUserLib_Close", "é"});
    EXPECT_EQ(Ok({"fault", "list"}),
              "OPERATION                                          MESSAGE             TIMES\n"
              "NorlithCtl::System::SystemInfoImpl::GetSystemUuid  \"UUID unavailable\"  3 left\n"
              "NorlithCtl::Util::Sysinfo::Get                     \"-- always\"         always\n"
              "QuillUserLib_Close                                 \"é\"                 always\n"
              "QuillUserLib_Init                                  \"two\\tparts\"        2 left\n");
    auto faults = simhost::Host(state_).Faults();
    ASSERT_EQ(faults.size(), 4u);
    EXPECT_EQ(faults[3].message, "two\tparts");
    simhost::CloseHost();

    // One fault by name; a name without a fault, or no operation at all, is refused.
    Ok({"fault", "clear", "QuillUserLib_Init"});
    ExpectRefusal({"fault", "clear", "QuillUserLib_Init"}, 1, "no fault is set on 'QuillUserLib_Init'");
    ExpectRefusal({"fault", "clear", "GetSystemUUID"}, 2,
                  "unknown operation 'GetSystemUUID' (nearest: " + kGetUuid);
    EXPECT_EQ(Lines(Ok({"fault", "list"})).size(), 4u);
    Ok({"fault", "clear"});
    EXPECT_EQ(Ok({"fault", "list"}), "");
}

TEST_F(QuarnhostTest, JournalPrintsAlignedRowsJsonLinesAndClears) {
    Init();
    Ok({"fault", "add", "QuillUserLib_AddQuill", "full", "--times", "1"});
    {
        testsupport::EnvOverride env("QUARN_HOST_STATE", state_);
        ASSERT_EQ(QuillUserLib_Init(), 0);
        EXPECT_EQ(QuillUserLib_AddQuill("first"), -1);
        for (int i = 0; i < 10; ++i) EXPECT_EQ(QuillUserLib_AddQuill("entry %d", i), 0);
        QuillUserLib_Close();
        simhost::CloseHost();
    }
    std::vector<std::string> lines = Lines(Ok({"journal"}));
    ASSERT_EQ(lines.size(), 12u);
    EXPECT_EQ(lines[0], "SEQUENCE  TIME                      KIND    OPERATION              ARGUMENTS");
    std::regex row(R"((\d+) +\d{4}-\d\d-\d\dT\d\d:\d\d:\d\d\.\d{3}Z  (change|fault ) +QuillUserLib_AddQuill  \{.*\})");
    for (std::size_t i = 1; i < lines.size(); ++i) {
        EXPECT_TRUE(std::regex_match(lines[i], row)) << lines[i];
        EXPECT_EQ(lines[i].find("20"), lines[0].find("TIME")) << lines[i];  // aligned under TIME
    }
    EXPECT_NE(lines[1].find(" fault   QuillUserLib_AddQuill  {\"message\":\"first\"}"), std::string::npos);
    EXPECT_NE(lines[11].find(" change  QuillUserLib_AddQuill  {\"message\":\"entry 9\"}"),
              std::string::npos);

    std::vector<std::string> last = Lines(Ok({"journal", "--limit", "2"}));
    ASSERT_EQ(last.size(), 3u);
    EXPECT_EQ(last[2].substr(last[2].find("QuillUserLib")), lines[11].substr(lines[11].find("QuillUserLib")));
    EXPECT_EQ(Ok({"journal", "--limit=0"}), "");
    std::vector<std::string> json = Lines(Ok({"journal", "--json", "--limit", "3"}));
    ASSERT_EQ(json.size(), 3u);
    std::int64_t previous = 0;
    for (const std::string& line : json) {
        auto entry = nlohmann::json::parse(line);
        EXPECT_GT(entry["sequence"].get<std::int64_t>(), previous);
        previous = entry["sequence"];
        EXPECT_EQ(entry["kind"], "change");
        EXPECT_EQ(entry["operation"], "QuillUserLib_AddQuill");
    }
    EXPECT_EQ(nlohmann::json::parse(json[2])["arguments"], nlohmann::json({{"message", "entry 9"}}));
    EXPECT_EQ(Lines(Ok({"journal", "--json"})).size(), 11u);

    ExpectRefusal({"journal", "--limit", "-1"}, 2, "--limit expects a whole number");
    ExpectRefusal({"journal", "--clear", "--json"}, 2, "--clear takes neither --json nor --limit");
    Ok({"journal", "--clear"});
    EXPECT_EQ(Ok({"journal"}), "");
    EXPECT_EQ(Ok({"journal", "--json"}), "");
}

TEST_F(QuarnhostTest, UsageErrorsExitWithTwoNamingTheProblem) {
    ExpectRefusal({}, 2, "missing command (init, export, fault, journal, syslog, observations, operations or netdump-server)");
    ExpectRefusal({"reboot"}, 2, "unknown command 'reboot'");
    ExpectRefusal({"--verbose", "export"}, 2, "unknown option '--verbose'");
    ExpectRefusal({"export", "--all"}, 2, "unknown option '--all' for export (see 'quarnhost export --help')");
    ExpectRefusal({"export", "now"}, 2, "unexpected argument 'now' for export");
    ExpectRefusal({"init", "--scenario"}, 2, "--scenario");
    ExpectRefusal({"init", "--force=yes"}, 2, "force");
    ExpectRefusal({"journal", "--clear", "--clear"}, 2, "--clear");
    ExpectRefusal({"fault"}, 2, "fault needs an action (add, list or clear)");
    ExpectRefusal({"fault", "remove"}, 2, "unknown fault action 'remove'");
    ExpectRefusal({"fault", "add", kGetUuid}, 2,
                  "fault add needs an OPERATION and a MESSAGE (see 'quarnhost fault add --help')");
    ExpectRefusal({"fault", "add", kGetUuid, "m", "extra"}, 2, "unexpected argument 'extra' for fault add");
    ExpectRefusal({"fault", "add", kGetUuid, "m", "--times"}, 2, "--times");
    for (const char* times : {"0", "-1", "abc", "1e3", "2.5", "1000000001", "99999999999999999999"})
        ExpectRefusal({"fault", "add", kGetUuid, "m", "--times", times}, 2, "--times expects");
    ExpectRefusal({"fault", "add", "SystemInfoImpl::GetSystemUUID", "m"}, 2,
                  "unknown operation 'SystemInfoImpl::GetSystemUUID' (nearest: " + kGetUuid);
    ExpectOneLine(RunQuarnhost({"--state"}), 2, "--state");
    ExpectOneLine(RunQuarnhost({"--state", "", "export"}), 2, "--state needs a directory");
    // None of these created or changed a host.
    EXPECT_FALSE(std::filesystem::exists(state_));
}

TEST_F(QuarnhostTest, OutputThatCannotBeWrittenIsAFailure) {
    Init();
    Ok({"fault", "add", kGetUuid, "m"});
    for (const std::vector<std::string>& args : std::vector<std::vector<std::string>>{
             {"--help"}, {"fault", "add", "--help"}, {"--version"}, {"export"}, {"fault", "list"},
             {"init", "--force"}}) {
        std::vector<std::string> with_state = {"--state", state_};
        with_state.insert(with_state.end(), args.begin(), args.end());
        ProcessResult result = testsupport::RunProgram(QUARNHOST_PATH, with_state, {}, "/dev/full");
        SCOPED_TRACE(::testing::PrintToString(args));
        EXPECT_EQ(result.status, 1);
        EXPECT_EQ(result.err, "quarnhost: cannot write the output: No space left on device\n");
    }
}

TEST_F(QuarnhostTest, UnusableStateIsAFailureThatChangesNothing) {
    testsupport::WriteFile(dir_ / "plain", "x");
    state_ = dir_ / "plain/host";
    ExpectRefusal({"export"}, 1, "Cannot open the simulated host at '" + state_ + "'");
    ExpectRefusal({"init"}, 1, "Cannot open the simulated host at '" + state_ + "'");

    state_ = dir_ / "corrupt";
    std::filesystem::create_directories(state_);
    testsupport::WriteFile(state_ + "/host.db", std::string(4096, 'z'));
    for (auto args : std::vector<std::vector<std::string>>{
             {"export"}, {"journal"}, {"fault", "list"}, {"fault", "add", kGetUuid, "m"},
             {"fault", "clear"}, {"init", "--force"}})
        ExpectRefusal(args, 1, "Cannot open the simulated host at '" + state_ + "': '" + state_ +
                                   "/host.db': file is not a database");
    EXPECT_EQ(testsupport::ReadFile(state_ + "/host.db"), std::string(4096, 'z'));
    EXPECT_EQ(std::distance(std::filesystem::directory_iterator(state_), {}), 2);  // host.lock
}

// Overwrites the page that holds table's rows with garbage, leaving every other page sound.
void SmashTable(const std::string& state, const std::string& table) {
    std::int64_t page = 0, page_size = 0;
    {
        simhost::Db db(simhost::DatabasePath(state), simhost::Db::Mode::ReadWrite);
        db.Exec("PRAGMA wal_checkpoint(TRUNCATE)");
        page_size = db.QueryInt("PRAGMA page_size");
        simhost::Query root = db.Cached("SELECT rootpage FROM sqlite_master WHERE name = ?1");
        root->Bind(1, table);
        ASSERT_TRUE(root->Step());
        page = root->Int(0);
    }
    std::fstream file(simhost::DatabasePath(state), std::ios::in | std::ios::out | std::ios::binary);
    file.seekp((page - 1) * page_size);
    file << std::string(static_cast<std::size_t>(page_size), '\xa5');
}

TEST_F(QuarnhostTest, ADamagedDatabaseIsOneClearLineUntilReplaced) {
    Init();
    Ok({"fault", "add", kGetUuid, "m"});
    SmashTable(state_, "items");
    std::string smashed = testsupport::ReadFile(state_ + "/host.db");
    // Even commands that never read the smashed page refuse the file.
    for (auto args : std::vector<std::vector<std::string>>{
             {"export"}, {"journal"}, {"fault", "list"}, {"fault", "add", kGetUuid, "m"},
             {"fault", "clear"}}) {
        ProcessResult result = Run(args);
        ExpectOneLine(result, 1, "'" + state_ + "/host.db' is damaged", ::testing::PrintToString(args));
        for (const char* sql : {"SELECT", "INSERT", "DELETE", "PRAGMA"})
            EXPECT_EQ(result.err.find(sql), std::string::npos) << result.err;
    }
    EXPECT_EQ(testsupport::ReadFile(state_ + "/host.db"), smashed);
    ExpectRefusal({"init"}, 1, "already exists");
    EXPECT_EQ(Ok({"init", "--force"}),
              "Replaced the simulated host at '" + state_ + "' from the default scenario\n");
    EXPECT_TRUE(simtest::Holds(Export(), simhost::DefaultScenario()));

    // Cut short in the middle of its pages.
    std::filesystem::resize_file(state_ + "/host.db", 3 * 4096 + 100);
    ProcessResult truncated = Run({"fault", "list"});
    ExpectOneLine(truncated, 1, "'" + state_ + "/host.db' is damaged");
    Ok({"init", "--force"});
    EXPECT_TRUE(simtest::Holds(Export(), simhost::DefaultScenario()));
}

TEST_F(QuarnhostTest, FindsItsHostLikeQuarncli) {
    testsupport::TempDir home;
    auto from_env = RunQuarnhost({"init"}, {{"QUARN_HOST_STATE", state_}});
    EXPECT_EQ(from_env.status, 0) << from_env.err;
    EXPECT_TRUE(simhost::Host(state_).Exists());
    auto from_home = RunQuarnhost(
        {"export"}, {{"QUARN_HOST_STATE", std::nullopt}, {"XDG_STATE_HOME", std::nullopt},
                     {"HOME", home.Path()}});
    EXPECT_EQ(from_home.status, 0) << from_home.err;
    EXPECT_TRUE(simhost::Host(home / ".local/state/quarncli/host").Exists());
    auto from_xdg = RunQuarnhost(
        {"journal"}, {{"QUARN_HOST_STATE", std::nullopt}, {"XDG_STATE_HOME", home / "xdg"}});
    EXPECT_EQ(from_xdg.status, 0) << from_xdg.err;
    EXPECT_TRUE(simhost::Host(home / "xdg/quarncli/host").Exists());
    auto from_option = RunQuarnhost({"--host-state", dir_ / "other", "export"},
                                    {{"QUARN_HOST_STATE", state_}});
    EXPECT_EQ(from_option.status, 0) << from_option.err;
    EXPECT_TRUE(simhost::Host(dir_ / "other").Exists());
    auto nowhere = RunQuarnhost(
        {"export"},
        {{"QUARN_HOST_STATE", std::nullopt}, {"XDG_STATE_HOME", std::nullopt}, {"HOME", std::nullopt}});
    ExpectOneLine(nowhere, 1, "Cannot locate the simulated host");
}

}  // namespace

namespace {

TEST_F(QuarnhostTest, ShowsTheHostsLogsOperationsAndEvents) {
    Init();
    EXPECT_EQ(Ok({"observations", "--limit", "1"}),
              "TIME                      EVENT              MESSAGE\n"
              "2024-03-18T09:12:44.000Z  quill.host.booted  \"Host booted: Quarn 8.0.2 build 22380479\"\n");
    EXPECT_EQ(Ok({"syslog"}), "");  // an empty log prints nothing
    {
        testsupport::EnvOverride env("QUARN_HOST_STATE", state_);
        NorlithCtl::Os::Env::Default()->Syslog(2, "line one\nline two");
        simhost::CloseHost();
    }
    EXPECT_EQ(nlohmann::json::parse(Ok({"syslog", "--json"}))["message"], "line one\nline two");
    EXPECT_NE(Ok({"syslog"}).find("\"line one\\nline two\""), std::string::npos);

    std::string operations = Ok({"operations"});
    for (const simhost::OperationInfo& info : simhost::Operations())
        EXPECT_NE(operations.find(info.name), std::string::npos) << info.name;
    EXPECT_EQ(Ok({"operations", "--markdown"}), simhost::OperationsMarkdown());

    Ok({"fault", "add", kGetUuid, "busy", "--event", "quill.host.unavailable", "--arg", "in maintenance"});
    EXPECT_NE(Ok({"fault", "list"}).find("\"The host is not available: in maintenance\""), std::string::npos);
    ExpectRefusal({"fault", "add", kGetUuid, "m", "--event", "quill.host.unavailable"}, 2,
                  "event 'quill.host.unavailable' takes 1 argument, not 0");
    ExpectRefusal({"fault", "add", kGetUuid, "m", "--arg", "x"}, 2, "--arg needs --event");
}

}  // namespace
