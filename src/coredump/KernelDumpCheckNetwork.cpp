#include "coredump/KernelDumpCheckNetwork.h"

#include <norlithctl/NetworkInfoImpl.h>

#include <memory>
#include <string>

namespace TarselCli {
namespace System {

boost::shared_ptr<KernelDumpCheckNetwork> KernelDumpCheckNetwork::New() {
    return boost::shared_ptr<KernelDumpCheckNetwork>(new KernelDumpCheckNetwork());
}

KernelDumpCheckNetwork::KernelDumpCheckNetwork() {
    SetDescription("Check the status of the configured network dump server");
    SetMetaDataField("type", "fetcher");
    SetDefaultOutputFormatter("simple");
}

KernelDumpCheckNetwork::~KernelDumpCheckNetwork() {}

InputSpecPtr KernelDumpCheckNetwork::GetInputSpecInternal() { return MakeInputSpec(); }

OutputSpecPtr KernelDumpCheckNetwork::GetOutputSpecInternal() { return StringOutputSpec(); }

void KernelDumpCheckNetwork::ExecuteInternal(const InputPtr&, const OutputPtr& output) {
    const std::string verified = "Verified the configured netdump server is running";
    std::string outcome;
    // Every host failure, the check's own included, is an outcome like the others rather than an
    // exception the framework would have to deal with.
    try {
        NorlithCtl::Network::NetworkInfoImpl network;
        const bool enabled = network.GetNetDumperEnabled();
        std::string interfaceName;
        Ravel::Network::Ipv4Address address;
        int port = 0;
        network.GetNetDumperParams(interfaceName, address, port);
        if (!enabled) {
            outcome = "Network coredump not enabled";
        } else if (!address.IsValidAddress()) {
            outcome = "Invalid IP address configured";
        } else {
            std::string error;
            network.RunNetDumperCheck(interfaceName, address, port, error);
            outcome = error.empty() ? verified : error;
        }
    } catch (const Ravel::Lib::RavelException& e) {
        outcome = e.GetMessage(0);
    }
    if (outcome != verified) output->SetError(outcome);
    SetResult(output, MetaObj::MetaString::New(outcome));
}

}  // namespace System
}  // namespace TarselCli

