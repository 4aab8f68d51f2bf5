// system welcomemsg get: the direct console's welcome message as text, unchanged. A host
// failure while reading becomes the host's message as the error; a failure to build the
// system-information object leaves ExecuteInternal.
#pragma once

#include "frame/CommandModel.h"

namespace TarselCli {
namespace System {

class WelcomeMessageGet : public virtual AutoCli::Command {
public:
    static boost::shared_ptr<WelcomeMessageGet> New();
    virtual ~WelcomeMessageGet();

    InputSpecPtr GetInputSpecInternal() override;
    OutputSpecPtr GetOutputSpecInternal() override;
    void ExecuteInternal(const InputPtr& input, const OutputPtr& output) override;

protected:
    WelcomeMessageGet();
};

}  // namespace System
}  // namespace TarselCli
