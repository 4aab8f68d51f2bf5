#include "process/SecpolicyDomainList.h"

#include <norlithctl/NorlithAccessInterfaceImpl.h>

#include <map>

namespace TarselCli {
namespace System {

boost::shared_ptr<SecpolicyDomainList> SecpolicyDomainList::New() {
    return boost::shared_ptr<SecpolicyDomainList>(new SecpolicyDomainList());
}

SecpolicyDomainList::SecpolicyDomainList() {
    SetDescription("List the enforcement level for each domain.");
    SetMetaDataField("type", "fetcher");
    SetDefaultOutputFormatter("table");
    SetDefaultOutputParameter("fields:DomainList", "Domain Name,Enforcement Level");
}

SecpolicyDomainList::~SecpolicyDomainList() {}

InputSpecPtr SecpolicyDomainList::GetInputSpecInternal() { return MakeInputSpec(); }

OutputSpecPtr SecpolicyDomainList::GetOutputSpecInternal() {
    return StructListOutputSpec(GetOutputStructure());
}

StructPtr SecpolicyDomainList::GetOutputStructure() {
    return MakeStructTemplate("DomainList",
                              {{"Domain Name", FieldString}, {"Enforcement Level", FieldString}});
}

void SecpolicyDomainList::ExecuteInternal(const InputPtr&, const OutputPtr& output) {
    boost::shared_ptr<MetaObj::MetaList> list =
        MetaObj::MetaList::New(MetaObj::MetaTypeStruct, GetOutputStructure());
    NorlithCtl::Security::NorlithAccessInterfaceImpl access;
    GuardHost(output, [&] {
        // The map orders the domains by name, byte for byte.
        const std::map<std::string, long long> domains = access.GetKeywordsMap(0);
        for (const auto& domain : domains) {
            StructPtr row = GetOutputStructure();
            row->SetField("Domain Name", domain.first);
            row->SetField("Enforcement Level", access.GetStatus(domain.first));
            list->AddStruct(row);
        }
        SetResult(output, list);
    });
}

}  // namespace System
}  // namespace TarselCli
