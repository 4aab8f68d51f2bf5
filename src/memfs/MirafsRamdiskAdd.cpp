#include "memfs/MirafsRamdiskAdd.h"

#include <norlithctl/Env.h>

#include <cerrno>
#include <cstdint>
#include <cstring>
#include <string>

namespace TarselCli {
namespace System {

boost::shared_ptr<MirafsRamdiskAdd> MirafsRamdiskAdd::New(bool withInodeOptions) {
    return boost::shared_ptr<MirafsRamdiskAdd>(new MirafsRamdiskAdd(withInodeOptions));
}

MirafsRamdiskAdd::MirafsRamdiskAdd(bool withInodeOptions) : withInodeOptions_(withInodeOptions) {
    SetDescription("Add a new Mirafs RAM disk to the Devudi Host and mount it.");
    SetMetaDataField("type", "operation");
}

MirafsRamdiskAdd::~MirafsRamdiskAdd() {}

InputSpecPtr MirafsRamdiskAdd::GetInputSpecInternal() {
    const ParamDef minSize{"min-size", "m", CallSpec::ParameterTypeInt, true,
                           "Minimum size (min reservation in MiB)"};
    const ParamDef maxSize{"max-size", "M", CallSpec::ParameterTypeInt, true,
                           "Maximum size (max reservation in MiB)"};
    const ParamDef permissions{"permissions", "p", CallSpec::ParameterTypeString, true,
                               "Permissions for the root of the ramdisk (mode)"};
    const ParamDef name{"name", "n", CallSpec::ParameterTypeString, true, "Name for the ramdisk"};
    const ParamDef target{"target", "t", CallSpec::ParameterTypeString, true,
                          "Mountpoint for the ramdisk (absolute path)"};
    if (!withInodeOptions_) return MakeInputSpec({minSize, maxSize, permissions, name, target});
    return MakeInputSpec(
        {minSize, maxSize,
         ParamDef{"reserved-inodes", "i", CallSpec::ParameterTypeInt, false, "Number of reserved inodes"},
         ParamDef{"max-inodes", "I", CallSpec::ParameterTypeInt, false, "Maximum number of inodes"}
             .Range(1, 2147483647),
         ParamDef{"coredump", "d", CallSpec::ParameterTypeFlag, false,
                  "Include this ramdisk as part of coredumps"},
         permissions, name, target});
}

OutputSpecPtr MirafsRamdiskAdd::GetOutputSpecInternal() { return BoolOutputSpec(); }

void MirafsRamdiskAdd::ExecuteInternal(const InputPtr& input, const OutputPtr& output) {
    const std::string target = input->GetString("target");
    std::uint32_t reservedInodes = 0;
    std::uint32_t maxInodes = 0;
    unsigned coredump = 0;
    if (withInodeOptions_) {
        if (input->HasValue("reserved-inodes"))
            reservedInodes = static_cast<std::uint32_t>(input->GetInt("reserved-inodes"));
        if (input->HasValue("max-inodes"))
            maxInodes = static_cast<std::uint32_t>(input->GetInt("max-inodes"));
        if (reservedInodes > maxInodes) {
            output->SetError("reserved-inodes cannot be greater than max-inodes");
            return;
        }
        coredump = input->GetFlag("coredump") ? 1 : 0;
    }
    const std::string name = input->GetString("name");
    const std::string permissions = input->GetString("permissions");
    const std::string maxSize = input->GetString("max-size");
    const std::string minSize = input->GetString("min-size");
    // The option string is split at commas: a comma in a value would shift the fields after it.
    if (name.find(',') != std::string::npos) {
        output->SetError("Invalid name '" + name + "': a ramdisk name cannot contain ','");
        return;
    }
    if (permissions.find(',') != std::string::npos) {
        output->SetError("Invalid permissions '" + permissions + "': permissions cannot contain ','");
        return;
    }
    const std::string options = minSize + "," + maxSize + "," + std::to_string(reservedInodes) + "," +
                                std::to_string(maxInodes) + "," + std::to_string(coredump) + "," +
                                permissions + "," + name;
    if (NorlithCtl::Os::Env::Default()->Mount("", target.c_str(), "mirafs", 0, options.c_str()) != 0) {
        output->SetError(std::strerror(errno));
        return;
    }
    SetSuccess(output);
}

}  // namespace System
}  // namespace TarselCli
