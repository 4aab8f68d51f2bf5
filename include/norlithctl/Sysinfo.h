// NorlithCtl::Util::Sysinfo: a handle on one node of the kernel's information tree.
// <norlithctl/Records.h> gives the nodes this library serves and their record layouts.
//
// A node is addressed by its numeric identifier. Get() fills a caller-owned buffer with the
// node's fixed-size binary record, encoded from the host's current state. Nodes with instances
// (one record per ramdisk, per tardisk, ...) are listed with List() and addressed by adding the
// instance's name to the handle's instance path.
//
// Throws Ravel::Lib::RavelException: on construction for an unknown node, from Get() when the
// buffer size differs from the node's record size or the instance does not exist, from List() on
// a node without instances, and from any operation on which a fault is set.
#pragma once

#include <norlithctl/Export.h>
#include <norlithctl/Testing.h>

#include <cstddef>
#include <string>
#include <vector>

namespace NorlithCtl {
namespace Util {

class NORLITHCTL_API Sysinfo {
public:
    explicit Sysinfo(int node);
    virtual ~Sysinfo();

    virtual void Get(void* buffer, std::size_t size);
    virtual void List(std::vector<std::string>& names);
    virtual void AddInstancePath(const std::string& path);
    virtual void ResetInstance();

    int GetNode() const { return node_; }

private:
    Sysinfo(const Sysinfo&);
    Sysinfo& operator=(const Sysinfo&);

    int node_;
    std::vector<std::string> instance_path_;
    LiveObject live_;
};

}  // namespace Util
}  // namespace NorlithCtl
