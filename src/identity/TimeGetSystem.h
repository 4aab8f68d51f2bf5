// system time get: the host's current time as an ISO 8601 text, YYYY-MM-DDTHH:MM:SSZ, broken
// down in the host's zone (UTC on the simulated host) through the operating-system seam. It
// has no error path: a clock that cannot be read reads as -1, one second before 1970.
#pragma once

#include "frame/CommandModel.h"

namespace TarselCli {
namespace System {

class TimeGetSystem : public virtual AutoCli::Command {
public:
    static boost::shared_ptr<TimeGetSystem> New();
    virtual ~TimeGetSystem();

    InputSpecPtr GetInputSpecInternal() override;
    OutputSpecPtr GetOutputSpecInternal() override;
    void ExecuteInternal(const InputPtr& input, const OutputPtr& output) override;

protected:
    TimeGetSystem();
};

}  // namespace System
}  // namespace TarselCli
