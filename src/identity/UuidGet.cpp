#include "identity/UuidGet.h"

#include <norlithctl/SystemInfoImpl.h>

namespace TarselCli {
namespace System {

boost::shared_ptr<UuidGet> UuidGet::New() { return boost::shared_ptr<UuidGet>(new UuidGet()); }

UuidGet::UuidGet() {
    SetDescription("Get the system UUID.");
    SetMetaDataField("type", "fetcher");
    SetDefaultOutputFormatter("simple");
}

UuidGet::~UuidGet() {}

InputSpecPtr UuidGet::GetInputSpecInternal() { return MakeInputSpec(); }

OutputSpecPtr UuidGet::GetOutputSpecInternal() { return StringOutputSpec(); }

void UuidGet::ExecuteInternal(const InputPtr&, const OutputPtr& output) {
    NorlithCtl::System::SystemInfoImpl systemInfo;
    GuardHost(output, [&] {
        SetResult(output, MetaObj::MetaString::New(systemInfo.GetSystemUuid()));
    });
}

}  // namespace System
}  // namespace TarselCli
