// Call descriptions: what a command accepts and what it returns, and the values of one call.
//
// A command describes its parameters with an InputSpec of ParameterSpecs (each optionally
// constrained) and its result's shape with an OutputSpec holding a meta-object template. For one
// execution the framework hands the command an Input holding the parsed values and an Output that
// collects error messages and the result. All objects are created by New() and held by
// boost::shared_ptr.
//
// Misuse (an empty long name, a short name that is not one character, a range whose low bound
// exceeds its high bound) is a programming error and throws std::invalid_argument when the
// parameter is declared. A regular expression is compiled only when a value must be checked
// against it, so that start-up pays for no pattern it does not use; one that does not compile
// throws std::invalid_argument then.
#pragma once

#include <kitbase/Export.h>
#include <kitbase/MetaObj.h>

#include <boost/shared_ptr.hpp>

#include <map>
#include <string>
#include <vector>

namespace Kitbase {
namespace CallSpec {

// Parameter kinds; the values are part of the plug-in interface. (Of a fixed underlying type, so
// that a value this framework does not know, from a newer plug-in say, is one it can refuse.)
enum ParameterType : int {
    ParameterTypeString = 0,
    ParameterTypeInt = 1,
    ParameterTypeBool = 2,  // takes a value: --enable=true
    ParameterTypeFlag = 3,  // takes no value: --force
};

// Constraint kinds; the values are part of the plug-in interface.
enum ParameterConstraintType : int {
    ConstraintIntRange = 1,     // inclusive 64-bit signed bounds
    ConstraintStringRegex = 4,  // the pattern must match the whole value
};

class KITBASE_API ParameterConstraint {
public:
    static boost::shared_ptr<ParameterConstraint> New(ParameterConstraintType type);
    virtual ~ParameterConstraint();

    virtual void SetIntRange(long long low, long long high);
    virtual void SetStringRegex(const std::string& pattern);

    ParameterConstraintType GetType() const { return type_; }
    long long GetLow() const { return low_; }
    long long GetHigh() const { return high_; }
    const std::string& GetPattern() const { return pattern_; }

private:
    explicit ParameterConstraint(ParameterConstraintType type);

    ParameterConstraintType type_;
    long long low_;
    long long high_;
    std::string pattern_;
};

class KITBASE_API ParameterSpec {
public:
    static boost::shared_ptr<ParameterSpec> New(const std::string& longName, ParameterType type);
    virtual ~ParameterSpec();

    virtual void SetShortName(const std::string& letter);
    virtual void SetHelp(const std::string& text);
    virtual void AddConstraint(const boost::shared_ptr<ParameterConstraint>& constraint);
    virtual void SetRequired(bool required);

    const std::string& GetName() const { return name_; }
    ParameterType GetType() const { return type_; }
    const std::string& GetShortName() const { return short_name_; }  // empty when none
    const std::string& GetHelp() const { return help_; }
    const std::vector<boost::shared_ptr<ParameterConstraint> >& GetConstraints() const {
        return constraints_;
    }
    bool IsRequired() const { return required_; }

private:
    ParameterSpec(const std::string& longName, ParameterType type);

    std::string name_;
    ParameterType type_;
    std::string short_name_;
    std::string help_;
    std::vector<boost::shared_ptr<ParameterConstraint> > constraints_;
    bool required_;
};

class KITBASE_API InputSpec {
public:
    static boost::shared_ptr<InputSpec> New();
    virtual ~InputSpec();

    // Parameters keep the order of these calls. A second parameter with a long or short name
    // already in use is a programming error (std::invalid_argument).
    virtual void AddParameter(const boost::shared_ptr<ParameterSpec>& parameter);

    const std::vector<boost::shared_ptr<ParameterSpec> >& GetParameters() const {
        return parameters_;
    }
    // Look-ups by long or short name; null when there is no such parameter.
    boost::shared_ptr<ParameterSpec> Find(const std::string& longName) const;
    boost::shared_ptr<ParameterSpec> FindShort(const std::string& letter) const;

private:
    InputSpec() {}
    std::vector<boost::shared_ptr<ParameterSpec> > parameters_;
};

class KITBASE_API OutputSpec {
public:
    static boost::shared_ptr<OutputSpec> New();
    virtual ~OutputSpec();

    virtual void SetResultTemplate(const boost::shared_ptr<MetaObj::MetaObject>& resultTemplate);
    const boost::shared_ptr<MetaObj::MetaObject>& GetResultTemplate() const { return template_; }

private:
    OutputSpec() {}
    boost::shared_ptr<MetaObj::MetaObject> template_;
};

// The parsed values of one call, keyed by long name. Reading a parameter that was not given
// yields "", 0 or false. GetString of an integer yields its decimal text and of a boolean
// "true" or "false".
class KITBASE_API Input {
public:
    static boost::shared_ptr<Input> New();
    virtual ~Input();

    virtual std::string GetString(const std::string& name) const;
    virtual long long GetInt(const std::string& name) const;
    virtual bool GetBool(const std::string& name) const;
    virtual bool GetFlag(const std::string& name) const;
    virtual bool HasValue(const std::string& name) const;

    // Filled by the framework's parser (and by tests).
    void SetString(const std::string& name, const std::string& value);
    void SetInt(const std::string& name, long long value);
    void SetBool(const std::string& name, bool value);
    void SetFlag(const std::string& name);

private:
    Input() {}
    struct Value {
        ParameterType type;
        std::string text;
        long long number;
    };
    const Value* Lookup(const std::string& name) const;
    std::map<std::string, Value> values_;
};

// What one execution produced: error messages in the order set, and at most one result.
class KITBASE_API Output {
public:
    static boost::shared_ptr<Output> New();
    virtual ~Output();

    virtual void SetError(const std::string& message);
    virtual void SetResult(const boost::shared_ptr<MetaObj::MetaObject>& result);
    virtual void Complete();

    const std::vector<std::string>& GetErrors() const { return errors_; }
    const boost::shared_ptr<MetaObj::MetaObject>& GetResult() const { return result_; }
    bool IsComplete() const { return complete_; }

private:
    Output() : complete_(false) {}
    std::vector<std::string> errors_;
    boost::shared_ptr<MetaObj::MetaObject> result_;
    bool complete_;
};

}  // namespace CallSpec
}  // namespace Kitbase
