// FormatOption: one advanced option as a "SettingsAdvancedOption" structure, and whether it
// passes the delta filter.
//
// The fields are set in the order Path, Type, the four integer fields, the three string fields,
// Description: an integer option fills the integers and leaves the strings empty, a string
// option the reverse (its integers without value), an option of another kind only Path, Type
// (empty) and Description. An option whose typed interface cannot be reached (OptionCasts.h)
// shows the fallback values (-1 and "ERROR getting value" for integers, "ERROR getting values"
// for strings) and never passes the delta filter.
//
// *include is set to true, then to false when delta is true and the option's value equals its
// default. The caller keeps the option. A Ravel::Lib::RavelException from any getter passes
// through; the partly filled structure is discarded.
#pragma once

#include "frame/CommandModel.h"

#include <norlithctl/AdvancedOption.h>

namespace TarselCli {
namespace System {

boost::shared_ptr<MetaObj::MetaStruct> FormatOption(Ravel::Adv::AdvancedOption* option, bool delta,
                                                    bool* include);

}  // namespace System
}  // namespace TarselCli
