// Every formatter against golden outputs: field order by template, values without value,
// steering parameters (fields, show-header, table-columns, units, wrap-last), escaping, nesting.
#include "engine/Format.h"

#include <kitbase/MetaObj.h>

#include <gtest/gtest.h>
#include <nlohmann/json.hpp>

namespace {

using namespace Kitbase;
using namespace Kitbase::MetaObj;
using Engine::FormatParams;

typedef boost::shared_ptr<MetaStruct> StructPtr;
typedef boost::shared_ptr<MetaList> ListPtr;

std::string Render(const std::string& formatter, const MetaObject& result,
                   const MetaObject* tmpl = nullptr, const FormatParams& params = FormatParams(),
                   std::size_t width = 80) {
    std::string text;
    {
        Engine::Writer out(&text);
        Engine::RenderRequest request;
        request.result = &result;
        request.resultTemplate = tmpl;
        request.params = &params;
        request.width = width;
        EXPECT_TRUE(Engine::Render(formatter, request, out));
    }
    return text;
}

FormatParams Params(std::initializer_list<FormatParams::KeyValue> values) {
    return FormatParams(std::vector<FormatParams::KeyValue>(values));
}

StructPtr ModuleTemplate() {
    StructPtr shape = MetaStruct::New("Module");
    shape->SetField("Name", MetaString::New());
    shape->SetField("Size", MetaInt::New());
    shape->SetField("Loaded", MetaBool::New());
    shape->SetField("Aliases", MetaList::New(MetaTypeString));
    shape->SetField("Note", MetaString::New());
    return shape;
}

// Two modules: the first complete and in template order; the second set in another order,
// with a size without value, no aliases, no Note at all and a field the template lacks.
class FormatTest : public ::testing::Test {
protected:
    FormatTest() : shape(MetaList::New(MetaTypeStruct, ModuleTemplate())) {
        modules = MetaList::New(MetaTypeStruct, ModuleTemplate());
        StructPtr alpha = MetaStruct::New("Module");
        alpha->SetField("Name", "alpha");
        alpha->SetField("Size", 4096LL);
        alpha->SetField("Loaded", true);
        alpha->SetField("Aliases", std::vector<std::string>{"a1", "a2"});
        alpha->SetField("Note", "first");
        StructPtr beta = MetaStruct::New("Module");
        beta->SetField("Loaded", false);
        beta->SetField("Extra", "x");
        beta->SetField("Name", "beta");
        beta->SetField("Size", MetaInt::New());
        beta->SetField("Aliases", std::vector<std::string>());
        modules->AddStruct(alpha);
        modules->AddStruct(beta);
    }

