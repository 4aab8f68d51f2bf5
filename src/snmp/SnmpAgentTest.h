// system snmp test: with --user, whether that SNMPv3 user exists and whether the given secrets
// produce its stored hashes; without, a warmStart notification to every configured target. The
// lines it reports are one "AgentTest" structure. A notification that could not be delivered, a
// secret file that cannot be read and host failures become the error, with no result.
#pragma once

#include "frame/CommandModel.h"

namespace TarselCli {
namespace System {

class SnmpAgentTest : public virtual AutoCli::Command {
public:
    static boost::shared_ptr<SnmpAgentTest> New();
    virtual ~SnmpAgentTest();

    InputSpecPtr GetInputSpecInternal() override;
    OutputSpecPtr GetOutputSpecInternal() override;
    void ExecuteInternal(const InputPtr& input, const OutputPtr& output) override;
    virtual StructPtr GetOutputStructure();

protected:
    SnmpAgentTest();
};

}  // namespace System
}  // namespace TarselCli
