#include <simhost/Domain.h>

#include <simhost/domains/Identity.h>
#include <simhost/domains/Observations.h>

namespace simhost {

const std::vector<const Domain*>& Domains() {
    static const std::vector<const Domain*> domains = {
        &identity::TheDomain(),
        &observations::TheDomain(),
    };
    return domains;
}

}  // namespace simhost
