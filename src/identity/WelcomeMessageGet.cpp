#include "identity/WelcomeMessageGet.h"

#include <norlithctl/SystemInfoImpl.h>

namespace TarselCli {
namespace System {

boost::shared_ptr<WelcomeMessageGet> WelcomeMessageGet::New() {
    return boost::shared_ptr<WelcomeMessageGet>(new WelcomeMessageGet());
}

WelcomeMessageGet::WelcomeMessageGet() {
    SetDescription("Get the Welcome Message for Tolmar.");
    SetMetaDataField("type", "fetcher");
    SetDefaultOutputFormatter("simple");
}

WelcomeMessageGet::~WelcomeMessageGet() {}

InputSpecPtr WelcomeMessageGet::GetInputSpecInternal() { return MakeInputSpec(); }

OutputSpecPtr WelcomeMessageGet::GetOutputSpecInternal() { return StringOutputSpec(); }

void WelcomeMessageGet::ExecuteInternal(const InputPtr&, const OutputPtr& output) {
    NorlithCtl::System::SystemInfoImpl systemInfo;
    GuardHost(output, [&] {
        SetResult(output, MetaObj::MetaString::New(systemInfo.GetWelcomeMessage()));
    });
}

}  // namespace System
}  // namespace TarselCli
