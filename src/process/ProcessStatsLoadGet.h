// system process stats load get: the 1, 5 and 15 minute load averages per CPU, each the raw
// value over 100 x N with two decimals; with N = 0 (not counted yet) each shows 0.00. A host
// failure while fetching becomes the host's message as the error; a failure to build the
// statistics object leaves ExecuteInternal.
#pragma once

#include "frame/CommandModel.h"

namespace TarselCli {
namespace System {

class ProcessStatsLoadGet : public virtual AutoCli::Command {
public:
    static boost::shared_ptr<ProcessStatsLoadGet> New();
    virtual ~ProcessStatsLoadGet();

    InputSpecPtr GetInputSpecInternal() override;
    OutputSpecPtr GetOutputSpecInternal() override;
    void ExecuteInternal(const InputPtr& input, const OutputPtr& output) override;
    virtual StructPtr GetOutputStructure();

protected:
    ProcessStatsLoadGet();
};

}  // namespace System
}  // namespace TarselCli
