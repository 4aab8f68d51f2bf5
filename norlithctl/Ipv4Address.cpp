#include <norlithctl/Ipv4Address.h>

#include <simhost/domains/Coredump.h>

namespace Ravel {
namespace Network {

Ipv4Address::Ipv4Address() : valid_(false) {}

Ipv4Address::Ipv4Address(const std::string& text) : text_(text), valid_(IsValidAddress(text)) {}

bool Ipv4Address::IsValidAddress() const { return valid_; }

bool Ipv4Address::IsValidAddress(const std::string& text) { return simhost::coredump::IsIpv4(text); }

std::string Ipv4Address::GetStringAddress() const { return text_; }

}  // namespace Network
}  // namespace Ravel
