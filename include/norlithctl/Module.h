// Ravel::System::Module: one loadable kernel module of the host, and the records the module
// interface and the system-information object hand out (namespaces, declared parameters, log
// levels).
//
// A module object is a snapshot taken when it was read (NorlithCtl::System::ModuleImpl,
// SystemInfoImpl::GetModules and GetModuleByName): the getters of the first block answer from
// it and do not throw. Its owner deletes it through the virtual destructor of
// Ravel::Lib::RavelObject. The log level operations reach the host and may throw
// Ravel::Lib::RavelException.
#pragma once

#include <norlithctl/Export.h>
#include <norlithctl/RavelObject.h>
#include <norlithctl/Testing.h>

#include <cstdint>
#include <string>
#include <vector>

namespace Ravel {
namespace System {

// A namespace a module provides or requires, with the versions it provides or accepts, in the
// host's order.
struct ModuleNamespace {
    std::string name;
    std::vector<std::string> versions;
};

// One parameter a module declares; type is one of "int", "uint", "bool", "string", "int array"
// and "uint array".
struct ModuleParam {
    std::string name;
    std::string type;
    std::string description;
};

// One log level of the kernel core or of a module: its level now and the one it returns to at a
// reset or a reboot. Handed out in vectors of pointers; the receiver deletes every record, e.g.
// with NorlithCtl::Util::DeleteVector.
struct LogLevel {
    std::string name;
    std::int32_t currentLevel;
    std::int32_t defaultLevel;
    NorlithCtl::LiveObject live;  // counts the record while it lives (Testing.h)
};

class NORLITHCTL_API Module : public virtual Lib::RavelObject {
public:
    virtual ~Module();

    // Whether the module is loaded now.
    virtual bool IsLoaded() = 0;
    virtual std::string GetVersion() = 0;
    virtual std::string GetSignatureDigest() = 0;
    virtual std::string GetSignatureFingerPrint() = 0;
    virtual std::string GetSignatureIssuer() = 0;
    // Whether the module is enabled: loaded at the next boot.
    virtual bool IsEnabled() = 0;
    // The namespace the module provides; its versions are empty when it provides none.
    virtual ModuleNamespace GetProvidedNamespace() = 0;
    virtual std::string GetFileVersion() = 0;
    virtual std::string GetLicense() = 0;
    virtual std::vector<ModuleNamespace> GetRequiredNamespaces() = 0;
    virtual std::string GetSignedStatus() = 0;
    // The path of the module's file on the host.
    virtual std::string GetModuleFile() = 0;

    // The module's log levels, read from the host; the caller owns the records.
    virtual std::vector<LogLevel*> GetLogLevels() = 0;
    // Sets one of its log levels until the next boot; refuses an unknown name or a level
    // outside the host's range (0 to 31).
    virtual void SetLogLevel(const std::string& name, std::uint32_t level) = 0;
    // Returns one of its log levels to its default.
    virtual void SetDefaultLogLevel(const std::string& name) = 0;

protected:
    Module();
};

}  // namespace System
}  // namespace Ravel
