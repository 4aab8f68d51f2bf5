#include "memfs/MirafsTardiskList.h"

#include "frame/Record.h"

#include <norlithctl/Records.h>
#include <norlithctl/Sysinfo.h>

#include <string>
#include <vector>

namespace TarselCli {
namespace System {

namespace {
typedef NorlithCtl::Util::Records::MirafsTardisk Layout;
typedef NorlithCtl::Util::Records::MirafsTardiskList ListLayout;
}  // namespace

boost::shared_ptr<MirafsTardiskList> MirafsTardiskList::New() {
    return boost::shared_ptr<MirafsTardiskList>(new MirafsTardiskList());
}

MirafsTardiskList::MirafsTardiskList() {
    SetDescription("List the tardisks used by the host.");
    SetMetaDataField("type", "operation");
    SetDefaultOutputFormatter("table");
    SetDefaultOutputParameter("table-columns", "Tardisk Name,System,Size");
    SetDefaultOutputParameter("units:MirafsTardisk.Size", "B");
    SetMetaDataField("type", "fetcher");
}

MirafsTardiskList::~MirafsTardiskList() {}

InputSpecPtr MirafsTardiskList::GetInputSpecInternal() { return MakeInputSpec(); }

OutputSpecPtr MirafsTardiskList::GetOutputSpecInternal() {
    return StructListOutputSpec(GetOutputStructure());
}

StructPtr MirafsTardiskList::GetOutputStructure() {
    return MakeStructTemplate("MirafsTardisk",
                              {{"Tardisk Name", FieldString}, {"System", FieldBool}, {"Size", FieldInt}});
}

void MirafsTardiskList::ExecuteInternal(const InputPtr&, const OutputPtr& output) {
    boost::shared_ptr<MetaObj::MetaList> list =
        MetaObj::MetaList::New(MetaObj::MetaTypeStruct, GetOutputStructure());
    GuardHost(
        output,
        [&] {
            NorlithCtl::Util::Sysinfo names(ListLayout::kNode);
            NorlithCtl::Util::Sysinfo tardisk(Layout::kNode);
            std::vector<std::string> tardisks;
            names.List(tardisks);
            for (const std::string& name : tardisks) {
                tardisk.ResetInstance();
                tardisk.AddInstancePath(name);
                char record[Layout::kSize];
                tardisk.Get(record, sizeof record);
                StructPtr row = GetOutputStructure();
                row->SetField("Tardisk Name", name);
                row->SetField("System", RecordUnsigned(record, sizeof record, Layout::kSystem.offset,
                                                       Layout::kSystem.width) != 0);
                row->SetField("Size", static_cast<long long>(RecordUnsigned(
                                          record, sizeof record, Layout::kSizeBytes.offset,
                                          Layout::kSizeBytes.width)));
                list->AddStruct(row);
            }
            SetResult(output, list);
        },
        1);
}

}  // namespace System
}  // namespace TarselCli
