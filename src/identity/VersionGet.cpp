#include "identity/VersionGet.h"

#include "frame/Record.h"

#include <norlithctl/Sysinfo.h>

namespace TarselCli {
namespace System {

namespace {
const int kVersionNode = 1238;
const std::size_t kVersionRecordSize = 312;
const std::size_t kProductOffset = 0;
const std::size_t kVersionOffset = 32;
const std::size_t kBuildOffset = 64;
const std::size_t kUpdateOffset = 160;
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
            NorlithCtl::Util::Sysinfo info(kVersionNode);
            char record[kVersionRecordSize];
            info.Get(record, sizeof record);
            result->SetField("Build", RecordText(record, sizeof record, kBuildOffset));
            result->SetField("Version", RecordText(record, sizeof record, kVersionOffset));
            result->SetField("Product", RecordText(record, sizeof record, kProductOffset));
            result->SetField("Update", RecordText(record, sizeof record, kUpdateOffset));
            SetResult(output, result);
        },
        0, "Unable to query product version: ");
}

}  // namespace System
}  // namespace TarselCli
