// Ravel::Adv: the interfaces of the host kernel's advanced options, a tree of named branches whose
// leaves are options addressed by a path such as "/Misc/HostName".
//
// An option has a kind (GetType): 0 an integer option, served through AdvancedIntegerOption, 1 a
// string option, served through AdvancedStringOption; any other kind is one the library exposes
// through no typed interface. An option object is a snapshot of the option taken when it was
// handed out (or last refreshed, RavelObject::Refresh): its getters read the snapshot, SetValue
// and ResetToDefault stage a change that RavelObject::Commit applies.
//
// Ownership: the objects in the vectors GetOptions and GetBranches return, and the branch
// GetBranch returns, belong to the caller, which deletes each through its virtual destructor.
// Every operation may throw Ravel::Lib::RavelException: the host cannot be reached, a fault, a
// value the option refuses (SetValue names the option and what it accepts), or a value the host
// could not read (GetValue of an option whose reading failed).
#pragma once

#include <norlithctl/Export.h>
#include <norlithctl/RavelObject.h>

#include <cstdint>
#include <string>
#include <vector>

namespace Ravel {
namespace Adv {

class NORLITHCTL_API AdvancedOption : public virtual Ravel::Lib::RavelObject {
public:
    ~AdvancedOption() override;

    // The option's full path, e.g. "/Net/TcpMss".
    virtual std::string GetPath() = 0;
    // 0 integer, 1 string, anything else a kind without a typed interface.
    virtual int GetType() = 0;
    virtual std::string GetDescription() = 0;
    // Stages the option's return to its default value.
    virtual void ResetToDefault() = 0;
};

class NORLITHCTL_API AdvancedIntegerOption : public virtual AdvancedOption {
public:
    ~AdvancedIntegerOption() override;

    virtual std::uint32_t GetDefault() = 0;
    virtual std::uint32_t GetMin() = 0;
    virtual std::uint32_t GetMax() = 0;
    virtual std::uint32_t GetValue() = 0;
    // Stages a new value; refuses one outside GetMin()..GetMax().
    virtual void SetValue(std::uint32_t value) = 0;
};

class NORLITHCTL_API AdvancedStringOption : public virtual AdvancedOption {
public:
    ~AdvancedStringOption() override;

    virtual std::string GetDefault() = 0;
    // The characters a value may hold; empty when any printable character is accepted.
    virtual std::string GetValidCharacters() = 0;
    virtual std::string GetValue() = 0;
    // Stages a new value; refuses one with a character outside GetValidCharacters() or too long.
    virtual void SetValue(const std::string& value) = 0;
};

class NORLITHCTL_API AdvancedOptionBranch {
public:
    virtual ~AdvancedOptionBranch();

    // The branch's own options, in the host's order.
    virtual std::vector<AdvancedOption*> GetOptions() = 0;
    // The branch's direct sub-branches, in the host's order.
    virtual std::vector<AdvancedOptionBranch*> GetBranches() = 0;
    // The direct sub-branch of that name, or null when there is none.
    virtual AdvancedOptionBranch* GetBranch(const std::string& name) = 0;

protected:
    AdvancedOptionBranch() {}

private:
    AdvancedOptionBranch(const AdvancedOptionBranch&);
    AdvancedOptionBranch& operator=(const AdvancedOptionBranch&);
};

}  // namespace Adv
}  // namespace Ravel
