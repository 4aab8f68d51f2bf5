#include "identity/TimeGetSystem.h"

#include <norlithctl/Env.h>

#include <iomanip>
#include <sstream>

namespace TarselCli {
namespace System {

boost::shared_ptr<TimeGetSystem> TimeGetSystem::New() {
    return boost::shared_ptr<TimeGetSystem>(new TimeGetSystem());
}

TimeGetSystem::TimeGetSystem() {
    SetDescription("Disply the current system time.");
    SetMetaDataField("type", "fetcher");
    SetDefaultOutputFormatter("simple");
}

TimeGetSystem::~TimeGetSystem() {}

InputSpecPtr TimeGetSystem::GetInputSpecInternal() { return MakeInputSpec(); }

OutputSpecPtr TimeGetSystem::GetOutputSpecInternal() { return StringOutputSpec(); }

void TimeGetSystem::ExecuteInternal(const InputPtr&, const OutputPtr& output) {
    NorlithCtl::Os::Env* os = NorlithCtl::Os::Env::Default();
    time_t now = os->Time(nullptr);
    struct tm parts {};
    os->LocalTime(&now, &parts);
    std::ostringstream text;
    text << std::setfill('0') << std::setw(4) << parts.tm_year + 1900 << '-' << std::setw(2)
         << parts.tm_mon + 1 << '-' << std::setw(2) << parts.tm_mday << 'T' << std::setw(2)
         << parts.tm_hour << ':' << std::setw(2) << parts.tm_min << ':' << std::setw(2)
         << parts.tm_sec << 'Z';
    SetResult(output, MetaObj::MetaString::New(text.str()));
}

}  // namespace System
}  // namespace TarselCli
