// FreePercent: the share of a capacity left free, in whole percent, as the memory file system
// commands show it: (100 x (capacity - used)) / capacity in signed 64-bit arithmetic, truncated
// toward zero (1000 and 333 give 66), negative when more than the capacity is used, and 0 for a
// capacity of 0 instead of a division by zero. Fails never.
#pragma once

namespace TarselCli {
namespace System {

long long FreePercent(long long capacity, long long used);

}  // namespace System
}  // namespace TarselCli
