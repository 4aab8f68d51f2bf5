#include "process/ProcessStatsRunningGet.h"

#include <norlithctl/ServerStats.h>

#include <boost/scoped_ptr.hpp>

namespace TarselCli {
namespace System {

boost::shared_ptr<ProcessStatsRunningGet> ProcessStatsRunningGet::New() {
    return boost::shared_ptr<ProcessStatsRunningGet>(new ProcessStatsRunningGet());
}

ProcessStatsRunningGet::ProcessStatsRunningGet() {
    SetDescription("Number of currently running processes.");
    SetMetaDataField("type", "fetcher");
    SetDefaultOutputFormatter("simple");
}

ProcessStatsRunningGet::~ProcessStatsRunningGet() {}

InputSpecPtr ProcessStatsRunningGet::GetInputSpecInternal() { return MakeInputSpec(); }

OutputSpecPtr ProcessStatsRunningGet::GetOutputSpecInternal() {
    return MakeOutputSpec(GetOutputStructure());
}

StructPtr ProcessStatsRunningGet::GetOutputStructure() {
    return MakeStructTemplate("ProcessStatsRunningGet", {{"Running Processes", FieldInt}});
}

void ProcessStatsRunningGet::ExecuteInternal(const InputPtr&, const OutputPtr& output) {
    StructPtr result = GetOutputStructure();
    boost::scoped_ptr<Ravel::AdvStats::ServerStats> stats(new Ravel::AdvStats::ServerStats());
    GuardHost(output, [&] {
        stats->FetchAllStats();
        result->SetField("Running Processes", static_cast<int>(stats->GetRunningProcesses()));
        SetResult(output, result);
    });
}

}  // namespace System
}  // namespace TarselCli
