// NorlithCtl::Adv::AdvancedOptionBranchImpl: a branch of the host's advanced option tree
// (Ravel::Adv::AdvancedOptionBranch, AdvancedOption.h).
//
// The default constructor makes the root branch, whose own options are the top-level ones; the
// branch's GetBranches and GetBranch hand out its sub-branches, and GetOptions its options, one
// object each that the caller owns and deletes (AdvancedOptionImpl.h describes the option
// objects). A branch object holds only its path: each of its operations reads the host's tree as
// it is then. Construction and every operation may throw Ravel::Lib::RavelException (the host
// cannot be reached, or a fault); a branch whose path has gone from the host has no options and
// no sub-branches.
#pragma once

#include <norlithctl/AdvancedOption.h>
#include <norlithctl/Export.h>
#include <norlithctl/Testing.h>

#include <string>
#include <vector>

namespace NorlithCtl {
namespace Adv {

class NORLITHCTL_API AdvancedOptionBranchImpl : public Ravel::Adv::AdvancedOptionBranch {
public:
    // The root branch.
    AdvancedOptionBranchImpl();
    ~AdvancedOptionBranchImpl() override;

    std::vector<Ravel::Adv::AdvancedOption*> GetOptions() override;
    std::vector<Ravel::Adv::AdvancedOptionBranch*> GetBranches() override;
    Ravel::Adv::AdvancedOptionBranch* GetBranch(const std::string& name) override;

    // The branch's path: "" for the root, "/Net/Tcp" for a sub-branch.
    const std::string& GetPath() const { return path_; }

private:
    struct Child {};
    AdvancedOptionBranchImpl(Child, const std::string& path);

    std::string path_;
    LiveObject live_;
};

}  // namespace Adv
}  // namespace NorlithCtl
