// NorlithCtl::Network::NetworkInfoImpl: the host's network dump settings (a switch, the
// interface to send from, the server's IPv4 address and port) and the check of that server.
//
// Built per command on the stack. The constructor and every operation may throw
// Ravel::Lib::RavelException: the host cannot be reached, a fault set on the operation, or a
// refusal of SetNetDumperParams (an interface the host does not have or that is down, an address
// that is not valid, a port outside 1..65535; then nothing changes). RunNetDumperCheck reports
// what it finds through its error text rather than by throwing (docs/host/coredump.md).
#pragma once

#include <norlithctl/Export.h>
#include <norlithctl/Ipv4Address.h>
#include <norlithctl/Testing.h>

#include <string>

namespace NorlithCtl {
namespace Network {

class NORLITHCTL_API NetworkInfoImpl {
public:
    NetworkInfoImpl();
    virtual ~NetworkInfoImpl();

    virtual bool GetNetDumperEnabled();
    // The stored interface, address and port ("", an invalid address and 0 when never set).
    virtual void GetNetDumperParams(std::string& interfaceName, Ravel::Network::Ipv4Address& address,
                                    int& port);
    virtual void SetNetDumperEnabled(bool enabled);
    virtual void SetNetDumperParams(const std::string& interfaceName,
                                    const Ravel::Network::Ipv4Address& address, int port);
    // Probes the server at address:port over UDP from the interface and waits, at most the
    // host's check timeout, for its answer. error is left empty when the server answered, else
    // it says what went wrong (an unknown or down interface, no route, port unreachable, no
    // answer within the timeout).
    virtual void RunNetDumperCheck(const std::string& interfaceName,
                                   const Ravel::Network::Ipv4Address& address, int port,
                                   std::string& error);

private:
    NetworkInfoImpl(const NetworkInfoImpl&);
    NetworkInfoImpl& operator=(const NetworkInfoImpl&);

    LiveObject live_;
};

}  // namespace Network
}  // namespace NorlithCtl
