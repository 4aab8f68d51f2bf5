// From a command's words to its output, messages and exit status.
#include "cli/CommandRun.h"

#include "cli/Guard.h"
#include "cli/Resolve.h"
#include "engine/Format.h"
#include "engine/FormatCheck.h"
#include "engine/Help.h"
#include "engine/OptionParser.h"
#include "engine/Text.h"

namespace Kitbase {
namespace Cli {

namespace {

const char kDefaultFormatter[] = "simple";

void Render(Console& console, AutoCli::Command& command, const CallSpec::OutputSpec* outputSpec,
            const MetaObj::MetaObject& result, const GlobalOptions& options) {
    Engine::FormatParams params(command.GetDefaultOutputParameters());
    for (const std::pair<std::string, std::string>& setting : options.formatParams) {
        params.Set(setting.first, setting.second);
    }
    std::string formatter =
        options.formatterSet ? options.formatter : command.GetDefaultOutputFormatter();
    if (!Engine::IsFormatter(formatter)) formatter = kDefaultFormatter;
    Engine::RenderRequest request;
    request.result = &result;
    request.resultTemplate = outputSpec ? outputSpec->GetResultTemplate().get() : nullptr;
    request.params = &params;
    request.width = Engine::TerminalWidth(console.OutFd());
    Engine::Render(formatter, request, console.Out());
}

}  // namespace

int RunCommand(Console& console, AutoCli::Command& command, const std::vector<std::string>& path,
               const CallSpec::InputSpec& spec, const std::vector<std::string>& words,
               const GlobalOptions& options) {
    const std::string where = "'" + Engine::JoinWords(path) + "'";
    Engine::ParseOutcome parsed;
    std::string failure;
    if (!options.help &&
        !Guard(where, [&] { parsed = Engine::ParseOptions(spec, words, GlobalOptionNames()); },
               &failure)) {
        console.Message(failure);
        return console.Finish(kExitFailed);
    }
    if (options.help || parsed.status == Engine::ParseOutcome::kHelp) {
        Engine::WriteCommandHelp(console.Out(), command, spec, UsageText(path, true),
                                 Engine::TerminalWidth(console.OutFd()));
        return console.Finish(kExitOk);
    }
    if (parsed.status == Engine::ParseOutcome::kError) {
        console.Error(parsed.error);
        return console.Finish(kExitUsage);
    }

    // The result's shape is asked for first: --format-param is checked against it before the
    // command runs.
    boost::shared_ptr<CallSpec::OutputSpec> outputSpec;
    if (!Guard(where, [&] { outputSpec = command.GetOutputSpec(); }, &failure)) {
        console.Message(failure);
        return console.Finish(kExitFailed);
    }
    std::string refusal;
    if (!Engine::CheckFormatParams(options.formatParams,
                                   outputSpec ? outputSpec->GetResultTemplate().get() : nullptr,
                                   &refusal)) {
        console.Error(refusal);
        return console.Finish(kExitUsage);
    }

    boost::shared_ptr<CallSpec::Output> output = CallSpec::Output::New();
    bool ran = Guard(where, [&] { command.Execute(parsed.input, output); }, &failure);
    if (ran && output->GetResult()) {
        Render(console, command, outputSpec.get(), *output->GetResult(), options);
    }
    // The result first, then the messages; a failed write of the result still lets them out.
    const std::vector<std::string>& errors = output->GetErrors();
    for (const std::string& error : errors) console.Message(error);
    if (!ran) console.Message(failure);
    return console.Finish(!ran || !errors.empty() ? kExitFailed : kExitOk);
}

}  // namespace Cli
}  // namespace Kitbase
