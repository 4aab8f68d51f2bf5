// system welcomemsg set: replaces the direct console's welcome message with --message, byte for
// byte; the host layer decides what it accepts and its refusal becomes the error. A failure to
// build the system-information object leaves ExecuteInternal.
#pragma once

#include "frame/CommandModel.h"

namespace TarselCli {
namespace System {

class WelcomeMessageSet : public virtual AutoCli::Command {
public:
    static boost::shared_ptr<WelcomeMessageSet> New();
    virtual ~WelcomeMessageSet();

    InputSpecPtr GetInputSpecInternal() override;
    OutputSpecPtr GetOutputSpecInternal() override;
    void ExecuteInternal(const InputPtr& input, const OutputPtr& output) override;

protected:
    WelcomeMessageSet();
};

}  // namespace System
}  // namespace TarselCli
