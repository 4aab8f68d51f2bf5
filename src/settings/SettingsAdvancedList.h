// system settings advanced list: the host's advanced options as "SettingsAdvancedOption"
// structures: one option (--option, looked up by its whole path), one sub tree (--tree, a path of
// branch names split at "/"; empty components are dropped, so "/Net/Tcp", "Net/Tcp/" and
// "Net//Tcp" name the same branch and "" or "/" the root), or the whole tree, depth first;
// --delta keeps only options whose value differs from their default (it does not apply to
// --option). An unknown option is reported with no result; an unknown sub tree is reported and
// still yields an empty list. Host failures are reported with the host's message.
#pragma once

#include "frame/CommandModel.h"

namespace TarselCli {
namespace System {

class SettingsAdvancedList : public virtual AutoCli::Command {
public:
    static boost::shared_ptr<SettingsAdvancedList> New();
    virtual ~SettingsAdvancedList();

    InputSpecPtr GetInputSpecInternal() override;
    OutputSpecPtr GetOutputSpecInternal() override;
    void ExecuteInternal(const InputPtr& input, const OutputPtr& output) override;

    // The structure of one row: the "SettingsAdvancedOption" template.
    virtual StructPtr GetOutputStructure();

protected:
    SettingsAdvancedList();
};

}  // namespace System
}  // namespace TarselCli
