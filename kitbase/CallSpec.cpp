// Declared parameters and result shapes, and the input and output of one execution.
#include <kitbase/CallSpec.h>

#include "engine/Text.h"

#include <stdexcept>

namespace Kitbase {
namespace CallSpec {

// ---- constraints ----

ParameterConstraint::ParameterConstraint(ParameterConstraintType type)
    : type_(type), low_(0), high_(0) {}

boost::shared_ptr<ParameterConstraint> ParameterConstraint::New(ParameterConstraintType type) {
    if (type != ConstraintIntRange && type != ConstraintStringRegex) {
        throw std::invalid_argument("unknown parameter constraint kind " +
                                    std::to_string(static_cast<int>(type)));
    }
    return boost::shared_ptr<ParameterConstraint>(new ParameterConstraint(type));
}

ParameterConstraint::~ParameterConstraint() {}

void ParameterConstraint::SetIntRange(long long low, long long high) {
    if (type_ != ConstraintIntRange) {
        throw std::invalid_argument("SetIntRange on a constraint that is not an integer range");
    }
    if (low > high) {
        throw std::invalid_argument("integer range " + std::to_string(low) + ".." +
                                    std::to_string(high) + " is empty");
    }
    low_ = low;
    high_ = high;
}

// The pattern is compiled only when a value is checked against it (see engine/Validate), so that
// building the parameters of a command costs no regular-expression compilation.
void ParameterConstraint::SetStringRegex(const std::string& pattern) {
    if (type_ != ConstraintStringRegex) {
        throw std::invalid_argument("SetStringRegex on a constraint that is not a regex");
    }
    pattern_ = pattern;
}

// ---- parameters ----

ParameterSpec::ParameterSpec(const std::string& longName, ParameterType type)
    : name_(longName), type_(type), required_(false) {}

boost::shared_ptr<ParameterSpec> ParameterSpec::New(const std::string& longName,
                                                    ParameterType type) {
    if (longName.empty()) throw std::invalid_argument("parameter with an empty long name");
    if (longName[0] == '-' || longName.find_first_of(" \t\n=") != std::string::npos) {
        throw std::invalid_argument("parameter name '" + longName +
                                    "' cannot be typed as an option");
    }
    if (type != ParameterTypeString && type != ParameterTypeInt && type != ParameterTypeBool &&
        type != ParameterTypeFlag) {
        throw std::invalid_argument("parameter '" + longName + "' has an unknown kind " +
                                    std::to_string(static_cast<int>(type)));
    }
    return boost::shared_ptr<ParameterSpec>(new ParameterSpec(longName, type));
}

ParameterSpec::~ParameterSpec() {}

void ParameterSpec::SetShortName(const std::string& letter) {
    if (letter.size() != 1 || letter[0] == '-' || letter[0] == '=' ||
        static_cast<unsigned char>(letter[0]) <= ' ') {
        throw std::invalid_argument("parameter '" + name_ + "': short name '" + letter +
                                    "' is not one printable character");
    }
    short_name_ = letter;
}

void ParameterSpec::SetHelp(const std::string& text) { help_ = text; }

void ParameterSpec::AddConstraint(const boost::shared_ptr<ParameterConstraint>& constraint) {
    if (!constraint) throw std::invalid_argument("parameter '" + name_ + "': null constraint");
    constraints_.push_back(constraint);
}

void ParameterSpec::SetRequired(bool required) { required_ = required; }

// ---- declared parameters ----

boost::shared_ptr<InputSpec> InputSpec::New() {
    return boost::shared_ptr<InputSpec>(new InputSpec());
}

InputSpec::~InputSpec() {}

void InputSpec::AddParameter(const boost::shared_ptr<ParameterSpec>& parameter) {
    if (!parameter) throw std::invalid_argument("null parameter");
    if (Find(parameter->GetName())) {
        throw std::invalid_argument("parameter '--" + parameter->GetName() + "' declared twice");
    }
    if (!parameter->GetShortName().empty() && FindShort(parameter->GetShortName())) {
        throw std::invalid_argument("short name '-" + parameter->GetShortName() +
                                    "' of '--" + parameter->GetName() + "' is already in use");
    }
    parameters_.push_back(parameter);
}

boost::shared_ptr<ParameterSpec> InputSpec::Find(const std::string& longName) const {
    for (std::size_t i = 0; i < parameters_.size(); ++i) {
        if (parameters_[i]->GetName() == longName) return parameters_[i];
    }
    return boost::shared_ptr<ParameterSpec>();
}

boost::shared_ptr<ParameterSpec> InputSpec::FindShort(const std::string& letter) const {
    if (letter.empty()) return boost::shared_ptr<ParameterSpec>();
    for (std::size_t i = 0; i < parameters_.size(); ++i) {
        if (parameters_[i]->GetShortName() == letter) return parameters_[i];
    }
    return boost::shared_ptr<ParameterSpec>();
}

// ---- result shape ----

boost::shared_ptr<OutputSpec> OutputSpec::New() {
    return boost::shared_ptr<OutputSpec>(new OutputSpec());
}

OutputSpec::~OutputSpec() {}

void OutputSpec::SetResultTemplate(const boost::shared_ptr<MetaObj::MetaObject>& resultTemplate) {
    template_ = resultTemplate;
}

// ---- input ----

boost::shared_ptr<Input> Input::New() { return boost::shared_ptr<Input>(new Input()); }

Input::~Input() {}

const Input::Value* Input::Lookup(const std::string& name) const {
    std::map<std::string, Value>::const_iterator it = values_.find(name);
    return it == values_.end() ? nullptr : &it->second;
}

std::string Input::GetString(const std::string& name) const {
    const Value* value = Lookup(name);
    return value ? value->text : std::string();
}

long long Input::GetInt(const std::string& name) const {
    const Value* value = Lookup(name);
    if (!value) return 0;
    if (value->type == ParameterTypeString) {
        long long number = 0;
        return Engine::ParseInt64(value->text, &number) ? number : 0;
    }
    return value->number;
}

bool Input::GetBool(const std::string& name) const {
    const Value* value = Lookup(name);
    if (!value) return false;
    if (value->type == ParameterTypeString) {
        bool flag = false;
        return Engine::ParseBool(value->text, &flag) && flag;
    }
    return value->number != 0;
}

bool Input::GetFlag(const std::string& name) const { return GetBool(name); }

bool Input::HasValue(const std::string& name) const { return Lookup(name) != nullptr; }

void Input::SetString(const std::string& name, const std::string& value) {
    Value& slot = values_[name];
    slot.type = ParameterTypeString;
    slot.text = value;
    slot.number = 0;
}

void Input::SetInt(const std::string& name, long long value) {
    Value& slot = values_[name];
    slot.type = ParameterTypeInt;
    slot.text = std::to_string(value);
    slot.number = value;
}

void Input::SetBool(const std::string& name, bool value) {
    Value& slot = values_[name];
    slot.type = ParameterTypeBool;
    slot.text = value ? "true" : "false";
    slot.number = value ? 1 : 0;
}

void Input::SetFlag(const std::string& name) {
    Value& slot = values_[name];
    slot.type = ParameterTypeFlag;
    slot.text = "true";
    slot.number = 1;
}

// ---- output ----

boost::shared_ptr<Output> Output::New() { return boost::shared_ptr<Output>(new Output()); }

Output::~Output() {}

void Output::SetError(const std::string& message) { errors_.push_back(message); }

void Output::SetResult(const boost::shared_ptr<MetaObj::MetaObject>& result) { result_ = result; }

void Output::Complete() { complete_ = true; }

}  // namespace CallSpec
}  // namespace Kitbase
