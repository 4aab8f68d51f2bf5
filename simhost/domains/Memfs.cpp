#include <simhost/domains/Memfs.h>

#include <simhost/Mirafs.h>

#include <unordered_map>
#include <unordered_set>

namespace simhost {
namespace mirafs {
namespace {

// The ramdisks as a scenario section: the items, in mount order.
class RamdiskSection : public Section {
public:
    explicit RamdiskSection(std::vector<Ramdisk> ramdisks) : ramdisks_(std::move(ramdisks)) {}
    nlohmann::ordered_json ToJson() const override { return Codec<std::vector<Ramdisk>>::Write(ramdisks_); }
    void Write(WriteContext& context) const override {
        for (const Ramdisk& ramdisk : ramdisks_) PutRamdisk(context.db, ramdisk);
    }

private:
    std::vector<Ramdisk> ramdisks_;
};

// A collection domain whose items also keep their mount points in an index (Mirafs.cpp).
class RamdiskDomain : public Domain {
public:
    const char* Name() const override { return Ramdisk::kSection; }
    std::string Shape() const override {
        std::string shape;
        Codec<std::vector<Ramdisk>>::Shape(shape);
        return shape + "+mount-points";
    }
    std::unique_ptr<Section> Parse(const nlohmann::json* value, const Location& at) const override {
        std::vector<Ramdisk> ramdisks = Ramdisk::Default();
        if (value) Codec<std::vector<Ramdisk>>::Read(*value, at, ramdisks);
        std::unordered_set<std::string> names;
        std::unordered_map<std::string, const Ramdisk*> mount_points;
        for (std::size_t i = 0; i < ramdisks.size(); ++i) {
            const Ramdisk& ramdisk = ramdisks[i];
            if (!names.insert(ramdisk.name).second)
                at.Index(i).Member("name").Fail("'" + ramdisk.name + "' appears twice");
            auto [earlier, added] = mount_points.emplace(ramdisk.mount_point, &ramdisk);
            if (!added)
                at.Index(i).Member("mount_point").Fail("'" + ramdisk.mount_point + "' is the mount point of '" +
                                                       earlier->second->name + "' already");
        }
        return std::make_unique<RamdiskSection>(std::move(ramdisks));
    }
    std::unique_ptr<Section> Read(Db& db, const std::string&) const override {
        return std::make_unique<RamdiskSection>(Items<Ramdisk>(db).All());
    }
    // Ramdisks made at run time are gone after a reboot; the system ones are mounted again.
    void Boot(Db& db) const override {
        for (Ramdisk ramdisk : Items<Ramdisk>(db).All())
            if (!Ramdisk::Boot(ramdisk)) EraseRamdisk(db, ramdisk);
    }
};

}  // namespace

// The system ramdisks a booted host has: configuration, scratch space, logs, agents' state,
// statistics buffers and optional packages. Names and figures are this simulation's own.
std::vector<Ramdisk> Ramdisk::Default() {
    auto system = [](const char* name, const char* mount_point, std::uint32_t reserved,
                     std::uint32_t maximum, std::uint32_t reserved_inodes, std::uint32_t maximum_inodes,
                     bool coredump, const char* permissions, std::uint64_t peak_kib) {
        Ramdisk ramdisk;
        ramdisk.name = name;
        ramdisk.mount_point = mount_point;
        ramdisk.reserved_mib = reserved;
        ramdisk.maximum_mib = maximum;
        ramdisk.reserved_inodes = reserved_inodes;
        ramdisk.maximum_inodes = maximum_inodes;
        ramdisk.coredump = coredump;
        ramdisk.permissions = permissions;
        ramdisk.system = true;
        ramdisk.peak_used_kib = peak_kib;
        return ramdisk;
    };
    return {
        system("sysconf", "/etc", 24, 48, 512, 4096, true, "0755", 3412),
        system("scratch", "/tmp", 0, 192, 256, 8192, false, "1777", 40960),
        system("hostlog", "/var/log", 16, 128, 128, 2048, true, "0755", 51204),
        system("agentdb", "/var/lib/agents", 8, 64, 64, 1024, true, "0750", 9024),
        system("statsbuf", "/var/spool/stats", 4, 40, 32, 512, false, "0755", 12288),
        system("optpkgs", "/opt", 0, 32, 0, 2048, false, "0755", 1024),
    };
}

// The tardisks the host booted from, in load order: the base system, drivers, agents and tools,
// and the saved host configuration.
std::vector<Tardisk> Tardisk::Default() {
    return {
        {"basesys.t00", 178614927, true}, {"kernmods.t00", 41828790, true},
        {"nicdrv.t00", 23584113, true},   {"stordrv.t00", 31457806, true},
        {"hostagnt.t00", 66584202, true}, {"mgmtsvc.t00", 18927755, true},
        {"toolset.t00", 12189321, true},  {"locales.t00", 4718634, true},
        {"fwtools.t00", 9437460, true},   {"crypto.t00", 3145911, true},
        {"diagkit.t00", 7340218, false},  {"hoststate.tgz", 262611, true},
    };
}

const Domain& RamdiskTable::TheDomain() {
    static const RamdiskDomain domain;
    return domain;
}

}  // namespace mirafs
}  // namespace simhost
