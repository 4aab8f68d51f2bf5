// system boot device get: the NIC and file system the host booted from, and its stateless boot
// NIC, as one "SystemBootDevice" structure. A host failure while reading becomes the host's
// message as the error; a failure to build the host object leaves ExecuteInternal.
#pragma once

#include "frame/CommandModel.h"

namespace TarselCli {
namespace System {

class BootDeviceGet : public virtual AutoCli::Command {
public:
    static boost::shared_ptr<BootDeviceGet> New();
    virtual ~BootDeviceGet();

    InputSpecPtr GetInputSpecInternal() override;
    OutputSpecPtr GetOutputSpecInternal() override;
    void ExecuteInternal(const InputPtr& input, const OutputPtr& output) override;
    virtual StructPtr GetOutputStructure();

protected:
    BootDeviceGet();
};

}  // namespace System
}  // namespace TarselCli
