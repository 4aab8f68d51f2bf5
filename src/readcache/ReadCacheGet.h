// ReadCacheGet: whether the content based read cache is active now and whether it is enabled
// from the next boot on, as one "CBRCStatus" structure. Exported from the plug-in but attached
// nowhere in the tree. A host failure after the system-information object is built becomes its
// message and no result; a failure to build it leaves ExecuteInternal.
#pragma once

#include "frame/CommandModel.h"
#include "frame/Export.h"

namespace TarselCli {
namespace System {

class SYSTEM_EXPORT ReadCacheGet : public virtual AutoCli::Command {
public:
    static boost::shared_ptr<ReadCacheGet> New();
    virtual ~ReadCacheGet();

    InputSpecPtr GetInputSpecInternal() override;
    OutputSpecPtr GetOutputSpecInternal() override;
    void ExecuteInternal(const InputPtr& input, const OutputPtr& output) override;

protected:
    ReadCacheGet();
};

}  // namespace System
}  // namespace TarselCli
