#include "power/Shutdown.h"

#include <norlithctl/Env.h>
#include <norlithctl/QuillUserLib.h>
#include <norlithctl/SystemInfoImpl.h>

#include <cerrno>
#include <csignal>
#include <syslog.h>

namespace TarselCli {
namespace System {
namespace {

const std::string::size_type kMaxReason = 512;

struct OperationText {
    const char* description;
    const char* logPrefix;
    const char* quillFormat;
    int signal;
};

const OperationText kOperations[] = {
    {"Reboot the system. The host must be in maintenance mode.", "Reason for reboot: <",
     "@&!*@*@(quill.user.quarncli.host.reboot)%s", SIGTERM},
    {"Power off the system. The host must be in maintenance mode.", "Reason for power off: <",
     "@&!*@*@(quill.user.quarncli.host.poweroff)%s", SIGUSR2},
};

}  // namespace

std::atomic<bool> Shutdown::_operationInProgress(false);

boost::shared_ptr<Shutdown> Shutdown::New(ShutdownOperation operation) {
    return boost::shared_ptr<Shutdown>(new Shutdown(operation));
}

Shutdown::Shutdown(ShutdownOperation operation) : _operation(operation) {
    SetDescription(kOperations[_operation].description);
    SetMetaDataField("type", "operation");
}

Shutdown::~Shutdown() {}

InputSpecPtr Shutdown::GetInputSpecInternal() {
    return MakeInputSpec({
        {"reason", "r", CallSpec::ParameterTypeString, true, "Reason for performing the operation"},
        ParamDef{"delay", "d", CallSpec::ParameterTypeInt, false, "Delay interval in seconds"}
            .Range(10, 4294967295LL),
    });
}

OutputSpecPtr Shutdown::GetOutputSpecInternal() { return BoolOutputSpec(); }

void Shutdown::ExecuteInternal(const InputPtr& input, const OutputPtr& output) {
    GuardHost(
        output,
        [&] {
            NorlithCtl::System::SystemInfoImpl systemInfo;
            const std::string reason = input->GetString("reason");
            if (reason.size() > kMaxReason) {
                output->SetError("Reason message cannot be longer than 512 characters.");
                return;
            }
            if (systemInfo.GetMaintenanceModeState() != 1) {
                output->SetError(
                    "System is not in maintenance mode. Cannot perform requested operation.");
                return;
            }
            if (_operationInProgress.exchange(true)) {
                output->SetError("System is already performing requested operation.");
                return;
            }
            if (input->HasValue("delay"))
                SafeSleep(static_cast<unsigned int>(input->GetInt("delay") - 10));
            LogReason(reason);
            NorlithCtl::Os::Env::Default()->Kill(1, kOperations[_operation].signal);
            SetSuccess(output);
        },
        1);
}

void Shutdown::SafeSleep(unsigned int seconds) {
    struct timespec wanted {};
    wanted.tv_sec = static_cast<time_t>(seconds);
    struct timespec left {};
    NorlithCtl::Os::Env* os = NorlithCtl::Os::Env::Default();
    while (os->NanoSleep(&wanted, &left) == -1 && errno == EINTR) wanted = left;
}

void Shutdown::LogMsgQuill(std::string text) {
    if (QuillUserLib_Init() != 0) return;
    QuillUserLib_AddQuill(kOperations[_operation].quillFormat, text.c_str());
    QuillUserLib_Close();
}

void Shutdown::LogMsgSyslog(std::string text) {
    NorlithCtl::Os::Env::Default()->Syslog(LOG_CRIT, text.c_str());
}

void Shutdown::LogReason(std::string reason) {
    const std::string text = kOperations[_operation].logPrefix + reason + ">";
    LogMsgQuill(text);
    LogMsgSyslog(text);
    SafeSleep(10);
}

}  // namespace System
}  // namespace TarselCli
