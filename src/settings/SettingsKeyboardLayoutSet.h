// system settings keyboard layout set: applies a keyboard layout now and, unless --no-persist is
// given, stores it for later boots. Without --layout nothing is stored and the layout in use is
// applied again. The host refuses a layout it does not offer; a failure to apply it comes after
// the layout was stored, which stays stored.
#pragma once

#include "frame/CommandModel.h"

namespace TarselCli {
namespace System {

class SettingsKeyboardLayoutSet : public virtual AutoCli::Command {
public:
    static boost::shared_ptr<SettingsKeyboardLayoutSet> New();
    virtual ~SettingsKeyboardLayoutSet();

    InputSpecPtr GetInputSpecInternal() override;
    OutputSpecPtr GetOutputSpecInternal() override;
    void ExecuteInternal(const InputPtr& input, const OutputPtr& output) override;

protected:
    SettingsKeyboardLayoutSet();
};

}  // namespace System
}  // namespace TarselCli
