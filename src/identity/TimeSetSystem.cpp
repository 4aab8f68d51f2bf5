#include "identity/TimeSetSystem.h"

#include <norlithctl/Env.h>

#include <cerrno>
#include <climits>
#include <cstring>
#include <string>

namespace TarselCli {
namespace System {
namespace {

// One field of the broken-down time: its parameter, the values accepted, the refusal, where it
// is stored and what is added to store it.
struct TimeField {
    const char* name;
    long long low;
    long long high;
    const char* message;
    int tm::*member;
    int offset;
};

// In the order the fields are read; a value is checked whole (64 bits), so one that does not
// fit a 32-bit integer is refused rather than taken by its low bits.
const TimeField kFields[] = {
    {"year", 1970, INT_MAX, "Year must be > 1970", &tm::tm_year, -1900},
    {"month", 1, 12, "Month must be between 1 and 12", &tm::tm_mon, -1},
    {"day", 1, 31, "Invalid day", &tm::tm_mday, 0},
    {"hour", 0, 24, "Invalid hour", &tm::tm_hour, 0},
    {"min", 0, 60, "Invalid minute", &tm::tm_min, 0},
    {"sec", 0, 60, "Invalid second", &tm::tm_sec, 0},
};

}  // namespace

boost::shared_ptr<TimeSetSystem> TimeSetSystem::New() {
    return boost::shared_ptr<TimeSetSystem>(new TimeSetSystem());
}

TimeSetSystem::TimeSetSystem() {
    SetDescription(
        "Set the system clock time. Any missing parameters will default to the current time");
    SetMetaDataField("type", "operation");
}

TimeSetSystem::~TimeSetSystem() {}

InputSpecPtr TimeSetSystem::GetInputSpecInternal() {
    return MakeInputSpec({
        {"year", "y", CallSpec::ParameterTypeInt, false, "Year"},
        {"month", "M", CallSpec::ParameterTypeInt, false, "Month"},
        {"day", "d", CallSpec::ParameterTypeInt, false, "Day"},
        {"hour", "H", CallSpec::ParameterTypeInt, false, "Hour"},
        {"min", "m", CallSpec::ParameterTypeInt, false, "Minute"},
        {"sec", "s", CallSpec::ParameterTypeInt, false, "Second"},
    });
}

OutputSpecPtr TimeSetSystem::GetOutputSpecInternal() { return BoolOutputSpec(); }

void TimeSetSystem::ExecuteInternal(const InputPtr& input, const OutputPtr& output) {
    NorlithCtl::Os::Env* os = NorlithCtl::Os::Env::Default();
    time_t now = os->Time(nullptr);
    struct tm parts {};
    os->LocalTime(&now, &parts);

    bool any = false;
    for (const TimeField& field : kFields) any = any || input->HasValue(field.name);
    if (!any) {
        output->SetError("You must specify one of year, month, day, hour, minute or second");
        return;
    }
    for (const TimeField& field : kFields) {
        if (!input->HasValue(field.name)) continue;
        const long long value = input->GetInt(field.name);
        if (value < field.low || value > field.high) {
            output->SetError(field.message);
            return;
        }
        parts.*field.member = static_cast<int>(value) + field.offset;
    }

    time_t when = os->MakeTime(&parts);
    if (when == static_cast<time_t>(-1)) {
        output->SetError("Invalid time");
        return;
    }
    struct timeval clock {};
    clock.tv_sec = when;
    clock.tv_usec = 0;
    if (os->SetTimeOfDay(&clock, nullptr) == -1) {
        output->SetError(std::string("Unable to set time: ") + std::strerror(errno));
        return;
    }
    SetSuccess(output);
}

}  // namespace System
}  // namespace TarselCli
