#include "frame/CommandModel.h"

namespace TarselCli {
namespace System {

StructPtr MakeStructTemplate(const std::string& structName, std::initializer_list<FieldDef> fields) {
    StructPtr result = MetaObj::MetaStruct::New(structName);
    for (const FieldDef& field : fields) {
        switch (field.kind) {
        case FieldString:
            result->SetField(field.name, MetaObj::MetaString::New());
            break;
        case FieldInt:
            result->SetField(field.name, MetaObj::MetaInt::New());
            break;
        case FieldBool:
            result->SetField(field.name, MetaObj::MetaBool::New());
            break;
        case FieldStringList:
            result->SetField(field.name, MetaObj::MetaList::New(MetaObj::MetaTypeString));
            break;
        }
    }
    return result;
}

ParamDef& ParamDef::Range(long long lowBound, long long highBound) {
    hasRange = true;
    low = lowBound;
    high = highBound;
    return *this;
}

ParamDef& ParamDef::Regex(const char* pattern) {
    regex = pattern;
    return *this;
}

InputSpecPtr MakeInputSpec(std::initializer_list<ParamDef> parameters) {
    InputSpecPtr spec = CallSpec::InputSpec::New();
    for (const ParamDef& def : parameters) {
        // A constraint is made and filled before its parameter.
        boost::shared_ptr<CallSpec::ParameterConstraint> constraint;
        if (def.hasRange) {
            constraint = CallSpec::ParameterConstraint::New(CallSpec::ConstraintIntRange);
            constraint->SetIntRange(def.low, def.high);
        } else if (def.regex) {
            constraint = CallSpec::ParameterConstraint::New(CallSpec::ConstraintStringRegex);
            constraint->SetStringRegex(def.regex);
        }
        boost::shared_ptr<CallSpec::ParameterSpec> parameter =
            CallSpec::ParameterSpec::New(def.longName, def.kind);
        if (def.shortName) parameter->SetShortName(def.shortName);
        parameter->SetHelp(def.help);
        if (constraint) parameter->AddConstraint(constraint);
        parameter->SetRequired(def.required);
        spec->AddParameter(parameter);
    }
    return spec;
}

OutputSpecPtr MakeOutputSpec(const boost::shared_ptr<MetaObj::MetaObject>& resultTemplate) {
    OutputSpecPtr spec = CallSpec::OutputSpec::New();
    spec->SetResultTemplate(resultTemplate);
    return spec;
}

OutputSpecPtr BoolOutputSpec() { return MakeOutputSpec(MetaObj::MetaBool::New()); }
OutputSpecPtr StringOutputSpec() { return MakeOutputSpec(MetaObj::MetaString::New()); }
OutputSpecPtr IntOutputSpec() { return MakeOutputSpec(MetaObj::MetaInt::New()); }

OutputSpecPtr StructListOutputSpec(const StructPtr& rowTemplate) {
    return MakeOutputSpec(MetaObj::MetaList::New(MetaObj::MetaTypeStruct, rowTemplate));
}

void SetResult(const OutputPtr& output, const boost::shared_ptr<MetaObj::MetaObject>& result) {
    output->SetResult(result);
    output->Complete();
}

void SetSuccess(const OutputPtr& output) { SetResult(output, MetaObj::MetaBool::New(true)); }

}  // namespace System
}  // namespace TarselCli
