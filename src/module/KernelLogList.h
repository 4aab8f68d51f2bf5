// KernelLogList: the log levels of the kernel core, or with --module those of one module, with
// their current and default levels, as "LogLevel" structures; --level-name keeps the level of
// exactly that name. Exported from the plug-in and attached nowhere in the tree. A module the
// host does not know is reported as "Could not find module with the name '<name>'"; a host
// failure becomes the host's message and no list. The records are released on every path.
#pragma once

#include "frame/CommandModel.h"
#include "frame/Export.h"

namespace TarselCli {
namespace System {

class SYSTEM_EXPORT KernelLogList : public virtual AutoCli::Command {
public:
    static boost::shared_ptr<KernelLogList> New();
    virtual ~KernelLogList();

    InputSpecPtr GetInputSpecInternal() override;
    OutputSpecPtr GetOutputSpecInternal() override;
    void ExecuteInternal(const InputPtr& input, const OutputPtr& output) override;
    virtual StructPtr GetOutputStructure();

protected:
    KernelLogList();
};

}  // namespace System
}  // namespace TarselCli
