#include "coredump/KernelDumpGetNetwork.h"

#include <norlithctl/NetworkInfoImpl.h>

#include <string>

namespace TarselCli {
namespace System {

boost::shared_ptr<KernelDumpGetNetwork> KernelDumpGetNetwork::New() {
    return boost::shared_ptr<KernelDumpGetNetwork>(new KernelDumpGetNetwork());
}

KernelDumpGetNetwork::KernelDumpGetNetwork() {
    SetDescription("Get the currently configured parameters for network coredump, if enabled.");
    SetMetaDataField("type", "fetcher");
    SetDefaultOutputFormatter("simple");
}

KernelDumpGetNetwork::~KernelDumpGetNetwork() {}

InputSpecPtr KernelDumpGetNetwork::GetInputSpecInternal() { return MakeInputSpec(); }

OutputSpecPtr KernelDumpGetNetwork::GetOutputSpecInternal() { return MakeOutputSpec(GetOutputStructure()); }

StructPtr KernelDumpGetNetwork::GetOutputStructure() {
    return MakeStructTemplate("NetworkCoredump", {{"Enabled", FieldBool},
                                                  {"Host VNic", FieldString},
                                                  {"Network Server IP", FieldString},
                                                  {"Network Server Port", FieldInt}});
}

void KernelDumpGetNetwork::ExecuteInternal(const InputPtr&, const OutputPtr& output) {
    GuardHost(output, [&] {
        NorlithCtl::Network::NetworkInfoImpl network;
        const bool enabled = network.GetNetDumperEnabled();
        StructPtr result = GetOutputStructure();
        result->SetField("Enabled", enabled);
        // Switched off, the other fields stay as the template has them.
        if (enabled) {
            std::string interfaceName;
            Ravel::Network::Ipv4Address address;
            int port = 0;
            network.GetNetDumperParams(interfaceName, address, port);
            result->SetField("Host VNic", interfaceName);
            result->SetField("Network Server IP", address.GetStringAddress());
            result->SetField("Network Server Port", port);
        }
        SetResult(output, result);
    });
}

}  // namespace System
}  // namespace TarselCli
