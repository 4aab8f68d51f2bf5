// quarnhost as a process: every command, and every refusal as one line with its exit status.
#include "TestSupport.h"

#include <norlithctl/QuillUserLib.h>

#include <simhost/Host.h>
#include <simhost/Store.h>

#include <gtest/gtest.h>

#include <filesystem>
#include <regex>

namespace {

using testsupport::ProcessResult;
using simtest::RunQuarnhost;

const std::string kGetUuid = "NorlithCtl::System::SystemInfoImpl::GetSystemUuid";

class QuarnhostTest : public ::testing::Test {
protected:
    ProcessResult Run(std::vector<std::string> args) {
        args.insert(args.begin(), {"--state", state_});
        return RunQuarnhost(args);
    }
    // A refusal: the status, nothing on stdout, one line on stderr that contains `text`.
    void ExpectRefusal(const std::vector<std::string>& args, int status, const std::string& text) {
        ProcessResult result = Run(args);
        SCOPED_TRACE(::testing::PrintToString(args));
        EXPECT_EQ(result.status, status);
        EXPECT_EQ(result.out, "");
        ASSERT_FALSE(result.err.empty());
        EXPECT_EQ(result.err.rfind("quarnhost: ", 0), 0u) << result.err;
        EXPECT_EQ(result.err.find('\n'), result.err.size() - 1) << result.err;
        EXPECT_NE(result.err.find(text), std::string::npos) << result.err;
    }
    std::string Export() {
        ProcessResult result = Run({"export"});
        EXPECT_EQ(result.status, 0) << result.err;
        return result.out;
    }
    void TearDown() override { simhost::CloseHost(); }

