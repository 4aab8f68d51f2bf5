// system settings keyboard layout list: the keyboard layouts the host offers, one "Layout"
// structure each, in the host's order.
#pragma once

#include "frame/CommandModel.h"

namespace TarselCli {
namespace System {

class SettingsKeyboardLayoutList : public virtual AutoCli::Command {
public:
    static boost::shared_ptr<SettingsKeyboardLayoutList> New();
    virtual ~SettingsKeyboardLayoutList();

    InputSpecPtr GetInputSpecInternal() override;
    OutputSpecPtr GetOutputSpecInternal() override;
    void ExecuteInternal(const InputPtr& input, const OutputPtr& output) override;

    // The structure of one row: the "Layout" template.
    virtual StructPtr GetOutputStructure();

protected:
    SettingsKeyboardLayoutList();
};

}  // namespace System
}  // namespace TarselCli
