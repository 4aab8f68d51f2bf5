#include "coredump/LookUpDumpFilePath.h"

#include <norlithctl/RavelException.h>

#include <memory>

namespace TarselCli {
namespace System {

std::string LookUpDumpFilePath(const std::function<Ravel::Storage::DiagnosticFile*()>& lookUp) {
    std::unique_ptr<Ravel::Storage::DiagnosticFile> file;
    try {
        file.reset(lookUp());
    } catch (const Ravel::Lib::RavelException&) {
        return "";
    }
    return file ? file->GetPath() : std::string();
}

}  // namespace System
}  // namespace TarselCli
