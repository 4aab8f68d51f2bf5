#include "memfs/FreePercent.h"

namespace TarselCli {
namespace System {

long long FreePercent(long long capacity, long long used) {
    if (capacity == 0) return 0;
    return (100 * (capacity - used)) / capacity;
}

}  // namespace System
}  // namespace TarselCli
