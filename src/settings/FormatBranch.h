// FormatBranch: every option of an advanced option branch and of all its sub-branches, rendered
// by FormatOption and appended to a list, depth first: the branch's own options (in the
// library's order), then each sub-branch's, recursively. With delta, options whose value equals
// their default are left out.
//
// The caller keeps the branch and the list. The option and branch objects the walk obtains are
// deleted on every path. A Ravel::Lib::RavelException while one option is rendered drops that
// option; one escaping a sub-branch's walk drops the rest of that sub-branch (what it appended
// stays). One raised by the branch's own GetOptions or GetBranches passes to the caller.
#pragma once

#include "frame/CommandModel.h"

#include <norlithctl/AdvancedOption.h>

namespace TarselCli {
namespace System {

void FormatBranch(Ravel::Adv::AdvancedOptionBranch* branch, boost::shared_ptr<MetaObj::MetaList> list,
                  bool delta);

}  // namespace System
}  // namespace TarselCli
