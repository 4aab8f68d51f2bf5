#include "snmp/SnmpAgentHash.h"

#include "snmp/ReadSecretFile.h"

#include <norlithctl/SnmpAgentConfigImpl.h>

#include <map>

namespace TarselCli {
namespace System {

boost::shared_ptr<SnmpAgentHash> SnmpAgentHash::New() {
    return boost::shared_ptr<SnmpAgentHash>(new SnmpAgentHash());
}

SnmpAgentHash::SnmpAgentHash() {
    SetDescription("Generate localized hash values based on this agents snmp engine id.");
    SetMetaDataField("type", "operation");
    SetDefaultOutputFormatter("simple");
}

SnmpAgentHash::~SnmpAgentHash() {}

InputSpecPtr SnmpAgentHash::GetInputSpecInternal() {
    return MakeInputSpec({
        {"auth-hash", "A", CallSpec::ParameterTypeString, true,
         "Provide filename to secret for authentication hash, use in set --users"},
        {"priv-hash", "X", CallSpec::ParameterTypeString, false,
         "Provide filename to secret for privacy hash, use in set --users"},
        {"raw-secret", "r", CallSpec::ParameterTypeFlag, false,
         "Make -A and -X flags read raw secret from command line instead of file."},
    });
}

OutputSpecPtr SnmpAgentHash::GetOutputSpecInternal() { return MakeOutputSpec(GetOutputStructure()); }

StructPtr SnmpAgentHash::GetOutputStructure() {
    return MakeStructTemplate("SNMPv3Hash", {{"auth-hash", FieldString}, {"priv-hash", FieldString}});
}

void SnmpAgentHash::ExecuteInternal(const InputPtr& input, const OutputPtr& output) {
    GuardHost(output, [&] {
        StructPtr result = GetOutputStructure();
        NorlithCtl::System::SnmpAgentConfigImpl config;
        std::string authSecret = input->GetString("auth-hash");
        std::string privSecret = input->GetString("priv-hash");
        const bool raw = input->HasValue("raw-secret");

        if (authSecret.empty() && !privSecret.empty()) {
            output->SetError("Must specify --auth-hash when using --priv-hash");
            return;
        }
        if (!raw) {
            if (!authSecret.empty()) authSecret = ReadSecretFile(authSecret);
            if (!privSecret.empty()) privSecret = ReadSecretFile(privSecret);
        }
        // An empty secret (an empty value, or a blank first line) is as short as a secret gets:
        // it gets the length message rather than ending the command without a word.
        if (authSecret.size() < 8) {
            output->SetError("Authentication secret must be at least eight(8) characters in length");
            return;
        }
        if (!privSecret.empty() && privSecret.size() < 8) {
            output->SetError("Privacy secret must be at least eight(8) characters in length");
            return;
        }

        std::string authProtocol;
        std::string privProtocol;
        std::map<std::string, std::string> options;
        config.GetOptions(options);
        for (const auto& [key, value] : options) {
            if (key == "authentication") authProtocol = value;
            if (key == "privacy") privProtocol = value;
        }
        if (authProtocol.empty()) {
            output->SetError("Must specify set authentication protocol via set --authentication");
            return;
        }
        if (!privSecret.empty() && privProtocol.empty()) {
            output->SetError("Must first set privacy protocol via set --privacy");
            return;
        }

        std::string authHash;
        std::string privHash;
        std::string error;
        if (!config.GenerateHash(authSecret, privSecret, authProtocol, privProtocol, authHash, privHash, error)) {
            output->SetError(error);
            return;
        }
        result->SetField("auth-hash", authHash);
        result->SetField("priv-hash", privHash);
        SetResult(output, result);
    });
}

}  // namespace System
}  // namespace TarselCli
