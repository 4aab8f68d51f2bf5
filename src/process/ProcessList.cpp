#include "process/ProcessList.h"

#include <norlithctl/NorlithAccessInterfaceImpl.h>
#include <norlithctl/ResourceInfoImpl.h>

#include <vector>

namespace TarselCli {
namespace System {

namespace {

using Ravel::Resource::World;

// The worlds GetAllWorlds handed out; each is deleted when the holder goes, on every path.
class OwnedWorlds {
public:
    explicit OwnedWorlds(std::vector<World*> worlds) : worlds_(std::move(worlds)) {}
    ~OwnedWorlds() { DeleteAll(); }
    OwnedWorlds(const OwnedWorlds&) = delete;
    OwnedWorlds& operator=(const OwnedWorlds&) = delete;

    const std::vector<World*>& get() const { return worlds_; }
    void DeleteAll() {
        for (World* world : worlds_) delete world;
        worlds_.clear();
    }

private:
    std::vector<World*> worlds_;
};

}  // namespace

boost::shared_ptr<ProcessList> ProcessList::New() {
    return boost::shared_ptr<ProcessList>(new ProcessList());
}

ProcessList::ProcessList() {
    SetDescription("List the Norlith UserWorld processes currently on the host.");
    SetMetaDataField("type", "fetcher");
    SetDefaultOutputFormatter("table");
    SetDefaultOutputParameter("fields:UserWorld", "Id,Cartel Id,Name,Security Domain,Command Line");
}

ProcessList::~ProcessList() {}

InputSpecPtr ProcessList::GetInputSpecInternal() { return MakeInputSpec(); }

OutputSpecPtr ProcessList::GetOutputSpecInternal() {
    return StructListOutputSpec(GetOutputStructure());
}

StructPtr ProcessList::GetOutputStructure() {
    return MakeStructTemplate("UserWorld", {{"Id", FieldInt},
                                            {"Name", FieldString},
                                            {"Command Line", FieldString},
                                            {"Cartel Id", FieldInt},
                                            {"Parent Cartel Id", FieldInt},
                                            {"World Group Id", FieldInt},
                                            {"Cartel Group Id", FieldInt},
                                            {"Session Id", FieldInt},
                                            {"World Flags", FieldInt},
                                            {"World State", FieldString},
                                            {"World Type", FieldString},
                                            {"Security Domain", FieldString}});
}

void ProcessList::ExecuteInternal(const InputPtr&, const OutputPtr& output) {
    NorlithCtl::Resource::ResourceInfoImpl resourceInfo;
    GuardHost(output, [&] {
        boost::shared_ptr<MetaObj::MetaList> list =
            MetaObj::MetaList::New(MetaObj::MetaTypeStruct, GetOutputStructure());
        OwnedWorlds worlds(resourceInfo.GetAllWorlds());
        NorlithCtl::Security::NorlithAccessInterfaceImpl access;
        for (const World* world : worlds.get()) {
            try {
                StructPtr row = GetOutputStructure();
                row->SetField("Id", world->GetId());
                row->SetField("Name", world->GetName());
                row->SetField("Command Line", world->GetCommandLine());
                row->SetField("Cartel Id", world->GetCartelId());
                row->SetField("Parent Cartel Id", world->GetParentCartelId());
                row->SetField("World Group Id", world->GetWorldGroupId());
                row->SetField("Cartel Group Id", world->GetCartelGroupId());
                row->SetField("Session Id", world->GetSessionId());
                row->SetField("World Flags", world->GetWorldFlags());
                row->SetField("World State", world->GetWorldState());
                row->SetField("World Type", world->GetWorldType());
                row->SetField("Security Domain", access.GetLabel(world->GetSecurityDomainId(), 0));
                list->AddStruct(row);
            } catch (const Ravel::Lib::RavelException&) {
                // A world that cannot be read (it may have gone meanwhile) is left out.
            }
        }
        worlds.DeleteAll();
        SetResult(output, list);
    });
}

}  // namespace System
}  // namespace TarselCli
