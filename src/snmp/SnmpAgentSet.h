// system snmp set: changes the SNMP agent's stored configuration. Each given parameter is checked
// (the port's range and the engine id's length here; everything else by the host-control
// library), handed to one configuration object, and the configuration is saved once at the end;
// a given engine id also removes the agent's boot record /var/tmp/snmp_boot.txt. Any refusal is
// the error and nothing is saved. Result: true.
#pragma once

#include "frame/CommandModel.h"

namespace TarselCli {
namespace System {

class SnmpAgentSet : public virtual AutoCli::Command {
public:
    static boost::shared_ptr<SnmpAgentSet> New();
    virtual ~SnmpAgentSet();

    InputSpecPtr GetInputSpecInternal() override;
    OutputSpecPtr GetOutputSpecInternal() override;
    void ExecuteInternal(const InputPtr& input, const OutputPtr& output) override;

protected:
    SnmpAgentSet();
};

}  // namespace System
}  // namespace TarselCli
