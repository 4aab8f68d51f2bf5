// Ravel::Resource::World: one user-level process (a "world") of the host, as the resource
// information hands it out (NorlithCtl::Resource::ResourceInfoImpl::GetAllWorlds).
//
// A world is a snapshot taken when the list was read: its getters answer from it and do not
// throw. Its owner deletes it through the virtual destructor of Ravel::Lib::RavelObject.
#pragma once

#include <norlithctl/Export.h>
#include <norlithctl/RavelObject.h>

#include <cstdint>
#include <string>

namespace Ravel {
namespace Resource {

class NORLITHCTL_API World : public Lib::RavelObject {
public:
    virtual ~World();

    virtual long long GetId() const = 0;
    // The cartel (process) the world belongs to: the id of its first world.
    virtual long long GetCartelId() const = 0;
    virtual long long GetParentCartelId() const = 0;
    virtual std::string GetName() const = 0;
    virtual std::string GetCommandLine() const = 0;
    virtual long long GetWorldGroupId() const = 0;
    virtual long long GetCartelGroupId() const = 0;
    virtual long long GetSessionId() const = 0;
    // A bit set: 0x1 started by the host at boot, 0x2 restarted by its supervisor, 0x4 attached
    // to a terminal, 0x8 memory locked.
    virtual long long GetWorldFlags() const = 0;
    // "main" (the cartel's first world) or "helper".
    virtual std::string GetWorldType() const = 0;
    // "running", "ready", "sleeping", "waiting", "stopped" or "exiting".
    virtual std::string GetWorldState() const = 0;
    // The id of the world's security domain; NorlithAccessInterfaceImpl::GetLabel names it.
    virtual std::uint32_t GetSecurityDomainId() const = 0;

protected:
    World();
};

}  // namespace Resource
}  // namespace Ravel
