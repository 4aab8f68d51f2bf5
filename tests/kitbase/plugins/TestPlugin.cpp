// A plug-in for quarncli's process tests: the namespace "kb" with commands that exercise every
// parameter kind, each way a command can end, and the formatters' steering parameters.
#include <kitbase/AutoCli.h>
#include <kitbase/CallSpec.h>
#include <kitbase/MetaObj.h>
#include <norlithctl/RavelException.h>

#include <cstdlib>
#include <stdexcept>

namespace {

using namespace Kitbase;
typedef boost::shared_ptr<CallSpec::Input> InputPtr;
typedef boost::shared_ptr<CallSpec::Output> OutputPtr;

boost::shared_ptr<CallSpec::ParameterSpec> Param(const char* name, const char* letter,
                                                 CallSpec::ParameterType type, bool required,
                                                 const char* help) {
    boost::shared_ptr<CallSpec::ParameterSpec> spec = CallSpec::ParameterSpec::New(name, type);
    if (letter) spec->SetShortName(letter);
    spec->SetHelp(help);
    spec->SetRequired(required);
    return spec;
}

// A command whose behaviour is a function; the tree owns it like any plug-in command.
class TestCommand : public AutoCli::Command {
public:
    typedef void (*Body)(const InputPtr&, const OutputPtr&);
    typedef boost::shared_ptr<CallSpec::InputSpec> (*Inputs)();

    static boost::shared_ptr<TestCommand> New(const char* description, Inputs inputs,
                                              const boost::shared_ptr<MetaObj::MetaObject>& shape,
                                              Body body) {
        return boost::shared_ptr<TestCommand>(new TestCommand(description, inputs, shape, body));
    }

