#include <norlithctl/Sysinfo.h>

#include "HostCall.h"

#include <simhost/Records.h>

#include <cstring>

namespace NorlithCtl {
namespace Util {
namespace {

using simhost::Op;

std::string NodeName(int node) { return "kernel information node " + std::to_string(node); }

// The node's description; the constructor has checked that it exists.
const simhost::SysinfoNode& KnownNode(int node) {
    const simhost::SysinfoNode* found = simhost::FindSysinfoNode(node);
    if (!found) throw simhost::HostError("unknown " + NodeName(node));
    return *found;
}

nlohmann::ordered_json PathJson(const std::vector<std::string>& path) {
    return nlohmann::ordered_json(path);
}

}  // namespace

Sysinfo::Sysinfo(int node) : node_(node) {
    norlithctl::HostCall([&] {
        simhost::Call call(Op::Sysinfo_New, simhost::Args().Add("node", node));
        KnownNode(node);
    });
}

Sysinfo::~Sysinfo() {}

void Sysinfo::Get(void* buffer, std::size_t size) {
    norlithctl::HostCall([&] {
        simhost::Call call(Op::Sysinfo_Get, simhost::Args()
                                                .Add("node", node_)
                                                .Add("instance", PathJson(instance_path_))
                                                .Add("size", size));
        const simhost::SysinfoNode& node = KnownNode(node_);
        if (size != node.record_size)
            throw simhost::HostError("Cannot read " + NodeName(node_) + ": the buffer has " +
                                     std::to_string(size) + " bytes, the record has " +
                                     std::to_string(node.record_size));
        if (!buffer) throw simhost::HostError("Cannot read " + NodeName(node_) + ": no buffer");
        std::vector<unsigned char> record = node.read(call, instance_path_);
        std::memcpy(buffer, record.data(), size);
    });
}

void Sysinfo::List(std::vector<std::string>& names) {
    norlithctl::HostCall([&] {
        simhost::Call call(Op::Sysinfo_List, simhost::Args()
                                                 .Add("node", node_)
                                                 .Add("instance", PathJson(instance_path_)));
        const simhost::SysinfoNode& node = KnownNode(node_);
        if (!node.list) throw simhost::HostError(NodeName(node_) + " has no instances");
        for (std::string& name : node.list(call)) names.push_back(std::move(name));
    });
}

void Sysinfo::AddInstancePath(const std::string& path) {
    norlithctl::HostCall([&] {
        simhost::Call call(Op::Sysinfo_AddInstancePath,
                           simhost::Args().Add("node", node_).Add("path", path));
        if (!KnownNode(node_).list) throw simhost::HostError(NodeName(node_) + " has no instances");
        instance_path_.push_back(path);
    });
}

void Sysinfo::ResetInstance() {
    norlithctl::HostCall([&] {
        simhost::Call call(Op::Sysinfo_ResetInstance, simhost::Args().Add("node", node_));
        instance_path_.clear();
    });
}

}  // namespace Util
}  // namespace NorlithCtl
