// libFuzzer target over quarncli's option parsing: the global options before the path, the
// global options taken from after it, and the command-option parser.
//
// The first byte picks one of a few parameter lists (every kind with range and regex
// constraints and required parameters; one that claims -h; one without parameters); the rest,
// split at NUL bytes, is the argument list. Whatever the words, each parser must answer with
// exactly one outcome: accepted (every given parameter readable), help, or a refusal of one
// line with no control character in it (user text in it is escaped). Taking the global options
// out of the words keeps the others in order. Run by hand:
//   build-clang/bin/fuzz_option_parser -max_total_time=60
#include "cli/GlobalOptions.h"
#include "engine/OptionParser.h"

#include <kitbase/CallSpec.h>

#include <cstdint>
#include <cstdlib>
#include <string>
#include <vector>

namespace {

using namespace Kitbase::CallSpec;

boost::shared_ptr<ParameterSpec> Param(const boost::shared_ptr<InputSpec>& spec, const char* name,
                                       const char* letter, ParameterType type, bool required) {
    boost::shared_ptr<ParameterSpec> parameter = ParameterSpec::New(name, type);
    if (letter) parameter->SetShortName(letter);
    parameter->SetRequired(required);
    spec->AddParameter(parameter);
    return parameter;
}

std::vector<boost::shared_ptr<InputSpec> > Specs() {
    std::vector<boost::shared_ptr<InputSpec> > specs;

    boost::shared_ptr<InputSpec> rich = InputSpec::New();
    Param(rich, "name", "n", ParameterTypeString, false);
    boost::shared_ptr<ParameterConstraint> range = ParameterConstraint::New(ConstraintIntRange);
    range->SetIntRange(-100, 100);
    Param(rich, "count", "c", ParameterTypeInt, false)->AddConstraint(range);
    Param(rich, "big", nullptr, ParameterTypeInt, false);
    Param(rich, "enable", "e", ParameterTypeBool, false);
    Param(rich, "force", "f", ParameterTypeFlag, false);
    boost::shared_ptr<ParameterConstraint> regex = ParameterConstraint::New(ConstraintStringRegex);
    regex->SetStringRegex("([a-z]+|[0-9]{1,3}(\\.[0-9]{1,3}){3})(:[0-9]+)?");
    Param(rich, "target", "t", ParameterTypeString, false)->AddConstraint(regex);
    specs.push_back(rich);

    boost::shared_ptr<InputSpec> strict = InputSpec::New();
    Param(strict, "host", "h", ParameterTypeString, true);
    Param(strict, "port", "p", ParameterTypeInt, true);
    Param(strict, "quiet", "q", ParameterTypeFlag, false);
    specs.push_back(strict);

    specs.push_back(InputSpec::New());
    return specs;
}

// A refusal is one printable line: user text in it is escaped.
void CheckRefusal(const std::string& message) {
    if (message.empty()) abort();
    for (unsigned char c : message) {
        if (c < 0x20 || c == 0x7f) abort();
    }
}

// The global options before and after the path.
void CheckGlobalOptions(const InputSpec& spec, const std::vector<std::string>& args) {
    Kitbase::Cli::GlobalOptions options;
    std::size_t next = 0;
    std::string error;
    if (!Kitbase::Cli::ParseLeading(args, &next, &options, &error)) {
        CheckRefusal(error);
    } else if (next > args.size()) {
        abort();
    }
    Kitbase::Cli::GlobalOptions trailing;
    std::vector<std::string> remaining;
    error.clear();
    if (!Kitbase::Cli::TakeTrailing(args, &spec, &trailing, &remaining, &error)) {
        CheckRefusal(error);
        return;
    }
    // What is left is the words in their order, some taken out.
    std::size_t at = 0;
    for (const std::string& word : remaining) {
        while (at < args.size() && args[at] != word) ++at;
        if (at == args.size()) abort();
        ++at;
    }
}

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const uint8_t* data, size_t size) {
    static const std::vector<boost::shared_ptr<InputSpec> > specs = Specs();
    if (size == 0) return 0;
    const InputSpec& spec = *specs[data[0] % specs.size()];
    std::vector<std::string> args;
    std::string current;
    for (size_t i = 1; i < size; ++i) {
        if (data[i] == 0) {
            args.push_back(current);
            current.clear();
        } else {
            current += static_cast<char>(data[i]);
        }
    }
    if (size > 1) args.push_back(current);

    CheckGlobalOptions(spec, args);
    Kitbase::Engine::ParseOutcome outcome = Kitbase::Engine::ParseOptions(spec, args);
    switch (outcome.status) {
        case Kitbase::Engine::ParseOutcome::kOk: {
            if (!outcome.input) abort();
            const std::vector<boost::shared_ptr<ParameterSpec> >& parameters =
                spec.GetParameters();
            for (size_t i = 0; i < parameters.size(); ++i) {
                const std::string& name = parameters[i]->GetName();
                if (parameters[i]->IsRequired() && !outcome.input->HasValue(name)) abort();
                (void)outcome.input->GetString(name);
                (void)outcome.input->GetInt(name);
                (void)outcome.input->GetBool(name);
            }
            break;
        }
        case Kitbase::Engine::ParseOutcome::kHelp:
            break;
        case Kitbase::Engine::ParseOutcome::kError:
            if (outcome.input) abort();
            CheckRefusal(outcome.error);
            break;
    }
    return 0;
}
