// system snmp get: the SNMP agent's stored configuration as one "AgentConfig" structure, whose
// field names are the parameters of system snmp set. A malformed configuration file and host
// failures become the error; each stored option the agent does not know adds an error and the
// structure is still the result.
#pragma once

#include "frame/CommandModel.h"

namespace TarselCli {
namespace System {

class SnmpAgentGet : public virtual AutoCli::Command {
public:
    static boost::shared_ptr<SnmpAgentGet> New();
    virtual ~SnmpAgentGet();

    InputSpecPtr GetInputSpecInternal() override;
    OutputSpecPtr GetOutputSpecInternal() override;
    void ExecuteInternal(const InputPtr& input, const OutputPtr& output) override;
    virtual StructPtr GetOutputStructure();

protected:
    SnmpAgentGet();
};

}  // namespace System
}  // namespace TarselCli
