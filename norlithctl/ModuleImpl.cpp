// The kernel module object: a snapshot of one module of the "modules" domain, and the operations
// that load, enable and configure it and set its log levels (domains "modules",
// "module_aliases" and "log_levels").
#include <norlithctl/ModuleImpl.h>

#include "HostCall.h"
#include "ModuleState.h"

#include <simhost/domains/Modules.h>

#include <optional>

namespace Ravel {
namespace System {
Module::Module() {}
Module::~Module() {}
}  // namespace System
}  // namespace Ravel

namespace NorlithCtl {
namespace System {
namespace {

using simhost::Args;
using simhost::Call;
using simhost::HostError;
using simhost::Items;
using simhost::Op;
namespace modules = simhost::modules;

std::string Quoted(const std::string& name) { return modules::QuoteName(name); }

// The module the host knows by that name; refuses a malformed name or one it does not know.
modules::Module Known(Call& call, const std::string& name) {
    modules::CheckName(name);
    std::optional<modules::Module> found = call.Items<modules::Module>().Find(name);
    if (!found) throw modules::Unknown(call.db(), name);
    return *found;
}

std::string JoinPairs(const modules::Pairs& pairs) {
    std::string text;
    for (const auto& pair : pairs) {
        if (!text.empty()) text += ' ';
        text += pair.first + "=" + pair.second;
    }
    return text;
}

// The stored pairs with the given ones merged in: a given name replaces its stored value, new
// names follow in their order.
modules::Pairs Merge(modules::Pairs stored, const modules::Pairs& given) {
    for (const auto& pair : given) {
        bool replaced = false;
        for (auto& old : stored)
            if (old.first == pair.first) {
                old.second = pair.second;
                replaced = true;
            }
        if (!replaced) stored.push_back(pair);
    }
    return stored;
}

Ravel::System::ModuleNamespace ToRecord(const modules::Namespace& ns) {
    Ravel::System::ModuleNamespace record;
    record.name = ns.name;
    record.versions = ns.versions;
    return record;
}

}  // namespace

ModuleImpl::ModuleImpl(std::unique_ptr<State> state) : state_(std::move(state)) {}

ModuleImpl::ModuleImpl(const std::string& name) : state_(new State) {
    state_->module.name = name;
    norlithctl::HostCall([&] {
        Call call(Op::ModuleImpl_New, Args().Add("name", name));
        std::optional<modules::Module> found = call.Items<modules::Module>().Find(name);
        if (found) {
            state_->module = std::move(*found);
            state_->known = true;
        }
    });
    if (!state_->known) state_->module.enabled = false;
}

ModuleImpl::~ModuleImpl() {}

bool ModuleImpl::IsValidName(std::string name) {
    return norlithctl::HostCall([&] {
        Call call(Op::ModuleImpl_IsValidName, Args().Add("name", name));
        return modules::IsModuleName(name) && call.Items<modules::Module>().Contains(name);
    });
}

bool ModuleImpl::GetEnabled() {
    return norlithctl::HostCall([&] {
        const std::string& name = state_->module.name;
        Call call(Op::ModuleImpl_GetEnabled, Args().Add("name", name));
        std::optional<modules::Module> found = call.Items<modules::Module>().Find(name);
        return found && found->enabled;
    });
}

void ModuleImpl::Load(std::string options, bool force) {
    norlithctl::HostCall([&] {
        const std::string name = state_->module.name;
        Call call(Op::ModuleImpl_Load,
                  Args().Add("name", name).Add("options", options).Add("force", force));
        modules::Module module = Known(call, name);
        if (module.loaded)
            throw HostError("Module " + Quoted(name) +
                            " is already loaded; options stored now apply at its next load");
        if (!module.enabled && !force)
            throw HostError("Module " + Quoted(name) + " is disabled; it loads only when forced");
        if (!options.empty()) modules::CheckOptionsFor(module, options);
        module.loaded = true;
        module.loaded_options = options.empty() ? module.options : options;
        call.Change([&](simhost::Db& db) { Items<modules::Module>(db).Put(module); });
        state_->module = std::move(module);
        state_->known = true;
    });
}

void ModuleImpl::SetEnabled(bool enabled) {
    norlithctl::HostCall([&] {
        const std::string name = state_->module.name;
        Call call(Op::ModuleImpl_SetEnabled, Args().Add("name", name).Add("enabled", enabled));
        modules::Module module = Known(call, name);
        module.enabled = enabled;
        call.Change([&](simhost::Db& db) { Items<modules::Module>(db).Put(module); });
        state_->module = std::move(module);
        state_->known = true;
    });
}

void ModuleImpl::SetOptionString(std::string options, bool merge) {
    norlithctl::HostCall([&] {
        const std::string name = state_->module.name;
        Call call(Op::ModuleImpl_SetOptionString,
                  Args().Add("name", name).Add("options", options).Add("merge", merge));
        modules::CheckName(name);
        std::optional<modules::Module> found = call.Items<modules::Module>().Find(name);
        if (found) {
            modules::CheckOptionsFor(*found, options);
            if (merge) {
                modules::Pairs given;
                modules::ParseOptions(options, given);
                found->options = JoinPairs(Merge(modules::LenientPairs(found->options), given));
            } else {
                found->options = options;
            }
            call.Change([&](simhost::Db& db) { Items<modules::Module>(db).Put(*found); });
            state_->module = std::move(*found);
            state_->known = true;
            return;
        }
        // A name the host does not know as a module: kept as given, unchecked but for what any
        // stored text must be.
        std::string problem = simhost::CheckText(options, modules::kMaxOptionString);
        if (!problem.empty())
            throw HostError("Option string for " + Quoted(name) + " refused: " + problem);
        modules::Alias alias;
        alias.name = name;
        alias.options = options;
        if (merge) {
            std::optional<modules::Alias> stored = call.Items<modules::Alias>().Find(name);
            alias.options = JoinPairs(Merge(modules::LenientPairs(stored ? stored->options : ""),
                                            modules::LenientPairs(options)));
        }
        call.Change([&](simhost::Db& db) { Items<modules::Alias>(db).Put(alias); });
    });
}

std::vector<Ravel::System::ModuleParam> ModuleImpl::GetParameters() {
    return norlithctl::HostCall([&] {
        const std::string& name = state_->module.name;
        Call call(Op::ModuleImpl_GetParameters, Args().Add("name", name));
        std::vector<Ravel::System::ModuleParam> parameters;
        std::optional<modules::Module> found = call.Items<modules::Module>().Find(name);
        if (found)
            for (const modules::Parameter& p : found->parameters)
                parameters.push_back({p.name, p.type, p.description});
        return parameters;
    });
}

std::map<std::string, std::string> ModuleImpl::GetOptions() {
    return norlithctl::HostCall([&] {
        const std::string& name = state_->module.name;
        Call call(Op::ModuleImpl_GetOptions, Args().Add("name", name));
        std::string stored;
        if (std::optional<modules::Module> found = call.Items<modules::Module>().Find(name))
            stored = found->options;
        else if (std::optional<modules::Alias> alias = call.Items<modules::Alias>().Find(name))
            stored = alias->options;
        std::map<std::string, std::string> options;
        for (auto& pair : modules::LenientPairs(stored)) options[pair.first] = pair.second;
        return options;
    });
}

void ModuleImpl::Refresh() {
    norlithctl::HostCall([&] {
        const std::string name = state_->module.name;
        Call call(Op::ModuleImpl_Refresh, Args().Add("name", name));
        state_->module = Known(call, name);
        state_->known = true;
    });
}

// Every change applies at once: nothing is ever staged.
void ModuleImpl::Commit() {}
bool ModuleImpl::HasPendingChanges() { return false; }
void ModuleImpl::DiscardChanges() {}

std::string ModuleImpl::GetName() { return state_->module.name; }
std::string ModuleImpl::ToString() { return "module " + state_->module.name; }

bool ModuleImpl::IsLoaded() { return state_->module.loaded; }
std::string ModuleImpl::GetVersion() { return state_->module.version; }
std::string ModuleImpl::GetSignatureDigest() { return state_->module.signature_digest; }
std::string ModuleImpl::GetSignatureFingerPrint() { return state_->module.signature_fingerprint; }
std::string ModuleImpl::GetSignatureIssuer() { return state_->module.signature_issuer; }
bool ModuleImpl::IsEnabled() { return state_->module.enabled; }
Ravel::System::ModuleNamespace ModuleImpl::GetProvidedNamespace() {
    return ToRecord(state_->module.provides);
}
std::string ModuleImpl::GetFileVersion() { return state_->module.file_version; }
std::string ModuleImpl::GetLicense() { return state_->module.license; }
std::vector<Ravel::System::ModuleNamespace> ModuleImpl::GetRequiredNamespaces() {
    std::vector<Ravel::System::ModuleNamespace> records;
    for (const modules::Namespace& ns : state_->module.requires_) records.push_back(ToRecord(ns));
    return records;
}
std::string ModuleImpl::GetSignedStatus() { return state_->module.signed_status; }
std::string ModuleImpl::GetModuleFile() { return state_->module.file; }

std::vector<Ravel::System::LogLevel*> ModuleImpl::GetLogLevels() {
    // Built under owners, so that a failure half way hands out (and leaks) nothing.
    std::vector<std::unique_ptr<Ravel::System::LogLevel>> owned;
    norlithctl::HostCall([&] {
        const std::string name = state_->module.name;
        Call call(Op::ModuleImpl_GetLogLevels, Args().Add("name", name));
        Known(call, name);
        call.Items<modules::LogLevel>().ForEachWithPrefix(name + ":", [&](const modules::LogLevel& level) {
            if (level.module == name) owned.push_back(ToLogRecord(level));
        });
    });
    return ReleaseAll(owned);
}

void ModuleImpl::SetLogLevel(const std::string& levelName, std::uint32_t level) {
    norlithctl::HostCall([&] {
        const std::string name = state_->module.name;
        Call call(Op::ModuleImpl_SetLogLevel,
                  Args().Add("name", name).Add("level_name", levelName).Add("level", level));
        Known(call, name);
        modules::LogLevel record = modules::FindLogLevel(call.db(), name, levelName);
        modules::CheckLevel(levelName, level);
        record.current = static_cast<std::int32_t>(level);
        call.Change([&](simhost::Db& db) { Items<modules::LogLevel>(db).Put(record); });
    });
}

void ModuleImpl::SetDefaultLogLevel(const std::string& levelName) {
    norlithctl::HostCall([&] {
        const std::string name = state_->module.name;
        Call call(Op::ModuleImpl_SetDefaultLogLevel,
                  Args().Add("name", name).Add("level_name", levelName));
        Known(call, name);
        modules::LogLevel record = modules::FindLogLevel(call.db(), name, levelName);
        record.current = record.default_level;
        call.Change([&](simhost::Db& db) { Items<modules::LogLevel>(db).Put(record); });
    });
}

}  // namespace System
}  // namespace NorlithCtl
