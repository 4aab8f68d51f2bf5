// The system-information object's console operations: the direct console's welcome message.
#include <norlithctl/SystemInfoImpl.h>

#include "HostCall.h"

#include <simhost/domains/Console.h>

namespace NorlithCtl {
namespace System {

using simhost::console::Console;

std::string SystemInfoImpl::GetWelcomeMessage() {
    return norlithctl::HostCall([&] {
        simhost::Call call(simhost::Op::SystemInfoImpl_GetWelcomeMessage);
        return call.Read<Console>().welcome_message;
    });
}

void SystemInfoImpl::SetWelcomeMessage(std::string message) {
    norlithctl::HostCall([&] {
        simhost::Call call(simhost::Op::SystemInfoImpl_SetWelcomeMessage,
                           simhost::Args().Add("message", message));
        std::string problem = simhost::console::WelcomeMessageProblem(message);
        if (!problem.empty()) throw simhost::HostError(problem);
        call.Update<Console>([&](Console& console) { console.welcome_message = message; });
    });
}

}  // namespace System
}  // namespace NorlithCtl
