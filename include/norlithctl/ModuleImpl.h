// NorlithCtl::System::ModuleImpl: the host-control library's kernel module object.
//
// Constructed from a module name, on the caller's stack; the name need not be one the host knows
// (IsValidName tells), and construction does not refuse it: a module the host does not know reads
// as empty (no file, not loaded, not enabled) and its host operations refuse to act on it, with
// the exceptions documented below. The library also hands modules out by pointer
// (SystemInfoImpl::GetModules, GetModuleByName); the receiver deletes them.
//
// The getters of Ravel::System::Module answer from the snapshot taken at construction (or the
// last Refresh). Load, SetEnabled, SetOptionString and the log level setters change the host at
// once (one journaled change each) and update the snapshot; nothing is ever staged, so Commit
// has nothing to apply. Every host operation may throw Ravel::Lib::RavelException.
//
// Loaded and enabled are kept apart: Load changes what runs now, SetEnabled what the next boot
// loads. At a reboot the enabled modules are the loaded ones, each with its stored option string.
#pragma once

#include <norlithctl/Export.h>
#include <norlithctl/Module.h>

#include <map>
#include <memory>
#include <string>
#include <vector>

namespace NorlithCtl {
namespace System {

class NORLITHCTL_API ModuleImpl : public virtual Ravel::System::Module {
public:
    // Reads the module of that name (any text; see above).
    explicit ModuleImpl(const std::string& name);
    ~ModuleImpl() override;

    // True when name is a module the host knows.
    static bool IsValidName(std::string name);

    // Whether the module is enabled, read from the host now.
    bool GetEnabled();
    // Loads the module now. options: "" loads it with its stored option string, anything else
    // with these options (checked against its parameters; not stored). force: load even when
    // the module is disabled. Refuses a name the host does not know, a module already loaded and,
    // without force, a disabled one.
    void Load(std::string options, bool force);
    // Enables (the next boot loads it) or disables the module; what runs now is unchanged.
    void SetEnabled(bool enabled);
    // Stores the option string the module is loaded with next (blank-separated name=value
    // pairs, docs/host/modules.md). merge false replaces the stored string with options as
    // given, byte for byte; true adds the given pairs to the stored ones, a given name replacing
    // its stored value. Refuses a malformed string, an undeclared parameter or a value its type
    // does not accept. For a name the host does not know as a module (an alias), the string is
    // stored unchecked, as long as the name is a well-formed module name.
    void SetOptionString(std::string options, bool merge);
    // The parameters the module declares, in its order (none for a name the host does not know).
    std::vector<Ravel::System::ModuleParam> GetParameters();
    // The values stored for the next load, by parameter name (for an alias, what its stored
    // string holds that reads as name=value).
    std::map<std::string, std::string> GetOptions();

    // Ravel::Lib::RavelObject
    void Refresh() override;
    void Commit() override;
    bool HasPendingChanges() override;
    void DiscardChanges() override;
    std::string GetName() override;
    std::string ToString() override;

    // Ravel::System::Module
    bool IsLoaded() override;
    std::string GetVersion() override;
    std::string GetSignatureDigest() override;
    std::string GetSignatureFingerPrint() override;
    std::string GetSignatureIssuer() override;
    bool IsEnabled() override;
    Ravel::System::ModuleNamespace GetProvidedNamespace() override;
    std::string GetFileVersion() override;
    std::string GetLicense() override;
    std::vector<Ravel::System::ModuleNamespace> GetRequiredNamespaces() override;
    std::string GetSignedStatus() override;
    std::string GetModuleFile() override;
    std::vector<Ravel::System::LogLevel*> GetLogLevels() override;
    void SetLogLevel(const std::string& name, std::uint32_t level) override;
    void SetDefaultLogLevel(const std::string& name) override;

    // What the library knows of one module. Internal.
    struct State;
    explicit ModuleImpl(std::unique_ptr<State> state);

private:
    ModuleImpl(const ModuleImpl&);
    ModuleImpl& operator=(const ModuleImpl&);

    std::unique_ptr<State> state_;
};

}  // namespace System
}  // namespace NorlithCtl
