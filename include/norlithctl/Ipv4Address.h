// Ravel::Network::Ipv4Address: an IPv4 address as a value. A default-constructed address, or one
// built from text that is not a dotted IPv4 address (four decimal numbers 0..255, no leading
// zeros, no blanks), is not valid; GetStringAddress then returns the text it was given ("" for
// a default one). Nothing here throws or reaches the host.
#pragma once

#include <norlithctl/Export.h>

#include <string>

namespace Ravel {
namespace Network {

class NORLITHCTL_API Ipv4Address {
public:
    Ipv4Address();
    explicit Ipv4Address(const std::string& text);

    bool IsValidAddress() const;
    static bool IsValidAddress(const std::string& text);
    std::string GetStringAddress() const;

private:
    std::string text_;
    bool valid_;
};

}  // namespace Network
}  // namespace Ravel
