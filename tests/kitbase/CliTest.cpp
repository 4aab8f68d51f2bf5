// quarncli as a process, against the test plug-ins: listings, help, suggestions, parsing, the
// ways a command ends (exit statuses 0, 1 and 2 with their stdout and stderr), formatter choice,
// global options and broken plug-ins.
#include "cli/Cli.h"
#include "support/Files.h"
#include "support/Process.h"

#include <gtest/gtest.h>
#include <nlohmann/json.hpp>

#include <algorithm>
#include <cstdlib>
#include <fcntl.h>
#include <unistd.h>
#include <map>
#include <optional>
#include <sstream>
#include <string>
#include <vector>

namespace {

using Outcome = testsupport::ProcessResult;
// Variables set (or, with nullopt, removed) in quarncli's environment.
using Environment = std::map<std::string, std::optional<std::string>>;

// Runs quarncli with args (no plug-in directory added) and extra environment settings, at 80
// columns unless env sets COLUMNS; stdout goes to outPath when given.
Outcome QuarncliRaw(const std::vector<std::string>& args, Environment env = {},
                    const std::optional<std::string>& outPath = std::nullopt) {
    const char* program = std::getenv("QUARNCLI");
    if (program == nullptr) {
        ADD_FAILURE() << "QUARNCLI is not set (ctest sets it to the built quarncli)";
        return Outcome();
    }
    env.emplace("COLUMNS", "80");
    return testsupport::RunProgram(program, args, env, outPath);
}

// quarncli --plugin-dir <the good test plug-ins> args...
Outcome Quarncli(const std::vector<std::string>& args, const Environment& env = {}) {
    std::vector<std::string> all = {"--plugin-dir", KB_GOOD_PLUGINS};
    all.insert(all.end(), args.begin(), args.end());
    return QuarncliRaw(all, env);
}

// A usage error: status 2, nothing on stdout, exactly one line on stderr, returned.
std::string UsageError(const std::vector<std::string>& args) {
    Outcome outcome = Quarncli(args);
    EXPECT_EQ(2, outcome.status);
    EXPECT_EQ("", outcome.out);
    EXPECT_EQ(1, std::count(outcome.err.begin(), outcome.err.end(), '\n')) << outcome.err;
    return outcome.err;
}

TEST(Cli, NamespaceListsItsChildrenWithDescriptions) {
    Outcome outcome = Quarncli({"kb"});
    EXPECT_EQ(0, outcome.status);
    EXPECT_EQ("", outcome.err);
    EXPECT_EQ("Usage: quarncli [global options] kb <namespace|command> ... [options]\n"
              "\n"
              "Commands of the framework's test plug-in.\n"
              "\n"
              "Available namespaces:\n"
              "  deep  A namespace two levels down.\n"
              "\n"
              "Available commands:\n"
              "  echo       Echo what the input answers for every kind.\n"
              "  need       Needs its required options.\n"
              "  fail       Sets two errors.\n"
              "  partial    Sets an error and a result.\n"
              "  ravel      Throws a host-control exception.\n"
              "  crash      Throws a standard exception.\n"
              "  hoststate  Show QUARN_HOST_STATE.\n"
              "  disks      List the disks.\n"
              "  clash      Takes options named like global ones.\n"
              "  raw        Returns and reports raw host text.\n",
              outcome.out);
    EXPECT_EQ(outcome.out, Quarncli({"kb", "--help"}).out);
    EXPECT_EQ(outcome.out, Quarncli({"--help", "kb"}).out);

    Outcome root = Quarncli({});
    EXPECT_EQ(0, root.status);
    EXPECT_NE(std::string::npos, root.out.find("\nAvailable namespaces:\n  kb  Commands of"));
    EXPECT_NE(std::string::npos, root.out.find("\nGlobal options (before or after the command words):\n"));
    EXPECT_NE(std::string::npos, root.out.find("  --format-param KEY=VALUE  "));
}

TEST(Cli, CommandHelpShowsEveryParameter) {
    Outcome outcome = Quarncli({"kb", "echo", "--help"});
    EXPECT_EQ(0, outcome.status);
    EXPECT_EQ("Usage: quarncli [global options] kb echo [options]\n"
              "\n"
              "Echo what the input answers for every kind.\n"
              "\n"
              "Options:\n"
              "  -n, --name <string>  A name.\n"
              "  -c, --count <int>    How many, 1 to 100. Range: 1 to 100.\n"
              "  -e, --enable <bool>  On or off. Takes true, false, yes, no, 1 or 0.\n"
              "  -f, --force          Do it anyway. Flag: takes no value.\n"
              "  -w, --word <string>  Lower-case letters then digits. Must match: [a-z]+[0-9]*\n"
              "  --big <int>          Any integer.\n",
              outcome.out);
    EXPECT_EQ(outcome.out, Quarncli({"--help", "kb", "echo"}).out);
    EXPECT_EQ(outcome.out, Quarncli({"kb", "echo", "--bogus", "-h"}).out);
    EXPECT_NE(
        std::string::npos,
        Quarncli({"kb", "need", "-h"}).out.find("  -t, --target <string>  Where to go. Required."));
    EXPECT_NE(std::string::npos, Quarncli({"kb", "fail", "--help"}).out.find("takes no options"));
}

TEST(Cli, InputAnswersForEveryKindAfterParsing) {
    Outcome outcome =
        Quarncli({"--formatter", "keyvalue", "kb", "echo", "-n", "alpha", "--count=7", "--enable",
                  "No", "-f", "--word", "abc12", "--big", "-9223372036854775808"});
    ASSERT_EQ(0, outcome.status) << outcome.err;
    EXPECT_EQ("", outcome.err);
    const char* expected[] = {
        "Echo.name.has=true",      "Echo.name.string=alpha",   "Echo.name.int=0",
        "Echo.count.has=true",     "Echo.count.string=7",      "Echo.count.int=7",
        "Echo.enable.has=true",    "Echo.enable.string=false", "Echo.enable.bool=false",
        "Echo.force.has=true",     "Echo.force.flag=true",     "Echo.word.string=abc12",
        "Echo.big.string=-9223372036854775808", "Echo.big.int=-9223372036854775808"};
    for (const char* line : expected) {
        EXPECT_NE(std::string::npos, outcome.out.find(std::string(line) + "\n")) << line;
    }
    // Parameters not given read as empty, 0 and false.
    Outcome empty = Quarncli({"--formatter", "keyvalue", "kb", "echo"});
    EXPECT_NE(std::string::npos,
              empty.out.find("Echo.count.has=false\nEcho.count.string=\nEcho.count.int=0\n"
                             "Echo.count.bool=false\nEcho.count.flag=false\n"));
}

TEST(Cli, UsageErrorsExitWithStatus2AndOneLine) {
    EXPECT_EQ("quarncli: unknown option '--nmae'; did you mean '--name'?\n",
              UsageError({"kb", "echo", "--nmae", "x"}));
    EXPECT_EQ("quarncli: missing required options --target (-t) (a text value) and --level (a "
              "decimal integer)\n",
              UsageError({"kb", "need"}));
    EXPECT_EQ("quarncli: option --count (-c) takes an integer from 1 to 100, got 101\n",
              UsageError({"kb", "echo", "-c", "101"}));
    EXPECT_EQ("quarncli: option --word (-w) takes a value matching '[a-z]+[0-9]*', got 'ab-1'\n",
              UsageError({"kb", "echo", "--word=ab-1"}));
    EXPECT_EQ("quarncli: option --name (-n) is given more than once\n",
              UsageError({"kb", "echo", "-n", "a", "--name", "b"}));
    EXPECT_EQ("quarncli: unexpected argument 'stray'; this command takes only options (--name "
              "VALUE)\n",
              UsageError({"kb", "echo", "-f", "stray"}));
    EXPECT_EQ("quarncli: option --big takes a decimal integer, got '1e3'\n",
              UsageError({"kb", "echo", "--big", "1e3"}));
    EXPECT_EQ("quarncli: unknown option '--formater'; did you mean '--formatter'?\n",
              UsageError({"kb", "echo", "--formater", "json"}));
    EXPECT_EQ("quarncli: unexpected '--bogus' after 'kb deep', which is a namespace: name one of "
              "its commands (run 'quarncli kb deep' to list them)\n",
              UsageError({"kb", "deep", "--bogus"}));
}

TEST(Cli, UnknownWordsNameTheNearestChildrenOrAllOfThem) {
    EXPECT_EQ("quarncli: unknown command 'ehco' under 'kb'; did you mean 'echo'?\n",
              UsageError({"kb", "ehco"}));
    EXPECT_EQ("quarncli: unknown command 'dep' under 'kb'; did you mean 'deep'?\n",
              UsageError({"kb", "dep", "deeper"}));
    EXPECT_EQ("quarncli: unknown command 'qqqqqq' under 'kb'; valid: echo, need, fail, partial, "
              "ravel, crash, hoststate, disks, clash, raw and deep\n",
              UsageError({"kb", "qqqqqq"}));
    EXPECT_EQ("quarncli: unknown command 'KB'; did you mean 'kb'?\n", UsageError({"KB"}));
    EXPECT_EQ("quarncli: unknown command 'dne' under 'kb deep deeper'; did you mean 'done'?\n",
              UsageError({"kb", "deep", "deeper", "dne"}));
}

TEST(Cli, GlobalOptionErrorsExitWithStatus2) {
    EXPECT_EQ("quarncli: unknown formatter 'yaml'; choose simple, table, json, xml, csv or "
              "keyvalue\n",
              UsageError({"--formatter", "yaml", "kb", "echo"}));
    EXPECT_EQ("quarncli: unknown global option '--formater'; did you mean '--formatter'?\n",
              UsageError({"--formater=json", "kb"}));
    EXPECT_EQ(0u, UsageError({"--format-param", "novalue", "kb", "disks"})
                      .find("quarncli: global option '--format-param' takes KEY=VALUE"));
    EXPECT_EQ("quarncli: global option '--formatter' is given more than once\n",
              UsageError({"--formatter=json", "--formatter", "xml", "kb"}));
    EXPECT_EQ("quarncli: global option '--host-state' needs a value\n",
              UsageError({"--host-state"}));
    EXPECT_EQ("quarncli: global option '--schema' takes no value\n",
              UsageError({"--schema=yes"}));
}

TEST(Cli, CommandErrorsGoToStderrInOrderWithStatus1) {
    Outcome fail = Quarncli({"kb", "fail"});
    EXPECT_EQ(1, fail.status);
    EXPECT_EQ("", fail.out);
    EXPECT_EQ("Unable to open the vault: the door is stuck\nSecond complaint\n", fail.err);

    Outcome partial = Quarncli({"kb", "partial"});
    EXPECT_EQ(1, partial.status);
    EXPECT_EQ("first item\n", partial.out);
    EXPECT_EQ("Partly done: 1 of 2 items failed\n", partial.err);
}

TEST(Cli, ExceptionsFromCommandsAreCaughtWithStatus1) {
    Outcome ravel = Quarncli({"kb", "ravel"});
    EXPECT_EQ(1, ravel.status);
    EXPECT_EQ("", ravel.out);
    EXPECT_EQ("set before the throw\nHost refused: maintenance mode required\n", ravel.err);

    Outcome crash = Quarncli({"kb", "crash"});
    EXPECT_EQ(1, crash.status);
    EXPECT_EQ("", crash.out);
    EXPECT_EQ("quarncli: internal error in 'kb crash': wires crossed\n", crash.err);
}

TEST(Cli, FormatterAndFormatParamsSteerTheOutput) {
    Outcome table = Quarncli({"kb", "disks"});
    EXPECT_EQ(0, table.status);
    EXPECT_EQ("Name     Size (B)  Note\n"
              "-------  --------  ------------------------------------------\n"
              "root     4096      boot volume\n"
              "scratch  65536     fast temporary space for builds and caches\n",
              table.out);
    Outcome steered = Quarncli({"--format-param", "table-columns=Name,Mounted", "--format-param",
                           "show-header:Disk=false", "kb", "disks"});
    EXPECT_EQ("root     true\nscratch  false\n", steered.out);
    Outcome wrapped =
        Quarncli({"--format-param=wrap-last=true", "kb", "disks"}, {{"COLUMNS", "40"}});
    EXPECT_EQ("Name     Size (B)  Note\n"
              "-------  --------  ---------------------\n"
              "root     4096      boot volume\n"
              "scratch  65536     fast temporary space\n"
              "                   for builds and caches\n",
              wrapped.out);

    Outcome json = Quarncli({"--formatter", "json", "kb", "disks"});
    EXPECT_EQ(0, json.status);
    nlohmann::json parsed = nlohmann::json::parse(json.out);
    ASSERT_EQ(2u, parsed.size());
    EXPECT_EQ(65536, parsed[1]["Size"]);
    EXPECT_EQ(false, parsed[1]["Mounted"]);
    // Commands without a default formatter print "simple".
    EXPECT_EQ("true\n", Quarncli({"kb", "deep", "deeper", "done"}).out);
}

TEST(Cli, HostStateIsHandedToPluginsThroughTheEnvironment) {
    EXPECT_EQ("/some/host dir\n",
              Quarncli({"--host-state", "/some/host dir", "kb", "hoststate"}).out);
    EXPECT_EQ("/from/env\n",
              Quarncli({"kb", "hoststate"}, {{"QUARN_HOST_STATE", "/from/env"}}).out);
    EXPECT_EQ("/option/wins\n", Quarncli({"--host-state=/option/wins", "kb", "hoststate"},
                                    {{"QUARN_HOST_STATE", "/from/env"}})
                                    .out);
}

TEST(Cli, SchemaDescribesTheTreeBelowThePath) {
    Outcome outcome = Quarncli({"--schema", "kb", "deep"});
    EXPECT_EQ(0, outcome.status);
    nlohmann::json schema = nlohmann::json::parse(outcome.out);
    EXPECT_EQ("deep", schema["name"]);
    EXPECT_EQ("kb deep", schema["path"]);
    EXPECT_EQ("kb deep deeper done", schema["children"][0]["children"][0]["path"]);
    EXPECT_EQ("command", schema["children"][0]["children"][0]["kind"]);

    nlohmann::json root = nlohmann::json::parse(Quarncli({"--schema"}).out);
    EXPECT_EQ("", root["path"]);
    EXPECT_EQ("kb", root["children"][0]["name"]);
    EXPECT_EQ(0u, UsageError({"--schema", "kb", "nope"}).find("quarncli: unknown command 'nope'"));
    EXPECT_EQ("quarncli: --schema takes command words only, got '--help'\n",
              UsageError({"--schema", "kb", "--help"}));
}

TEST(Cli, BrokenPluginsAreReportedAndTheOthersStillServe) {
    Outcome outcome =
        QuarncliRaw({"--plugin-dir", KB_MIXED_PLUGINS, "kb", "deep", "deeper", "done"});
    EXPECT_EQ(0, outcome.status);
    EXPECT_EQ("true\n", outcome.out);
    std::string dir = KB_MIXED_PLUGINS;
    std::istringstream lines(outcome.err);
    std::string line;
    std::vector<std::string> reports;
    while (std::getline(lines, line)) reports.push_back(line);
    ASSERT_EQ(3u, reports.size()) << outcome.err;
    // In name order: no entry point, the plug-in that throws, the file that is no library.
    EXPECT_EQ("quarncli: plug-in '" + dir + "/libaa_noentry.so' has no entry point "
              "AutoCli_RegisterNamespaces; skipped",
              reports[0]);
    EXPECT_EQ("quarncli: plug-in '" + dir + "/libzz_throwing.so' failed while registering its "
              "commands: registration broke halfway",
              reports[1]);
    EXPECT_EQ(0u, reports[2].find("quarncli: cannot load plug-in '" + dir + "/notaplugin.so': "));
    // What the throwing plug-in attached before it failed stays reachable.
    EXPECT_NE(
        std::string::npos,
        QuarncliRaw({"--plugin-dir", KB_MIXED_PLUGINS}).out.find("  half  Registered before"));
}

TEST(Cli, CommandsThatCannotDescribeThemselvesFailWithStatus1) {
    const std::string expected =
        "quarncli: internal error in 'half broken': no parameters today\n";
    for (const std::vector<std::string>& words :
         {std::vector<std::string>{"half", "broken"}, {"half", "broken", "--help"}}) {
        std::vector<std::string> args = {"--plugin-dir", KB_MIXED_PLUGINS};
        args.insert(args.end(), words.begin(), words.end());
        Outcome outcome = QuarncliRaw(args);
        EXPECT_EQ(1, outcome.status);
        EXPECT_EQ("", outcome.out);
        EXPECT_NE(std::string::npos, outcome.err.find(expected)) << outcome.err;
    }
    // The schema is all or nothing.
    Outcome schema = QuarncliRaw({"--plugin-dir", KB_MIXED_PLUGINS, "--schema", "half"});
    EXPECT_EQ(1, schema.status);
    EXPECT_EQ("", schema.out);
    EXPECT_NE(std::string::npos,
              schema.err.find("quarncli: internal error in --schema: no parameters today\n"));
}

TEST(Cli, MissingPluginDirectoryIsOneLine) {
    Outcome outcome = QuarncliRaw({"--plugin-dir", "/nonexistent/plugins", "kb"});
    EXPECT_EQ(2, outcome.status);
    EXPECT_EQ("", outcome.out);
    EXPECT_EQ("quarncli: cannot read the plug-in directory '/nonexistent/plugins': No such file "
              "or directory\n",
              outcome.err);
}

TEST(Cli, VersionAndWriteFailures) {
    Outcome version = QuarncliRaw({"--version"});
    EXPECT_EQ(0, version.status);
    EXPECT_EQ("quarncli (Kitbase) 1.0.0\n", version.out);

    Outcome full = QuarncliRaw({"--plugin-dir", KB_GOOD_PLUGINS, "kb", "disks"}, {}, "/dev/full");
    EXPECT_EQ(1, full.status);
    EXPECT_EQ("quarncli: cannot write the output: No space left on device\n", full.err);
    // The command's own messages still reach stderr, before the write failure.
    Outcome partial =
        QuarncliRaw({"--plugin-dir", KB_GOOD_PLUGINS, "kb", "partial"}, {}, "/dev/full");
    EXPECT_EQ(1, partial.status);
    EXPECT_EQ("Partly done: 1 of 2 items failed\n"
              "quarncli: cannot write the output: No space left on device\n",
              partial.err);
}

TEST(Cli, GlobalOptionsMayFollowThePath) {
    nlohmann::json echo = nlohmann::json::parse(
        Quarncli({"kb", "echo", "-n", "x", "--formatter", "json", "-f"}).out);
    EXPECT_EQ("x", echo["name.string"]);
    EXPECT_EQ(true, echo["force.flag"]);
    EXPECT_EQ("root     true\nscratch  false\n",
              Quarncli({"kb", "disks", "--format-param=table-columns=Name,Mounted",
                        "--format-param", "show-header:Disk=no"})
                  .out);
    EXPECT_EQ("/after\n", Quarncli({"kb", "hoststate", "--host-state", "/after"}).out);
    // Also the plug-in directory, and after a namespace's words.
    Outcome listed = QuarncliRaw({"kb", "deep", "--plugin-dir", KB_GOOD_PLUGINS, "--formatter=csv"});
    EXPECT_EQ(0, listed.status) << listed.err;
    EXPECT_EQ("Name,Kind,Description\r\ndeeper,namespace,Three levels down.\r\n", listed.out);
    EXPECT_EQ("kb deep", nlohmann::json::parse(Quarncli({"kb", "deep", "--schema"}).out)["path"]);
    EXPECT_EQ("quarncli: global option '--formatter' is given more than once\n",
              UsageError({"--formatter", "json", "kb", "echo", "--formatter", "xml"}));
    EXPECT_EQ("quarncli: global option '--formatter' needs a value\n",
              UsageError({"kb", "echo", "--formatter"}));
}

TEST(Cli, ACommandsOwnOptionWinsOverTheGlobalOneOfItsName) {
    Outcome clash = Quarncli({"kb", "clash", "--formatter", "mine", "--plugin-dir=/mine"});
    EXPECT_EQ(0, clash.status) << clash.err;
    EXPECT_EQ("formatter=mine plugin-dir=/mine\n", clash.out);
    // Read as global at first, --plugin-dir turns out to be the command's: the tree is built
    // again from the default directory, which has no "kb".
    Outcome rebuilt = QuarncliRaw({"kb", "clash", "--plugin-dir", KB_GOOD_PLUGINS});
    EXPECT_EQ(2, rebuilt.status);
    EXPECT_EQ(0u, rebuilt.err.find("quarncli: unknown command 'kb'")) << rebuilt.err;
}

TEST(Cli, FormatParamsAreCheckedBeforeTheCommandRuns) {
    // "kb fail" would print its errors; a refused setting stops it first.
    EXPECT_EQ("quarncli: global option '--format-param': unknown key 'foo'; keys are "
              "fields:<Struct>, show-header:<Struct>, table-columns, units:<Struct>.<Field> and "
              "wrap-last\n",
              UsageError({"--format-param", "foo=bar", "kb", "fail"}));
    EXPECT_EQ("quarncli: global option '--format-param': unknown field 'size' in 'fields:Disk'; "
              "the fields of Disk are Name, Size, Mounted and Note; did you mean 'Size'?\n",
              UsageError({"kb", "disks", "--format-param", "fields:Disk=Name,size"}));
    EXPECT_EQ("quarncli: global option '--format-param': 'show-header:Disk' takes true, false, "
              "yes, no, 1 or 0, got 'maybe'\n",
              UsageError({"kb", "disks", "--format-param", "show-header:Disk=maybe"}));
    // A namespace listing has the shape of its children.
    EXPECT_EQ(0u, UsageError({"--formatter", "json", "--format-param", "fields:Disk=Name", "kb"})
                      .find("quarncli: global option '--format-param': unknown structure 'Disk' "
                            "in 'fields:Disk'; this command's structures are Child"));
}

TEST(Cli, NamespaceListingsHonourTheFormatter) {
    nlohmann::json children = nlohmann::json::parse(Quarncli({"--formatter", "json", "kb"}).out);
    ASSERT_EQ(11u, children.size());
    EXPECT_EQ((nlohmann::json{{"Name", "echo"},
                              {"Kind", "command"},
                              {"Description", "Echo what the input answers for every kind."}}),
              children[0]);
    EXPECT_EQ("namespace", children[10]["Kind"]);
    EXPECT_EQ("Name    Kind       Description\n"
              "------  ---------  ------------------\n"
              "deeper  namespace  Three levels down.\n",
              Quarncli({"--formatter", "table", "kb", "deep"}).out);
    EXPECT_EQ("Child[0].Name=deeper\nChild[0].Kind=namespace\n"
              "Child[0].Description=Three levels down.\n",
              Quarncli({"kb", "deep", "--formatter", "keyvalue"}).out);
    EXPECT_EQ("   Name: deeper\n",
              Quarncli({"--formatter", "simple", "--format-param", "fields:Child=Name",
                        "--format-param", "show-header:Child=false", "kb", "deep"})
                  .out);
}

TEST(Cli, HostTextIsEscapedInOutputAndMessages) {
    Outcome raw = Quarncli({"kb", "raw"});
    EXPECT_EQ(1, raw.status);
    EXPECT_EQ("Raw:\n   Text: one\\nRaw:\\n   Text: forged\\x1b[2J\n", raw.out);
    // One line per message, in order, nothing raw.
    EXPECT_EQ("fault: disk\\nquarncli: all is well\\x1b[0m\nsecond\n", raw.err);
    EXPECT_EQ("Raw.Text=one\\nRaw:\\n   Text: forged\\x1b[2J\n",
              Quarncli({"kb", "raw", "--formatter", "keyvalue"}).out);
    EXPECT_EQ("Text\r\n\"one\nRaw:\n   Text: forged\x1b[2J\"\r\n",
              Quarncli({"kb", "raw", "--formatter", "csv"}).out);
    EXPECT_EQ("one\nRaw:\n   Text: forged\x1b[2J",
              nlohmann::json::parse(Quarncli({"kb", "raw", "--formatter", "json"}).out)["Text"]);
}

// Runs quarncli's logic in this process with the program's location unreadable.
Outcome RunWithoutProgramLocation(const std::vector<std::string>& args) {
    testsupport::TempDir dir;
    int out = open((dir / "out").c_str(), O_WRONLY | O_CREAT | O_TRUNC, 0600);
    int err = open((dir / "err").c_str(), O_WRONLY | O_CREAT | O_TRUNC, 0600);
    Kitbase::Cli::RunSettings settings;
    settings.exeLink = "/nonexistent/exe";
    Outcome outcome;
    outcome.status = Kitbase::Cli::Run(args, out, err, settings);
    close(out);
    close(err);
    outcome.out = testsupport::ReadFile(dir / "out");
    outcome.err = testsupport::ReadFile(dir / "err");
    return outcome;
}

TEST(Cli, AnUnreadableProgramLocationLoadsNoPluginsFromElsewhere) {
    Outcome lost = RunWithoutProgramLocation({"kb", "deep"});
    EXPECT_EQ(1, lost.status);
    EXPECT_EQ("", lost.out);
    EXPECT_EQ("quarncli: cannot find the plug-in directory: the program's location "
              "(/nonexistent/exe) cannot be read: No such file or directory; give --plugin-dir "
              "DIR\n",
              lost.err);
    Outcome given = RunWithoutProgramLocation({"--plugin-dir", KB_GOOD_PLUGINS, "kb", "deep",
                                               "deeper", "done"});
    EXPECT_EQ(0, given.status) << given.err;
    EXPECT_EQ("true\n", given.out);
}

TEST(Cli, EveryOutputFailsWithStatus1WhenItCannotBeWritten) {
    for (const std::vector<std::string>& args : std::vector<std::vector<std::string>>{
             {"--version"}, {"--help"}, {"kb"}, {"--formatter", "json", "kb"}, {"--schema"},
             {"kb", "echo", "--help"}}) {
        std::vector<std::string> all = {"--plugin-dir", KB_GOOD_PLUGINS};
        all.insert(all.end(), args.begin(), args.end());
        Outcome full = QuarncliRaw(all, {}, "/dev/full");
        EXPECT_EQ(1, full.status) << args[0];
        EXPECT_EQ("quarncli: cannot write the output: No space left on device\n", full.err);
    }
}

}  // namespace
