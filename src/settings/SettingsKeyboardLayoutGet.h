// system settings keyboard layout get: the console keyboard layout in use, as text.
#pragma once

#include "frame/CommandModel.h"

namespace TarselCli {
namespace System {

class SettingsKeyboardLayoutGet : public virtual AutoCli::Command {
public:
    static boost::shared_ptr<SettingsKeyboardLayoutGet> New();
    virtual ~SettingsKeyboardLayoutGet();

    InputSpecPtr GetInputSpecInternal() override;
    OutputSpecPtr GetOutputSpecInternal() override;
    void ExecuteInternal(const InputPtr& input, const OutputPtr& output) override;

protected:
    SettingsKeyboardLayoutGet();
};

}  // namespace System
}  // namespace TarselCli
