// NorlithCtl::Adv: the host-control library's advanced option objects (Ravel::Adv interfaces,
// AdvancedOption.h).
//
// FindOption, and the branches' GetOptions, hand out one object per option: an integer option as
// AdvancedIntegerOptionImpl, a string option as AdvancedStringOptionImpl, a user variable of
// either kind as AdvancedUserIntegerOptionImpl or AdvancedUserStringOptionImpl, and any other
// option (another kind, or one the host serves through no typed interface) as the plain
// AdvancedOptionImpl. The caller owns the object and deletes it through its virtual destructor.
//
// Each object is a snapshot of its option: getters read the snapshot and never reach the host.
// SetValue and ResetToDefault check the new value against the option's rules and stage it;
// Commit applies what is staged (journaled as one change of the option, re-checked against the
// option as the host holds it then); Refresh reads the option again and keeps what is staged.
// Host operations (FindOption, Refresh, Commit, ResetToDefault, SetValue) may throw
// Ravel::Lib::RavelException; GetValue throws it for an option whose value the host cannot read.
#pragma once

#include <norlithctl/AdvancedOption.h>
#include <norlithctl/Export.h>

#include <cstdint>
#include <memory>
#include <string>

namespace NorlithCtl {
namespace Adv {

// What the library knows of one option: its snapshot and its staged change. Internal.
struct OptionState;

class NORLITHCTL_API AdvancedOptionImpl : public virtual Ravel::Adv::AdvancedOption {
public:
    // The option at path ("/Net/TcpMss"), or null when the host has none there. The caller owns
    // the object.
    static Ravel::Adv::AdvancedOption* FindOption(const std::string& path);

    explicit AdvancedOptionImpl(std::unique_ptr<OptionState> state);
    ~AdvancedOptionImpl() override;

    void Refresh() override;
    void Commit() override;
    bool HasPendingChanges() override;
    void DiscardChanges() override;
    std::string GetName() override;
    std::string ToString() override;

    std::string GetPath() override;
    int GetType() override;
    std::string GetDescription() override;
    void ResetToDefault() override;

protected:
    OptionState& State() { return *state_; }

private:
    AdvancedOptionImpl(const AdvancedOptionImpl&);
    AdvancedOptionImpl& operator=(const AdvancedOptionImpl&);

    std::unique_ptr<OptionState> state_;
};

class NORLITHCTL_API AdvancedIntegerOptionImpl : public AdvancedOptionImpl,
                                                 public virtual Ravel::Adv::AdvancedIntegerOption {
public:
    explicit AdvancedIntegerOptionImpl(std::unique_ptr<OptionState> state);
    ~AdvancedIntegerOptionImpl() override;

    std::uint32_t GetDefault() override;
    std::uint32_t GetMin() override;
    std::uint32_t GetMax() override;
    std::uint32_t GetValue() override;
    void SetValue(std::uint32_t value) override;
};

// A user-defined integer variable (under /UserVars on the default host).
class NORLITHCTL_API AdvancedUserIntegerOptionImpl
    : public AdvancedOptionImpl,
      public virtual Ravel::Adv::AdvancedIntegerOption {
public:
    explicit AdvancedUserIntegerOptionImpl(std::unique_ptr<OptionState> state);
    ~AdvancedUserIntegerOptionImpl() override;

    std::uint32_t GetDefault() override;
    std::uint32_t GetMin() override;
    std::uint32_t GetMax() override;
    std::uint32_t GetValue() override;
    void SetValue(std::uint32_t value) override;
};

class NORLITHCTL_API AdvancedStringOptionImpl : public AdvancedOptionImpl,
                                                public virtual Ravel::Adv::AdvancedStringOption {
public:
    explicit AdvancedStringOptionImpl(std::unique_ptr<OptionState> state);
    ~AdvancedStringOptionImpl() override;

    std::string GetDefault() override;
    std::string GetValidCharacters() override;
    std::string GetValue() override;
    void SetValue(const std::string& value) override;
};

// A user-defined string variable.
class NORLITHCTL_API AdvancedUserStringOptionImpl
    : public AdvancedOptionImpl,
      public virtual Ravel::Adv::AdvancedStringOption {
public:
    explicit AdvancedUserStringOptionImpl(std::unique_ptr<OptionState> state);
    ~AdvancedUserStringOptionImpl() override;

    std::string GetDefault() override;
    std::string GetValidCharacters() override;
    std::string GetValue() override;
    void SetValue(const std::string& value) override;
};

}  // namespace Adv
}  // namespace NorlithCtl
