// The command model every command of the "system" plug-in follows, in one place.
//
// A command class derives virtually from Kitbase::AutoCli::Command, sets its description, metadata
// and default formatter parameters in its constructor, and implements three hooks. What those hooks
// share lives here: declaring parameters and building result templates from short tables,
// setting a result, and the handler that turns a host-control failure into the output's error.
//
// Nothing here keeps state. The helpers only call the framework and the host-control library;
// the only exception they catch is Ravel::Lib::RavelException, inside GuardHost.
#pragma once

#include <kitbase/AutoCli.h>
#include <kitbase/CallSpec.h>
#include <kitbase/MetaObj.h>
#include <norlithctl/RavelException.h>

#include <boost/shared_ptr.hpp>

#include <initializer_list>
#include <string>

namespace TarselCli {
namespace System {

namespace AutoCli = Kitbase::AutoCli;
namespace CallSpec = Kitbase::CallSpec;
namespace MetaObj = Kitbase::MetaObj;

typedef boost::shared_ptr<CallSpec::Input> InputPtr;
typedef boost::shared_ptr<CallSpec::Output> OutputPtr;
typedef boost::shared_ptr<CallSpec::InputSpec> InputSpecPtr;
typedef boost::shared_ptr<CallSpec::OutputSpec> OutputSpecPtr;
typedef boost::shared_ptr<MetaObj::MetaStruct> StructPtr;

// One column of a structure template.
enum FieldKind { FieldString, FieldInt, FieldBool, FieldStringList };
struct FieldDef {
    const char* name;
    FieldKind kind;
};

// A structure named structName with one empty typed value per field, in column order.
StructPtr MakeStructTemplate(const std::string& structName, std::initializer_list<FieldDef> fields);

// One parameter of a command: long name, short name (null when none), kind, required, help, and
// optionally an integer range or a whole-value regular expression.
struct ParamDef {
    const char* longName;
    const char* shortName;
    CallSpec::ParameterType kind;
    bool required;
    const char* help;

    ParamDef& Range(long long low, long long high);
    ParamDef& Regex(const char* pattern);

    bool hasRange = false;
    long long low = 0;
    long long high = 0;
    const char* regex = nullptr;
};

// The command's parameters, in declaration order; empty for none.
InputSpecPtr MakeInputSpec(std::initializer_list<ParamDef> parameters = {});

// The result's shape: that of the template.
OutputSpecPtr MakeOutputSpec(const boost::shared_ptr<MetaObj::MetaObject>& resultTemplate);
// The result shapes of the plain result kinds and of a list of structures.
OutputSpecPtr BoolOutputSpec();
OutputSpecPtr StringOutputSpec();
OutputSpecPtr IntOutputSpec();
OutputSpecPtr StructListOutputSpec(const StructPtr& rowTemplate);

// Success: the result, then Complete.
void SetResult(const OutputPtr& output, const boost::shared_ptr<MetaObj::MetaObject>& result);
// Success of a command that changes state: MetaBool true, then Complete.
void SetSuccess(const OutputPtr& output);

// Runs work() under the handler of the command model: a Ravel::Lib::RavelException, taken by
// reference, becomes the output's error, prefix followed by GetMessage(form). Anything else
// passes through. Returns whether work() completed.
template <class Work>
bool GuardHost(const OutputPtr& output, Work work, char form = 0, const char* prefix = "") {
    try {
        work();
        return true;
    } catch (const Ravel::Lib::RavelException& e) {
        output->SetError(prefix + e.GetMessage(form));
        return false;
    }
}

}  // namespace System
}  // namespace TarselCli
