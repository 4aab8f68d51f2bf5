#include "coredump/KernelDumpAddFile.h"

#include <norlithctl/StorageInfoImpl.h>

#include <cstdint>
#include <string>

namespace TarselCli {
namespace System {

boost::shared_ptr<KernelDumpAddFile> KernelDumpAddFile::New() {
    return boost::shared_ptr<KernelDumpAddFile>(new KernelDumpAddFile());
}

KernelDumpAddFile::KernelDumpAddFile() {
    SetDescription("Create a Norlith Dump QRFS file for this system.");
    SetMetaDataField("type", "operation");
}

KernelDumpAddFile::~KernelDumpAddFile() {}

InputSpecPtr KernelDumpAddFile::GetInputSpecInternal() {
    return MakeInputSpec({
        {"size", "s", CallSpec::ParameterTypeInt, false,
         "Manually set the size in MB of the created Dump File.  If not provided, a default size for the "
         "current machine will be calculated."},
        {"datastore", "d", CallSpec::ParameterTypeString, false,
         "Manually specify the datastore the Dump File is created in.  If not provided, a datastore of "
         "sufficient size will be automatically chosen."},
        {"file", "f", CallSpec::ParameterTypeString, false,
         "Manually specify the file name of the created Dump File.  If not provided, a unique name will be "
         "chosen."},
        {"auto", "a", CallSpec::ParameterTypeFlag, false,
         "Automatically create a file if none found and autoCreateDumpFile kernel option is set."},
    });
}

OutputSpecPtr KernelDumpAddFile::GetOutputSpecInternal() { return BoolOutputSpec(); }

void KernelDumpAddFile::ExecuteInternal(const InputPtr& input, const OutputPtr& output) {
    std::int64_t size = 0;
    std::string datastore;
    std::string file;
    if (input->HasValue("size")) size = input->GetInt("size");
    if (input->HasValue("datastore")) datastore = input->GetString("datastore");
    if (input->HasValue("file")) file = input->GetString("file");
    // The library takes the size as an unsigned count of MB; it tells a negative one apart.
    const std::uint64_t megabytes = static_cast<std::uint64_t>(size);
    GuardHost(output, [&] {
        NorlithCtl::Storage::StorageInfoImpl storage;
        if (input->GetFlag("auto"))
            storage.AutoAddDiagnosticFile(megabytes, datastore, file);
        else
            storage.CreateDiagnosticFile(megabytes, datastore, file);
        SetSuccess(output);
    });
}

}  // namespace System
}  // namespace TarselCli
