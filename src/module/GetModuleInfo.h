// GetModuleInfo: fills a "ModuleDetails" structure from one module object: its name, file,
// license, versions and signature as the module returns them, the provided namespace as
// "name@first version" ("" when it has no versions) and one "name@version" entry per required
// namespace and version. The caller keeps the module; nothing is caught here.
#pragma once

#include "frame/CommandModel.h"

#include <norlithctl/ModuleImpl.h>

namespace TarselCli {
namespace System {

// Fills details in place and returns it.
StructPtr GetModuleInfo(NorlithCtl::System::ModuleImpl& module, StructPtr details);

}  // namespace System
}  // namespace TarselCli
