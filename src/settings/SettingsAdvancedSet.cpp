#include "settings/SettingsAdvancedSet.h"

#include "settings/OptionCasts.h"

#include <norlithctl/AdvancedOptionImpl.h>

#include <cstdint>
#include <memory>
#include <string>

namespace TarselCli {
namespace System {

boost::shared_ptr<SettingsAdvancedSet> SettingsAdvancedSet::New() {
    return boost::shared_ptr<SettingsAdvancedSet>(new SettingsAdvancedSet());
}

SettingsAdvancedSet::SettingsAdvancedSet() {
    SetDescription("Set the value of an advanced option.");
    SetMetaDataField("type", "operation");
}

SettingsAdvancedSet::~SettingsAdvancedSet() {}

InputSpecPtr SettingsAdvancedSet::GetInputSpecInternal() {
    return MakeInputSpec({
        {"option", "o", CallSpec::ParameterTypeString, true,
         "The name of the option to set the value of. Example: \"/Misc/HostName\""},
        ParamDef{"int-value", "i", CallSpec::ParameterTypeInt, false,
                 "If the option is an integer value use this option."}
            .Range(0, 4294967295LL),
        {"string-value", "s", CallSpec::ParameterTypeString, false,
         "If the option is a string use this option."},
        {"default", "d", CallSpec::ParameterTypeFlag, false, "Reset the option to its default value."},
    });
}

OutputSpecPtr SettingsAdvancedSet::GetOutputSpecInternal() { return BoolOutputSpec(); }

void SettingsAdvancedSet::ExecuteInternal(const InputPtr& input, const OutputPtr& output) {
    const std::string name = input->GetString("option");
    const bool toDefault = input->GetFlag("default");
    const int given = int(input->HasValue("int-value")) + int(input->HasValue("string-value")) +
                      int(toDefault);
    if (given != 1) {
        output->SetError("must specify exactly one of: int-value, string-value, default");
        return;
    }
    GuardHost(
        output,
        [&] {
            std::unique_ptr<Ravel::Adv::AdvancedOption> option(
                NorlithCtl::Adv::AdvancedOptionImpl::FindOption(name));
            if (!option) {
                output->SetError("unknown option: " + name);
                return;
            }
            Ravel::Lib::RavelObject& object = *option;
            if (toDefault) {
                option->ResetToDefault();
                object.Refresh();
                object.Commit();
                SetSuccess(output);
                return;
            }
            const int kind = option->GetType();
            if (kind == 0) {
                Ravel::Adv::AdvancedIntegerOption* integer = AsIntegerOption(option.get());
                if (!integer) {
                    output->SetError("unable to access option '" + name + "' as integer option");
                } else if (!input->HasValue("int-value")) {
                    output->SetError("option is of type int, but input does not have int value");
                } else {
                    integer->SetValue(static_cast<std::uint32_t>(input->GetInt("int-value")));
                    object.Commit();
                    SetSuccess(output);
                }
            } else if (kind == 1) {
                Ravel::Adv::AdvancedStringOption* text = AsStringOption(option.get());
                if (!text) {
                    output->SetError("unable to access option '" + name + "' as string option");
                } else if (!input->HasValue("string-value")) {
                    output->SetError("option is type of string, but input does not have string value");
                } else {
                    text->SetValue(input->GetString("string-value"));
                    object.Commit();
                    SetSuccess(output);
                }
            } else {
                output->SetError("unable to access option '" + name + "' as string or integer option");
            }
        },
        1);
}

}  // namespace System
}  // namespace TarselCli
