#include <norlithctl/NetworkInfoImpl.h>

#include "HostCall.h"

#include <simhost/NetDump.h>
#include <simhost/domains/Coredump.h>

#include "util/Text.h"

#include <optional>

namespace NorlithCtl {
namespace Network {
namespace {

using simhost::Args;
using simhost::Call;
using simhost::HostError;
using simhost::Op;
namespace coredump = simhost::coredump;

}  // namespace

NetworkInfoImpl::NetworkInfoImpl() {
    norlithctl::HostCall([] { Call call(Op::NetworkInfoImpl_New); });
}

NetworkInfoImpl::~NetworkInfoImpl() {}

bool NetworkInfoImpl::GetNetDumperEnabled() {
    return norlithctl::HostCall([] {
        Call call(Op::NetworkInfoImpl_GetNetDumperEnabled);
        return call.Read<coredump::NetDump>().enabled;
    });
}

void NetworkInfoImpl::GetNetDumperParams(std::string& interfaceName, Ravel::Network::Ipv4Address& address,
                                         int& port) {
    coredump::NetDump state = norlithctl::HostCall([] {
        Call call(Op::NetworkInfoImpl_GetNetDumperParams);
        return call.Read<coredump::NetDump>();
    });
    interfaceName = state.interface;
    address = state.server.empty() ? Ravel::Network::Ipv4Address() : Ravel::Network::Ipv4Address(state.server);
    port = state.port;
}

void NetworkInfoImpl::SetNetDumperEnabled(bool enabled) {
    norlithctl::HostCall([&] {
        Call call(Op::NetworkInfoImpl_SetNetDumperEnabled, Args().Add("enabled", enabled));
        call.Update<coredump::NetDump>([&](coredump::NetDump& state) { state.enabled = enabled; });
    });
}

void NetworkInfoImpl::SetNetDumperParams(const std::string& interfaceName,
                                         const Ravel::Network::Ipv4Address& address, int port) {
    norlithctl::HostCall([&] {
        Call call(Op::NetworkInfoImpl_SetNetDumperParams, Args()
                                                              .Add("interface", interfaceName)
                                                              .Add("address", address.GetStringAddress())
                                                              .Add("port", port));
        std::optional<coredump::Interface> found = call.Items<coredump::Interface>().Find(interfaceName);
        if (!found) throw coredump::UnknownInterface(call.db(), interfaceName);
        if (!found->up)
            throw HostError("Interface " + interfaceName +
                            " is down: network dump needs an interface that is up");
        if (!address.IsValidAddress())
            throw HostError(quarn::util::Quote(address.GetStringAddress()) + " is not a valid IPv4 address");
        if (port < 1 || port > 65535)
            throw HostError("Port " + std::to_string(port) + " is not a port: expected 1 to 65535");
        call.Update<coredump::NetDump>([&](coredump::NetDump& state) {
            state.interface = interfaceName;
            state.server = address.GetStringAddress();
            state.port = port;
        });
    });
}

void NetworkInfoImpl::RunNetDumperCheck(const std::string& interfaceName,
                                        const Ravel::Network::Ipv4Address& address, int port,
                                        std::string& error) {
    // The host is read and released before the probe: the wait must not hold it.
    std::int64_t timeout_ms = 0;
    error = norlithctl::HostCall([&]() -> std::string {
        Call call(Op::NetworkInfoImpl_RunNetDumperCheck, Args()
                                                             .Add("interface", interfaceName)
                                                             .Add("address", address.GetStringAddress())
                                                             .Add("port", port));
        std::optional<coredump::Interface> found = call.Items<coredump::Interface>().Find(interfaceName);
        if (!found) return "Interface " + quarn::util::Quote(interfaceName) + " is not a network interface of this host";
        if (!found->up) return "Interface " + interfaceName + " is down: the dump server cannot be reached through it";
        if (!address.IsValidAddress()) return quarn::util::Quote(address.GetStringAddress()) + " is not a valid IPv4 address";
        if (port < 1 || port > 65535) return "Port " + std::to_string(port) + " is not a port: expected 1 to 65535";
        timeout_ms = static_cast<std::int64_t>(call.Read<coredump::NetDump>().check_timeout_seconds) * 1000;
        return "";
    });
    if (error.empty()) error = simhost::netdump::Probe(address.GetStringAddress(), port, timeout_ms);
}

}  // namespace Network
}  // namespace NorlithCtl
