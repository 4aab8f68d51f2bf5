// system process stats running get: the number of running processes of the host, as one
// "ProcessStatsRunningGet" structure. A host failure while fetching becomes the host's message as
// the error; a failure to build the statistics object leaves ExecuteInternal.
#pragma once

#include "frame/CommandModel.h"

namespace TarselCli {
namespace System {

class ProcessStatsRunningGet : public virtual AutoCli::Command {
public:
    static boost::shared_ptr<ProcessStatsRunningGet> New();
    virtual ~ProcessStatsRunningGet();

    InputSpecPtr GetInputSpecInternal() override;
    OutputSpecPtr GetOutputSpecInternal() override;
    void ExecuteInternal(const InputPtr& input, const OutputPtr& output) override;
    virtual StructPtr GetOutputStructure();

protected:
    ProcessStatsRunningGet();
};

}  // namespace System
}  // namespace TarselCli
