// The keyboard domain: the console keyboard layouts the host offers, the layout in use now and
// the layout the host uses from the next boot.
//
// Scenario section "keyboard" (default: "English (US)" of 37 layouts):
//   {"current": layout in use now, "configured": layout for later boots,
//    "available": [layout names, in the order the library lists them]}
// A layout name is 1..64 bytes of text; at most 500 layouts, none twice (compared without
// regard to case). "current" and "configured" are "" or a listed layout. At a reboot the
// configured layout becomes the current one.
//
// Layout names given to the library are matched against "available" without regard to case
// (FindLayout) and stored in their listed spelling.
#pragma once

#include <simhost/Export.h>
#include <simhost/Mapping.h>
#include <simhost/State.h>

#include <optional>
#include <string>
#include <vector>

namespace simhost {
namespace keyboard {

struct Keyboard {
    static constexpr char kSection[] = "keyboard";
    static constexpr StateKind kKind = StateKind::kSingleton;

    std::string current;
    std::string configured;
    std::vector<std::string> available;

    SIMHOST_API static Keyboard Default();
    static void Boot(Keyboard& keyboard) { keyboard.current = keyboard.configured; }
    SIMHOST_API std::string Check() const;
};

template <class V>
void Describe(V& v, Keyboard& s) {
    v("current", s.current, Text(64));
    v("configured", s.configured, Text(64));
    v("available", s.available, MaxItems(500), Each(Text(64, false)));
}

// The listed spelling of a layout name matched without regard to case, if the host offers it.
SIMHOST_API std::optional<std::string> FindLayout(const Keyboard& keyboard, const std::string& name);
// The error for a layout the host does not offer, naming the nearest offered ones.
SIMHOST_API HostError UnknownLayout(const Keyboard& keyboard, const std::string& name);

}  // namespace keyboard
}  // namespace simhost
