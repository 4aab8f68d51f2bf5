// Ravel::Storage::DiagnosticPartition and Ravel::Storage::DiagnosticFile: the two local targets
// the host kernel can write its core dump to, as NorlithCtl::Storage::StorageInfoImpl hands them
// out.
//
// Both are snapshots: a partition's name and path, and what a dump file held when it was read,
// answer from the object. The receiver owns every object it is given and deletes it through the
// virtual destructor of Ravel::Lib::RavelObject. Refresh reads the host again and may throw
// Ravel::Lib::RavelException; nothing is ever staged on these objects.
#pragma once

#include <norlithctl/Export.h>
#include <norlithctl/RavelObject.h>

#include <cstdint>
#include <string>

namespace Ravel {
namespace Storage {

class NORLITHCTL_API DiagnosticPartition : public Lib::RavelObject {
public:
    virtual ~DiagnosticPartition();

    // The partition's name: its disk's device name, ":" and the partition number.
    virtual std::string GetName() = 0;
    // The partition's device path, "/dev/disks/" followed by its name.
    virtual std::string GetPath() = 0;

protected:
    DiagnosticPartition();
};

class NORLITHCTL_API DiagnosticFile : public Lib::RavelObject {
public:
    virtual ~DiagnosticFile();

    // The file's host path.
    virtual std::string GetPath() = 0;
    // Whether the file exists as a regular file under the host's root/ and starts with the
    // dump-file header whose size matches the file's length. With reread the file is examined
    // again; without, the object answers from what it read last (a new object reads once).
    // Throws Ravel::Lib::RavelException only when the host cannot be reached (or a fault).
    virtual bool IsValid(bool reread) = 0;
    // The file's length in bytes (0 when it does not exist); read as IsValid reads.
    virtual std::int64_t GetSize() = 0;

protected:
    DiagnosticFile();
};

}  // namespace Storage
}  // namespace Ravel
