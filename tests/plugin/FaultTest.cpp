// The generic fault test: for every registered invocation of a command, each host operation the
// invocation calls is made to fail in turn, and the command must report that failure as it
// promises (its message form and prefix, no result, nothing escaping) and release every host
// object it received. One loop for every command; no hand-written copy per fault.
#include "Harness.h"

#include <norlithctl/RavelException.h>
#include <simhost/Events.h>
#include <simhost/Host.h>
#include <simhost/Trace.h>

#include <gtest/gtest.h>

#include <algorithm>
#include <set>

namespace {

using plugintest::FaultCase;
using plugintest::Outcome;

const char kEvent[] = "quill.host.operation.failed";

plugintest::CommandPtr Make(const FaultCase& c) {
    if (c.before) c.before();
    return c.make ? c.make() : plugintest::FindCommand(c.path);
}

plugintest::InputPtr InputOf(const FaultCase& c) {
    plugintest::InputPtr input = Kitbase::CallSpec::Input::New();
    if (c.input) c.input(*input);
    return input;
}

std::string Scenario(const FaultCase& c) {
    return c.scenario.empty() ? simhost::DefaultScenario() : c.scenario;
}

// The host operations an invocation calls, each once, in the order of their first call.
std::vector<std::string> OperationsOf(const FaultCase& c) {
    simhost::trace::Enable();
    plugintest::Run run = plugintest::Execute(Make(c), InputOf(c));
    simhost::trace::Disable();
    std::vector<std::string> seen;
    for (const std::string& op : simhost::trace::TakeOperations())
        if (std::find(seen.begin(), seen.end(), op) == seen.end()) seen.push_back(op);
    EXPECT_FALSE(run.escaped) << run.exception;
    EXPECT_TRUE(run.output->GetErrors().empty()) << run.output->GetErrors().front();
    EXPECT_TRUE(run.output->GetResult()) << "the invocation itself must succeed";
    EXPECT_EQ(run.leaked, 0);
    return seen;
}

std::string Replace(std::string text, const std::string& from, const std::string& to) {
    for (std::size_t at = text.find(from); at != std::string::npos; at = text.find(from, at + to.size()))
        text.replace(at, from.size(), to);
    return text;
}

class FaultTest : public ::testing::TestWithParam<FaultCase> {};

TEST_P(FaultTest, EveryFailingHostOperationIsReportedAsTheCommandPromises) {
    const FaultCase& c = GetParam();
    simhost::TempHost host(Scenario(c));
    std::vector<std::string> operations = OperationsOf(c);
    ASSERT_FALSE(operations.empty());
    for (const std::string& op : operations) {
        SCOPED_TRACE("failing operation: " + op);
        host.host().Init(Scenario(c), true);
        const std::string text = "injected failure of " + op;
        const simhost::Event event{kEvent, {op, "injected"}};
        host.host().AddFault(op, text, std::nullopt, event);
        plugintest::Run run = plugintest::Execute(Make(c), InputOf(c));
        EXPECT_EQ(run.leaked, 0) << "host objects were not released";

        auto special = c.special.find(op);
        Outcome outcome = special == c.special.end() ? Outcome() : special->second;
        const std::string message = c.form ? simhost::FormatEvent(event) : text;
        switch (outcome.kind) {
        case Outcome::kEscapes:
            EXPECT_TRUE(run.escaped);
            EXPECT_EQ(run.exception, text);
            EXPECT_TRUE(run.output->GetErrors().empty());
            EXPECT_FALSE(run.output->GetResult());
            break;
        case Outcome::kIgnored:
            EXPECT_FALSE(run.escaped) << run.exception;
            EXPECT_TRUE(run.output->GetErrors().empty());
            EXPECT_EQ(bool(run.output->GetResult()), true);
            break;
        case Outcome::kReported: {
            EXPECT_FALSE(run.escaped) << run.exception;
            std::vector<std::string> expected = outcome.errors;
            if (expected.empty()) expected.push_back(c.prefix + "{message}");
            for (std::string& line : expected) line = Replace(line, "{message}", message);
            EXPECT_EQ(run.output->GetErrors(), expected);
            EXPECT_EQ(bool(run.output->GetResult()), outcome.result);
            EXPECT_EQ(run.output->IsComplete(), outcome.result);
            break;
        }
        }
    }
}

INSTANTIATE_TEST_SUITE_P(Commands, FaultTest, ::testing::ValuesIn(plugintest::FaultCases()),
                         [](const ::testing::TestParamInfo<FaultCase>& info) { return info.param.name; });

TEST(FaultCases, EveryCommandOfTheTreeHasOne) {
    std::set<std::string> covered;
    for (const FaultCase& c : plugintest::FaultCases()) covered.insert(c.path);
    for (const std::string& path : plugintest::CommandPaths())
        EXPECT_TRUE(covered.count(path)) << "no fault case for '" << path << "'";
}

}  // namespace
