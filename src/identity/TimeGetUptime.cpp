#include "identity/TimeGetUptime.h"

#include <norlithctl/ServerStats.h>

#include <boost/scoped_ptr.hpp>

namespace TarselCli {
namespace System {

boost::shared_ptr<TimeGetUptime> TimeGetUptime::New() {
    return boost::shared_ptr<TimeGetUptime>(new TimeGetUptime());
}

TimeGetUptime::TimeGetUptime() {
    SetDescription("Disply the number of microseconds the system has been running.");
    SetMetaDataField("type", "fetcher");
    SetDefaultOutputFormatter("simple");
}

TimeGetUptime::~TimeGetUptime() {}

InputSpecPtr TimeGetUptime::GetInputSpecInternal() { return MakeInputSpec(); }

OutputSpecPtr TimeGetUptime::GetOutputSpecInternal() { return IntOutputSpec(); }

void TimeGetUptime::ExecuteInternal(const InputPtr&, const OutputPtr& output) {
    boost::scoped_ptr<Ravel::AdvStats::ServerStats> stats(new Ravel::AdvStats::ServerStats());
    GuardHost(
        output,
        [&] {
            stats->FetchAllStats();
            const long long uptime = stats->GetUptimeMicros();
            SetResult(output, MetaObj::MetaInt::New(uptime));
        },
        0, "Unable to get system uptime: ");
}

}  // namespace System
}  // namespace TarselCli
