#include <simhost/NetDump.h>

#include <simhost/Error.h>

#include <arpa/inet.h>
#include <netinet/in.h>
#include <poll.h>
#include <sys/socket.h>
#include <unistd.h>

#include <cerrno>
#include <chrono>
#include <cstdio>
#include <cstring>
#include <random>

namespace simhost {
namespace netdump {
namespace {

const char kProbe[] = "NORLITHNETDUMP PROBE 1 ";
const char kReady[] = "NORLITHNETDUMP READY 1 ";

typedef std::chrono::steady_clock Clock;

std::string Nonce() {
    std::random_device random;
    char text[17];
    std::snprintf(text, sizeof text, "%08x%08x", static_cast<unsigned>(random()), static_cast<unsigned>(random()));
    return text;
}

bool Address(const std::string& address, int port, sockaddr_in* out) {
    std::memset(out, 0, sizeof *out);
    out->sin_family = AF_INET;
    out->sin_port = htons(static_cast<std::uint16_t>(port));
    return port >= 0 && port <= 65535 && inet_pton(AF_INET, address.c_str(), &out->sin_addr) == 1;
}

// Closes the descriptor it holds.
struct Socket {
    int fd;
    ~Socket() {
        if (fd >= 0) close(fd);
    }
};

}  // namespace

bool IsLoopback(const std::string& address) {
    sockaddr_in in;
    return Address(address, 0, &in) && (ntohl(in.sin_addr.s_addr) >> 24) == 127;
}

std::string Probe(const std::string& address, int port, std::int64_t timeout_ms) {
    const std::string where = address + ":" + std::to_string(port);
    sockaddr_in server;
    if (port < 1 || port > 65535 || !Address(address, port, &server))
        return "Cannot probe " + where + ": not an IPv4 address and port";
    if (!IsLoopback(address))
        return "No route to the network dump server at " + where +
               ": this host's network reaches only 127.0.0.0/8";
    Socket socket_{socket(AF_INET, SOCK_DGRAM | SOCK_CLOEXEC, 0)};
    if (socket_.fd < 0) return std::string("Cannot open a UDP socket: ") + std::strerror(errno);
    // Connected, so that an ICMP port unreachable comes back as ECONNREFUSED.
    if (connect(socket_.fd, reinterpret_cast<const sockaddr*>(&server), sizeof server) != 0)
        return "Cannot reach the network dump server at " + where + ": " + std::strerror(errno);
    const std::string nonce = Nonce();
    const std::string probe = kProbe + nonce + "\n";
    const std::string expected = kReady + nonce + "\n";
    const Clock::time_point deadline = Clock::now() + std::chrono::milliseconds(timeout_ms);
    Clock::time_point next_send = Clock::now();
    for (;;) {
        Clock::time_point now = Clock::now();
        if (now >= next_send) {
            if (send(socket_.fd, probe.data(), probe.size(), 0) < 0) {
                if (errno == ECONNREFUSED)
                    return "Port " + std::to_string(port) + " of " + address +
                           " is unreachable: no network dump server listens there";
                if (errno != EINTR)
                    return "Cannot send the probe to " + where + ": " + std::strerror(errno);
            }
            next_send = now + std::chrono::seconds(1);
        }
        if (now >= deadline) break;
        Clock::time_point wake = std::min(deadline, next_send);
        long wait = static_cast<long>(std::chrono::duration_cast<std::chrono::milliseconds>(wake - now).count()) + 1;
        pollfd ready{socket_.fd, POLLIN, 0};
        int got = poll(&ready, 1, static_cast<int>(wait));
        if (got < 0 && errno != EINTR) return std::string("Cannot wait for the answer: ") + std::strerror(errno);
        if (got <= 0) continue;
        char reply[128];
        ssize_t size = recv(socket_.fd, reply, sizeof reply, 0);
        if (size < 0) {
            if (errno == ECONNREFUSED)
                return "Port " + std::to_string(port) + " of " + address +
                       " is unreachable: no network dump server listens there";
            if (errno != EINTR && errno != EAGAIN)
                return "Cannot read the answer from " + where + ": " + std::strerror(errno);
            continue;
        }
        if (std::string(reply, static_cast<std::size_t>(size)) == expected) return "";
    }
    const std::int64_t seconds = (timeout_ms + 999) / 1000;
    return "No answer from the network dump server at " + where + " within " + std::to_string(seconds) +
           (seconds == 1 ? " second" : " seconds");
}

Server::Server(const std::string& address, int port) {
    sockaddr_in local;
    if (!Address(address, port, &local))
        throw HostError("Cannot listen on " + address + ":" + std::to_string(port) + ": not an IPv4 address and port");
    fd_ = socket(AF_INET, SOCK_DGRAM | SOCK_CLOEXEC, 0);
    if (fd_ < 0) throw HostError(std::string("Cannot open a UDP socket: ") + std::strerror(errno));
    if (bind(fd_, reinterpret_cast<const sockaddr*>(&local), sizeof local) != 0) {
        int error = errno;
        close(fd_);
        throw HostError("Cannot listen on " + address + ":" + std::to_string(port) + ": " + std::strerror(error));
    }
    socklen_t size = sizeof local;
    getsockname(fd_, reinterpret_cast<sockaddr*>(&local), &size);
    port_ = ntohs(local.sin_port);
}

Server::~Server() {
    if (fd_ >= 0) close(fd_);
}

std::size_t Server::Serve(double seconds, const std::atomic<bool>* stop) {
    const Clock::time_point deadline =
        Clock::now() + std::chrono::duration_cast<Clock::duration>(std::chrono::duration<double>(seconds));
    const std::size_t prefix = std::strlen(kProbe);
    std::size_t answered = 0;
    while (Clock::now() < deadline && !(stop && stop->load())) {
        pollfd ready{fd_, POLLIN, 0};
        if (poll(&ready, 1, 100) <= 0) continue;
        char probe[128];
        sockaddr_in from;
        socklen_t size = sizeof from;
        ssize_t got = recvfrom(fd_, probe, sizeof probe, 0, reinterpret_cast<sockaddr*>(&from), &size);
        if (got <= 0) continue;
        std::string text(probe, static_cast<std::size_t>(got));
        // A probe: the prefix, 16 hexadecimal digits and a newline.
        if (text.size() != prefix + 17 || text.compare(0, prefix, kProbe) != 0 || text.back() != '\n') continue;
        std::string answer = kReady + text.substr(prefix);
        if (sendto(fd_, answer.data(), answer.size(), 0, reinterpret_cast<const sockaddr*>(&from), size) > 0)
            ++answered;
    }
    return answered;
}

}  // namespace netdump
}  // namespace simhost
