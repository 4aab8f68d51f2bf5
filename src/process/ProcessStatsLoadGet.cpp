#include "process/ProcessStatsLoadGet.h"

#include <norlithctl/ServerStats.h>

#include <boost/scoped_ptr.hpp>

#include <iomanip>
#include <sstream>

namespace TarselCli {
namespace System {

namespace {

// A raw load value over 100 x scale, with exactly two decimals. A scale of 0 means the host
// has not counted its CPUs yet; the load is then shown as 0.00 rather than "inf" or "nan".
std::string LoadText(std::uint32_t raw, std::int32_t scale) {
    std::ostringstream text;
    text << std::fixed << std::setprecision(2)
         << (scale <= 0 ? 0.0 : static_cast<double>(raw) / (100.0 * scale));
    return text.str();
}

}  // namespace

boost::shared_ptr<ProcessStatsLoadGet> ProcessStatsLoadGet::New() {
    return boost::shared_ptr<ProcessStatsLoadGet>(new ProcessStatsLoadGet());
}

ProcessStatsLoadGet::ProcessStatsLoadGet() {
    SetDescription("System load average over the last 1, 5 and 15 minutes.");
    SetMetaDataField("type", "fetcher");
    SetDefaultOutputFormatter("simple");
}

ProcessStatsLoadGet::~ProcessStatsLoadGet() {}

InputSpecPtr ProcessStatsLoadGet::GetInputSpecInternal() { return MakeInputSpec(); }

OutputSpecPtr ProcessStatsLoadGet::GetOutputSpecInternal() {
    return MakeOutputSpec(GetOutputStructure());
}

StructPtr ProcessStatsLoadGet::GetOutputStructure() {
    return MakeStructTemplate("ProcessStatsLoadGet", {{"Load 1 Minute", FieldString},
                                                      {"Load 5 Minutes", FieldString},
                                                      {"Load 15 Minutes", FieldString}});
}

void ProcessStatsLoadGet::ExecuteInternal(const InputPtr&, const OutputPtr& output) {
    StructPtr result = GetOutputStructure();
    boost::scoped_ptr<Ravel::AdvStats::ServerStats> stats(new Ravel::AdvStats::ServerStats());
    GuardHost(output, [&] {
        stats->FetchAllStats();
        const std::int32_t scale = stats->GetCpuStats().GetPcpuCount();
        const Ravel::AdvStats::LoadStats& load = stats->GetLoadStats();
        const std::uint32_t one = load.GetOneMinute();
        const std::uint32_t five = load.GetFiveMinutes();
        const std::uint32_t fifteen = load.GetFifteenMinutes();
        result->SetField("Load 1 Minute", LoadText(one, scale));
        result->SetField("Load 5 Minutes", LoadText(five, scale));
        result->SetField("Load 15 Minutes", LoadText(fifteen, scale));
        SetResult(output, result);
    });
}

}  // namespace System
}  // namespace TarselCli