    testsupport::TempDir dir_;
    std::string state_ = dir_ / "host";
};

TEST_F(QuarnhostTest, HelpDescribesEveryCommand) {
    ProcessResult result = RunQuarnhost({"--help"});
    EXPECT_EQ(result.status, 0);
    for (const char* word : {"init", "--scenario", "--force", "export", "fault add", "--times",
                             "fault list", "fault clear", "journal", "--clear", "--state"})
        EXPECT_NE(result.out.find(word), std::string::npos) << word;
    EXPECT_EQ(RunQuarnhost({"fault", "-h"}).out, result.out);
}

TEST_F(QuarnhostTest, InitCreatesRefusesAndReplaces) {
    ProcessResult created = Run({"init", "--scenario", simtest::ScenarioFile("no-netboot.json")});
    EXPECT_EQ(created.status, 0) << created.err;
    EXPECT_NE(created.out.find("Created"), std::string::npos);
    EXPECT_TRUE(simtest::Holds(Export(), testsupport::ReadFile(simtest::ScenarioFile("no-netboot.json"))));

    ExpectRefusal({"init"}, 1, "already exists at '" + state_ + "'; use --force");
    EXPECT_TRUE(simtest::Holds(Export(), testsupport::ReadFile(simtest::ScenarioFile("no-netboot.json"))));

    ProcessResult replaced = Run({"init", "--force"});
    EXPECT_EQ(replaced.status, 0) << replaced.err;
    EXPECT_NE(replaced.out.find("Replaced"), std::string::npos);
    EXPECT_TRUE(simtest::Holds(Export(), simhost::DefaultScenario()));
}

TEST_F(QuarnhostTest, ABadScenarioFileIsRefusedWithItsLocation) {
    ASSERT_EQ(Run({"init", "--scenario", simtest::ScenarioFile("stateless.json")}).status, 0);
    std::string before = Export();
    std::string bad = dir_ / "bad.json";
    testsupport::WriteFile(bad, simtest::EditedDefault("/identity/product", std::string(40, 'q')));
    ExpectRefusal({"init", "--force", "--scenario", bad}, 1,
                  bad + ": scenario: identity.product: expected a string of at most 31 bytes");
    testsupport::WriteFile(bad, "{\"format\": 1,");
    ExpectRefusal({"init", "--force", "--scenario", bad}, 1, "scenario: not valid JSON");
    ExpectRefusal({"init", "--force", "--scenario", dir_ / "missing.json"}, 1, "cannot read");
    EXPECT_EQ(Export(), before);
}

TEST_F(QuarnhostTest, ExportCreatesTheDefaultHostOnFirstUse) {
    EXPECT_TRUE(simtest::Holds(Export(), simhost::DefaultScenario()));
    EXPECT_TRUE(std::filesystem::is_directory(state_ + "/root"));
}

TEST_F(QuarnhostTest, FaultsAreAddedListedAndCleared) {
    EXPECT_EQ(Run({"fault", "add", kGetUuid, "UUID unavailable", "--times", "3"}).status, 0);
    EXPECT_EQ(Run({"fault", "add", "--times=2", "QuillUserLib_Init", "two\tparts"}).status, 0);
    ExpectRefusal({"fault", "add", "NorlithCtl::Util::Sysinfo::Get", "-x"}, 2, "unknown option '-x'");
    EXPECT_EQ(Run({"fault", "add", "--", "NorlithCtl::Util::Sysinfo::Get", "-- always"}).status, 0);
    ProcessResult listed = Run({"fault", "list"});
    EXPECT_EQ(listed.status, 0);
    EXPECT_EQ(listed.out,
              kGetUuid + "\t\"UUID unavailable\"\t3 left\n"
              "NorlithCtl::Util::Sysinfo::Get\t\"-- always\"\talways\n"
              "QuillUserLib_Init\t\"two\\tparts\"\t2 left\n");
    auto faults = simhost::Host(state_).Faults();
    ASSERT_EQ(faults.size(), 3u);
    EXPECT_EQ(faults[2].message, "two\tparts");
    simhost::CloseHost();

    EXPECT_EQ(Run({"fault", "clear"}).status, 0);
    EXPECT_EQ(Run({"fault", "list"}).out, "");
}

TEST_F(QuarnhostTest, JournalPrintsOneLinePerEntryAndClears) {
    Run({"init"});
    Run({"fault", "add", "QuillUserLib_AddQuill", "full", "--times", "1"});
    {
        testsupport::EnvOverride env("QUARN_HOST_STATE", state_);
        ASSERT_EQ(QuillUserLib_Init(), 0);
        EXPECT_EQ(QuillUserLib_AddQuill("first"), -1);
        EXPECT_EQ(QuillUserLib_AddQuill("second one"), 0);
        QuillUserLib_Close();
        simhost::CloseHost();
    }
    ProcessResult journal = Run({"journal"});
    EXPECT_EQ(journal.status, 0);
    std::regex line(R"(\d+ \d{4}-\d\d-\d\dT\d\d:\d\d:\d\d\.\d{3}Z (change|fault) \S+ \{.*\})");
    std::vector<std::string> lines;
    std::istringstream in(journal.out);
    for (std::string text; std::getline(in, text);) {
        EXPECT_TRUE(std::regex_match(text, line)) << text;
        lines.push_back(text);
    }
    ASSERT_EQ(lines.size(), 2u);
    EXPECT_NE(lines[0].find(" fault QuillUserLib_AddQuill {\"message\":\"first\"}"), std::string::npos);
    EXPECT_NE(lines[1].find(" change QuillUserLib_AddQuill {\"message\":\"second one\"}"),
              std::string::npos);

    EXPECT_EQ(Run({"journal", "--clear"}).status, 0);
    EXPECT_EQ(Run({"journal"}).out, "");
}

TEST_F(QuarnhostTest, UsageErrorsExitWithTwo) {
    ExpectRefusal({}, 2, "missing command");
    ExpectRefusal({"reboot"}, 2, "unknown command 'reboot'");
    ExpectRefusal({"--verbose", "export"}, 2, "unknown option '--verbose'");
    ExpectRefusal({"export", "--all"}, 2, "unknown option '--all' for export");
    ExpectRefusal({"export", "now"}, 2, "unexpected argument 'now'");
    ExpectRefusal({"init", "--scenario"}, 2, "option '--scenario' needs a value");
    ExpectRefusal({"init", "--force=yes"}, 2, "takes no value");
    ExpectRefusal({"journal", "--clear", "--clear"}, 2, "given twice");
    ExpectRefusal({"fault"}, 2, "fault needs an action");
    ExpectRefusal({"fault", "remove"}, 2, "unknown fault action 'remove'");
    ExpectRefusal({"fault", "add", kGetUuid}, 2, "needs an OPERATION and a MESSAGE");
    ExpectRefusal({"fault", "add", kGetUuid, "m", "--times"}, 2, "'--times' needs a value");
    for (const char* times : {"0", "-1", "abc", "1e3", "2.5", "1000000001", "99999999999999999999"})
        ExpectRefusal({"fault", "add", kGetUuid, "m", "--times", times}, 2, "--times expects");
    ExpectRefusal({"fault", "add", "SystemInfoImpl::GetSystemUUID", "m"}, 2,
                  "unknown operation 'SystemInfoImpl::GetSystemUUID' (nearest: " + kGetUuid);
    ProcessResult no_state = RunQuarnhost({"--state"});
    EXPECT_EQ(no_state.status, 2);
    EXPECT_NE(no_state.err.find("'--state' needs a value"), std::string::npos);
    // None of these created or changed a host.
    EXPECT_FALSE(std::filesystem::exists(state_));
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
             {"init", "--force"}})
        ExpectRefusal(args, 1, "Cannot open the simulated host at '" + state_ + "'");
    EXPECT_EQ(testsupport::ReadFile(state_ + "/host.db"), std::string(4096, 'z'));
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
    auto nowhere = RunQuarnhost(
        {"export"},
        {{"QUARN_HOST_STATE", std::nullopt}, {"XDG_STATE_HOME", std::nullopt}, {"HOME", std::nullopt}});
    EXPECT_EQ(nowhere.status, 1);
    EXPECT_NE(nowhere.err.find("Cannot locate the simulated host"), std::string::npos);
}

}  // namespace
