#include "module/GetModuleInfo.h"

#include <string>
#include <vector>

namespace TarselCli {
namespace System {

StructPtr GetModuleInfo(NorlithCtl::System::ModuleImpl& module, StructPtr details) {
    // The module's virtual interface: the calls below go through its slots.
    Ravel::System::Module& info = module;
    details->SetField("Module", info.GetName());
    details->SetField("Module File", info.GetModuleFile());
    details->SetField("License", info.GetLicense());
    details->SetField("Version", info.GetVersion());
    details->SetField("File Version", info.GetFileVersion());
    details->SetField("Signed Status", info.GetSignedStatus());
    details->SetField("Signature Issuer", info.GetSignatureIssuer());
    details->SetField("Signature Digest", info.GetSignatureDigest());
    details->SetField("Signature FingerPrint", info.GetSignatureFingerPrint());

    const Ravel::System::ModuleNamespace provided = info.GetProvidedNamespace();
    // Only the first version of the provided namespace is shown.
    details->SetField("Provided Namespaces",
                      provided.versions.empty() ? std::string()
                                                : provided.name + "@" + provided.versions.front());

    boost::shared_ptr<MetaObj::MetaList> required = MetaObj::MetaList::New(MetaObj::MetaTypeString);
    const std::vector<Ravel::System::ModuleNamespace> namespaces = info.GetRequiredNamespaces();
    for (const Ravel::System::ModuleNamespace& ns : namespaces)
        for (const std::string& version : ns.versions)
            required->AddValue(MetaObj::MetaString::New(ns.name + "@" + version));
    details->SetField("Required Namespaces", required);
    return details;
}

}  // namespace System
}  // namespace TarselCli
