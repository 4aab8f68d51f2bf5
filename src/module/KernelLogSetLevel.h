// KernelLogSetLevel: sets one log level of the kernel core, or with --module of one module, to
// --level or back to its default with --default (given with any value), until the next boot.
// Exported from the plug-in and attached nowhere in the tree. A module the host does not know is
// reported as "Could not find module with the name '<name>'" and nothing changes; refusals of
// the host (unknown level name, level out of its range) become its message.
#pragma once

#include "frame/CommandModel.h"
#include "frame/Export.h"

namespace TarselCli {
namespace System {

class SYSTEM_EXPORT KernelLogSetLevel : public virtual AutoCli::Command {
public:
    static boost::shared_ptr<KernelLogSetLevel> New();
    virtual ~KernelLogSetLevel();

    InputSpecPtr GetInputSpecInternal() override;
    OutputSpecPtr GetOutputSpecInternal() override;
    void ExecuteInternal(const InputPtr& input, const OutputPtr& output) override;

protected:
    KernelLogSetLevel();
};

}  // namespace System
}  // namespace TarselCli
