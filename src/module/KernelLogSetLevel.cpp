#include "module/KernelLogSetLevel.h"

#include <norlithctl/ModuleImpl.h>
#include <norlithctl/SystemInfoImpl.h>

#include <cstdint>
#include <memory>
#include <string>

namespace TarselCli {
namespace System {

boost::shared_ptr<KernelLogSetLevel> KernelLogSetLevel::New() {
    return boost::shared_ptr<KernelLogSetLevel>(new KernelLogSetLevel());
}

KernelLogSetLevel::KernelLogSetLevel() {
    SetDescription(
        "Set a specific Norlith loglevel to the given value. Optionally with the --module option set "
        "the value of a module's loglevel. This setting will not persist across reboots.");
    SetMetaDataField("type", "operation");
}

KernelLogSetLevel::~KernelLogSetLevel() {}

InputSpecPtr KernelLogSetLevel::GetInputSpecInternal() {
    return MakeInputSpec({
        {"level-name", "l", CallSpec::ParameterTypeString, true,
         "The name of the Norlith or module loglevel to set a level for."},
        {"module", "m", CallSpec::ParameterTypeString, false,
         "The name of the Norlith module to set a loglevel for."},
        {"default", "d", CallSpec::ParameterTypeBool, false, "Reset the loglevel to its default value."},
        ParamDef{"level", "L", CallSpec::ParameterTypeInt, false, "The value of the loglevel to set."}
            .Range(0, 2147483647LL),
    });
}

OutputSpecPtr KernelLogSetLevel::GetOutputSpecInternal() { return BoolOutputSpec(); }

void KernelLogSetLevel::ExecuteInternal(const InputPtr& input, const OutputPtr& output) {
    // Giving --default resets, whatever its value.
    const bool toDefault = input->HasValue("default");
    const std::string levelName = input->GetString("level-name");
    GuardHost(output, [&] {
        NorlithCtl::System::SystemInfoImpl systemInfo;
        const bool hasLevel = input->HasValue("level");
        if (!toDefault && !hasLevel) {
            output->SetError("must specify default or level");
            return;
        }
        if (toDefault && hasLevel) {
            output->SetError("cant specify default with level");
            return;
        }
        if (input->HasValue("module")) {
            const std::string name = input->GetString("module");
            std::unique_ptr<Ravel::System::Module> found(systemInfo.GetModuleByName(name));
            NorlithCtl::System::ModuleImpl* module =
                dynamic_cast<NorlithCtl::System::ModuleImpl*>(found.get());
            // Without this check a module the host does not know would be used through null.
            if (!module) {
                output->SetError("Could not find module with the name '" + name + "'");
                return;
            }
            if (toDefault)
                module->SetDefaultLogLevel(levelName);
            else
                module->SetLogLevel(levelName, static_cast<std::uint32_t>(input->GetInt("level")));
        } else if (toDefault) {
            systemInfo.SetDefaultLogLevel(levelName);
        } else {
            systemInfo.SetLogLevel(levelName, static_cast<std::uint32_t>(input->GetInt("level")));
        }
        SetSuccess(output);
    });
}

}  // namespace System
}  // namespace TarselCli
