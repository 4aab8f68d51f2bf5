#include "settings/FormatOption.h"

#include "settings/OptionCasts.h"

namespace TarselCli {
namespace System {
namespace {

typedef boost::shared_ptr<MetaObj::MetaInt> IntPtr;

// The library's unsigned 32-bit values, widened without sign extension.
IntPtr Unsigned(std::uint32_t value) { return MetaObj::MetaInt::New(static_cast<long long>(value)); }
IntPtr NoInteger() { return MetaObj::MetaInt::New(); }

void FillIntegers(const StructPtr& result, const IntPtr& value, const IntPtr& defaultValue,
                  const IntPtr& min, const IntPtr& max) {
    result->SetField("Int Value", value);
    result->SetField("Default Int Value", defaultValue);
    result->SetField("Min Value", min);
    result->SetField("Max Value", max);
}

void FillStrings(const StructPtr& result, const std::string& value, const std::string& defaultValue,
                 const std::string& validCharacters) {
    result->SetField("String Value", value);
    result->SetField("Default String Value", defaultValue);
    result->SetField("Valid Characters", validCharacters);
}

void FillInteger(Ravel::Adv::AdvancedOption* option, const StructPtr& result, bool delta, bool* include) {
    Ravel::Adv::AdvancedIntegerOption* integer = AsIntegerOption(option);
    if (!integer) {
        if (delta) *include = false;
        FillIntegers(result, MetaObj::MetaInt::New(-1), MetaObj::MetaInt::New(-1),
                     MetaObj::MetaInt::New(-1), MetaObj::MetaInt::New(-1));
        FillStrings(result, "ERROR getting value", "", "");
        return;
    }
    if (delta) {
        const std::uint32_t value = integer->GetValue();
        if (value == integer->GetDefault()) *include = false;
    }
    FillIntegers(result, Unsigned(integer->GetValue()), Unsigned(integer->GetDefault()),
                 Unsigned(integer->GetMin()), Unsigned(integer->GetMax()));
    FillStrings(result, "", "", "");
}

void FillString(Ravel::Adv::AdvancedOption* option, const StructPtr& result, bool delta, bool* include) {
    Ravel::Adv::AdvancedStringOption* text = AsStringOption(option);
    FillIntegers(result, NoInteger(), NoInteger(), NoInteger(), NoInteger());
    if (!text) {
        if (delta) *include = false;
        FillStrings(result, "ERROR getting values", "", "");
        return;
    }
    if (delta) {
        const std::string defaultValue = text->GetDefault();
        if (text->GetValue() == defaultValue) *include = false;
    }
    FillStrings(result, text->GetValue(), text->GetDefault(), text->GetValidCharacters());
}

}  // namespace

StructPtr FormatOption(Ravel::Adv::AdvancedOption* option, bool delta, bool* include) {
    const int kind = option->GetType();
    StructPtr result = MetaObj::MetaStruct::New("SettingsAdvancedOption");
    *include = true;
    const char* typeText = kind == 0 ? "integer" : kind == 1 ? "string" : "";
    result->SetField("Path", option->GetPath());
    result->SetField("Type", typeText);
    if (kind == 0)
        FillInteger(option, result, delta, include);
    else if (kind == 1)
        FillString(option, result, delta, include);
    result->SetField("Description", option->GetDescription());
    return result;
}

}  // namespace System
}  // namespace TarselCli
