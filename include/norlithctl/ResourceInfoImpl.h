// NorlithCtl::Resource::ResourceInfoImpl: the host's resource information, its user-level
// processes (worlds).
//
// Built per command on the stack. GetAllWorlds() hands out one new Ravel::Resource::World per
// world, in the host's order; the caller owns every element and deletes each (none is null).
//
// The constructor and GetAllWorlds may throw Ravel::Lib::RavelException (a host that cannot be
// opened, a fault set on the operation); when GetAllWorlds throws, it hands out nothing.
#pragma once

#include <norlithctl/Export.h>
#include <norlithctl/Testing.h>
#include <norlithctl/World.h>

#include <vector>

namespace NorlithCtl {
namespace Resource {

class NORLITHCTL_API ResourceInfoImpl {
public:
    ResourceInfoImpl();
    virtual ~ResourceInfoImpl();

    virtual std::vector<Ravel::Resource::World*> GetAllWorlds();

private:
    ResourceInfoImpl(const ResourceInfoImpl&);
    ResourceInfoImpl& operator=(const ResourceInfoImpl&);

    LiveObject live_;
};

}  // namespace Resource
}  // namespace NorlithCtl
