// system time set: sets the host's clock (through the operating-system seam: on the simulated
// host its clock, never the machine's) from any of year, month, day, hour, minute and second;
// the fields not given keep the values of the moment the command started. Each given field is
// checked in that order and the first refusal stops the command before the clock changes. A day
// beyond its month's end, hour 24 and minute or second 60 are carried into the next unit.
// A value that does not fit a 32-bit integer is refused with its field's message. The command
// catches no exception.
#pragma once

#include "frame/CommandModel.h"

namespace TarselCli {
namespace System {

class TimeSetSystem : public virtual AutoCli::Command {
public:
    static boost::shared_ptr<TimeSetSystem> New();
    virtual ~TimeSetSystem();

    InputSpecPtr GetInputSpecInternal() override;
    OutputSpecPtr GetOutputSpecInternal() override;
    void ExecuteInternal(const InputPtr& input, const OutputPtr& output) override;

protected:
    TimeSetSystem();
};

}  // namespace System
}  // namespace TarselCli
