#include "identity/WelcomeMessageSet.h"

#include <norlithctl/SystemInfoImpl.h>

namespace TarselCli {
namespace System {

boost::shared_ptr<WelcomeMessageSet> WelcomeMessageSet::New() {
    return boost::shared_ptr<WelcomeMessageSet>(new WelcomeMessageSet());
}

WelcomeMessageSet::WelcomeMessageSet() {
    SetDescription("Set the Welcome Message for Tolmar.");
    SetMetaDataField("type", "operation");
}

WelcomeMessageSet::~WelcomeMessageSet() {}

InputSpecPtr WelcomeMessageSet::GetInputSpecInternal() {
    return MakeInputSpec(
        {{"message", "m", CallSpec::ParameterTypeString, true, "Welcome Message String."}});
}

OutputSpecPtr WelcomeMessageSet::GetOutputSpecInternal() { return BoolOutputSpec(); }

void WelcomeMessageSet::ExecuteInternal(const InputPtr& input, const OutputPtr& output) {
    NorlithCtl::System::SystemInfoImpl systemInfo;
    GuardHost(output, [&] {
        systemInfo.SetWelcomeMessage(input->GetString("message"));
        SetSuccess(output);
    });
}

}  // namespace System
}  // namespace TarselCli
