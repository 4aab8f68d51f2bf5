// system settings kernel set: gives a kernel setting a new configured value, used from the next
// boot. The value is passed as typed; the host checks it against the setting's type and reports
// what it refuses, like an unknown name, with its message.
#pragma once

#include "frame/CommandModel.h"

namespace TarselCli {
namespace System {

class SettingsKernelSet : public virtual AutoCli::Command {
public:
    static boost::shared_ptr<SettingsKernelSet> New();
    virtual ~SettingsKernelSet();

    InputSpecPtr GetInputSpecInternal() override;
    OutputSpecPtr GetOutputSpecInternal() override;
    void ExecuteInternal(const InputPtr& input, const OutputPtr& output) override;

protected:
    SettingsKernelSet();
};

}  // namespace System
}  // namespace TarselCli
