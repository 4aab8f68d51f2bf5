// system snmp hash: the localized hashes of an SNMPv3 authentication secret (and optionally a
// privacy secret) for this agent's engine id, as system snmp set --users takes them, in one
// "SNMPv3Hash" structure. Secrets come from the first line of the named files, or from the
// command line with --raw-secret. The protocols are the agent's stored ones. Every refusal is
// one message and no result; a secret never appears in one.
#pragma once

#include "frame/CommandModel.h"

namespace TarselCli {
namespace System {

class SnmpAgentHash : public virtual AutoCli::Command {
public:
    static boost::shared_ptr<SnmpAgentHash> New();
    virtual ~SnmpAgentHash();

    InputSpecPtr GetInputSpecInternal() override;
    OutputSpecPtr GetOutputSpecInternal() override;
    void ExecuteInternal(const InputPtr& input, const OutputPtr& output) override;
    virtual StructPtr GetOutputStructure();

protected:
    SnmpAgentHash();
};

}  // namespace System
}  // namespace TarselCli
