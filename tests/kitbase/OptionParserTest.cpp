// The option parser: every parameter kind and spelling, refusals (each one line naming the
// option and what it accepts), required parameters and constraints.
#include "engine/OptionParser.h"

#include <gtest/gtest.h>

#include <stdexcept>

namespace {

using namespace Kitbase;
using namespace Kitbase::CallSpec;
using Engine::ParseOptions;
using Engine::ParseOutcome;

boost::shared_ptr<ParameterSpec> Add(const boost::shared_ptr<InputSpec>& spec, const char* name,
                                     const char* letter, ParameterType type,
                                     bool required = false) {
    boost::shared_ptr<ParameterSpec> parameter = ParameterSpec::New(name, type);
    if (letter) parameter->SetShortName(letter);
    parameter->SetRequired(required);
    spec->AddParameter(parameter);
    return parameter;
}

boost::shared_ptr<ParameterConstraint> Range(long long low, long long high) {
    boost::shared_ptr<ParameterConstraint> range = ParameterConstraint::New(ConstraintIntRange);
    range->SetIntRange(low, high);
    return range;
}

boost::shared_ptr<ParameterConstraint> Regex(const std::string& pattern) {
    boost::shared_ptr<ParameterConstraint> regex = ParameterConstraint::New(ConstraintStringRegex);
    regex->SetStringRegex(pattern);
    return regex;
}

class OptionParserTest : public ::testing::Test {
protected:
    OptionParserTest() : spec(InputSpec::New()) {
        Add(spec, "name", "n", ParameterTypeString);
        Add(spec, "count", "c", ParameterTypeInt)->AddConstraint(Range(1, 10));
        Add(spec, "big", nullptr, ParameterTypeInt);
        Add(spec, "enable", "e", ParameterTypeBool);
        Add(spec, "force", "f", ParameterTypeFlag);
        Add(spec, "word", "w", ParameterTypeString)->AddConstraint(Regex("[a-z]+[0-9]*"));
    }

    ParseOutcome Parse(const std::vector<std::string>& args) { return ParseOptions(*spec, args); }

    // The refusal for args; fails the test when they are accepted.
    std::string Refusal(const std::vector<std::string>& args) {
        ParseOutcome outcome = Parse(args);
        EXPECT_EQ(ParseOutcome::kError, outcome.status);
        EXPECT_FALSE(outcome.input);
        EXPECT_EQ(std::string::npos, outcome.error.find('\n'));
        return outcome.error;
    }

    boost::shared_ptr<CallSpec::Input> Accepted(const std::vector<std::string>& args) {
        ParseOutcome outcome = Parse(args);
        EXPECT_EQ(ParseOutcome::kOk, outcome.status) << outcome.error;
        return outcome.input ? outcome.input : Input::New();
    }

