#include <norlithctl/AdvancedOptionBranchImpl.h>

#include "AdvancedOptionState.h"
#include "HostCall.h"

#include <memory>

namespace NorlithCtl {
namespace Adv {
namespace {

using simhost::Args;
using simhost::Call;
using simhost::Op;
namespace advanced = simhost::advanced;

// Objects handed out as a vector belong to the caller only once the vector is returned; until
// then they are held here, so a failure half-way releases them.
template <class T>
class Handout {
public:
    void Add(T* object) { held_.emplace_back(object); }
    std::vector<T*> Release() {
        std::vector<T*> out;
        out.reserve(held_.size());
        for (std::unique_ptr<T>& object : held_) out.push_back(object.release());
        return out;
    }

private:
    std::vector<std::unique_ptr<T>> held_;
};

std::string RootPath(const std::string& path) { return path.empty() ? "/" : path; }

}  // namespace

AdvancedOptionBranchImpl::AdvancedOptionBranchImpl() {
    // The root holds nothing but its (empty) path; making it opens the host and may fault.
    norlithctl::HostCall([] { Call call(Op::AdvBranch_New); });
}

AdvancedOptionBranchImpl::AdvancedOptionBranchImpl(Child, const std::string& path) : path_(path) {}

AdvancedOptionBranchImpl::~AdvancedOptionBranchImpl() {}

std::vector<Ravel::Adv::AdvancedOption*> AdvancedOptionBranchImpl::GetOptions() {
    return norlithctl::HostCall([&] {
        Call call(Op::AdvBranch_GetOptions, Args().Add("branch", RootPath(path_)));
        Handout<Ravel::Adv::AdvancedOption> options;
        advanced::ForEachOptionIn(call.db(), path_, [&](advanced::Option&& option) {
            options.Add(MakeOption(std::move(option)));
        });
        return options.Release();
    });
}

std::vector<Ravel::Adv::AdvancedOptionBranch*> AdvancedOptionBranchImpl::GetBranches() {
    return norlithctl::HostCall([&] {
        Call call(Op::AdvBranch_GetBranches, Args().Add("branch", RootPath(path_)));
        Handout<Ravel::Adv::AdvancedOptionBranch> branches;
        advanced::ForEachBranchIn(call.db(), path_, [&](const std::string& path) {
            branches.Add(new AdvancedOptionBranchImpl(Child(), path));
        });
        return branches.Release();
    });
}

Ravel::Adv::AdvancedOptionBranch* AdvancedOptionBranchImpl::GetBranch(const std::string& name) {
    return norlithctl::HostCall([&]() -> Ravel::Adv::AdvancedOptionBranch* {
        Call call(Op::AdvBranch_GetBranch, Args().Add("branch", RootPath(path_)).Add("name", name));
        // A name holding "/" would reach below the direct children.
        if (name.empty() || name.find('/') != std::string::npos) return nullptr;
        const std::string path = path_ + "/" + name;
        if (!advanced::BranchExists(call.db(), path)) return nullptr;
        return new AdvancedOptionBranchImpl(Child(), path);
    });
}

}  // namespace Adv
}  // namespace NorlithCtl
