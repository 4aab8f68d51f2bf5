// The schema writer: every node's keys, commands' parameters, constraints and output shapes.
#include "engine/Schema.h"

#include <kitbase/AutoCli.h>

#include <gtest/gtest.h>
#include <nlohmann/json.hpp>

namespace {

using namespace Kitbase;
using nlohmann::ordered_json;

class ShapeCommand : public AutoCli::Command {
public:
    static boost::shared_ptr<ShapeCommand> New(const boost::shared_ptr<MetaObj::MetaObject>& shape,
                                               const boost::shared_ptr<CallSpec::InputSpec>& in) {
        return boost::shared_ptr<ShapeCommand>(new ShapeCommand(shape, in));
    }
    boost::shared_ptr<CallSpec::InputSpec> GetInputSpecInternal() { return inputs_; }
    boost::shared_ptr<CallSpec::OutputSpec> GetOutputSpecInternal() {
        boost::shared_ptr<CallSpec::OutputSpec> spec = CallSpec::OutputSpec::New();
        spec->SetResultTemplate(shape_);
        return spec;
    }
    void ExecuteInternal(const boost::shared_ptr<CallSpec::Input>&,
                         const boost::shared_ptr<CallSpec::Output>&) {}

private:
    ShapeCommand(const boost::shared_ptr<MetaObj::MetaObject>& shape,
                 const boost::shared_ptr<CallSpec::InputSpec>& in)
        : shape_(shape), inputs_(in) {}
    boost::shared_ptr<MetaObj::MetaObject> shape_;
    boost::shared_ptr<CallSpec::InputSpec> inputs_;
};

boost::shared_ptr<CallSpec::InputSpec> Inputs() {
    boost::shared_ptr<CallSpec::InputSpec> spec = CallSpec::InputSpec::New();
    boost::shared_ptr<CallSpec::ParameterSpec> name =
        CallSpec::ParameterSpec::New("name", CallSpec::ParameterTypeString);
    name->SetShortName("n");
    name->SetHelp("The \"name\".");
    name->SetRequired(true);
    boost::shared_ptr<CallSpec::ParameterConstraint> regex =
        CallSpec::ParameterConstraint::New(CallSpec::ConstraintStringRegex);
    regex->SetStringRegex("[a-z]+\\d*");
    name->AddConstraint(regex);
    spec->AddParameter(name);
    boost::shared_ptr<CallSpec::ParameterSpec> level =
        CallSpec::ParameterSpec::New("level", CallSpec::ParameterTypeInt);
    boost::shared_ptr<CallSpec::ParameterConstraint> range =
        CallSpec::ParameterConstraint::New(CallSpec::ConstraintIntRange);
    range->SetIntRange(-5, 9223372036854775807LL);
    level->AddConstraint(range);
    spec->AddParameter(level);
    spec->AddParameter(CallSpec::ParameterSpec::New("on", CallSpec::ParameterTypeBool));
    spec->AddParameter(CallSpec::ParameterSpec::New("force", CallSpec::ParameterTypeFlag));
    return spec;
}

boost::shared_ptr<AutoCli::NamespaceNode> Tree() {
    boost::shared_ptr<AutoCli::NamespaceNode> root = AutoCli::Namespace::New();
    boost::shared_ptr<AutoCli::NamespaceNode> top = root->SubNamespace("top");
    top->SetDescription("Top level.");

    boost::shared_ptr<MetaObj::MetaStruct> row = MetaObj::MetaStruct::New("Row");
    row->SetField("Name", MetaObj::MetaString::New());
    row->SetField("Size", MetaObj::MetaInt::New());
    row->SetField("On", MetaObj::MetaBool::New());
    row->SetField("Tags", MetaObj::MetaList::New(MetaObj::MetaTypeString));
    boost::shared_ptr<ShapeCommand> list = ShapeCommand::New(
        MetaObj::MetaList::New(MetaObj::MetaTypeStruct, row), Inputs());
    list->SetDescription("List rows.");
    list->SetMetaDataField("type", "fetcher");
    list->SetDefaultOutputFormatter("table");
    list->SetDefaultOutputParameter("table-columns", "Name,Size");
    list->SetDefaultOutputParameter("units:Row.Size", "B");
    top->RegisterNamespaceNode(list, "list");

    boost::shared_ptr<ShapeCommand> set =
        ShapeCommand::New(MetaObj::MetaBool::New(), CallSpec::InputSpec::New());
    set->SetMetaDataField("type", "operation");
    top->RegisterNamespaceNode(set, "set");
    top->RegisterNamespaceNode(
        ShapeCommand::New(MetaObj::MetaList::New(MetaObj::MetaTypeString),
                          CallSpec::InputSpec::New()),
        "names");
    top->RegisterNamespaceNode(ShapeCommand::New(row, CallSpec::InputSpec::New()), "one");
    top->RegisterNamespaceNode(AutoCli::Namespace::New(), "empty");
    return root;
}

ordered_json Schema(const boost::shared_ptr<AutoCli::NamespaceNode>& node,
                    const std::vector<std::string>& path) {
    std::string text;
    {
        Engine::Writer out(&text);
        Engine::WriteSchema(out, node, path);
    }
    return ordered_json::parse(text);
}

TEST(Schema, RootAndNamespacesListChildrenInAttachmentOrder) {
    ordered_json root = Schema(Tree(), {});
    EXPECT_EQ("", root["name"]);
    EXPECT_EQ("", root["path"]);
    EXPECT_EQ("namespace", root["kind"]);
    EXPECT_EQ("", root["description"]);
    ASSERT_EQ(1u, root["children"].size());
    const ordered_json& top = root["children"][0];
    EXPECT_EQ((std::vector<std::string>{"name", "path", "kind", "description", "children"}),
              [&] {
                  std::vector<std::string> keys;
                  for (auto it = top.begin(); it != top.end(); ++it) keys.push_back(it.key());
                  return keys;
              }());
    EXPECT_EQ("top", top["path"]);
    EXPECT_EQ("Top level.", top["description"]);
    std::vector<std::string> names;
    for (const ordered_json& child : top["children"]) names.push_back(child["name"]);
    EXPECT_EQ((std::vector<std::string>{"list", "set", "names", "one", "empty"}), names);
    EXPECT_EQ("top empty", top["children"][4]["path"]);
    EXPECT_TRUE(top["children"][4]["children"].empty());
}

TEST(Schema, CommandsDescribeParametersAndOutput) {
    boost::shared_ptr<AutoCli::NamespaceNode> tree = Tree();
    ordered_json list = Schema(tree->GetChild("top")->GetChild("list"), {"top", "list"});
    EXPECT_EQ("list", list["name"]);
    EXPECT_EQ("top list", list["path"]);
    EXPECT_EQ("command", list["kind"]);
    EXPECT_EQ("List rows.", list["description"]);
    EXPECT_EQ(ordered_json({{"type", "fetcher"}}), list["metadata"]);
    EXPECT_EQ("table", list["formatter"]);
    EXPECT_EQ(ordered_json::parse(R"([["table-columns", "Name,Size"], ["units:Row.Size", "B"]])"),
              list["output_params"]);
    EXPECT_EQ(ordered_json::parse(R"([
        {"name": "name", "short": "n", "kind": "string", "required": true, "help": "The \"name\".",
         "constraints": [{"kind": "regex", "pattern": "[a-z]+\\d*"}]},
        {"name": "level", "short": null, "kind": "int", "required": false, "help": "",
         "constraints": [{"kind": "int-range", "min": -5, "max": 9223372036854775807}]},
        {"name": "on", "short": null, "kind": "bool", "required": false, "help": "",
         "constraints": []},
        {"name": "force", "short": null, "kind": "flag", "required": false, "help": "",
         "constraints": []}])"),
              list["parameters"]);
    EXPECT_EQ(ordered_json::parse(R"({"kind": "list", "of": {"kind": "struct", "name": "Row",
        "fields": [{"name": "Name", "kind": "string"}, {"name": "Size", "kind": "int"},
                   {"name": "On", "kind": "bool"}, {"name": "Tags", "kind": "string-list"}]}})"),
              list["output"]);
}

TEST(Schema, OutputShapesOfScalarsStructsAndStringLists) {
    boost::shared_ptr<AutoCli::NamespaceNode> top = Tree()->GetChild("top");
    ordered_json set = Schema(top->GetChild("set"), {"top", "set"});
    EXPECT_EQ(ordered_json({{"kind", "bool"}}), set["output"]);
    EXPECT_TRUE(set["formatter"].is_null());
    EXPECT_TRUE(set["output_params"].empty());
    EXPECT_TRUE(set["parameters"].empty());
    EXPECT_EQ(ordered_json::parse(R"({"kind": "list", "of": {"kind": "string"}})"),
              Schema(top->GetChild("names"), {"top", "names"})["output"]);
    ordered_json one = Schema(top->GetChild("one"), {"top", "one"});
    EXPECT_EQ("struct", one["output"]["kind"]);
    EXPECT_EQ("Row", one["output"]["name"]);
    EXPECT_EQ(4u, one["output"]["fields"].size());
}

}  // namespace
