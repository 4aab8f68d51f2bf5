#include "readcache/ReadCacheGet.h"

#include <norlithctl/SystemInfoImpl.h>

namespace TarselCli {
namespace System {

boost::shared_ptr<ReadCacheGet> ReadCacheGet::New() {
    return boost::shared_ptr<ReadCacheGet>(new ReadCacheGet());
}

ReadCacheGet::ReadCacheGet() {
    SetDescription("Get the status of the Content Based Read Cache.");
    SetMetaDataField("type", "fetcher");
    SetDefaultOutputFormatter("simple");
}

ReadCacheGet::~ReadCacheGet() {}

InputSpecPtr ReadCacheGet::GetInputSpecInternal() { return MakeInputSpec(); }

OutputSpecPtr ReadCacheGet::GetOutputSpecInternal() {
    return MakeOutputSpec(
        MakeStructTemplate("CBRCStatus", {{"Active", FieldBool}, {"Enabled On Reboot", FieldBool}}));
}

void ReadCacheGet::ExecuteInternal(const InputPtr&, const OutputPtr& output) {
    NorlithCtl::System::SystemInfoImpl systemInfo;
    StructPtr result = MetaObj::MetaStruct::New("CBRCStatus");
    GuardHost(output, [&] {
        result->SetField("Active", systemInfo.GetCbrcRuntimeEnabled());
        result->SetField("Enabled On Reboot", systemInfo.GetCbrcConfiguredEnabled());
        SetResult(output, result);
    });
}

}  // namespace System
}  // namespace TarselCli
