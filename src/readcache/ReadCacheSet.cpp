#include "readcache/ReadCacheSet.h"

#include <norlithctl/SystemInfoImpl.h>

namespace TarselCli {
namespace System {

boost::shared_ptr<ReadCacheSet> ReadCacheSet::New() {
    return boost::shared_ptr<ReadCacheSet>(new ReadCacheSet());
}

ReadCacheSet::ReadCacheSet() {
    SetDescription("Configure the Content Based Read Cache");
    SetMetaDataField("type", "fetcher");
}

ReadCacheSet::~ReadCacheSet() {}

InputSpecPtr ReadCacheSet::GetInputSpecInternal() {
    return MakeInputSpec({{"enabled", "e", CallSpec::ParameterTypeBool, true,
                           "Indicate to the system whether it should enable the content based read "
                           "cache module in the norlith"}});
}

OutputSpecPtr ReadCacheSet::GetOutputSpecInternal() { return BoolOutputSpec(); }

void ReadCacheSet::ExecuteInternal(const InputPtr& input, const OutputPtr& output) {
    NorlithCtl::System::SystemInfoImpl systemInfo;
    GuardHost(output, [&] {
        systemInfo.SetCbrcEnabled(input->GetBool("enabled"));
        SetSuccess(output);
    });
}

}  // namespace System
}  // namespace TarselCli
