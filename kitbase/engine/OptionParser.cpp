// Command-option parsing and constraint enforcement.
#include "engine/OptionParser.h"

#include "engine/Text.h"

#include <limits>
#include <regex>
#include <stdexcept>

namespace Kitbase {
namespace Engine {

using CallSpec::InputSpec;
using CallSpec::ParameterConstraint;
using CallSpec::ParameterSpec;
typedef boost::shared_ptr<ParameterSpec> ParameterPtr;

const char* KindName(CallSpec::ParameterType type) {
    switch (type) {
        case CallSpec::ParameterTypeString: return "string";
        case CallSpec::ParameterTypeInt: return "int";
        case CallSpec::ParameterTypeBool: return "bool";
        case CallSpec::ParameterTypeFlag: return "flag";
    }
    return "string";
}

const char* KindAccepts(CallSpec::ParameterType type) {
    switch (type) {
        case CallSpec::ParameterTypeString: return "a text value";
        case CallSpec::ParameterTypeInt: return "a decimal integer";
        case CallSpec::ParameterTypeBool: return "true, false, yes, no, 1 or 0";
        case CallSpec::ParameterTypeFlag: return "no value";
    }
    return "a text value";
}

std::string OptionLabel(const ParameterSpec& parameter) {
    std::string label = "--" + parameter.GetName();
    if (!parameter.GetShortName().empty()) label += " (-" + parameter.GetShortName() + ")";
    return label;
}

namespace {

// The integer range of a parameter: the tightest of its range constraints, or the full range.
void IntBounds(const ParameterSpec& parameter, long long* low, long long* high, bool* limited) {
    *low = std::numeric_limits<long long>::min();
    *high = std::numeric_limits<long long>::max();
    *limited = false;
    const std::vector<boost::shared_ptr<ParameterConstraint> >& constraints =
        parameter.GetConstraints();
    for (std::size_t i = 0; i < constraints.size(); ++i) {
        if (constraints[i]->GetType() != CallSpec::ConstraintIntRange) continue;
        *limited = true;
        if (constraints[i]->GetLow() > *low) *low = constraints[i]->GetLow();
        if (constraints[i]->GetHigh() < *high) *high = constraints[i]->GetHigh();
    }
}

std::string IntAccepts(const ParameterSpec& parameter) {
    long long low, high;
    bool limited;
    IntBounds(parameter, &low, &high, &limited);
    if (!limited) return "a decimal integer";
    return "an integer from " + std::to_string(low) + " to " + std::to_string(high);
}

class Parser {
public:
    Parser(const InputSpec& spec, const std::vector<std::string>& args,
           const std::vector<std::string>& moreNames)
        : spec_(spec), args_(args), moreNames_(moreNames),
          given_(spec.GetParameters().size(), false) {
        outcome_.status = ParseOutcome::kOk;
        outcome_.input = CallSpec::Input::New();
    }

    ParseOutcome Run() {
        if (WantsHelp()) {
            outcome_.status = ParseOutcome::kHelp;
            outcome_.input.reset();
            return outcome_;
        }
        if (ParseWords() && CheckRequired()) CheckConstraints();
        if (outcome_.status != ParseOutcome::kOk) outcome_.input.reset();
        return outcome_;
    }

private:
    bool Fail(const std::string& message) {
        outcome_.status = ParseOutcome::kError;
        outcome_.error = message;
        return false;
    }

    bool WantsHelp() const {
        bool helpTaken = static_cast<bool>(spec_.Find("help"));
        bool hTaken = static_cast<bool>(spec_.FindShort("h"));
        for (std::size_t i = 0; i < args_.size(); ++i) {
            if ((args_[i] == "--help" && !helpTaken) || (args_[i] == "-h" && !hTaken)) return true;
        }
        return false;
    }

    std::size_t IndexOf(const ParameterSpec* parameter) const {
        const std::vector<ParameterPtr>& all = spec_.GetParameters();
        for (std::size_t i = 0; i < all.size(); ++i) {
            if (all[i].get() == parameter) return i;
        }
        return 0;
    }

