#include "identity/VersionGet.h"

#include "frame/Record.h"

#include <norlithctl/Records.h>
#include <norlithctl/Sysinfo.h>

namespace TarselCli {
namespace System {

namespace {
typedef NorlithCtl::Util::Records::ProductVersion Layout;
}  // namespace

boost::shared_ptr<VersionGet> VersionGet::New() {
    return boost::shared_ptr<VersionGet>(new VersionGet());
}

VersionGet::VersionGet() {
    SetDescription("Display the product name, version and build information.");
    SetMetaDataField("type", "fetcher");
    SetDefaultOutputFormatter("simple");
    SetDefaultOutputParameter("fields:VersionGet", "Product,Version,Build,Update");
    SetDefaultOutputParameter("show-header:VersionGet", "false");
}

VersionGet::~VersionGet() {}

InputSpecPtr VersionGet::GetInputSpecInternal() { return MakeInputSpec(); }

OutputSpecPtr VersionGet::GetOutputSpecInternal() {
    return MakeOutputSpec(MakeStructTemplate("VersionGet", {{"Product", FieldString},
                                                            {"Version", FieldString},
                                                            {"Build", FieldString},
                                                            {"Update", FieldString}}));
}

void VersionGet::ExecuteInternal(const InputPtr&, const OutputPtr& output) {
    GuardHost(
        output,
        [&] {
            StructPtr result = MetaObj::MetaStruct::New("VersionGet");
            NorlithCtl::Util::Sysinfo info(Layout::kNode);
            char record[Layout::kSize];
            info.Get(record, sizeof record);
            result->SetField("Build", RecordText(record, sizeof record, Layout::kBuild));
            result->SetField("Version", RecordText(record, sizeof record, Layout::kVersion));
            result->SetField("Product", RecordText(record, sizeof record, Layout::kProduct));
            result->SetField("Update", RecordText(record, sizeof record, Layout::kUpdate));
            SetResult(output, result);
        },
        0, "Unable to query product version: ");
}

}  // namespace System
}  // namespace TarselCli
