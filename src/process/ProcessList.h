// system process list: every user-level process (world) of the host, in the host's order, as
// a list of "UserWorld" structures, each with its security domain's label. A world whose data
// or label cannot be read is left out silently. A failure to read the list or to build the
// access control object becomes the host's message as the error (every world received is
// deleted on every path); a failure to build the resource information object leaves
// ExecuteInternal.
#pragma once

#include "frame/CommandModel.h"

namespace TarselCli {
namespace System {

class ProcessList : public virtual AutoCli::Command {
public:
    static boost::shared_ptr<ProcessList> New();
    virtual ~ProcessList();

    InputSpecPtr GetInputSpecInternal() override;
    OutputSpecPtr GetOutputSpecInternal() override;
    void ExecuteInternal(const InputPtr& input, const OutputPtr& output) override;
    virtual StructPtr GetOutputStructure();

protected:
    ProcessList();
};

}  // namespace System
}  // namespace TarselCli
