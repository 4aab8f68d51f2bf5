#include "coredump/KernelDumpSetNetwork.h"

#include <norlithctl/NetworkInfoImpl.h>

#include <cstdint>
#include <string>

namespace TarselCli {
namespace System {

boost::shared_ptr<KernelDumpSetNetwork> KernelDumpSetNetwork::New() {
    return boost::shared_ptr<KernelDumpSetNetwork>(new KernelDumpSetNetwork());
}

KernelDumpSetNetwork::KernelDumpSetNetwork() {
    SetDescription("Set the parameters used for network core dump");
    SetMetaDataField("type", "operation");
}

KernelDumpSetNetwork::~KernelDumpSetNetwork() {}

InputSpecPtr KernelDumpSetNetwork::GetInputSpecInternal() {
    return MakeInputSpec({
        {"enable", "e", CallSpec::ParameterTypeBool, false,
         "Enable network dump. This option cannot be specified when setting the dump parameters below."},
        {"interface-name", "v", CallSpec::ParameterTypeString, false,
         "An active interface to be used for the network core dump. Required option when setting dump "
         "parameters."},
        {"server-ipv4", "i", CallSpec::ParameterTypeString, false,
         "IP address of the core dump server. Required option when setting dump parameters."},
        {"server-port", "o", CallSpec::ParameterTypeInt, false,
         "Port on which the core dump server is listening. (Optional)"},
    });
}

OutputSpecPtr KernelDumpSetNetwork::GetOutputSpecInternal() { return BoolOutputSpec(); }

void KernelDumpSetNetwork::ExecuteInternal(const InputPtr& input, const OutputPtr& output) {
    const std::string interfaceName = input->HasValue("interface-name") ? input->GetString("interface-name") : "";
    const std::string addressText = input->HasValue("server-ipv4") ? input->GetString("server-ipv4") : "";
    int port = 0;
    if (input->HasValue("server-port")) {
        // Checked as the 64-bit number typed: a value that is no port is never cut down to one.
        const std::int64_t given = input->GetInt("server-port");
        if (given < 1 || given > 65535) {
            output->SetError("Invalid server port number.");
            return;
        }
        port = static_cast<int>(given);
    }
    GuardHost(output, [&] {
        NorlithCtl::Network::NetworkInfoImpl network;
        if (input->HasValue("enable")) {
            if (!interfaceName.empty() || !addressText.empty() || port != 0) {
                output->SetError(
                    "--enable cannot be combined with --interface-name, --server-ipv4, or --server-port.");
                return;
            }
            network.SetNetDumperEnabled(input->GetBool("enable"));
        } else {
            if (addressText.empty()) {
                output->SetError("Missing parameter: network server IP address.");
                return;
            }
            if (interfaceName.empty()) {
                output->SetError("Missing parameter: interface name.");
                return;
            }
            if (!Ravel::Network::Ipv4Address::IsValidAddress(addressText)) {
                output->SetError("Malformed Network Server IP Address");
                return;
            }
            const Ravel::Network::Ipv4Address address(addressText);
            network.SetNetDumperParams(interfaceName, address, port == 0 ? 6500 : port);
        }
        SetSuccess(output);
    });
}

}  // namespace System
}  // namespace TarselCli
