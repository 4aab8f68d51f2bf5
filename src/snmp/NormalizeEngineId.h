// NormalizeEngineId: an SNMPv3 engine id as a user writes it, reduced to its hexadecimal digits.
// Blanks around it go, a "0x" or "0X" prefix goes, and a value written in colon-separated groups
// is joined with one-character groups padded to two ("0x1:2" becomes "0102"). A value without
// colons keeps its length, odd or not. Changes its argument in place; never fails.
#pragma once

#include <string>

namespace TarselCli {
namespace System {

void NormalizeEngineId(std::string& engineId);

}  // namespace System
}  // namespace TarselCli
