// IsDelta: whether a kernel setting differs from its default, compared by the setting's type.
//
// Two values are equal, by type: 0 as identical strings; 1 as booleans (true when the first four
// characters are TRUE in any case, so "1", "yes" and "" are false); 2 and 4 as unsigned 32-bit
// numbers read with automatic base (decimal, 0x hexadecimal, leading-0 octal; reading stops at
// the first character that does not fit, no digits give 0); 3 as the lowest 8 bits of such
// numbers. Any other type is never a delta.
//
// The setting is a delta when the configured value differs from the default, or, when they are
// equal, when it has a runtime value (not empty) that differs from the default. Pure; nothing
// throws.
#pragma once

#include <norlithctl/KernelOpts.h>

#include <string>

namespace TarselCli {
namespace System {

bool IsDelta(Ravel::System::KernelOption::OptionType type, std::string defaultValue,
             std::string configured, std::string runtime);

}  // namespace System
}  // namespace TarselCli
