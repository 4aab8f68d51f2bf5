// NorlithCtl::Security::NorlithAccessInterfaceImpl: the host kernel's access control, its
// security domains and their enforcement levels.
//
// Built per command on the stack. Levels are "disabled", "audit" and "enforcing"; a level set
// here holds until the next boot, when every domain returns to the level it boots with.
// Nothing is handed out by pointer.
//
// Every operation, the constructor included, may throw Ravel::Lib::RavelException: an unknown
// label or keyword type, a security domain id or name the host does not have, a level outside
// the three (the message names the value and what is accepted; nothing changes), a host that
// cannot be opened, or a fault set on the operation.
#pragma once

#include <norlithctl/Export.h>
#include <norlithctl/Testing.h>

#include <cstdint>
#include <map>
#include <memory>
#include <string>

namespace NorlithCtl {
namespace Security {

class NORLITHCTL_API NorlithAccessInterfaceImpl {
public:
    NorlithAccessInterfaceImpl();
    virtual ~NorlithAccessInterfaceImpl();

    // The label of the security domain with that id. labelType 0, the only one, is the domain's
    // name. The domains are read once per object, at the first call.
    virtual std::string GetLabel(std::uint32_t id, int labelType);
    // keywordType 0, the only one, maps every security domain's name to its id.
    virtual std::map<std::string, long long> GetKeywordsMap(int keywordType);
    // The named domain's enforcement level now.
    virtual std::string GetStatus(std::string domainName);
    // Sets every domain's level now (not across a reboot).
    virtual void Enable(std::string level);
    // Sets the named domain's level now (not across a reboot).
    virtual void EnableDomain(std::string domainName, std::string level);

private:
    NorlithAccessInterfaceImpl(const NorlithAccessInterfaceImpl&);
    NorlithAccessInterfaceImpl& operator=(const NorlithAccessInterfaceImpl&);

    struct Labels;
    std::unique_ptr<Labels> labels_;
    LiveObject live_;
};

}  // namespace Security
}  // namespace NorlithCtl