    // Whether a word would be read as an option rather than as a value. The bare "--" is one
    // too: taken as a value it would hide a forgotten value behind what reads as a separator.
    bool LooksLikeOption(const std::string& word) const {
        if (word.size() >= 2 && word[0] == '-' && word[1] == '-') return true;
        return word.size() >= 2 && word[0] == '-' &&
               static_cast<bool>(spec_.FindShort(word.substr(1, 1)));
    }

    std::string UnknownOption(const std::string& word) const {
        std::string message = "unknown option " + Quote(word);
        const std::vector<ParameterPtr>& all = spec_.GetParameters();
        std::vector<std::string> names;
        for (std::size_t i = 0; i < all.size(); ++i) names.push_back("--" + all[i]->GetName());
        // Suggestions also come from the other names valid here (the global options).
        std::vector<std::string> candidates = names;
        candidates.insert(candidates.end(), moreNames_.begin(), moreNames_.end());
        std::string typed = word;
        std::string::size_type eq = typed.find('=');
        if (eq != std::string::npos) typed.erase(eq);
        std::vector<std::string> near = NearestNames(typed, candidates);
        if (!near.empty())
            return message + "; did you mean " + JoinNames(QuoteEach(near), " or ") + "?";
        if (all.empty()) return message + "; this command takes no options";
        return message + "; valid options: " + JoinNames(names, " and ");
    }

    bool ParseWords() {
        for (std::size_t i = 0; i < args_.size(); ++i) {
            const std::string& word = args_[i];
            ParameterPtr parameter;
            bool hasInline = false;
            std::string inlineValue;
            if (word.size() > 2 && word[0] == '-' && word[1] == '-') {
                std::string::size_type eq = word.find('=');
                std::string name = word.substr(2, eq == std::string::npos ? eq : eq - 2);
                if (eq != std::string::npos) {
                    hasInline = true;
                    inlineValue = word.substr(eq + 1);
                }
                parameter = spec_.Find(name);
            } else if (word.size() >= 2 && word[0] == '-' && word != "--") {
                parameter = spec_.FindShort(word.substr(1, 1));
                if (parameter && word.size() > 2) {
                    if (parameter->GetType() == CallSpec::ParameterTypeFlag) {
                        parameter.reset();  // "-fx" is not a flag followed by anything
                    } else {
                        hasInline = true;
                        inlineValue = word.substr(2);
                    }
                }
            } else {
                return Fail("unexpected argument " + Quote(word) +
                            "; this command takes only options (--name VALUE)");
            }
            if (!parameter) return Fail(UnknownOption(word));

            std::size_t index = IndexOf(parameter.get());
            if (given_[index]) {
                return Fail("option " + OptionLabel(*parameter) + " is given more than once");
            }
            given_[index] = true;

            if (parameter->GetType() == CallSpec::ParameterTypeFlag) {
                if (hasInline) {
                    return Fail("option " + OptionLabel(*parameter) +
                                " is a flag and takes no value, got " + Quote(word));
                }
                outcome_.input->SetFlag(parameter->GetName());
                continue;
            }
            std::string value;
            if (hasInline) {
                value = inlineValue;
            } else if (i + 1 < args_.size() && !LooksLikeOption(args_[i + 1])) {
                value = args_[++i];
            } else {
                std::string accepts = parameter->GetType() == CallSpec::ParameterTypeInt
                                          ? IntAccepts(*parameter)
                                          : KindAccepts(parameter->GetType());
                std::string message = "option " + OptionLabel(*parameter) + " needs a value (" +
                                      accepts + ")";
                if (i + 1 < args_.size()) {
                    message += "; write --" + parameter->GetName() +
                               "=VALUE for a value starting with '-'";
                }
                return Fail(message);
            }
            if (!Store(*parameter, value)) return false;
        }
        return true;
    }

