// The network dump server check, for real over UDP: the probe the host sends and the responder
// that `quarnhost netdump-server` runs.
//
// Protocol (one datagram each way, ASCII): the probe is "NORLITHNETDUMP PROBE 1 " followed by a
// nonce of 16 hexadecimal digits and "\n"; a server answers with "NORLITHNETDUMP READY 1 ", the
// same nonce and "\n". Anything else is ignored on both sides.
//
// The simulated host's network reaches only the loopback range 127.0.0.0/8: a probe for any
// other address is never sent and reports that there is no route, so a check can never send
// traffic off this machine.
#pragma once

#include <simhost/Export.h>

#include <atomic>
#include <cstddef>
#include <cstdint>
#include <string>

namespace simhost {
namespace netdump {

// Probes address:port (a valid dotted IPv4 address, port 1..65535) and waits at most
// timeout_ms for the answer, sending the probe again each second. Returns "" when the server
// answered, else what went wrong. Never throws.
SIMHOST_API std::string Probe(const std::string& address, int port, std::int64_t timeout_ms);

// Whether a dotted IPv4 address lies in 127.0.0.0/8.
SIMHOST_API bool IsLoopback(const std::string& address);

// A responder bound to one UDP address. Owns its socket.
class SIMHOST_API Server {
public:
    // Binds address:port (port 0: a free one); throws HostError naming the address and the
    // system's reason.
    Server(const std::string& address, int port);
    ~Server();
    Server(const Server&) = delete;
    Server& operator=(const Server&) = delete;

    int Port() const { return port_; }
    // Answers probes until seconds have passed or stop becomes true (checked at least every
    // 100 ms); returns how many probes it answered.
    std::size_t Serve(double seconds, const std::atomic<bool>* stop = nullptr);

private:
    int fd_ = -1;
    int port_ = 0;
};

}  // namespace netdump
}  // namespace simhost