    boost::shared_ptr<CallSpec::InputSpec> GetInputSpecInternal() {
        return inputs_ ? inputs_() : CallSpec::InputSpec::New();
    }
    boost::shared_ptr<CallSpec::OutputSpec> GetOutputSpecInternal() {
        boost::shared_ptr<CallSpec::OutputSpec> spec = CallSpec::OutputSpec::New();
        spec->SetResultTemplate(shape_);
        return spec;
    }
    void ExecuteInternal(const InputPtr& input, const OutputPtr& output) { body_(input, output); }

private:
    TestCommand(const char* description, Inputs inputs,
                const boost::shared_ptr<MetaObj::MetaObject>& shape, Body body)
        : inputs_(inputs), shape_(shape), body_(body) {
        SetDescription(description);
    }
    Inputs inputs_;
    boost::shared_ptr<MetaObj::MetaObject> shape_;
    Body body_;
};

// ---- kb echo: every parameter kind, and what the input answers for each ----

const char* const kEchoNames[] = {"name", "count", "enable", "force", "word", "big"};

boost::shared_ptr<CallSpec::InputSpec> EchoInputs() {
    boost::shared_ptr<CallSpec::InputSpec> spec = CallSpec::InputSpec::New();
    spec->AddParameter(Param("name", "n", CallSpec::ParameterTypeString, false, "A name"));
    boost::shared_ptr<CallSpec::ParameterSpec> count =
        Param("count", "c", CallSpec::ParameterTypeInt, false, "How many, 1 to 100");
    boost::shared_ptr<CallSpec::ParameterConstraint> range =
        CallSpec::ParameterConstraint::New(CallSpec::ConstraintIntRange);
    range->SetIntRange(1, 100);
    count->AddConstraint(range);
    spec->AddParameter(count);
    spec->AddParameter(Param("enable", "e", CallSpec::ParameterTypeBool, false, "On or off"));
    spec->AddParameter(Param("force", "f", CallSpec::ParameterTypeFlag, false, "Do it anyway"));
    boost::shared_ptr<CallSpec::ParameterSpec> word =
        Param("word", "w", CallSpec::ParameterTypeString, false, "Lower-case letters then digits");
    boost::shared_ptr<CallSpec::ParameterConstraint> regex =
        CallSpec::ParameterConstraint::New(CallSpec::ConstraintStringRegex);
    regex->SetStringRegex("[a-z]+[0-9]*");
    word->AddConstraint(regex);
    spec->AddParameter(word);
    spec->AddParameter(Param("big", nullptr, CallSpec::ParameterTypeInt, false, "Any integer"));
    return spec;
}

boost::shared_ptr<MetaObj::MetaStruct> EchoShape() {
    boost::shared_ptr<MetaObj::MetaStruct> shape = MetaObj::MetaStruct::New("Echo");
    for (const char* name : kEchoNames) {
        std::string base = name;
        shape->SetField(base + ".has", MetaObj::MetaBool::New());
        shape->SetField(base + ".string", MetaObj::MetaString::New());
        shape->SetField(base + ".int", MetaObj::MetaInt::New());
        shape->SetField(base + ".bool", MetaObj::MetaBool::New());
        shape->SetField(base + ".flag", MetaObj::MetaBool::New());
    }
    return shape;
}

void Echo(const InputPtr& input, const OutputPtr& output) {
    boost::shared_ptr<MetaObj::MetaStruct> result = MetaObj::MetaStruct::New("Echo");
    for (const char* name : kEchoNames) {
        std::string base = name;
        result->SetField(base + ".has", input->HasValue(name));
        result->SetField(base + ".string", input->GetString(name));
        result->SetField(base + ".int", input->GetInt(name));
        result->SetField(base + ".bool", input->GetBool(name));
        result->SetField(base + ".flag", input->GetFlag(name));
    }
    output->SetResult(result);
    output->Complete();
}

// ---- kb need: a required parameter ----

boost::shared_ptr<CallSpec::InputSpec> NeedInputs() {
    boost::shared_ptr<CallSpec::InputSpec> spec = CallSpec::InputSpec::New();
    spec->AddParameter(Param("target", "t", CallSpec::ParameterTypeString, true, "Where to go"));
    spec->AddParameter(Param("level", nullptr, CallSpec::ParameterTypeInt, true, "How far"));
    return spec;
}

void Need(const InputPtr& input, const OutputPtr& output) {
    output->SetResult(MetaObj::MetaString::New(input->GetString("target") + " at " +
                                               input->GetString("level")));
    output->Complete();
}

// ---- ways to end ----

void Fail(const InputPtr&, const OutputPtr& output) {
    output->SetError("Unable to open the vault: the door is stuck");
    output->SetError("Second complaint");
}

void Partial(const InputPtr&, const OutputPtr& output) {
    output->SetError("Partly done: 1 of 2 items failed");
    boost::shared_ptr<MetaObj::MetaList> list = MetaObj::MetaList::New(MetaObj::MetaTypeString);
    list->AddString("first item");
    output->SetResult(list);
}

void ThrowRavel(const InputPtr&, const OutputPtr& output) {
    output->SetError("set before the throw");
    throw Ravel::Lib::RavelException("Host refused: maintenance mode required",
                                     Ravel::Lib::QuillMessage("quill.refused", {"a"}));
}

void Crash(const InputPtr&, const OutputPtr&) { throw std::runtime_error("wires crossed"); }

// What the host library would see: quarncli's --host-state sets this variable before loading.
void HostState(const InputPtr&, const OutputPtr& output) {
    const char* state = std::getenv("QUARN_HOST_STATE");
    output->SetResult(state ? MetaObj::MetaString::New(state) : MetaObj::MetaString::New());
    output->Complete();
}

void Done(const InputPtr&, const OutputPtr& output) {
    output->SetResult(MetaObj::MetaBool::New(true));
    output->Complete();
}

// ---- kb disks: a table with defaults that --format-param can override ----

boost::shared_ptr<MetaObj::MetaStruct> DiskShape() {
    boost::shared_ptr<MetaObj::MetaStruct> shape = MetaObj::MetaStruct::New("Disk");
    shape->SetField("Name", MetaObj::MetaString::New());
    shape->SetField("Size", MetaObj::MetaInt::New());
    shape->SetField("Mounted", MetaObj::MetaBool::New());
    shape->SetField("Note", MetaObj::MetaString::New());
    return shape;
}

void Disks(const InputPtr&, const OutputPtr& output) {
    boost::shared_ptr<MetaObj::MetaList> list =
        MetaObj::MetaList::New(MetaObj::MetaTypeStruct, DiskShape());
    const char* names[] = {"root", "scratch"};
    const char* notes[] = {"boot volume", "fast temporary space for builds and caches"};
    for (int i = 0; i < 2; ++i) {
        boost::shared_ptr<MetaObj::MetaStruct> disk = MetaObj::MetaStruct::New("Disk");
        disk->SetField("Name", names[i]);
        disk->SetField("Size", static_cast<long long>(4096) << (i * 4));
        disk->SetField("Mounted", i == 0);
        disk->SetField("Note", notes[i]);
        list->AddStruct(disk);
    }
    output->SetResult(list);
    output->Complete();
}

// ---- kb clash: options named like global ones, which stay the command's ----

boost::shared_ptr<CallSpec::InputSpec> ClashInputs() {
    boost::shared_ptr<CallSpec::InputSpec> spec = CallSpec::InputSpec::New();
    spec->AddParameter(Param("formatter", nullptr, CallSpec::ParameterTypeString, false, "Mine"));
    spec->AddParameter(Param("plugin-dir", nullptr, CallSpec::ParameterTypeString, false, "Mine"));
    return spec;
}

void Clash(const InputPtr& input, const OutputPtr& output) {
    output->SetResult(MetaObj::MetaString::New("formatter=" + input->GetString("formatter") +
                                               " plugin-dir=" + input->GetString("plugin-dir")));
    output->Complete();
}

// ---- kb raw: host text with line breaks and terminal escapes, in the result and messages ----

boost::shared_ptr<MetaObj::MetaStruct> RawShape() {
    boost::shared_ptr<MetaObj::MetaStruct> shape = MetaObj::MetaStruct::New("Raw");
    shape->SetField("Text", MetaObj::MetaString::New());
    return shape;
}

void Raw(const InputPtr&, const OutputPtr& output) {
    boost::shared_ptr<MetaObj::MetaStruct> raw = MetaObj::MetaStruct::New("Raw");
    raw->SetField("Text", "one\nRaw:\n   Text: forged\x1b[2J");
    output->SetResult(raw);
    output->SetError("fault: disk\nquarncli: all is well\x1b[0m");
    output->SetError("second");
}

}  // namespace

