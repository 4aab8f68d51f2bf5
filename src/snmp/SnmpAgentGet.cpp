#include "snmp/SnmpAgentGet.h"

#include <norlithctl/SnmpAgentConfigImpl.h>

#include <boost/algorithm/string/classification.hpp>
#include <boost/algorithm/string/split.hpp>

#include <map>
#include <vector>

namespace TarselCli {
namespace System {
namespace {

typedef NorlithCtl::System::SnmpAgentConfigImpl Config;

// One list field filled from one of the configuration's list getters.
void SetListField(const StructPtr& result, const char* field, const Config& config,
                  void (Config::*getter)(std::vector<std::string>&) const,
                  std::vector<std::string>& scratch) {
    scratch.clear();
    (config.*getter)(scratch);
    boost::shared_ptr<MetaObj::MetaList> list = MetaObj::MetaList::New(MetaObj::MetaTypeString);
    for (const std::string& item : scratch) list->AddString(item);
    result->SetField(field, list);
}

}  // namespace

boost::shared_ptr<SnmpAgentGet> SnmpAgentGet::New() {
    return boost::shared_ptr<SnmpAgentGet>(new SnmpAgentGet());
}

SnmpAgentGet::SnmpAgentGet() {
    SetDescription("Get SNMP Agent configuration");
    SetMetaDataField("type", "fetcher");
    SetDefaultOutputFormatter("simple");
}

SnmpAgentGet::~SnmpAgentGet() {}

InputSpecPtr SnmpAgentGet::GetInputSpecInternal() { return MakeInputSpec(); }

OutputSpecPtr SnmpAgentGet::GetOutputSpecInternal() { return MakeOutputSpec(GetOutputStructure()); }

StructPtr SnmpAgentGet::GetOutputStructure() {
    return MakeStructTemplate("AgentConfig", {{"enable", FieldBool},
                                              {"port", FieldInt},
                                              {"communities", FieldStringList},
                                              {"targets", FieldStringList},
                                              {"notraps", FieldStringList},
                                              {"hwsrc", FieldString},
                                              {"engineid", FieldString},
                                              {"syslocation", FieldString},
                                              {"syscontact", FieldString},
                                              {"loglevel", FieldString},
                                              {"authentication", FieldString},
                                              {"privacy", FieldString},
                                              {"users", FieldStringList},
                                              {"remote-users", FieldStringList},
                                              {"v3targets", FieldStringList},
                                              {"largestorage", FieldBool}});
}

void SnmpAgentGet::ExecuteInternal(const InputPtr&, const OutputPtr& output) {
    GuardHost(output, [&] {
        StructPtr result = GetOutputStructure();
        Config config;
        if (!config.ValidConfigFile())
            throw Ravel::Lib::RavelException(
                "Configuration file, /etc/tarsel/snmp.xml, is not valid xml. Repair or replace it.",
                Ravel::Lib::QuillMessage());
        result->SetField("enable", config.GetEnabled());
        result->SetField("port", static_cast<long long>(config.GetPort()));
        std::vector<std::string> scratch;
        SetListField(result, "communities", config, &Config::GetCommunities, scratch);
        SetListField(result, "targets", config, &Config::GetTrapTargets, scratch);

        std::map<std::string, std::string> options;
        config.GetOptions(options);
        for (const auto& [key, value] : options) {
            if (key == "EventFilter") {
                std::vector<std::string> oids;
                boost::algorithm::split(oids, value, boost::algorithm::is_any_of(";"));
                result->SetField("notraps", oids);
            } else if (key == "EnvEventSource") {
                result->SetField("hwsrc", value);
            } else if (key == "engineid" || key == "syscontact" || key == "syslocation" ||
                       key == "loglevel" || key == "authentication" || key == "privacy") {
                result->SetField(key, value);
            } else {
                output->SetError("Unknown option " + key + " value '" + value + "'");
            }
        }

        SetListField(result, "users", config, &Config::GetUsers, scratch);
        SetListField(result, "remote-users", config, &Config::GetRemoteUsers, scratch);
        SetListField(result, "v3targets", config, &Config::GetV3Traps, scratch);
        result->SetField("largestorage", config.IsLargeStorageSupported());
        SetResult(output, result);
    });
}

}  // namespace System
}  // namespace TarselCli
