#include "memfs/MirafsGet.h"

#include "frame/Record.h"
#include "memfs/FreePercent.h"

#include <norlithctl/Records.h>
#include <norlithctl/Sysinfo.h>

namespace TarselCli {
namespace System {

namespace {
typedef NorlithCtl::Util::Records::MirafsStatus Layout;

long long Counter(const char* record, const NorlithCtl::Util::Records::Field& field) {
    return static_cast<long long>(RecordUnsigned(record, Layout::kSize, field.offset, field.width));
}
}  // namespace

boost::shared_ptr<MirafsGet> MirafsGet::New() { return boost::shared_ptr<MirafsGet>(new MirafsGet()); }

MirafsGet::MirafsGet() {
    SetDescription("Obtain status information on the memory filesystem as a whole.");
    SetMetaDataField("type", "operation");
    SetDefaultOutputFormatter("simple");
    SetDefaultOutputParameter("fields:MirafsStatus",
                              "Total Inodes,Used Inodes,Unlinked Inodes,Reserved Inodes,Peak Used "
                              "Inodes,Peak Unlinked Inodes,Peak Reserved Inodes,Free Inode "
                              "Percent,Lowest Free Inode Percent");
    SetDefaultOutputParameter("show-header:MirafsStatus", "false");
    SetMetaDataField("type", "fetcher");
}

MirafsGet::~MirafsGet() {}

InputSpecPtr MirafsGet::GetInputSpecInternal() { return MakeInputSpec(); }

OutputSpecPtr MirafsGet::GetOutputSpecInternal() { return MakeOutputSpec(GetOutputStructure()); }

StructPtr MirafsGet::GetOutputStructure() {
    return MakeStructTemplate("MirafsStatus", {{"Total Inodes", FieldInt},
                                               {"Used Inodes", FieldInt},
                                               {"Unlinked Inodes", FieldInt},
                                               {"Reserved Inodes", FieldInt},
                                               {"Peak Used Inodes", FieldInt},
                                               {"Peak Unlinked Inodes", FieldInt},
                                               {"Peak Reserved Inodes", FieldInt},
                                               {"Free Inode Percent", FieldInt},
                                               {"Lowest Free Inode Percent", FieldInt}});
}

void MirafsGet::ExecuteInternal(const InputPtr&, const OutputPtr& output) {
    GuardHost(
        output,
        [&] {
            NorlithCtl::Util::Sysinfo info(Layout::kNode);
            char record[Layout::kSize];
            info.Get(record, sizeof record);
            StructPtr result = GetOutputStructure();
            const long long total = Counter(record, Layout::kTotalInodes);
            const long long used = Counter(record, Layout::kUsedInodes);
            const long long peakUsed = Counter(record, Layout::kPeakUsedInodes);
            result->SetField("Total Inodes", total);
            result->SetField("Used Inodes", used);
            result->SetField("Peak Used Inodes", peakUsed);
            result->SetField("Unlinked Inodes", Counter(record, Layout::kUnlinkedInodes));
            result->SetField("Reserved Inodes", Counter(record, Layout::kReservedInodes));
            result->SetField("Peak Unlinked Inodes", Counter(record, Layout::kPeakUnlinkedInodes));
            result->SetField("Peak Reserved Inodes", Counter(record, Layout::kPeakReservedInodes));
            result->SetField("Free Inode Percent", FreePercent(total, used));
            result->SetField("Lowest Free Inode Percent", FreePercent(total, peakUsed));
            SetResult(output, result);
        },
        1);
}

}  // namespace System
}  // namespace TarselCli
