// system uuid get: the host's system UUID as text. A host failure while reading it becomes the
// host's message as the error; a failure to build the host object leaves ExecuteInternal.
#pragma once

#include "frame/CommandModel.h"

namespace TarselCli {
namespace System {

class UuidGet : public virtual AutoCli::Command {
public:
    static boost::shared_ptr<UuidGet> New();
    virtual ~UuidGet();

    InputSpecPtr GetInputSpecInternal() override;
    OutputSpecPtr GetOutputSpecInternal() override;
    void ExecuteInternal(const InputPtr& input, const OutputPtr& output) override;

protected:
    UuidGet();
};

}  // namespace System
}  // namespace TarselCli
