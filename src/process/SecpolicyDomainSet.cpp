#include "process/SecpolicyDomainSet.h"

#include <norlithctl/NorlithAccessInterfaceImpl.h>

namespace TarselCli {
namespace System {

boost::shared_ptr<SecpolicyDomainSet> SecpolicyDomainSet::New() {
    return boost::shared_ptr<SecpolicyDomainSet>(new SecpolicyDomainSet());
}

SecpolicyDomainSet::SecpolicyDomainSet() {
    SetDescription(
        "Set the enforcement level for a domain in the system. Any option specified here is not "
        "persistent and will not survive a reboot of the system.");
    SetMetaDataField("type", "operation");
}

SecpolicyDomainSet::~SecpolicyDomainSet() {}

InputSpecPtr SecpolicyDomainSet::GetInputSpecInternal() {
    return MakeInputSpec({
        {"all-domains", "a", CallSpec::ParameterTypeFlag, false, "All domains."},
        {"name", "n", CallSpec::ParameterTypeString, false, "The domain name."},
        {"level", "l", CallSpec::ParameterTypeString, true, "The enforcement level."},
    });
}

OutputSpecPtr SecpolicyDomainSet::GetOutputSpecInternal() { return BoolOutputSpec(); }

void SecpolicyDomainSet::ExecuteInternal(const InputPtr& input, const OutputPtr& output) {
    // The flag is tested for presence, as the name is.
    const bool allDomains = input->HasValue("all-domains");
    const bool name = input->HasValue("name");
    NorlithCtl::Security::NorlithAccessInterfaceImpl access;
    const std::string level = input->GetString("level");
    GuardHost(output, [&] {
        if (allDomains) {
            if (name) {
                output->SetError("Can't specify domain name with all-domains option");
                return;
            }
            access.Enable(level);
        } else {
            if (!name) {
                output->SetError("Must specify one of all-domains or name");
                return;
            }
            access.EnableDomain(input->GetString("name"), level);
        }
        SetSuccess(output);
    });
}

}  // namespace System
}  // namespace TarselCli
