#include "module/ModuleGet.h"

#include "module/GetModuleInfo.h"

#include <norlithctl/ModuleImpl.h>

#include <string>

namespace TarselCli {
namespace System {

boost::shared_ptr<ModuleGet> ModuleGet::New() {
    return boost::shared_ptr<ModuleGet>(new ModuleGet());
}

ModuleGet::ModuleGet() {
    SetDescription("Show the ELF header information for the given Norlith module.");
    SetMetaDataField("type", "fetcher");
    SetDefaultOutputFormatter("simple");
    SetDefaultOutputParameter("fields:ModuleDetails",
                              "Module,Module File,License,Version,Signed Status,Signature Issuer,"
                              "Signature Digest,Signature FingerPrint,Provided Namespaces,"
                              "Required Namespaces");
}

ModuleGet::~ModuleGet() {}

InputSpecPtr ModuleGet::GetInputSpecInternal() {
    return MakeInputSpec({
        {"module", "m", CallSpec::ParameterTypeString, true,
         "The name of the Norlith module to get the option string for."},
    });
}

OutputSpecPtr ModuleGet::GetOutputSpecInternal() { return MakeOutputSpec(GetOutputStructure()); }

StructPtr ModuleGet::GetOutputStructure() {
    return MakeStructTemplate("ModuleDetails", {
                                                   {"Module", FieldString},
                                                   {"Module File", FieldString},
                                                   {"License", FieldString},
                                                   {"Version", FieldString},
                                                   {"File Version", FieldString},
                                                   {"Provided Namespaces", FieldString},
                                                   {"Required Namespaces", FieldStringList},
                                                   {"Signed Status", FieldString},
                                                   {"Signature Issuer", FieldString},
                                                   {"Signature Digest", FieldString},
                                                   {"Signature FingerPrint", FieldString},
                                               });
}

void ModuleGet::ExecuteInternal(const InputPtr& input, const OutputPtr& output) {
    const std::string name = input->GetString("module");
    GuardHost(output, [&] {
        NorlithCtl::System::ModuleImpl module(name);
        if (!NorlithCtl::System::ModuleImpl::IsValidName(name)) {
            output->SetError("unknown module '" + name + "'");
            return;
        }
        SetResult(output, GetModuleInfo(module, GetOutputStructure()));
    });
}

}  // namespace System
}  // namespace TarselCli
