// The DNS configuration of the host's default network stack ("defaultTcpipStack"): its host
// name and its DNS domain. The fully qualified name is not stored; it is the host name, a dot
// and the domain (the host name alone when the domain is empty).
//
// Scenario section "dns" (every member optional):
//   host_name   one RFC 1123 label: 1 to 63 letters, digits and '-', not starting or ending
//               with '-'; default "qhost-07"
//   domain      "" (no domain) or such labels joined by dots, at most 253 characters; default
//               "lab.corvane.net"
// The host layer (NorlithCtl::Network::DnsConfigImpl) refuses a name that breaks these rules
// with a message naming the value and the rule; the refusal texts are made here, once.
#pragma once

#include <simhost/Export.h>
#include <simhost/Mapping.h>
#include <simhost/State.h>

#include <string>

namespace simhost {
namespace dns {

// The only network stack the host has.
constexpr char kDefaultStack[] = "defaultTcpipStack";
constexpr std::size_t kLabelMax = 63;
constexpr std::size_t kNameMax = 253;

// "" when text is acceptable as a host name / a domain / a fully qualified name, else the whole
// refusal message ("Invalid host name 'a.b': ...; a host name is ...").
SIMHOST_API std::string HostNameProblem(const std::string& text);
SIMHOST_API std::string DomainProblem(const std::string& text);
SIMHOST_API std::string FqdnProblem(const std::string& text);

inline bool IsHostName(const std::string& text) { return HostNameProblem(text).empty(); }
inline bool IsDomainOrEmpty(const std::string& text) {
    return text.empty() || DomainProblem(text).empty();
}

struct DnsConfig {
    static constexpr char kSection[] = "dns";
    static constexpr StateKind kKind = StateKind::kSingleton;

    std::string host_name;
    std::string domain;

    static DnsConfig Default() { return {"qhost-07", "lab.corvane.net"}; }
    std::string Fqdn() const { return domain.empty() ? host_name : host_name + "." + domain; }
};

template <class V>
void Describe(V& v, DnsConfig& s) {
    v("host_name", s.host_name,
      Pattern{IsHostName,
              "expected a host name of 1 to 63 letters, digits and '-', not starting or ending "
              "with '-'"});
    v("domain", s.domain,
      Pattern{IsDomainOrEmpty,
              "expected \"\" or labels of 1 to 63 letters, digits and '-' joined by dots, at "
              "most 253 characters"});
}

}  // namespace dns
}  // namespace simhost
