#include <norlithctl/ResourceInfoImpl.h>

#include "HostCall.h"

#include <simhost/domains/Processes.h>

#include <memory>
#include <optional>

namespace Ravel {
namespace Resource {
World::World() {}
World::~World() {}
}  // namespace Resource
}  // namespace Ravel

namespace NorlithCtl {
namespace Resource {
namespace {

typedef simhost::processes::World WorldState;

// A world as the host had it when the list was read.
class WorldImpl : public Ravel::Resource::World {
public:
    explicit WorldImpl(WorldState world) : world_(std::move(world)) {}

    long long GetId() const override { return world_.id; }
    long long GetCartelId() const override { return world_.cartel_id; }
    long long GetParentCartelId() const override { return world_.parent_cartel_id; }
    std::string GetName() const override { return world_.name; }
    std::string GetCommandLine() const override { return world_.command_line; }
    long long GetWorldGroupId() const override { return world_.world_group_id; }
    long long GetCartelGroupId() const override { return world_.cartel_group_id; }
    long long GetSessionId() const override { return world_.session_id; }
    long long GetWorldFlags() const override { return world_.flags; }
    std::string GetWorldType() const override { return world_.type; }
    std::string GetWorldState() const override { return world_.state; }
    std::uint32_t GetSecurityDomainId() const override { return world_.security_domain_id; }

    // A world is read-only: nothing is ever staged on it.
    void Refresh() override {
        norlithctl::HostCall([&] {
            simhost::Call call(simhost::Op::WorldImpl_Refresh, simhost::Args().Add("id", world_.id));
            std::optional<WorldState> now = call.Items<WorldState>().Find(world_.Key());
            if (!now) throw simhost::HostError("World " + std::to_string(world_.id) + " no longer exists");
            world_ = std::move(*now);
        });
    }
    void Commit() override {}
    bool HasPendingChanges() override { return false; }
    void DiscardChanges() override {}
    std::string GetName() override { return world_.name; }
    std::string ToString() override {
        return "world " + std::to_string(world_.id) + " (" + world_.name + ")";
    }

private:
    WorldState world_;
};

}  // namespace

ResourceInfoImpl::ResourceInfoImpl() {
    norlithctl::HostCall([] { simhost::Call call(simhost::Op::ResourceInfoImpl_New); });
}

ResourceInfoImpl::~ResourceInfoImpl() {}

std::vector<Ravel::Resource::World*> ResourceInfoImpl::GetAllWorlds() {
    // Built under owners, so that a failure half way hands out (and leaks) nothing.
    std::vector<std::unique_ptr<Ravel::Resource::World>> owned;
    norlithctl::HostCall([&] {
        simhost::Call call(simhost::Op::ResourceInfoImpl_GetAllWorlds);
        call.Items<WorldState>().ForEach(
            [&](WorldState world) { owned.emplace_back(new WorldImpl(std::move(world))); });
    });
    std::vector<Ravel::Resource::World*> worlds;
    worlds.reserve(owned.size());
    for (auto& world : owned) worlds.push_back(world.release());
    return worlds;
}

}  // namespace Resource
}  // namespace NorlithCtl
