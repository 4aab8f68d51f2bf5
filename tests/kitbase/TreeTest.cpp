// The command tree: SubNamespace, RegisterNamespaceNode, duplicates and bad names, and the
// command base's settings and hooks.
#include <kitbase/AutoCli.h>

#include <gtest/gtest.h>

#include <stdexcept>

namespace {

using namespace Kitbase;
using AutoCli::Command;
using AutoCli::Namespace;
using AutoCli::NamespaceNode;

class StubCommand : public Command {
public:
    static boost::shared_ptr<StubCommand> New() {
        return boost::shared_ptr<StubCommand>(new StubCommand());
    }
    boost::shared_ptr<CallSpec::InputSpec> GetInputSpecInternal() {
        ++inputCalls;
        return inputs;
    }
    boost::shared_ptr<CallSpec::OutputSpec> GetOutputSpecInternal() { return outputs; }
    void ExecuteInternal(const boost::shared_ptr<CallSpec::Input>& input,
                         const boost::shared_ptr<CallSpec::Output>& output) {
        output->SetResult(MetaObj::MetaString::New(input->GetString("x")));
    }

    boost::shared_ptr<CallSpec::InputSpec> inputs;
    boost::shared_ptr<CallSpec::OutputSpec> outputs;
    int inputCalls = 0;

private:
    StubCommand() {}
};

TEST(Tree, SubNamespaceCreatesOnceAndThenReturnsTheSameNode) {
    boost::shared_ptr<NamespaceNode> root = Namespace::New();
    boost::shared_ptr<NamespaceNode> first = root->SubNamespace("system");
    first->SetDescription("System things.");
    boost::shared_ptr<NamespaceNode> again = root->SubNamespace("system");
    EXPECT_EQ(first, again);
    ASSERT_EQ(1u, root->GetChildren().size());
    EXPECT_EQ("System things.", root->GetChild("system")->GetDescription());
    EXPECT_FALSE(first->IsCommand());
    EXPECT_EQ(first, first->shared_from_this());
}

TEST(Tree, ChildrenKeepAttachmentOrder) {
    boost::shared_ptr<NamespaceNode> root = Namespace::New();
    const char* names[] = {"get", "parameters", "list", "load", "set"};
    for (const char* name : names) root->RegisterNamespaceNode(Namespace::New(), name);
    root->RegisterNamespaceNode(StubCommand::New(), "run");
    ASSERT_EQ(6u, root->GetChildren().size());
    for (int i = 0; i < 5; ++i) EXPECT_EQ(names[i], root->GetChildren()[i].first);
    EXPECT_TRUE(root->GetChild("run")->IsCommand());
    EXPECT_FALSE(root->GetChild("nothing"));
}

TEST(Tree, DuplicatesAndUntypeableNamesAreRefused) {
    boost::shared_ptr<NamespaceNode> root = Namespace::New();
    root->RegisterNamespaceNode(Namespace::New(), "a");
    EXPECT_THROW(root->RegisterNamespaceNode(Namespace::New(), "a"), std::invalid_argument);
    EXPECT_THROW(root->RegisterNamespaceNode(StubCommand::New(), "a"), std::invalid_argument);
    EXPECT_THROW(root->RegisterNamespaceNode(Namespace::New(), ""), std::invalid_argument);
    EXPECT_THROW(root->RegisterNamespaceNode(Namespace::New(), "two words"),
                 std::invalid_argument);
    EXPECT_THROW(root->RegisterNamespaceNode(Namespace::New(), "tab\there"),
                 std::invalid_argument);
    EXPECT_THROW(root->RegisterNamespaceNode(Namespace::New(), "--opt"), std::invalid_argument);
    EXPECT_THROW(root->RegisterNamespaceNode(boost::shared_ptr<NamespaceNode>(), "null"),
                 std::invalid_argument);
    EXPECT_THROW(root->SubNamespace("bad name"), std::invalid_argument);
    EXPECT_EQ(1u, root->GetChildren().size());
}

TEST(Tree, CommandsAreLeavesAndCyclesAreRefused) {
    boost::shared_ptr<NamespaceNode> root = Namespace::New();
    boost::shared_ptr<StubCommand> command = StubCommand::New();
    root->RegisterNamespaceNode(command, "run");
    EXPECT_THROW(command->RegisterNamespaceNode(Namespace::New(), "below"),
                 std::invalid_argument);
    EXPECT_THROW(root->SubNamespace("run"), std::invalid_argument);

    boost::shared_ptr<NamespaceNode> child = root->SubNamespace("child");
    EXPECT_THROW(child->RegisterNamespaceNode(root, "loop"), std::invalid_argument);
    EXPECT_THROW(child->RegisterNamespaceNode(child, "self"), std::invalid_argument);
    EXPECT_TRUE(child->GetChildren().empty());
}

TEST(Tree, CommandSettingsReplaceTheirKeyInPlace) {
    boost::shared_ptr<StubCommand> command = StubCommand::New();
    EXPECT_EQ("", command->GetDefaultOutputFormatter());
    command->SetMetaDataField("type", "operation");
    command->SetMetaDataField("owner", "kb");
    command->SetMetaDataField("type", "fetcher");
    ASSERT_EQ(2u, command->GetMetaData().size());
    EXPECT_EQ("type", command->GetMetaData()[0].first);
    EXPECT_EQ("fetcher", command->GetMetaDataField("type"));
    EXPECT_EQ("", command->GetMetaDataField("absent"));

    command->SetDefaultOutputParameter("fields:X", "A,B");
    command->SetDefaultOutputParameter("wrap-last", "true");
    command->SetDefaultOutputParameter("fields:X", "B");
    ASSERT_EQ(2u, command->GetDefaultOutputParameters().size());
    EXPECT_EQ("B", command->GetDefaultOutputParameters()[0].second);
    command->SetDefaultOutputFormatter("table");
    EXPECT_EQ("table", command->GetDefaultOutputFormatter());
}

TEST(Tree, CommandHooksAreCalledThroughTheFramework) {
    boost::shared_ptr<StubCommand> command = StubCommand::New();
    // A command that hands back no parameter list or result shape gets empty ones.
    ASSERT_TRUE(command->GetInputSpec());
    EXPECT_TRUE(command->GetInputSpec()->GetParameters().empty());
    EXPECT_EQ(2, command->inputCalls);
    ASSERT_TRUE(command->GetOutputSpec());
    EXPECT_FALSE(command->GetOutputSpec()->GetResultTemplate());

    command->inputs = CallSpec::InputSpec::New();
    EXPECT_EQ(command->inputs, command->GetInputSpec());

    boost::shared_ptr<CallSpec::Input> input = CallSpec::Input::New();
    input->SetString("x", "value");
    boost::shared_ptr<CallSpec::Output> output = CallSpec::Output::New();
    command->Execute(input, output);
    ASSERT_TRUE(output->GetResult());
    EXPECT_EQ("value",
              boost::static_pointer_cast<MetaObj::MetaString>(output->GetResult())->GetValue());
    EXPECT_THROW(command->Execute(boost::shared_ptr<CallSpec::Input>(), output),
                 std::invalid_argument);
}

}  // namespace
