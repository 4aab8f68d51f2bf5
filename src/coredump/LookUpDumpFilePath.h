// The path of the active or the configured dump file as the file commands read it: the look-up
// runs once, its object is deleted at once, and a Ravel::Lib::RavelException from it is dropped
// so that the file counts as absent (""). A null object is absent too.
#pragma once

#include <norlithctl/Diagnostic.h>

#include <functional>
#include <string>

namespace TarselCli {
namespace System {

std::string LookUpDumpFilePath(const std::function<Ravel::Storage::DiagnosticFile*()>& lookUp);

}  // namespace System
}  // namespace TarselCli
