// The domains of Registry.def, in its order. Every header of simhost/domains/ is included
// (AllDomains.h is generated at build time), so declaring a domain is its header and one line.
#include <simhost/AllDomains.h>
#include <simhost/State.h>

namespace simhost {

const std::vector<const Domain*>& Domains() {
    static const std::vector<const Domain*> all = {
#define DOMAIN(Type) &DomainOf<Type>(),
#include <simhost/Registry.def>
    };
    return all;
}

}  // namespace simhost
