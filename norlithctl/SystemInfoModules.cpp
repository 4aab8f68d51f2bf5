// The module and log level operations of the system-information object (domains "modules" and
// "log_levels"; the kernel core's log levels are those of module "").
#include <norlithctl/SystemInfoImpl.h>

#include <norlithctl/ModuleImpl.h>

#include "HostCall.h"
#include "ModuleState.h"

#include <simhost/domains/Modules.h>

#include <memory>
#include <optional>

namespace NorlithCtl {
namespace System {
namespace {

using simhost::Args;
using simhost::Call;
using simhost::Op;
namespace modules = simhost::modules;

Ravel::System::Module* MakeModule(modules::Module module) {
    std::unique_ptr<ModuleImpl::State> state(new ModuleImpl::State);
    state->module = std::move(module);
    state->known = true;
    return new ModuleImpl(std::move(state));
}

}  // namespace

std::vector<Ravel::System::Module*> SystemInfoImpl::GetModules() {
    // Built under owners, so that a failure half way hands out (and leaks) nothing.
    std::vector<std::unique_ptr<Ravel::System::Module>> owned;
    norlithctl::HostCall([&] {
        Call call(Op::SystemInfoImpl_GetModules);
        call.Items<modules::Module>().ForEach(
            [&](modules::Module module) { owned.emplace_back(MakeModule(std::move(module))); });
    });
    return ReleaseAll(owned);
}

Ravel::System::Module* SystemInfoImpl::GetModuleByName(std::string name) {
    return norlithctl::HostCall([&]() -> Ravel::System::Module* {
        Call call(Op::SystemInfoImpl_GetModuleByName, Args().Add("name", name));
        if (!modules::IsModuleName(name)) return nullptr;
        std::optional<modules::Module> found = call.Items<modules::Module>().Find(name);
        return found ? MakeModule(std::move(*found)) : nullptr;
    });
}

std::vector<Ravel::System::LogLevel*> SystemInfoImpl::GetAllLogLevels() {
    std::vector<std::unique_ptr<Ravel::System::LogLevel>> owned;
    norlithctl::HostCall([&] {
        Call call(Op::SystemInfoImpl_GetAllLogLevels);
        call.Items<modules::LogLevel>().ForEachWithPrefix(":", [&](const modules::LogLevel& level) {
            if (level.module.empty()) owned.push_back(ToLogRecord(level));
        });
    });
    return ReleaseAll(owned);
}

void SystemInfoImpl::SetLogLevel(std::string name, std::uint32_t level) {
    norlithctl::HostCall([&] {
        Call call(Op::SystemInfoImpl_SetLogLevel, Args().Add("level_name", name).Add("level", level));
        modules::LogLevel record = modules::FindLogLevel(call.db(), "", name);
        modules::CheckLevel(name, level);
        record.current = static_cast<std::int32_t>(level);
        call.Change([&](simhost::Db& db) { simhost::Items<modules::LogLevel>(db).Put(record); });
    });
}

void SystemInfoImpl::SetDefaultLogLevel(std::string name) {
    norlithctl::HostCall([&] {
        Call call(Op::SystemInfoImpl_SetDefaultLogLevel, Args().Add("level_name", name));
        modules::LogLevel record = modules::FindLogLevel(call.db(), "", name);
        record.current = record.default_level;
        call.Change([&](simhost::Db& db) { simhost::Items<modules::LogLevel>(db).Put(record); });
    });
}

}  // namespace System
}  // namespace NorlithCtl
