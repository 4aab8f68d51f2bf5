// NorlithCtl::Network::DnsConfigImpl: the DNS configuration (host name and DNS domain) of one
// network stack of the host. The host has one stack, "defaultTcpipStack".
//
// Built per command on the stack. Changes are staged in the object: SetHostname, SetDomain and
// SetFqdn with applyNow false check the value and keep it; SaveConfig() applies every staged
// change at once, in one journaled transaction, and empties the stage (a stage left unsaved
// when the object is destroyed changes nothing). With applyNow true, a setter applies its own
// change at once (checked, journaled) and leaves the stage alone. The getters answer as the
// configuration would be after SaveConfig: the stored names with the staged changes applied.
//
// Names (the host layer's rules, also those of scenarios):
//   host name  one label of 1 to 63 letters, digits and '-', not starting or ending with '-'
//   domain     such labels joined by dots, at most 253 characters
//   FQDN       the host name, a dot and the domain: at least two such labels, at most 253
//              characters; SetFqdn sets both the host name (its first label) and the domain
//              (the rest)
//
// Every operation, the constructor included, may throw Ravel::Lib::RavelException: a stack
// other than "defaultTcpipStack", a name that breaks its rule (the message names the value and
// the rule, and nothing is staged or changed), a host that cannot be opened, or a fault set on
// the operation.
#pragma once

#include <norlithctl/Export.h>
#include <norlithctl/Testing.h>

#include <memory>
#include <string>

namespace NorlithCtl {
namespace Network {

class NORLITHCTL_API DnsConfigImpl {
public:
    explicit DnsConfigImpl(const std::string& stackName);
    virtual ~DnsConfigImpl();

    virtual std::string GetHostname();
    virtual std::string GetDomain();
    // The host name and the domain joined by a dot; the host name alone when there is no domain.
    virtual std::string GetFqdn();

    virtual void SetHostname(const std::string& hostName, bool applyNow);
    virtual void SetDomain(const std::string& domain, bool applyNow);
    virtual void SetFqdn(const std::string& fqdn, bool applyNow);

    // Applies the staged changes together; with none staged it changes (and journals) nothing.
    // When a rule refuses the changes, the stage is emptied and the stored names are unchanged;
    // a failure before applying (a fault, a host that cannot be opened) keeps the stage.
    virtual void SaveConfig();

private:
    DnsConfigImpl(const DnsConfigImpl&);
    DnsConfigImpl& operator=(const DnsConfigImpl&);

    struct Staging;
    std::unique_ptr<Staging> staging_;
    LiveObject live_;
};

}  // namespace Network
}  // namespace NorlithCtl
