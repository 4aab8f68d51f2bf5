// What the module objects of the host-control library hold (internal to the library): the module
// as the host held it when the object was made or last refreshed, and whether the host knows it.
#pragma once

#include <norlithctl/ModuleImpl.h>

#include <simhost/domains/Modules.h>

#include <memory>
#include <vector>

namespace NorlithCtl {
namespace System {

struct ModuleImpl::State {
    simhost::modules::Module module;
    bool known = false;
};

// A log level record as the library hands it out.
inline std::unique_ptr<Ravel::System::LogLevel> ToLogRecord(const simhost::modules::LogLevel& level) {
    std::unique_ptr<Ravel::System::LogLevel> record(new Ravel::System::LogLevel());
    record->name = level.name;
    record->currentLevel = level.current;
    record->defaultLevel = level.default_level;
    return record;
}

// Hands the owned objects over to the caller as plain pointers.
template <class T>
std::vector<T*> ReleaseAll(std::vector<std::unique_ptr<T>>& owned) {
    std::vector<T*> plain;
    plain.reserve(owned.size());
    for (auto& object : owned) plain.push_back(object.release());
    return plain;
}

}  // namespace System
}  // namespace NorlithCtl
