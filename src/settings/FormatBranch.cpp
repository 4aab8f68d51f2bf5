#include "settings/FormatBranch.h"

#include "settings/FormatOption.h"
#include "settings/Owned.h"

namespace TarselCli {
namespace System {

void FormatBranch(Ravel::Adv::AdvancedOptionBranch* branch, boost::shared_ptr<MetaObj::MetaList> list,
                  bool delta) {
    Owned<Ravel::Adv::AdvancedOption> options(branch->GetOptions());
    for (Ravel::Adv::AdvancedOption* option : options) {
        try {
            bool include = false;
            StructPtr row = FormatOption(option, delta, &include);
            if (include) list->AddStruct(row);
        } catch (const Ravel::Lib::RavelException&) {
            // An option that cannot be read is left out; the walk goes on.
        }
    }
    options.Clear();

    Owned<Ravel::Adv::AdvancedOptionBranch> children(branch->GetBranches());
    for (Ravel::Adv::AdvancedOptionBranch* child : children) {
        try {
            FormatBranch(child, list, delta);
        } catch (const Ravel::Lib::RavelException&) {
            // A sub-tree that fails keeps what it appended; the walk goes on with the next one.
        }
    }
}

}  // namespace System
}  // namespace TarselCli
