// system settings advanced set: gives one advanced option a new integer or string value, or
// returns it to its default. Exactly one of --int-value, --string-value and --default is taken;
// the option's kind decides which value applies. Values the option refuses (out of its range,
// characters it does not accept) are reported with the host's message, in the form built from
// its event record; the option keeps its value.
#pragma once

#include "frame/CommandModel.h"

namespace TarselCli {
namespace System {

class SettingsAdvancedSet : public virtual AutoCli::Command {
public:
    static boost::shared_ptr<SettingsAdvancedSet> New();
    virtual ~SettingsAdvancedSet();

    InputSpecPtr GetInputSpecInternal() override;
    OutputSpecPtr GetOutputSpecInternal() override;
    void ExecuteInternal(const InputPtr& input, const OutputPtr& output) override;

protected:
    SettingsAdvancedSet();
};

}  // namespace System
}  // namespace TarselCli
