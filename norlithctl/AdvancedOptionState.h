// What the advanced option objects of the host-control library hold (internal to the library):
// the option as the host held it when the object was made or last refreshed, and the change
// staged on it, which the getters show until it is committed or discarded.
#pragma once

#include <norlithctl/AdvancedOption.h>

#include <simhost/State.h>
#include <simhost/domains/Advanced.h>

#include <cstdint>
#include <string>

namespace NorlithCtl {
namespace Adv {

struct OptionState {
    enum class Pending { kNone, kValue, kDefault };

    simhost::advanced::Option stored;
    Pending pending = Pending::kNone;
    std::uint32_t int_value = 0;
    std::string text_value;
    simhost::Stage stage;

    // The value as the object shows it: the staged one, else the stored one (throwing the
    // option's read error when the host could not read it).
    std::uint32_t IntValue() const;
    std::string TextValue() const;
    void ClearPending();
};

// The object serving a stored option: a typed class for integer and string options (user
// variables as the user classes), the plain class otherwise. The caller owns it.
Ravel::Adv::AdvancedOption* MakeOption(simhost::advanced::Option option);

}  // namespace Adv
}  // namespace NorlithCtl
