#include "snmp/SnmpAgentTest.h"

#include "snmp/ReadSecretFile.h"

#include <norlithctl/SnmpAgentConfigImpl.h>

#include <vector>

namespace TarselCli {
namespace System {
namespace {

typedef NorlithCtl::System::SnmpAgentConfigImpl Config;

// "There is 1 target configured", "There are 2 targets configured", "There are 0 target
// configured": the plural noun only above one.
std::string TargetCountLine(std::size_t count) {
    return std::string("There") + (count == 1 ? " is " : " are ") + std::to_string(count) + " target" +
           (count > 1 ? "s" : "") + " configured";
}

}  // namespace

boost::shared_ptr<SnmpAgentTest> SnmpAgentTest::New() {
    return boost::shared_ptr<SnmpAgentTest>(new SnmpAgentTest());
}

SnmpAgentTest::SnmpAgentTest() {
    SetDescription("Verify Quarn SNMP notifications can be delivered to target destinations.");
    SetMetaDataField("type", "operation");
    SetDefaultOutputFormatter("simple");
}

SnmpAgentTest::~SnmpAgentTest() {}

InputSpecPtr SnmpAgentTest::GetInputSpecInternal() {
    return MakeInputSpec({
        {"user", "u", CallSpec::ParameterTypeString, false, "Validate a given SNMPv3 user name exists"},
        {"auth-hash", "A", CallSpec::ParameterTypeString, false,
         "Optionally test authentication secret generates matching hash for user"},
        {"priv-hash", "X", CallSpec::ParameterTypeString, false,
         "Optionally test privacy secret generates matching hash for user"},
        {"raw-secret", "r", CallSpec::ParameterTypeFlag, false,
         "Make -A and -X flags read raw secret from command line instead of file."},
    });
}

OutputSpecPtr SnmpAgentTest::GetOutputSpecInternal() { return MakeOutputSpec(GetOutputStructure()); }

StructPtr SnmpAgentTest::GetOutputStructure() {
    return MakeStructTemplate("AgentTest", {{"comments", FieldStringList}});
}

void SnmpAgentTest::ExecuteInternal(const InputPtr& input, const OutputPtr& output) {
    GuardHost(output, [&] {
        StructPtr result = GetOutputStructure();
        boost::shared_ptr<MetaObj::MetaList> comments = MetaObj::MetaList::New(MetaObj::MetaTypeString);
        const std::string user = input->GetString("user");
        std::string authSecret = input->GetString("auth-hash");
        std::string privSecret = input->GetString("priv-hash");
        const bool raw = input->HasValue("raw-secret");
        Config config;

        if (user.empty() && (!authSecret.empty() || !privSecret.empty()))
            throw Ravel::Lib::RavelException("auth/priv secret requires a user name to be specified.",
                                             Ravel::Lib::QuillMessage());
        if (!user.empty()) {
            comments->AddString("Testing SNMPv3 user '" + user + "'");
            if (!raw) {
                if (!authSecret.empty()) authSecret = ReadSecretFile(authSecret);
                if (!privSecret.empty()) privSecret = ReadSecretFile(privSecret);
            }
            std::string message;
            config.TestUser(user, authSecret, privSecret, message);
            comments->AddString(message);
        } else {
            std::vector<std::string> targets;
            config.GetTrapTargets(targets);
            std::size_t count = targets.size();
            targets.clear();
            config.GetV3Traps(targets);
            count += targets.size();
            comments->AddString(TargetCountLine(count));
            // A target that could not be reached makes TestTrap throw, so the lines below are
            // only shown after every notification went out.
            config.TestTrap(std::string());
            comments->AddString("send warmStart requested");
            comments->AddString("test completed normally.");
        }
        result->SetField("comments", comments);
        SetResult(output, result);
    });
}

}  // namespace System
}  // namespace TarselCli
