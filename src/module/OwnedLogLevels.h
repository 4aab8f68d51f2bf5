// OwnedLogLevels: the log level records the host-control library handed out, released with the
// library's NorlithCtl::Util::DeleteVector when the holder goes, on every path.
#pragma once

#include <norlithctl/Module.h>
#include <norlithctl/Util.h>

#include <vector>

namespace TarselCli {
namespace System {

class OwnedLogLevels {
public:
    OwnedLogLevels() {}
    ~OwnedLogLevels() { NorlithCtl::Util::DeleteVector(records_); }
    OwnedLogLevels(const OwnedLogLevels&) = delete;
    OwnedLogLevels& operator=(const OwnedLogLevels&) = delete;

    // Takes over records (the holder must be empty).
    void Take(std::vector<Ravel::System::LogLevel*> records) { records_ = std::move(records); }
    const std::vector<Ravel::System::LogLevel*>& Records() const { return records_; }
    void Release() { NorlithCtl::Util::DeleteVector(records_); }

private:
    std::vector<Ravel::System::LogLevel*> records_;
};

}  // namespace System
}  // namespace TarselCli
