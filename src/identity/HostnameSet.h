// system hostname set: changes the host name and the domain, or the fully qualified name, of
// the host's default network stack, staged and saved at once. The two option conflicts are
// refused before anything changes; each host step that fails is reported and the next one still
// runs, so the result can be true beside an error. A failure to build the DNS configuration
// object leaves ExecuteInternal.
#pragma once

#include "frame/CommandModel.h"

namespace TarselCli {
namespace System {

class HostnameSet : public virtual AutoCli::Command {
public:
    static boost::shared_ptr<HostnameSet> New();
    virtual ~HostnameSet();

    InputSpecPtr GetInputSpecInternal() override;
    OutputSpecPtr GetOutputSpecInternal() override;
    void ExecuteInternal(const InputPtr& input, const OutputPtr& output) override;

protected:
    HostnameSet();
};

}  // namespace System
}  // namespace TarselCli
