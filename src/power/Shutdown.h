// system shutdown reboot and system shutdown poweroff: one class, two instances that differ in
// their operation. The host must be in maintenance mode. An accepted request logs the user's
// reason to the host's observation log (through the event library) and to the system log,
// waits, and signals the host's init process (process 1) through the operating-system seam:
// SIGTERM reboots, SIGUSR2 powers off. Only one request is accepted per loaded library.
//
// Checks, in order: the reason's length (at most 512 bytes), the maintenance mode, the
// in-progress flag. The delay (10 seconds or more, the framework enforces it) is slept less 10
// seconds before logging, then 10 seconds after; the sleeps go through the seam, resumed when
// interrupted. Every host failure, the construction of the system-information object
// included, becomes the error in its event form (GetMessage(1)); the event library's and the
// seam's failures are not reported.
#pragma once

#include "frame/CommandModel.h"

#include <atomic>
#include <string>

namespace TarselCli {
namespace System {

class Shutdown : public virtual AutoCli::Command {
public:
    enum ShutdownOperation { Reboot = 0, PowerOff = 1 };

    static boost::shared_ptr<Shutdown> New(ShutdownOperation operation);
    virtual ~Shutdown();

    InputSpecPtr GetInputSpecInternal() override;
    OutputSpecPtr GetOutputSpecInternal() override;
    void ExecuteInternal(const InputPtr& input, const OutputPtr& output) override;

protected:
    explicit Shutdown(ShutdownOperation operation);

    void SafeSleep(unsigned int seconds);
    void LogMsgQuill(std::string text);
    void LogMsgSyslog(std::string text);
    void LogReason(std::string reason);

    // Set by the first request that passes the reason and maintenance checks, for every
    // instance, and never reset while the library is loaded. Tested and set in one step, so two
    // threads cannot both be accepted.
    static std::atomic<bool> _operationInProgress;

private:
    const ShutdownOperation _operation;
};

}  // namespace System
}  // namespace TarselCli
