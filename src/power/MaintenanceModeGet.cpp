#include "power/MaintenanceModeGet.h"

#include <norlithctl/SystemInfoImpl.h>

namespace TarselCli {
namespace System {

boost::shared_ptr<MaintenanceModeGet> MaintenanceModeGet::New() {
    return boost::shared_ptr<MaintenanceModeGet>(new MaintenanceModeGet());
}

MaintenanceModeGet::MaintenanceModeGet() {
    SetDescription("Get the maintenance mode state of the system.");
    SetMetaDataField("type", "fetcher");
    SetDefaultOutputFormatter("simple");
}

MaintenanceModeGet::~MaintenanceModeGet() {}

InputSpecPtr MaintenanceModeGet::GetInputSpecInternal() { return MakeInputSpec(); }

OutputSpecPtr MaintenanceModeGet::GetOutputSpecInternal() { return StringOutputSpec(); }

void MaintenanceModeGet::ExecuteInternal(const InputPtr&, const OutputPtr& output) {
    GuardHost(
        output,
        [&] {
            NorlithCtl::System::SystemInfoImpl systemInfo;
            const int state = systemInfo.GetMaintenanceModeState();
            const char* text = state == 1 ? "Enabled" : state == 2 ? "Disabled" : "Unknown";
            SetResult(output, MetaObj::MetaString::New(text));
        },
        1);
}

}  // namespace System
}  // namespace TarselCli
