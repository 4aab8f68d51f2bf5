#include "snmp/SnmpAgentSet.h"

#include "snmp/NormalizeEngineId.h"

#include <norlithctl/Env.h>
#include <norlithctl/SnmpAgentConfigImpl.h>

#include <boost/algorithm/string/classification.hpp>
#include <boost/algorithm/string/split.hpp>
#include <boost/algorithm/string/trim.hpp>

#include <map>
#include <vector>

namespace TarselCli {
namespace System {
namespace {

using CallSpec::ParameterTypeBool;
using CallSpec::ParameterTypeFlag;
using CallSpec::ParameterTypeInt;
using CallSpec::ParameterTypeString;

[[noreturn]] void Refuse(const std::string& message) {
    throw Ravel::Lib::RavelException(message, Ravel::Lib::QuillMessage());
}

// A comma-separated parameter as a list: the whole value trimmed, then split at every comma;
// items keep their own blanks and empty items stay.
std::vector<std::string> ToList(std::string value) {
    boost::algorithm::trim(value);
    std::vector<std::string> items;
    boost::algorithm::split(items, value, boost::algorithm::is_any_of(","));
    return items;
}

}  // namespace

boost::shared_ptr<SnmpAgentSet> SnmpAgentSet::New() {
    return boost::shared_ptr<SnmpAgentSet>(new SnmpAgentSet());
}

SnmpAgentSet::SnmpAgentSet() {
    SetDescription("This command allows the user to set up Quarn SNMP agent.");
    SetMetaDataField("type", "operation");
}

SnmpAgentSet::~SnmpAgentSet() {}

InputSpecPtr SnmpAgentSet::GetInputSpecInternal() {
    return MakeInputSpec({
        {"enable", "e", ParameterTypeBool, false, "Start or stop SNMP service. Values: [yes|no, true|false, 0|1]"},
        {"port", "p", ParameterTypeInt, false, "Set UDP port to poll snmp agent on. The default is udp/161"},
        {"communities", "c", ParameterTypeString, false,
         "Set up to ten communities each no more than 64 characters. Format is: community1[,community2,...] (this overwrites previous settings)"},
        {"targets", "t", ParameterTypeString, false,
         "Set up to three targets to send SNMPv1 traps to. Format is: ip-or-hostname[@port]/community[,...] The default port is udp/162. (this overwrites previous settings)"},
        {"hwsrc", "y", ParameterTypeString, false,
         "Where to source hardware events from IPMI sensors or CIM Indications. One of: indications|sensors"},
        {"syslocation", "L", ParameterTypeString, false,
         "System location string as presented in sysLocation.0. Up to 255 characters."},
        {"syscontact", "C", ParameterTypeString, false,
         "System contact string as presented in sysContact.0. Up to 255 characters"},
        {"loglevel", "l", ParameterTypeString, false, "System Agent syslog logging level: debug|info|warning|error"},
        {"notraps", "n", ParameterTypeString, false,
         "Comma separated list of trap oids for traps not to be sent by agent. Use value 'reset' to clear setting"},
        {"reset", "r", ParameterTypeFlag, false, "Return agent configuration to factory defaults"},
        ParamDef{"engineid", "E", ParameterTypeString, false,
                 "Set SNMPv3 engine id. Must be at least 10 to 32 hexadecimal characters. 0x or 0X is stripped if found as well as colons (:)"}
            .Regex("(0x|0X|)[0-9a-fA-F:]+"),
        {"authentication", "a", ParameterTypeString, false, "Set default authentication protocol. Values: none, MD5, SHA1"},
        {"privacy", "x", ParameterTypeString, false, "Set default privacy protocol. Values: none, AES128"},
        {"users", "u", ParameterTypeString, false,
         "Set up to five local users. Format is: user/-|auth-hash/-|priv-hash/model[,...] Where user is 32 chars max. '-' indicates no hash. Model is one of (none|auth|priv)."},
        {"remote-users", "R", ParameterTypeString, false,
         "Set up to five inform user ids. Format is: user/auth-proto/-|auth-hash/priv-proto/-|priv-hash/engine-id[,...] Where user is 32 chars max. auth-proto is none|MD5|SHA1, priv-proto is none|AES. '-' indicates no hash. engine-id is hex string '0x0-9a-f' up to 32 chars max."},
        {"v3targets", "i", ParameterTypeString, false,
         "Set up to three SNMPv3 notification targets. Format is: ip-or-hostname[@port]/remote-user/security-level/trap|inform[,...]."},
        {"largestorage", "s", ParameterTypeBool, false,
         "Support large storage for hrStorageAllocationUnits * hrStorageSize. Values: [yes|no, true|false, 0|1]. Control how the agent reports hrStorageAllocationUnits, hrStorageSize and hrStorageUsed in hrStorageTable. Setting this directive to 1 to support large storage with small allocation units, the agent re-calculates these values so they all fit Integer32 and hrStorageAllocationUnits * hrStorageSize gives real size of the storage ( Note: hrStorageAllocationUnits will not be real allocation units if real hrStorageSize won't fit into Integer32 ). Setting this directive to 0 turns off this calculation and the agent reports real hrStorageAllocationUnits, but it might report wrong hrStorageSize for large storage because the value won't fit into Integer32."},
    });
}

OutputSpecPtr SnmpAgentSet::GetOutputSpecInternal() { return BoolOutputSpec(); }

namespace {

// Stages every given parameter on config, in the fixed order of the checks, gathering the
// scalar settings into options. Returns whether anything was given.
bool StageParameters(const InputPtr& input, NorlithCtl::System::SnmpAgentConfigImpl& config,
                     std::map<std::string, std::string>& options, bool& engineIdGiven) {
    bool somethingToSet = false;
    if (input->HasValue("reset")) {
        config.Reset();
        somethingToSet = true;
    }
    if (input->HasValue("enable")) {
        config.SetEnabled(input->GetBool("enable"));
        somethingToSet = true;
    }
    if (input->HasValue("port")) {
        long long port = input->GetInt("port");
        if (port < 0 || port > 65535)
            Refuse("Port must be in range 0 - 65535 and not be already in use by another application.");
        config.SetPort(static_cast<unsigned short>(port));
        somethingToSet = true;
    }
    if (input->HasValue("communities")) {
        config.SetCommunities(ToList(input->GetString("communities")));
        somethingToSet = true;
    }
    if (input->HasValue("targets")) {
        config.SetTrapTargets(ToList(input->GetString("targets")));
        somethingToSet = true;
    }
    const std::pair<const char*, const char*> early[] = {
        {"hwsrc", "EnvEventSource"}, {"notraps", "EventFilter"}, {"authentication", "authentication"}};
    for (const auto& [parameter, key] : early) {
        if (input->HasValue(parameter)) {
            options[key] = input->GetString(parameter);
            somethingToSet = true;
        }
    }
    if (input->HasValue("engineid")) {
        std::string engineId = input->GetString("engineid");
        NormalizeEngineId(engineId);
        if (engineId.size() <= 9) Refuse("Option engineid minimum length is 10 characters.");
        if (engineId.size() > 32) Refuse("Option engineid maximum length is 32 characters.");
        options["engineid"] = engineId;
        engineIdGiven = true;
        somethingToSet = true;
    }
    for (const char* name : {"syslocation", "syscontact", "loglevel", "privacy"}) {
        if (input->HasValue(name)) {
            options[name] = input->GetString(name);
            somethingToSet = true;
        }
    }
    typedef void (NorlithCtl::System::SnmpAgentConfigImpl::*ListSetter)(const std::vector<std::string>&);
    const std::pair<const char*, ListSetter> lists[] = {
        {"users", &NorlithCtl::System::SnmpAgentConfigImpl::SetUsers},
        {"remote-users", &NorlithCtl::System::SnmpAgentConfigImpl::SetRemoteUsers},
        {"v3targets", &NorlithCtl::System::SnmpAgentConfigImpl::SetV3Targets}};
    for (const auto& [parameter, setter] : lists) {
        if (input->HasValue(parameter)) {
            (config.*setter)(ToList(input->GetString(parameter)));
            somethingToSet = true;
        }
    }
    if (input->HasValue("largestorage")) {
        config.SetLargeStorageSupport(input->GetBool("largestorage"));
        somethingToSet = true;
    }
    return somethingToSet;
}

}  // namespace

void SnmpAgentSet::ExecuteInternal(const InputPtr& input, const OutputPtr& output) {
    GuardHost(output, [&] {
        {
            NorlithCtl::System::SnmpAgentConfigImpl config;
            std::map<std::string, std::string> options;
            bool engineIdGiven = false;
            if (!StageParameters(input, config, options, engineIdGiven)) Refuse("Specify what to set or --help");
            if (!options.empty()) config.SetOptions(options);
            // The agent's record of its engine boots belongs to the old engine id; a missing file
            // is fine, so the result is not looked at.
            if (engineIdGiven) NorlithCtl::Os::Env::Default()->Unlink("/var/tmp/snmp_boot.txt");
            config.SaveConfig();
        }
        SetSuccess(output);
    });
}

}  // namespace System
}  // namespace TarselCli
