#include "memfs/MirafsRamdiskList.h"

#include "frame/Record.h"
#include "memfs/FreePercent.h"

#include <norlithctl/Records.h>
#include <norlithctl/Sysinfo.h>

#include <string>
#include <vector>

namespace TarselCli {
namespace System {

namespace {
typedef NorlithCtl::Util::Records::MirafsRamdisk Layout;
typedef NorlithCtl::Util::Records::MirafsRamdiskList ListLayout;

long long Number(const char* record, const NorlithCtl::Util::Records::Field& field) {
    return static_cast<long long>(RecordUnsigned(record, Layout::kSize, field.offset, field.width));
}
}  // namespace

boost::shared_ptr<MirafsRamdiskList> MirafsRamdiskList::New() {
    return boost::shared_ptr<MirafsRamdiskList>(new MirafsRamdiskList());
}

MirafsRamdiskList::MirafsRamdiskList() {
    SetDescription("List the RAM disks used by the host.");
    SetMetaDataField("type", "operation");
    SetDefaultOutputFormatter("table");
    SetDefaultOutputParameter("table-columns",
                              "Ramdisk Name,System,Include in Coredumps,Reserved,Maximum,Used,Peak "
                              "Used,Free,Reserved Free,Maximum Inodes,Allocated Inodes,Used "
                              "Inodes,Mount Point");
    SetDefaultOutputParameter("units:MirafsRamdisk.Reserved", "KiB");
    SetDefaultOutputParameter("units:MirafsRamdisk.Maximum", "KiB");
    SetDefaultOutputParameter("units:MirafsRamdisk.Used", "KiB");
    SetDefaultOutputParameter("units:MirafsRamdisk.Peak Used", "KiB");
    SetDefaultOutputParameter("units:MirafsRamdisk.Free", "%");
    SetDefaultOutputParameter("units:MirafsRamdisk.Reserved Free", "%");
    SetMetaDataField("type", "fetcher");
}

MirafsRamdiskList::~MirafsRamdiskList() {}

InputSpecPtr MirafsRamdiskList::GetInputSpecInternal() { return MakeInputSpec(); }

OutputSpecPtr MirafsRamdiskList::GetOutputSpecInternal() {
    return StructListOutputSpec(GetOutputStructure());
}

StructPtr MirafsRamdiskList::GetOutputStructure() {
    return MakeStructTemplate("MirafsRamdisk", {{"Ramdisk Name", FieldString},
                                                {"System", FieldBool},
                                                {"Include in Coredumps", FieldBool},
                                                {"Reserved", FieldInt},
                                                {"Maximum", FieldInt},
                                                {"Used", FieldInt},
                                                {"Peak Used", FieldInt},
                                                {"Free", FieldInt},
                                                {"Reserved Free", FieldInt},
                                                {"Maximum Inodes", FieldInt},
                                                {"Allocated Inodes", FieldInt},
                                                {"Used Inodes", FieldInt},
                                                {"Mount Point", FieldString}});
}

void MirafsRamdiskList::ExecuteInternal(const InputPtr&, const OutputPtr& output) {
    boost::shared_ptr<MetaObj::MetaList> list =
        MetaObj::MetaList::New(MetaObj::MetaTypeStruct, GetOutputStructure());
    GuardHost(
        output,
        [&] {
            NorlithCtl::Util::Sysinfo names(ListLayout::kNode);
            NorlithCtl::Util::Sysinfo ramdisk(Layout::kNode);
            std::vector<std::string> ramdisks;
            names.List(ramdisks);
            for (const std::string& name : ramdisks) {
                ramdisk.ResetInstance();
                ramdisk.AddInstancePath(name);
                char record[Layout::kSize];
                ramdisk.Get(record, sizeof record);
                StructPtr row = GetOutputStructure();
                const long long reserved = Number(record, Layout::kReservedMib) * 1024;
                const long long maximum = Number(record, Layout::kMaximumMib) * 1024;
                const long long used = Number(record, Layout::kUsedPages) * 4;
                row->SetField("Ramdisk Name", name);
                row->SetField("System", Number(record, Layout::kSystem) != 0);
                row->SetField("Include in Coredumps", Number(record, Layout::kCoredump) != 0);
                row->SetField("Reserved", reserved);
                row->SetField("Maximum", maximum);
                row->SetField("Used", used);
                row->SetField("Peak Used", Number(record, Layout::kPeakUsedPages) * 4);
                row->SetField("Free", FreePercent(maximum, used));
                row->SetField("Reserved Free", reserved > used ? FreePercent(reserved, used) : 0LL);
                row->SetField("Maximum Inodes", Number(record, Layout::kMaximumInodes));
                row->SetField("Allocated Inodes", Number(record, Layout::kAllocatedInodes));
                row->SetField("Used Inodes", Number(record, Layout::kUsedInodes));
                row->SetField("Mount Point", RecordText(record, sizeof record, Layout::kMountPoint));
                list->AddStruct(row);
            }
            SetResult(output, list);
        },
        1);
}

}  // namespace System
}  // namespace TarselCli