    boost::shared_ptr<InputSpec> spec;
};

TEST_F(OptionParserTest, EveryKindInEveryForm) {
    boost::shared_ptr<Input> input =
        Accepted({"--name", "alpha", "-c", "3", "--enable=YES", "-f", "--big=-7", "-wabc1"});
    EXPECT_EQ("alpha", input->GetString("name"));
    EXPECT_EQ(3, input->GetInt("count"));
    EXPECT_EQ("3", input->GetString("count"));
    EXPECT_TRUE(input->GetBool("enable"));
    EXPECT_TRUE(input->GetFlag("force"));
    EXPECT_EQ(-7, input->GetInt("big"));
    EXPECT_EQ("abc1", input->GetString("word"));

    input = Accepted({"-n", "beta", "--count=10", "-e", "0"});
    EXPECT_EQ("beta", input->GetString("name"));
    EXPECT_EQ(10, input->GetInt("count"));
    EXPECT_FALSE(input->GetBool("enable"));
    EXPECT_TRUE(input->HasValue("enable"));
    EXPECT_FALSE(input->HasValue("force"));
    EXPECT_FALSE(input->GetFlag("force"));
    EXPECT_FALSE(input->HasValue("big"));
    EXPECT_EQ(0, input->GetInt("big"));

    EXPECT_TRUE(Accepted({})->GetString("name").empty());
}

TEST_F(OptionParserTest, ValuesMayBeEmptyOrStartWithADash) {
    boost::shared_ptr<Input> input = Accepted({"--name=", "--big", "-5"});
    EXPECT_TRUE(input->HasValue("name"));
    EXPECT_EQ("", input->GetString("name"));
    EXPECT_EQ(-5, input->GetInt("big"));
    EXPECT_EQ("--force", Accepted({"--name=--force"})->GetString("name"));
    EXPECT_EQ("-", Accepted({"-n", "-"})->GetString("name"));
    EXPECT_EQ("a=b", Accepted({"--name=a=b"})->GetString("name"));
}

TEST_F(OptionParserTest, BooleanSpellings) {
    for (const char* yes : {"true", "True", "YES", "yes", "1"}) {
        EXPECT_TRUE(Accepted({"--enable", yes})->GetBool("enable")) << yes;
    }
    for (const char* no : {"false", "FALSE", "No", "0"}) {
        boost::shared_ptr<Input> input = Accepted({"--enable", no});
        EXPECT_FALSE(input->GetBool("enable")) << no;
        EXPECT_EQ("false", input->GetString("enable"));
    }
    EXPECT_EQ("option --enable (-e) takes true, false, yes, no, 1 or 0, got 'on'",
              Refusal({"--enable", "on"}));
    EXPECT_EQ("option --enable (-e) needs a value (true, false, yes, no, 1 or 0)",
              Refusal({"--enable"}));
}

TEST_F(OptionParserTest, FlagsTakeNoValue) {
    EXPECT_EQ("option --force (-f) is a flag and takes no value, got '--force=yes'",
              Refusal({"--force=yes"}));
    // "-fx" is neither the flag nor a value for it.
    EXPECT_EQ(0u, Refusal({"-fx"}).find("unknown option '-fx'"));
    // The word after a flag is not swallowed as its value.
    EXPECT_EQ("unexpected argument 'yes'; this command takes only options (--name VALUE)",
              Refusal({"--force", "yes"}));
}

TEST_F(OptionParserTest, UnknownOptionsNameTheNearestOrAllValidOnes) {
    EXPECT_EQ("unknown option '--nmae'; did you mean '--name'?", Refusal({"--nmae", "x"}));
    EXPECT_EQ("unknown option '--enabel=1'; did you mean '--enable'?", Refusal({"--enabel=1"}));
    EXPECT_EQ("unknown option '--zzzzzz'; valid options: --name, --count, --big, --enable, "
              "--force and --word",
              Refusal({"--zzzzzz"}));
    EXPECT_EQ(0u, Refusal({"-z", "1"}).find("unknown option '-z'"));
    EXPECT_EQ(0u, Refusal({"--"}).find("unexpected argument '--'"));
    EXPECT_EQ("unknown option '--x'; this command takes no options",
              ParseOptions(*InputSpec::New(), {"--x"}).error);
    // Names valid elsewhere on the line (the global options) are suggested, never accepted.
    EXPECT_EQ("unknown option '--formater'; did you mean '--formatter'?",
              ParseOptions(*spec, {"--formater", "json"}, {"--formatter", "--schema"}).error);
    EXPECT_EQ("unknown option '--formater'; did you mean '--formatter'?",
              ParseOptions(*InputSpec::New(), {"--formater"}, {"--formatter"}).error);
    // User text in the refusal is quoted: escaped, and cut when long.
    std::string echoed = Refusal({std::string("--\x1b[2J\n") + std::string(131072, 'v')});
    EXPECT_LT(echoed.size(), 200u);
    EXPECT_EQ(0u, echoed.find("unknown option '--\\x1b[2J\\nvvv"));
}

TEST_F(OptionParserTest, RepeatedOptionsAreRefusedWhateverTheSpelling) {
    EXPECT_EQ("option --name (-n) is given more than once", Refusal({"--name", "a", "-n", "b"}));
    EXPECT_EQ("option --force (-f) is given more than once", Refusal({"-f", "--force"}));
    EXPECT_EQ("option --big is given more than once", Refusal({"--big=1", "--big=1"}));
}

TEST_F(OptionParserTest, MissingValues) {
    EXPECT_EQ("option --name (-n) needs a value (a text value)", Refusal({"--name"}));
    // A following option is not taken as the value; the message shows the way around.
    EXPECT_EQ("option --name (-n) needs a value (a text value); write --name=VALUE for a value "
              "starting with '-'",
              Refusal({"--name", "--force"}));
    EXPECT_EQ(
        "option --count (-c) needs a value (an integer from 1 to 10); write --count=VALUE for a "
        "value starting with '-'",
        Refusal({"-c", "-f"}));
    // The bare "--" is never a value, in either spelling; the '=' form still passes it.
    const std::string dashes = "option --name (-n) needs a value (a text value); write "
                               "--name=VALUE for a value starting with '-'";
    EXPECT_EQ(dashes, Refusal({"--name", "--"}));
    EXPECT_EQ(dashes, Refusal({"-n", "--", "x"}));
    EXPECT_EQ("--", Accepted({"--name=--"})->GetString("name"));
}

TEST_F(OptionParserTest, StrayPositionalWordsAreRefused) {
    EXPECT_EQ("unexpected argument 'extra'; this command takes only options (--name VALUE)",
              Refusal({"--name", "a", "extra"}));
    EXPECT_EQ(0u, Refusal({"-"}).find("unexpected argument '-'"));
}

TEST_F(OptionParserTest, IntegersAreDecimal64BitWithoutJunk) {
    EXPECT_EQ(9223372036854775807LL,
              Accepted({"--big", "9223372036854775807"})->GetInt("big"));
    EXPECT_EQ(-9223372036854775807LL - 1,
              Accepted({"--big", "-9223372036854775808"})->GetInt("big"));
    EXPECT_EQ("option --big takes a decimal integer, got '9223372036854775808'",
              Refusal({"--big", "9223372036854775808"}));
    EXPECT_EQ("option --big takes a decimal integer, got '12x'", Refusal({"--big", "12x"}));
    EXPECT_EQ("option --big takes a decimal integer, got ''", Refusal({"--big="}));
    EXPECT_EQ("option --big takes a decimal integer, got '0x1f'", Refusal({"--big=0x1f"}));
    EXPECT_EQ("option --big takes a decimal integer, got ' 1'", Refusal({"--big", " 1"}));
}

TEST_F(OptionParserTest, IntegerRangesAreInclusive) {
    EXPECT_EQ(1, Accepted({"-c", "1"})->GetInt("count"));
    EXPECT_EQ(10, Accepted({"-c", "10"})->GetInt("count"));
    EXPECT_EQ("option --count (-c) takes an integer from 1 to 10, got 0", Refusal({"-c", "0"}));
    EXPECT_EQ("option --count (-c) takes an integer from 1 to 10, got 11", Refusal({"-c11"}));
    EXPECT_EQ("option --count (-c) takes an integer from 1 to 10, got '99999999999999999999'",
              Refusal({"-c", "99999999999999999999"}));
}

TEST_F(OptionParserTest, RegularExpressionsMustMatchTheWholeValue) {
    EXPECT_EQ("abc", Accepted({"--word", "abc"})->GetString("word"));
    EXPECT_EQ("abc123", Accepted({"-w", "abc123"})->GetString("word"));
    EXPECT_EQ("option --word (-w) takes a value matching '[a-z]+[0-9]*', got 'abc1x'",
              Refusal({"--word", "abc1x"}));
    EXPECT_EQ("option --word (-w) takes a value matching '[a-z]+[0-9]*', got '9abc'",
              Refusal({"--word", "9abc"}));
    EXPECT_EQ("option --word (-w) takes a value matching '[a-z]+[0-9]*', got ''",
              Refusal({"--word="}));
    // Values that control characters would break over lines are shown escaped.
    EXPECT_EQ("option --word (-w) takes a value matching '[a-z]+[0-9]*', got 'a\\nb'",
              Refusal({"--word", "a\nb"}));
    EXPECT_EQ(0u, Refusal({"--word", std::string(5000, 'a')})
                      .find("option --word (-w) takes at most 1024 characters, got 5000"));
}

TEST_F(OptionParserTest, PatternsAreCompiledOnlyWhenTheirParameterIsGiven) {
    boost::shared_ptr<InputSpec> broken = InputSpec::New();
    Add(broken, "pattern", "p", ParameterTypeString)->AddConstraint(Regex("([unclosed"));
    Add(broken, "other", nullptr, ParameterTypeString);
    EXPECT_EQ(ParseOutcome::kOk, ParseOptions(*broken, {"--other", "x"}).status);
    EXPECT_THROW(ParseOptions(*broken, {"--pattern", "x"}), std::invalid_argument);
}

TEST_F(OptionParserTest, RequiredParametersAreNamedWithWhatTheyTake) {
    boost::shared_ptr<InputSpec> strict = InputSpec::New();
    Add(strict, "target", "t", ParameterTypeString, true);
    Add(strict, "level", nullptr, ParameterTypeInt, true)->AddConstraint(Range(0, 3));
    Add(strict, "quiet", "q", ParameterTypeFlag);
    EXPECT_EQ("missing required options --target (-t) (a text value) and --level (an integer "
              "from 0 to 3)",
              ParseOptions(*strict, {"-q"}).error);
    EXPECT_EQ("missing required option --level (an integer from 0 to 3)",
              ParseOptions(*strict, {"-t", "x"}).error);
    EXPECT_EQ(ParseOutcome::kOk, ParseOptions(*strict, {"-t", "x", "--level", "3"}).status);
    // Refusals of what was given come before what is missing.
    EXPECT_EQ(0u, ParseOptions(*strict, {"--bogus"}).error.find("unknown option '--bogus'"));
}

TEST_F(OptionParserTest, HelpWinsAnywhereUnlessTheCommandClaimsTheName) {
    EXPECT_EQ(ParseOutcome::kHelp, Parse({"--help"}).status);
    EXPECT_EQ(ParseOutcome::kHelp, Parse({"--bogus", "-h"}).status);
    EXPECT_EQ(ParseOutcome::kHelp, Parse({"--name", "x", "--help"}).status);

    boost::shared_ptr<InputSpec> claims = InputSpec::New();
    Add(claims, "host", "h", ParameterTypeString);
    ParseOutcome outcome = ParseOptions(*claims, {"-h", "example"});
    ASSERT_EQ(ParseOutcome::kOk, outcome.status);
    EXPECT_EQ("example", outcome.input->GetString("host"));
    EXPECT_EQ(ParseOutcome::kHelp, ParseOptions(*claims, {"--help"}).status);
}

}  // namespace
