#include "identity/HostnameGet.h"

#include <norlithctl/DnsConfigImpl.h>

namespace TarselCli {
namespace System {

boost::shared_ptr<HostnameGet> HostnameGet::New() {
    return boost::shared_ptr<HostnameGet>(new HostnameGet());
}

HostnameGet::HostnameGet() {
    SetDescription("Get the host, domain or fully qualified name of the Quarn host.");
    SetMetaDataField("type", "fetcher");
    SetDefaultOutputFormatter("simple");
}

HostnameGet::~HostnameGet() {}

InputSpecPtr HostnameGet::GetInputSpecInternal() { return MakeInputSpec(); }

OutputSpecPtr HostnameGet::GetOutputSpecInternal() { return MakeOutputSpec(GetOutputStructure()); }

StructPtr HostnameGet::GetOutputStructure() {
    return MakeStructTemplate("FullyQualifiedHostName",
                              {{"Host Name", FieldString},
                               {"Domain Name", FieldString},
                               {"Fully Qualified Domain Name", FieldString}});
}

void HostnameGet::ExecuteInternal(const InputPtr&, const OutputPtr& output) {
    NorlithCtl::Network::DnsConfigImpl dnsConfig("defaultTcpipStack");
    GuardHost(output, [&] {
        StructPtr result = GetOutputStructure();
        result->SetField("Host Name", dnsConfig.GetHostname());
        result->SetField("Domain Name", dnsConfig.GetDomain());
        result->SetField("Fully Qualified Domain Name", dnsConfig.GetFqdn());
        SetResult(output, result);
    });
}

}  // namespace System
}  // namespace TarselCli
