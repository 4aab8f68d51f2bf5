// The typed views of an advanced option the library handed out: the option converted to its
// integer (or string) interface by dynamic cast, and when that fails, through the library's
// integer (string) option class and then its user variable class, each converted back to the
// interface. The first conversion that succeeds wins; null when none does. The caller keeps
// ownership of the option; nothing here throws.
#pragma once

#include <norlithctl/AdvancedOption.h>

namespace TarselCli {
namespace System {

Ravel::Adv::AdvancedIntegerOption* AsIntegerOption(Ravel::Adv::AdvancedOption* option);
Ravel::Adv::AdvancedStringOption* AsStringOption(Ravel::Adv::AdvancedOption* option);

}  // namespace System
}  // namespace TarselCli