    ListPtr shape;
    ListPtr modules;
};

// ---- simple ----

TEST_F(FormatTest, SimpleListsStructuresAsBlocksInTemplateOrder) {
    EXPECT_EQ("Module:\n"
              "   Name: alpha\n"
              "   Size: 4096\n"
              "   Loaded: true\n"
              "   Aliases: a1, a2\n"
              "   Note: first\n"
              "\n"
              "Module:\n"
              "   Name: beta\n"
              "   Size:\n"
              "   Loaded: false\n"
              "   Aliases:\n"
              "   Note:\n"
              "   Extra: x\n",
              Render("simple", *modules, shape.get()));
}

TEST_F(FormatTest, SimpleFollowsFieldsHeaderAndUnits) {
    FormatParams params = Params({{"fields:Module", "Size,Name,Nothing"},
                                  {"show-header:Module", "false"},
                                  {"units:Module.Size", "B"}});
    EXPECT_EQ("   Size: 4096 B\n"
              "   Name: alpha\n"
              "   Nothing:\n"
              "\n"
              "   Size:\n"
              "   Name: beta\n"
              "   Nothing:\n",
              Render("simple", *modules, shape.get(), params));
}

TEST_F(FormatTest, SimpleScalarsAndListsOfScalars) {
    EXPECT_EQ("hello world\n", Render("simple", *MetaString::New("hello world")));
    EXPECT_EQ("-12\n", Render("simple", *MetaInt::New(-12)));
    EXPECT_EQ("false\n", Render("simple", *MetaBool::New(false)));
    EXPECT_EQ("\n", Render("simple", *MetaInt::New()));
    ListPtr lines = MetaList::New(MetaTypeString);
    lines->AddString("one");
    lines->AddString("two");
    EXPECT_EQ("one\ntwo\n", Render("simple", *lines));
    EXPECT_EQ("", Render("simple", *MetaList::New(MetaTypeString)));
    EXPECT_EQ("", Render("simple", *MetaList::New(MetaTypeStruct, ModuleTemplate())));
}

StructPtr HostWithDisks() {
    StructPtr host = MetaStruct::New("Host");
    host->SetField("Name", "h1");
    ListPtr disks = MetaList::New(MetaTypeStruct);
    for (int i = 0; i < 2; ++i) {
        StructPtr disk = MetaStruct::New("Disk");
        disk->SetField("Name", "d" + std::to_string(i));
        disk->SetField("Size", i + 1);
        disks->AddStruct(disk);
    }
    host->SetField("Disks", disks);
    host->SetField("Tags", std::vector<std::string>{"x", "y"});
    return host;
}

TEST_F(FormatTest, SimpleNestsStructuresInListFields) {
    EXPECT_EQ("Host:\n"
              "   Name: h1\n"
              "   Disks:\n"
              "      Disk:\n"
              "         Name: d0\n"
              "         Size: 1\n"
              "      Disk:\n"
              "         Name: d1\n"
              "         Size: 2\n"
              "   Tags: x, y\n",
              Render("simple", *HostWithDisks()));
    EXPECT_EQ("   Name: h1\n"
              "   Disks:\n"
              "         Size: 1\n"
              "         Size: 2\n"
              "   Tags: x, y\n",
              Render("simple", *HostWithDisks(), nullptr,
                     Params({{"show-header:Host", "false"},
                             {"show-header:Disk", "false"},
                             {"fields:Disk", "Size"}})));
}

TEST_F(FormatTest, TemplateAppliesOnlyToStructuresOfItsName) {
    StructPtr other = MetaStruct::New("Other");
    other->SetField("B", 2);
    other->SetField("A", 1);
    StructPtr tmpl = MetaStruct::New("Different");
    tmpl->SetField("A", MetaInt::New());
    tmpl->SetField("B", MetaInt::New());
    EXPECT_EQ("Other:\n   B: 2\n   A: 1\n", Render("simple", *other, tmpl.get()));
    StructPtr same = MetaStruct::New("Other");
    same->SetField("A", MetaInt::New());
    same->SetField("B", MetaInt::New());
    EXPECT_EQ("Other:\n   A: 1\n   B: 2\n", Render("simple", *other, same.get()));
}

// ---- table ----

TEST_F(FormatTest, TableAlignsColumnsAndDropsTrailingBlanks) {
    EXPECT_EQ("Name   Size  Loaded  Aliases  Note   Extra\n"
              "-----  ----  ------  -------  -----  -----\n"
              "alpha  4096  true    a1, a2   first\n"
              "beta         false                   x\n",
              Render("table", *modules, shape.get()));
}

TEST_F(FormatTest, TableColumnsWinOverFieldsAndUnitsGoIntoTheHeading) {
    FormatParams params = Params({{"fields:Module", "Note"},
                                  {"table-columns", "Name,Size"},
                                  {"units:Module.Size", "KiB"}});
    EXPECT_EQ("Name   Size (KiB)\n"
              "-----  ----------\n"
              "alpha  4096\n"
              "beta\n",
              Render("table", *modules, shape.get(), params));
    EXPECT_EQ("Note   Loaded\n"
              "-----  ------\n"
              "first  true\n"
              "       false\n",
              Render("table", *modules, shape.get(), Params({{"fields:Module", "Note,Loaded"}})));
}

TEST_F(FormatTest, TableWithoutHeaderSingleStructAndEmptyList) {
    EXPECT_EQ("alpha  4096\n"
              "beta\n",
              Render("table", *modules, shape.get(),
                     Params({{"table-columns", "Name,Size"}, {"show-header:Module", "false"}})));
    EXPECT_EQ("Name  Size  Tags\n"
              "----  ----  ----\n"
              "h1          x, y\n",
              Render("table", *HostWithDisks(), nullptr,
                     Params({{"table-columns", "Name,Size,Tags"}})));
    EXPECT_EQ("Name  Size  Loaded  Aliases  Note\n"
              "----  ----  ------  -------  ----\n",
              Render("table", *MetaList::New(MetaTypeStruct, ModuleTemplate())));
    EXPECT_EQ("42\n", Render("table", *MetaInt::New(42)));
}

TEST_F(FormatTest, TableKeepsCellsOnOneLineAndCountsCodePoints) {
    ListPtr rows = MetaList::New(MetaTypeStruct);
    const char* names[] = {"\xC3\xA9t\xC3\xA9", "tab\there", "line\nbreak", "\x1b[2Jgone"};
    for (const char* name : names) {
        StructPtr row = MetaStruct::New("Row");
        row->SetField("Name", name);
        row->SetField("N", 1);
        rows->AddStruct(row);
    }
    // Control characters show escaped, and the columns are as wide as what shows.
    EXPECT_EQ("Name         N\n"
              "-----------  -\n"
              "\xC3\xA9t\xC3\xA9          1\n"
              "tab\\there    1\n"
              "line\\nbreak  1\n"
              "\\x1b[2Jgone  1\n",
              Render("table", *rows));
}

// Host data with control characters cannot forge lines or reach the terminal raw.
TEST_F(FormatTest, HostTextIsEscapedInSimpleAndKeyValueAndQuotedInCsv) {
    StructPtr nic = MetaStruct::New("Nic");
    nic->SetField("Name", "eth0\nNic:\n   Name: forged");
    nic->SetField("Note", "bell\a tab\t esc\x1b[0m back\\slash \xFF");
    EXPECT_EQ("Nic:\n"
              "   Name: eth0\\nNic:\\n   Name: forged\n"
              "   Note: bell\\x07 tab\\t esc\\x1b[0m back\\slash \\xff\n",
              Render("simple", *nic));
    EXPECT_EQ("Nic.Name=eth0\\nNic:\\n   Name: forged\n"
              "Nic.Note=bell\\x07 tab\\t esc\\x1b[0m back\\\\slash \\xff\n",
              Render("keyvalue", *nic));
    EXPECT_EQ("Name,Note\r\n"
              "\"eth0\nNic:\n   Name: forged\",bell\a tab\t esc\x1b[0m back\\slash \xFF\r\n",
              Render("csv", *nic));
    ListPtr lines = MetaList::New(MetaTypeString);
    lines->AddString("one\ntwo");
    EXPECT_EQ("one\\ntwo\n", Render("simple", *lines));
    EXPECT_EQ("\"one\ntwo\"\r\n", Render("csv", *lines));
}

ListPtr Descriptions() {
    ListPtr rows = MetaList::New(MetaTypeStruct);
    const char* text[][2] = {{"a", "one two three four five six seven eight nine ten"},
                             {"bb", "short"},
                             {"c", "abcdefghijklmnopqrstuvwxyzABCD"}};
    for (auto& pair : text) {
        StructPtr row = MetaStruct::New("Row");
        row->SetField("Name", pair[0]);
        row->SetField("Description", pair[1]);
        rows->AddStruct(row);
    }
    return rows;
}

TEST_F(FormatTest, TableWrapsTheLastColumnToTheWidth) {
    EXPECT_EQ("Name  Description\n"
              "----  ------------------------\n"
              "a     one two three four five\n"
              "      six seven eight nine ten\n"
              "bb    short\n"
              "c     abcdefghijklmnopqrstuvwx\n"
              "      yzABCD\n",
              Render("table", *Descriptions(), nullptr, Params({{"wrap-last", "true"}}), 30));
    // When the table fits, wrap-last changes nothing.
    std::string whole = Render("table", *Descriptions(), nullptr, FormatParams(), 200);
    EXPECT_NE(std::string::npos,
              whole.find("a     one two three four five six seven eight nine ten\n"));
    EXPECT_EQ(whole, Render("table", *Descriptions(), nullptr, Params({{"wrap-last", "true"}}),
                            200));
}

// Network cards: a heading of two words, MAC addresses (one token each) and a long note.
ListPtr Nics() {
    ListPtr rows = MetaList::New(MetaTypeStruct);
    const char* text[][4] = {
        {"vmnic0", "00:50:56:a1:b2:c3", "Up", "Uplink to the management network, team A"},
        {"vmnic1", "00:50:56:a1:b2:c4", "Down", "Spare"}};
    for (auto& nic : text) {
        StructPtr row = MetaStruct::New("Nic");
        row->SetField("Name", nic[0]);
        row->SetField("MAC Address", nic[1]);
        row->SetField("Link State", nic[2]);
        row->SetField("Description", nic[3]);
        rows->AddStruct(row);
    }
    return rows;
}

// Every line within width; with no token split unless it alone is wider than its column.
void ExpectFitted(const std::string& table, std::size_t width) {
    std::size_t start = 0;
    while (start < table.size()) {
        std::size_t end = table.find('\n', start);
        EXPECT_LE(end - start, width) << table.substr(start, end - start);
        start = end + 1;
    }
    EXPECT_EQ(std::string::npos, table.find("00:50:56:a1\n")) << table;
}

TEST_F(FormatTest, WideTablesAreFittedToTheWidthAtWordBoundaries) {
    std::string fitted = Render("table", *Nics(), nullptr, FormatParams(), 60);
    EXPECT_EQ("Name    MAC Address        Link State  Description\n"
              "------  -----------------  ----------  -------------------\n"
              "vmnic0  00:50:56:a1:b2:c3  Up          Uplink to the\n"
              "                                       management network,\n"
              "                                       team A\n"
              "vmnic1  00:50:56:a1:b2:c4  Down        Spare\n",
              fitted);
    ExpectFitted(fitted, 60);
    // Narrower: every column short of its width shares what is left, headings wrap too.
    std::string shared = Render("table", *Nics(), nullptr, FormatParams(), 50);
    EXPECT_EQ("Name    MAC Address        Link   Description\n"
              "                           State\n"
              "------  -----------------  -----  ----------------\n"
              "vmnic0  00:50:56:a1:b2:c3  Up     Uplink to the\n"
              "                                  management\n"
              "                                  network, team A\n"
              "vmnic1  00:50:56:a1:b2:c4  Down   Spare\n",
              shared);
    ExpectFitted(shared, 50);
    // wrap-last: the last column gives way first, so the others keep their width.
    std::string last = Render("table", *Nics(), nullptr, Params({{"wrap-last", "yes"}}), 50);
    EXPECT_EQ("Name    MAC Address        Link State  Description\n"
              "------  -----------------  ----------  -----------\n"
              "vmnic0  00:50:56:a1:b2:c3  Up          Uplink to\n"
              "                                       the\n"
              "                                       management\n"
              "                                       network,\n"
              "                                       team A\n"
              "vmnic1  00:50:56:a1:b2:c4  Down        Spare\n",
              last);
    ExpectFitted(last, 50);
    // So narrow that the words cannot all fit: columns share the width, long tokens split.
    std::string narrow = Render("table", *Nics(), nullptr, FormatParams(), 30);
    std::size_t start = 0;
    while (start < narrow.size()) {
        std::size_t end = narrow.find('\n', start);
        EXPECT_LE(end - start, 30u) << narrow;
        start = end + 1;
    }
}

// ---- csv ----

TEST_F(FormatTest, CsvQuotesPerRfc4180) {
    EXPECT_EQ("Name,Size,Loaded,Aliases,Note,Extra\r\n"
              "alpha,4096,true,\"a1, a2\",first,\r\n"
              "beta,,false,,,x\r\n",
              Render("csv", *modules, shape.get()));
    StructPtr odd = MetaStruct::New("Odd");
    odd->SetField("Text", "say \"hi\"\nbye");
    odd->SetField("Plain", "x y");
    EXPECT_EQ("Text,Plain\r\n\"say \"\"hi\"\"\nbye\",x y\r\n", Render("csv", *odd));
    EXPECT_EQ("Size,Name\r\n4096,alpha\r\n,beta\r\n",
              Render("csv", *modules, shape.get(), Params({{"fields:Module", "Size,Name"}})));
    EXPECT_EQ("\"a,b\"\r\n", Render("csv", *MetaString::New("a,b")));
}

// ---- json ----

TEST_F(FormatTest, JsonWritesEveryFieldInTemplateOrder) {
    EXPECT_EQ("[\n"
              "  {\n"
              "    \"Name\": \"alpha\",\n"
              "    \"Size\": 4096,\n"
              "    \"Loaded\": true,\n"
              "    \"Aliases\": [\n"
              "      \"a1\",\n"
              "      \"a2\"\n"
              "    ],\n"
              "    \"Note\": \"first\"\n"
              "  },\n"
              "  {\n"
              "    \"Name\": \"beta\",\n"
              "    \"Size\": null,\n"
              "    \"Loaded\": false,\n"
              "    \"Aliases\": [],\n"
              "    \"Note\": null,\n"
              "    \"Extra\": \"x\"\n"
              "  }\n"
              "]\n",
              Render("json", *modules, shape.get(),
                     Params({{"fields:Module", "Name"}, {"table-columns", "Size"}})));
}

TEST_F(FormatTest, JsonScalarsNestingAndEscaping) {
    EXPECT_EQ("\"text\"\n", Render("json", *MetaString::New("text")));
    EXPECT_EQ("null\n", Render("json", *MetaString::New()));
    EXPECT_EQ("-9223372036854775808\n",
              Render("json", *MetaInt::New(-9223372036854775807LL - 1)));
    EXPECT_EQ("[]\n", Render("json", *MetaList::New(MetaTypeStruct)));
    EXPECT_EQ("{}\n", Render("json", *MetaStruct::New("Empty")));

    nlohmann::json host = nlohmann::json::parse(Render("json", *HostWithDisks()));
    EXPECT_EQ("d1", host["Disks"][1]["Name"]);
    EXPECT_EQ(2, host["Disks"][1]["Size"]);

    StructPtr odd = MetaStruct::New("Odd");
    odd->SetField("key \"quoted\"\n", std::string("bad \xFF byte \x01 ctl", 16));
    nlohmann::json parsed = nlohmann::json::parse(Render("json", *odd));
    EXPECT_EQ("bad \xEF\xBF\xBD byte \x01 ctl", parsed["key \"quoted\"\n"].get<std::string>());
}

// ---- xml ----

TEST_F(FormatTest, XmlHasOneElementPerStructureAndField) {
    ListPtr one = MetaList::New(MetaTypeStruct, ModuleTemplate());
    one->AddStruct(boost::static_pointer_cast<MetaStruct>(modules->GetElements()[1]));
    EXPECT_EQ("<?xml version=\"1.0\" encoding=\"UTF-8\"?>\n"
              "<output>\n"
              "  <list>\n"
              "    <structure name=\"Module\">\n"
              "      <field name=\"Name\"><string>beta</string></field>\n"
              "      <field name=\"Size\"><int null=\"true\"/></field>\n"
              "      <field name=\"Loaded\"><bool>false</bool></field>\n"
              "      <field name=\"Aliases\">\n"
              "        <list/>\n"
              "      </field>\n"
              "      <field name=\"Note\"><string null=\"true\"/></field>\n"
              "      <field name=\"Extra\"><string>x</string></field>\n"
              "    </structure>\n"
              "  </list>\n"
              "</output>\n",
              Render("xml", *one, shape.get()));
    StructPtr odd = MetaStruct::New("A&B");
    odd->SetField("x<\"y\">", "1 < 2 & \"q\"\x02");
    EXPECT_EQ("<?xml version=\"1.0\" encoding=\"UTF-8\"?>\n"
              "<output>\n"
              "  <structure name=\"A&amp;B\">\n"
              "    <field name=\"x&lt;&quot;y&quot;&gt;\"><string>1 &lt; 2 &amp; \"q\"\xEF\xBF\xBD"
              "</string></field>\n"
              "  </structure>\n"
              "</output>\n",
              Render("xml", *odd));
    std::string host = Render("xml", *HostWithDisks());
    EXPECT_NE(std::string::npos, host.find("    <field name=\"Disks\">\n"
                                           "      <list>\n"
                                           "        <structure name=\"Disk\">\n"
                                           "          <field name=\"Name\"><string>d0</string>"
                                           "</field>\n"))
        << host;
    EXPECT_EQ("<?xml version=\"1.0\" encoding=\"UTF-8\"?>\n<output>\n  <bool>true</bool>\n"
              "</output>\n",
              Render("xml", *MetaBool::New(true)));
}

// ---- keyvalue ----

TEST_F(FormatTest, KeyValueNamesEveryScalar) {
    EXPECT_EQ("Module[0].Name=alpha\n"
              "Module[0].Size=4096\n"
              "Module[0].Loaded=true\n"
              "Module[0].Aliases[0]=a1\n"
              "Module[0].Aliases[1]=a2\n"
              "Module[0].Note=first\n"
              "Module[1].Name=beta\n"
              "Module[1].Size=\n"
              "Module[1].Loaded=false\n"
              "Module[1].Note=\n"
              "Module[1].Extra=x\n",
              Render("keyvalue", *modules, shape.get()));
    EXPECT_EQ("Host.Name=h1\n"
              "Host.Disks[0].Name=d0\n"
              "Host.Disks[0].Size=1\n"
              "Host.Disks[1].Name=d1\n"
              "Host.Disks[1].Size=2\n"
              "Host.Tags[0]=x\n"
              "Host.Tags[1]=y\n",
              Render("keyvalue", *HostWithDisks()));
    EXPECT_EQ("Value=two\\nlines \\\\ back\n",
              Render("keyvalue", *MetaString::New("two\nlines \\ back")));
    ListPtr names = MetaList::New(MetaTypeString);
    names->AddString("p");
    EXPECT_EQ("Value[0]=p\n", Render("keyvalue", *names));
}

TEST_F(FormatTest, UnknownFormatterWritesNothing) {
    std::string text;
    {
        Engine::Writer out(&text);
        Engine::RenderRequest request;
        request.result = modules.get();
        EXPECT_FALSE(Engine::Render("yaml", request, out));
    }
    EXPECT_EQ("", text);
    EXPECT_TRUE(Engine::IsFormatter("keyvalue"));
    EXPECT_FALSE(Engine::IsFormatter("Table"));
}

}  // namespace