    bool Store(const ParameterSpec& parameter, const std::string& value) {
        switch (parameter.GetType()) {
            case CallSpec::ParameterTypeInt: {
                long long number = 0;
                if (!ParseInt64(value, &number)) {
                    return Fail("option " + OptionLabel(parameter) + " takes " +
                                IntAccepts(parameter) + ", got " + Quote(value));
                }
                outcome_.input->SetInt(parameter.GetName(), number);
                return true;
            }
            case CallSpec::ParameterTypeBool: {
                bool flag = false;
                if (!ParseBool(value, &flag)) {
                    return Fail("option " + OptionLabel(parameter) + " takes " +
                                KindAccepts(parameter.GetType()) + ", got " + Quote(value));
                }
                outcome_.input->SetBool(parameter.GetName(), flag);
                return true;
            }
            default:
                outcome_.input->SetString(parameter.GetName(), value);
                return true;
        }
    }

    bool CheckRequired() {
        const std::vector<ParameterPtr>& all = spec_.GetParameters();
        std::vector<std::string> missing;
        for (std::size_t i = 0; i < all.size(); ++i) {
            if (!all[i]->IsRequired() || given_[i]) continue;
            std::string accepts = all[i]->GetType() == CallSpec::ParameterTypeInt
                                      ? IntAccepts(*all[i])
                                      : KindAccepts(all[i]->GetType());
            missing.push_back(OptionLabel(*all[i]) + " (" + accepts + ")");
        }
        if (missing.empty()) return true;
        return Fail(std::string(missing.size() == 1 ? "missing required option "
                                                    : "missing required options ") +
                    JoinNames(missing, " and "));
    }

    bool CheckConstraints() {
        const std::vector<ParameterPtr>& all = spec_.GetParameters();
        for (std::size_t i = 0; i < all.size(); ++i) {
            if (!given_[i]) continue;
            const ParameterSpec& parameter = *all[i];
            const std::vector<boost::shared_ptr<ParameterConstraint> >& constraints =
                parameter.GetConstraints();
            for (std::size_t c = 0; c < constraints.size(); ++c) {
                if (!Check(parameter, *constraints[c])) return false;
            }
        }
        return true;
    }

    bool Check(const ParameterSpec& parameter, const ParameterConstraint& constraint) {
        const std::string& name = parameter.GetName();
        if (constraint.GetType() == CallSpec::ConstraintIntRange) {
            if (parameter.GetType() != CallSpec::ParameterTypeInt) return true;
            long long value = outcome_.input->GetInt(name);
            if (value < constraint.GetLow() || value > constraint.GetHigh()) {
                return Fail("option " + OptionLabel(parameter) + " takes " +
                            IntAccepts(parameter) + ", got " + std::to_string(value));
            }
            return true;
        }
        if (parameter.GetType() == CallSpec::ParameterTypeFlag) return true;
        std::string value = outcome_.input->GetString(name);
        if (value.size() > kMaxRegexValueLength) {
            return Fail("option " + OptionLabel(parameter) + " takes at most " +
                        std::to_string(kMaxRegexValueLength) + " characters, got " +
                        std::to_string(value.size()));
        }
        std::regex pattern;
        try {
            pattern.assign(constraint.GetPattern(), std::regex::ECMAScript);
        } catch (const std::regex_error& e) {
            throw std::invalid_argument("option --" + name +
                                        " has a pattern that does not compile ('" +
                                        constraint.GetPattern() + "'): " + e.what());
        }
        bool matches = false;
        try {
            matches = std::regex_match(value, pattern);
        } catch (const std::regex_error&) {
            return Fail("option " + OptionLabel(parameter) + ": the value " + Quote(value) +
                        " is too complex to check against '" + constraint.GetPattern() + "'");
        }
        if (!matches) {
            return Fail("option " + OptionLabel(parameter) + " takes a value matching '" +
                        constraint.GetPattern() + "', got " + Quote(value));
        }
        return true;
    }

    const InputSpec& spec_;
    const std::vector<std::string>& args_;
    const std::vector<std::string>& moreNames_;
    std::vector<bool> given_;
    ParseOutcome outcome_;
};

}  // namespace

ParseOutcome ParseOptions(const InputSpec& spec, const std::vector<std::string>& args) {
    static const std::vector<std::string> kNone;
    return Parser(spec, args, kNone).Run();
}

ParseOutcome ParseOptions(const InputSpec& spec, const std::vector<std::string>& args,
                          const std::vector<std::string>& moreNames) {
    return Parser(spec, args, moreNames).Run();
}

}  // namespace Engine
}  // namespace Kitbase
