// The command-option parser: turns the words after a command's path into a CallSpec::Input,
// checked against the command's InputSpec.
//
// Accepted forms: --long VALUE, --long=VALUE, -s VALUE, -sVALUE; a flag takes no value; a boolean
// takes true/false/yes/no/1/0 in any case; an integer is decimal 64-bit signed. A separate VALUE
// is the next word unless that word looks like an option (starts with "--", the bare "--"
// included, or is '-' and a declared short name); such a value needs the '=' form. Commands take
// no positional words, so "--" ends nothing: it is refused like any stray word. --help or -h anywhere (when the command
// does not declare them itself) asks for the command's help instead.
//
// After parsing, required parameters, integer ranges and whole-value regular expressions are
// enforced, in declaration order. Each refusal is one line naming the option and what it accepts.
// Patterns are compiled only when a constrained parameter was given; a pattern that does not
// compile is the command's programming error and throws std::invalid_argument.
#pragma once

#include <kitbase/CallSpec.h>
#include <kitbase/Export.h>

#include <boost/shared_ptr.hpp>

#include <string>
#include <vector>

namespace Kitbase {
namespace Engine {

struct ParseOutcome {
    enum Status { kOk, kHelp, kError };
    Status status = kOk;
    std::string error;                            // kError: the one-line refusal
    boost::shared_ptr<CallSpec::Input> input;     // kOk: the parsed values
};

// Longest value checked against a regular expression; longer values are refused, because the
// standard library's matcher recurses once per character.
const std::size_t kMaxRegexValueLength = 1024;

KITBASE_API ParseOutcome ParseOptions(const CallSpec::InputSpec& spec,
                                      const std::vector<std::string>& args);
// The same; an unknown option's "did you mean" also considers moreNames (e.g. "--formatter"),
// which are otherwise not accepted here.
KITBASE_API ParseOutcome ParseOptions(const CallSpec::InputSpec& spec,
                                      const std::vector<std::string>& args,
                                      const std::vector<std::string>& moreNames);

// How a parameter is written on the command line: "--name" or "--name (-n)".
KITBASE_API std::string OptionLabel(const CallSpec::ParameterSpec& parameter);
// What a parameter of that kind takes, for help and refusals: "a text value", "a decimal
// integer", "true, false, yes, no, 1 or 0", "no value".
KITBASE_API const char* KindAccepts(CallSpec::ParameterType type);
// The kind's short name as help and the schema print it: string, int, bool, flag.
KITBASE_API const char* KindName(CallSpec::ParameterType type);

}  // namespace Engine
}  // namespace Kitbase
