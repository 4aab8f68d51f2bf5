// --format-param settings checked against a result's shape: keys, structures (nested ones
// included), fields and boolean values, each refusal naming what is accepted.
#include "engine/FormatCheck.h"

#include <kitbase/MetaObj.h>

#include <gtest/gtest.h>

namespace {

using namespace Kitbase::MetaObj;
using Kitbase::Engine::CheckFormatParams;

typedef std::vector<std::pair<std::string, std::string> > Settings;

// A list of Host structures, each with lists of Disk and Boot structures.
boost::shared_ptr<MetaObject> HostsTemplate() {
    boost::shared_ptr<MetaStruct> disk = MetaStruct::New("Disk");
    disk->SetField("Name", MetaString::New());
    disk->SetField("Size", MetaInt::New());
    boost::shared_ptr<MetaStruct> boot = MetaStruct::New("Boot");
    boot->SetField("Device", MetaString::New());
    boost::shared_ptr<MetaStruct> host = MetaStruct::New("Host");
    host->SetField("Name", MetaString::New());
    host->SetField("Disks", MetaList::New(MetaTypeStruct, disk));
    host->SetField("Boot", MetaList::New(MetaTypeStruct, boot));
    return MetaList::New(MetaTypeStruct, host);
}

std::string Refusal(const Settings& settings, const MetaObject* tmpl) {
    std::string error;
    EXPECT_FALSE(CheckFormatParams(settings, tmpl, &error));
    return error;
}

TEST(FormatCheck, KnownKeysStructuresAndFieldsPass) {
    boost::shared_ptr<MetaObject> hosts = HostsTemplate();
    std::string error;
    EXPECT_TRUE(CheckFormatParams({{"fields:Host", "Name, Disks"},
                                   {"fields:Disk", "Size"},
                                   {"show-header:Boot", "No"},
                                   {"table-columns", "Boot,Name"},
                                   {"units:Disk.Size", "KiB"},
                                   {"wrap-last", "1"},
                                   {"fields:Host", ""}},
                                  hosts.get(), &error))
        << error;
    EXPECT_TRUE(CheckFormatParams({}, nullptr, &error));
    // A field name with a dot in it still finds its structure.
    boost::shared_ptr<MetaStruct> echo = MetaStruct::New("Echo");
    echo->SetField("name.has", MetaBool::New());
    EXPECT_TRUE(CheckFormatParams({{"units:Echo.name.has", "x"}}, echo.get(), &error)) << error;
}

TEST(FormatCheck, RefusalsNameWhatIsAccepted) {
    boost::shared_ptr<MetaObject> hosts = HostsTemplate();
    EXPECT_EQ("global option '--format-param': unknown key 'foo'; keys are fields:<Struct>, "
              "show-header:<Struct>, table-columns, units:<Struct>.<Field> and wrap-last",
              Refusal({{"foo", "bar"}}, hosts.get()));
    EXPECT_EQ("global option '--format-param': unknown structure 'Hots' in 'fields:Hots'; this "
              "command's structures are Host, Disk and Boot; did you mean 'Host'?",
              Refusal({{"fields:Hots", "Name"}}, hosts.get()));
    EXPECT_EQ("global option '--format-param': unknown field 'name' in 'fields:Disk'; the fields "
              "of Disk are Name and Size; did you mean 'Name'?",
              Refusal({{"fields:Disk", "Size,name"}}, hosts.get()));
    EXPECT_EQ("global option '--format-param': 'show-header:Host' takes true, false, yes, no, 1 "
              "or 0, got 'maybe'",
              Refusal({{"show-header:Host", "maybe"}}, hosts.get()));
    EXPECT_EQ("global option '--format-param': 'wrap-last' takes true, false, yes, no, 1 or 0, "
              "got ''",
              Refusal({{"wrap-last", ""}}, hosts.get()));
    // Table columns are fields of the rows' structure, not of structures nested in them.
    EXPECT_EQ(0u, Refusal({{"table-columns", "Size"}}, hosts.get())
                      .find("global option '--format-param': unknown field 'Size' in "
                            "'table-columns'; the fields of Host are Name, Disks and Boot"));
    EXPECT_EQ(0u, Refusal({{"units:Disk.Weight", "g"}}, hosts.get())
                      .find("global option '--format-param': unknown field 'Weight' in "
                            "'units:Disk.Weight'"));
    EXPECT_EQ(0u, Refusal({{"units:Nope.Size", "g"}}, hosts.get())
                      .find("global option '--format-param': unknown structure 'Nope'"));
    EXPECT_EQ("global option '--format-param': 'units:Disk' names no field; write "
              "units:<Struct>.<Field>",
              Refusal({{"units:Disk", "g"}}, hosts.get()));
}

TEST(FormatCheck, ResultsWithoutStructuresTakeOnlyWrapLast) {
    boost::shared_ptr<MetaObject> text = MetaString::New();
    std::string error;
    EXPECT_TRUE(CheckFormatParams({{"wrap-last", "false"}}, text.get(), &error));
    EXPECT_EQ("global option '--format-param': unknown structure 'VersionGet' in "
              "'fields:VersionGet'; this command's output has no structures",
              Refusal({{"fields:VersionGet", "version"}}, text.get()));
    EXPECT_EQ("global option '--format-param': 'table-columns' needs a result made of "
              "structures; this command's output has no structures",
              Refusal({{"table-columns", "A"}}, nullptr));
}

}  // namespace
