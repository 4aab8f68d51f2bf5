#include "memfs/MirafsRamdiskRemove.h"

#include <norlithctl/Env.h>

#include <cerrno>
#include <cstring>
#include <string>

namespace TarselCli {
namespace System {

boost::shared_ptr<MirafsRamdiskRemove> MirafsRamdiskRemove::New() {
    return boost::shared_ptr<MirafsRamdiskRemove>(new MirafsRamdiskRemove());
}

MirafsRamdiskRemove::MirafsRamdiskRemove() {
    SetDescription("Remove a Mirafs RAM disk from the Devudi Host.");
    SetMetaDataField("type", "operation");
}

MirafsRamdiskRemove::~MirafsRamdiskRemove() {}

InputSpecPtr MirafsRamdiskRemove::GetInputSpecInternal() {
    return MakeInputSpec({{"target", "t", CallSpec::ParameterTypeString, true,
                           "Mountpoint for the ramdisk (absolute path)"}});
}

OutputSpecPtr MirafsRamdiskRemove::GetOutputSpecInternal() { return BoolOutputSpec(); }

void MirafsRamdiskRemove::ExecuteInternal(const InputPtr& input, const OutputPtr& output) {
    const std::string target = input->GetString("target");
    if (NorlithCtl::Os::Env::Default()->Umount(target.c_str()) != 0) {
        output->SetError(std::strerror(errno));
        return;
    }
    SetSuccess(output);
}

}  // namespace System
}  // namespace TarselCli
