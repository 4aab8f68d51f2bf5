// system settings kernel list: the host kernel's boot-time settings as "SettingsKernel" rows
// (name, type, description, configured, runtime, default), all or the one --option names;
// --delta keeps only settings that differ from their default (IsDelta). A runtime value the
// kernel does not report shows as "<unset>". Host failures, an unknown name among them, are
// reported with the host's message and no result.
#pragma once

#include "frame/CommandModel.h"

namespace TarselCli {
namespace System {

class SettingsKernelList : public virtual AutoCli::Command {
public:
    static boost::shared_ptr<SettingsKernelList> New();
    virtual ~SettingsKernelList();

    InputSpecPtr GetInputSpecInternal() override;
    OutputSpecPtr GetOutputSpecInternal() override;
    void ExecuteInternal(const InputPtr& input, const OutputPtr& output) override;

    // The structure of one row: the "SettingsKernel" template.
    virtual StructPtr GetOutputStructure();

protected:
    SettingsKernelList();
};

}  // namespace System
}  // namespace TarselCli
