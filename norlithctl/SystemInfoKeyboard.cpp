// The keyboard layout operations of the system-information object: the layout in use now and the
// layout stored for later boots are kept apart (domain "keyboard").
#include <norlithctl/SystemInfoImpl.h>

#include "HostCall.h"

#include <simhost/domains/Keyboard.h>

namespace NorlithCtl {
namespace System {
namespace {

using simhost::Args;
using simhost::Call;
using simhost::Op;
using simhost::keyboard::Keyboard;

// The listed spelling of a layout the host offers; refuses any other.
std::string Offered(const Keyboard& keyboard, const std::string& layout) {
    std::optional<std::string> found = simhost::keyboard::FindLayout(keyboard, layout);
    if (!found) throw simhost::keyboard::UnknownLayout(keyboard, layout);
    return *found;
}

}  // namespace

std::string SystemInfoImpl::GetKeyboardLayout() {
    return norlithctl::HostCall([] {
        Call call(Op::SystemInfoImpl_GetKeyboardLayout);
        return call.Read<Keyboard>().current;
    });
}

std::vector<std::string> SystemInfoImpl::GetKeyboardLayouts() {
    return norlithctl::HostCall([] {
        Call call(Op::SystemInfoImpl_GetKeyboardLayouts);
        return call.Read<Keyboard>().available;
    });
}

void SystemInfoImpl::SetKeyboardLayout(const std::string& layout) {
    norlithctl::HostCall([&] {
        Call call(Op::SystemInfoImpl_SetKeyboardLayout, Args().Add("layout", layout));
        std::string offered = Offered(call.Read<Keyboard>(), layout);
        call.Update<Keyboard>([&](Keyboard& keyboard) { keyboard.configured = offered; });
    });
}

void SystemInfoImpl::LoadKeyboardMappings(const std::string& layout) {
    norlithctl::HostCall([&] {
        Call call(Op::SystemInfoImpl_LoadKeyboardMappings, Args().Add("layout", layout));
        Keyboard keyboard = call.Read<Keyboard>();
        // An empty name applies the layout in use again: journaled, nothing else changes.
        std::string applied = layout.empty() ? keyboard.current : Offered(keyboard, layout);
        call.Update<Keyboard>([&](Keyboard& state) { state.current = applied; });
    });
}

}  // namespace System
}  // namespace NorlithCtl