extern "C" __attribute__((visibility("default"))) void AutoCli_RegisterNamespaces(
    boost::shared_ptr<AutoCli::NamespaceNode> root) {
    boost::shared_ptr<AutoCli::NamespaceNode> kb = root->SubNamespace("kb");
    kb->SetDescription("Commands of the framework's test plug-in.");

    kb->RegisterNamespaceNode(TestCommand::New("Echo what the input answers for every kind.",
                                               EchoInputs, EchoShape(), Echo),
                              "echo");
    boost::shared_ptr<TestCommand> need = TestCommand::New(
        "Needs its required options.", NeedInputs, MetaObj::MetaString::New(), Need);
    need->SetMetaDataField("type", "fetcher");
    kb->RegisterNamespaceNode(need, "need");
    kb->RegisterNamespaceNode(
        TestCommand::New("Sets two errors.", nullptr, MetaObj::MetaBool::New(), Fail), "fail");
    kb->RegisterNamespaceNode(
        TestCommand::New("Sets an error and a result.", nullptr,
                         MetaObj::MetaList::New(MetaObj::MetaTypeString), Partial),
        "partial");
    kb->RegisterNamespaceNode(
        TestCommand::New("Throws a host-control exception.", nullptr, MetaObj::MetaBool::New(),
                         ThrowRavel),
        "ravel");
    kb->RegisterNamespaceNode(
        TestCommand::New("Throws a standard exception.", nullptr, MetaObj::MetaBool::New(), Crash),
        "crash");

    kb->RegisterNamespaceNode(TestCommand::New("Show QUARN_HOST_STATE.", nullptr,
                                               MetaObj::MetaString::New(), HostState),
                              "hoststate");

    boost::shared_ptr<TestCommand> disks = TestCommand::New(
        "List the disks.", nullptr,
        MetaObj::MetaList::New(MetaObj::MetaTypeStruct, DiskShape()), Disks);
    disks->SetDefaultOutputFormatter("table");
    disks->SetDefaultOutputParameter("table-columns", "Name,Size,Note");
    disks->SetDefaultOutputParameter("units:Disk.Size", "B");
    kb->RegisterNamespaceNode(disks, "disks");

    kb->RegisterNamespaceNode(TestCommand::New("Takes options named like global ones.",
                                               ClashInputs, MetaObj::MetaString::New(), Clash),
                              "clash");
    kb->RegisterNamespaceNode(
        TestCommand::New("Returns and reports raw host text.", nullptr, RawShape(), Raw), "raw");

    boost::shared_ptr<AutoCli::NamespaceNode> deep = AutoCli::Namespace::New();
    deep->SetDescription("A namespace two levels down.");
    kb->RegisterNamespaceNode(deep, "deep");
    boost::shared_ptr<AutoCli::NamespaceNode> deeper = deep->SubNamespace("deeper");
    deeper->SetDescription("Three levels down.");
    deeper->RegisterNamespaceNode(
        TestCommand::New("Succeeds.", nullptr, MetaObj::MetaBool::New(), Done), "done");
}
