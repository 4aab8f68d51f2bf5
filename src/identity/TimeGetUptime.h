// system stats uptime get: microseconds since the host last booted, from the server
// statistics. A host failure while fetching becomes "Unable to get system uptime: " and the
// host's message; a failure to build the statistics object leaves ExecuteInternal.
#pragma once

#include "frame/CommandModel.h"

namespace TarselCli {
namespace System {

class TimeGetUptime : public virtual AutoCli::Command {
public:
    static boost::shared_ptr<TimeGetUptime> New();
    virtual ~TimeGetUptime();

    InputSpecPtr GetInputSpecInternal() override;
    OutputSpecPtr GetOutputSpecInternal() override;
    void ExecuteInternal(const InputPtr& input, const OutputPtr& output) override;

protected:
    TimeGetUptime();
};

}  // namespace System
}  // namespace TarselCli
