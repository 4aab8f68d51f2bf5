// ReadCacheSet: enables or disables the content based read cache (from the next boot on, as
// the host keeps it) and returns true. Exported from the plug-in but attached nowhere in the
// tree. A host failure after the system-information object is built becomes its message and no
// result; a failure to build it leaves ExecuteInternal.
#pragma once

#include "frame/CommandModel.h"
#include "frame/Export.h"

namespace TarselCli {
namespace System {

class SYSTEM_EXPORT ReadCacheSet : public virtual AutoCli::Command {
public:
    static boost::shared_ptr<ReadCacheSet> New();
    virtual ~ReadCacheSet();

    InputSpecPtr GetInputSpecInternal() override;
    OutputSpecPtr GetOutputSpecInternal() override;
    void ExecuteInternal(const InputPtr& input, const OutputPtr& output) override;

protected:
    ReadCacheSet();
};

}  // namespace System
}  // namespace TarselCli
