// system version get: the product name, version, build and update of the host, read from the
// kernel's product version record. Every host failure, its construction included, becomes the
// error "Unable to query product version: " followed by the host's message.
#pragma once

#include "frame/CommandModel.h"

namespace TarselCli {
namespace System {

class VersionGet : public virtual AutoCli::Command {
public:
    static boost::shared_ptr<VersionGet> New();
    virtual ~VersionGet();

    InputSpecPtr GetInputSpecInternal() override;
    OutputSpecPtr GetOutputSpecInternal() override;
    void ExecuteInternal(const InputPtr& input, const OutputPtr& output) override;

protected:
    VersionGet();
};

}  // namespace System
}  // namespace TarselCli
