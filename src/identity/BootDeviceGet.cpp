#include "identity/BootDeviceGet.h"

#include <norlithctl/SystemInfoImpl.h>

namespace TarselCli {
namespace System {

boost::shared_ptr<BootDeviceGet> BootDeviceGet::New() {
    return boost::shared_ptr<BootDeviceGet>(new BootDeviceGet());
}

BootDeviceGet::BootDeviceGet() {
    SetDescription("Get the systems boot device.");
    SetMetaDataField("type", "fetcher");
    SetDefaultOutputFormatter("simple");
}

BootDeviceGet::~BootDeviceGet() {}

InputSpecPtr BootDeviceGet::GetInputSpecInternal() { return MakeInputSpec(); }

OutputSpecPtr BootDeviceGet::GetOutputSpecInternal() { return MakeOutputSpec(GetOutputStructure()); }

StructPtr BootDeviceGet::GetOutputStructure() {
    return MakeStructTemplate("SystemBootDevice", {{"Boot NIC", FieldString},
                                                   {"Boot Filesystem UUID", FieldString},
                                                   {"Stateless Boot NIC", FieldString}});
}

void BootDeviceGet::ExecuteInternal(const InputPtr&, const OutputPtr& output) {
    NorlithCtl::System::SystemInfoImpl systemInfo;
    GuardHost(output, [&] {
        StructPtr result = GetOutputStructure();
        result->SetField("Boot NIC", systemInfo.GetBootNicMacAddress());
        result->SetField("Boot Filesystem UUID", systemInfo.GetBootFsUUID());
        result->SetField("Stateless Boot NIC", systemInfo.GetStatelessBootNicMacAddress());
        SetResult(output, result);
    });
}

}  // namespace System
}  // namespace TarselCli
