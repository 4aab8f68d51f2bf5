#include "settings/OptionCasts.h"

#include <norlithctl/AdvancedOptionImpl.h>

namespace TarselCli {
namespace System {

Ravel::Adv::AdvancedIntegerOption* AsIntegerOption(Ravel::Adv::AdvancedOption* option) {
    if (Ravel::Adv::AdvancedIntegerOption* typed = dynamic_cast<Ravel::Adv::AdvancedIntegerOption*>(option))
        return typed;
    if (NorlithCtl::Adv::AdvancedIntegerOptionImpl* impl =
            dynamic_cast<NorlithCtl::Adv::AdvancedIntegerOptionImpl*>(option))
        return impl;
    if (NorlithCtl::Adv::AdvancedUserIntegerOptionImpl* user =
            dynamic_cast<NorlithCtl::Adv::AdvancedUserIntegerOptionImpl*>(option))
        return user;
    return nullptr;
}

Ravel::Adv::AdvancedStringOption* AsStringOption(Ravel::Adv::AdvancedOption* option) {
    if (Ravel::Adv::AdvancedStringOption* typed = dynamic_cast<Ravel::Adv::AdvancedStringOption*>(option))
        return typed;
    if (NorlithCtl::Adv::AdvancedStringOptionImpl* impl =
            dynamic_cast<NorlithCtl::Adv::AdvancedStringOptionImpl*>(option))
        return impl;
    if (NorlithCtl::Adv::AdvancedUserStringOptionImpl* user =
            dynamic_cast<NorlithCtl::Adv::AdvancedUserStringOptionImpl*>(option))
        return user;
    return nullptr;
}

}  // namespace System
}  // namespace TarselCli
