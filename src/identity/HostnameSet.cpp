#include "identity/HostnameSet.h"

#include <norlithctl/DnsConfigImpl.h>

namespace TarselCli {
namespace System {

boost::shared_ptr<HostnameSet> HostnameSet::New() {
    return boost::shared_ptr<HostnameSet>(new HostnameSet());
}

HostnameSet::HostnameSet() {
    SetDescription(
        "This command allows the user to set the hostname, domain name or fully qualified domain "
        "name of the Quarn host.");
    SetMetaDataField("type", "operation");
}

HostnameSet::~HostnameSet() {}

InputSpecPtr HostnameSet::GetInputSpecInternal() {
    return MakeInputSpec({
        {"host", "H", CallSpec::ParameterTypeString, false,
         "The host name to set for the Quarn host. This name should not contain the DNS domain "
         "name of the host and can only contain letters, numbers and '-'. NOTE this is not the "
         "fully qualified name, that can be set with the --fqdn option. This option is mutually "
         "exclusive with the --fqdn option."},
        {"domain", "d", CallSpec::ParameterTypeString, false,
         "The domain name to set for the Quarn host. This option is mutually exclusive with the "
         "--fqdn option."},
        {"fqdn", "f", CallSpec::ParameterTypeString, false,
         "Set the fully qualified domain name of the Quarn host."},
    });
}

OutputSpecPtr HostnameSet::GetOutputSpecInternal() { return BoolOutputSpec(); }

void HostnameSet::ExecuteInternal(const InputPtr& input, const OutputPtr& output) {
    NorlithCtl::Network::DnsConfigImpl dnsConfig("defaultTcpipStack");
    const bool host = input->HasValue("host");
    const bool domain = input->HasValue("domain");
    const bool fqdn = input->HasValue("fqdn");
    if (!host && !domain && !fqdn) {
        output->SetError("You must specify at least one of: --host, --domain, --fqdn");
        return;
    }
    if (fqdn && (host || domain)) {
        output->SetError("You may not specify --host or --domain with --fqdn");
        return;
    }
    // Each step reports its own failure and the next one still runs; the staged changes that
    // were accepted are saved all the same.
    if (fqdn) {
        GuardHost(output, [&] { dnsConfig.SetFqdn(input->GetString("fqdn"), false); });
    } else {
        if (host) GuardHost(output, [&] { dnsConfig.SetHostname(input->GetString("host"), false); });
        if (domain) GuardHost(output, [&] { dnsConfig.SetDomain(input->GetString("domain"), false); });
    }
    GuardHost(output, [&] { dnsConfig.SaveConfig(); });
    SetSuccess(output);
}

}  // namespace System
}  // namespace TarselCli
