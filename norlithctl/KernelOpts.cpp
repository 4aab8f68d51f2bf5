#include <norlithctl/KernelOpts.h>

#include "HostCall.h"

#include <simhost/domains/KernelSettings.h>

namespace NorlithCtl {
namespace System {
namespace {

using simhost::Args;
using simhost::Call;
using simhost::Op;
namespace settings = simhost::kernel_settings;

// The named setting, read under the operation; an unknown name is refused.
settings::Setting Read(Op operation, const std::string& name) {
    return norlithctl::HostCall([&] {
        Call call(operation, Args().Add("name", name));
        std::optional<settings::Setting> setting = settings::Find(call.db(), name);
        if (!setting) throw settings::Unknown(call.db(), name);
        return std::move(*setting);
    });
}

}  // namespace

KernelOpts::KernelOpts() {
    // The object keeps no state; constructing it opens the host (and may fault).
    norlithctl::HostCall([] { Call call(Op::KernelOpts_New); });
}

KernelOpts::~KernelOpts() {}

std::vector<std::string> KernelOpts::GetOptionNames() {
    return norlithctl::HostCall([] {
        Call call(Op::KernelOpts_GetOptionNames);
        std::vector<std::string> names;
        call.Items<settings::Setting>().ForEach(
            [&](settings::Setting setting) { names.push_back(std::move(setting.name)); });
        return names;
    });
}

Ravel::System::KernelOption::OptionType KernelOpts::GetOptionType(const std::string& name) {
    return static_cast<Ravel::System::KernelOption::OptionType>(
        Read(Op::KernelOpts_GetOptionType, name).type);
}

std::string KernelOpts::GetOptionTypeString(Ravel::System::KernelOption::OptionType type) {
    return norlithctl::HostCall([&] {
        Call call(Op::KernelOpts_GetOptionTypeString, Args().Add("type", static_cast<int>(type)));
        return settings::TypeName(type);
    });
}

std::string KernelOpts::GetOptionDescription(const std::string& name) {
    return Read(Op::KernelOpts_GetOptionDescription, name).description;
}

std::string KernelOpts::GetOption(const std::string& name) {
    return Read(Op::KernelOpts_GetOption, name).configured;
}

std::string KernelOpts::GetRuntimeValue(const std::string& name) {
    return Read(Op::KernelOpts_GetRuntimeValue, name).runtime.value_or("");
}

std::string KernelOpts::GetOptionDefault(const std::string& name) {
    return Read(Op::KernelOpts_GetOptionDefault, name).default_value;
}

void KernelOpts::SetOption(const std::string& name, const std::string& value) {
    norlithctl::HostCall([&] {
        Call call(Op::KernelOpts_SetOption, Args().Add("name", name).Add("value", value));
        std::optional<settings::Setting> setting = settings::Find(call.db(), name);
        if (!setting) throw settings::Unknown(call.db(), name);
        if (!settings::CheckValue(setting->type, value).empty()) throw settings::Refused(*setting, value);
        setting->configured = value;
        call.Change([&](simhost::Db& db) { simhost::Items<settings::Setting>(db).Put(*setting); });
    });
}

}  // namespace System
}  // namespace NorlithCtl
