// Schema output: the command tree as indented JSON.
#include "engine/Schema.h"

#include "engine/Format.h"
#include "engine/OptionParser.h"
#include "engine/Text.h"

#include <kitbase/CallSpec.h>
#include <kitbase/MetaObj.h>

namespace Kitbase {
namespace Engine {
namespace {

using MetaObj::MetaList;
using MetaObj::MetaObject;
using MetaObj::MetaStruct;

// Indented JSON, written as it is built: every member and element on its own line.
class JsonBuilder {
public:
    explicit JsonBuilder(Writer& out) : out_(out), pendingKey_(false) {}

    void BeginObject() { Open('{'); }
    void EndObject() { Close('}'); }
    void BeginArray() { Open('['); }
    // An array of scalars kept on one line: ["a", "b"].
    void BeginInlineArray() {
        Separate();
        out_.Put('[');
        inline_ = true;
        inlineCount_ = 0;
    }
    void EndInlineArray() {
        out_.Put(']');
        inline_ = false;
    }
    void EndArray() { Close(']'); }

    void Key(const std::string& key) {
        Separate();
        PutJsonString(out_, key);
        out_.Put(": ", 2);
        pendingKey_ = true;
    }
    void String(const std::string& value) {
        Separate();
        PutJsonString(out_, value);
    }
    void Int(long long value) {
        Separate();
        out_.PutInt(value);
    }
    void Bool(bool value) {
        Separate();
        out_.PutText(value ? "true" : "false");
    }
    void Null() {
        Separate();
        out_.Put("null", 4);
    }
    // A string member, or null when value is empty and emptyIsNull is set.
    void Member(const std::string& key, const std::string& value, bool emptyIsNull = false) {
        Key(key);
        if (emptyIsNull && value.empty()) {
            Null();
        } else {
            String(value);
        }
    }

private:
    // Before a value: the comma and line break that separate it from the previous one, unless
    // it follows its key.
    void Separate() {
        if (inline_) {
            if (inlineCount_++ > 0) out_.Put(", ", 2);
            return;
        }
        if (pendingKey_) {
            pendingKey_ = false;
            return;
        }
        if (counts_.empty()) return;
        if (counts_.back()++ > 0) out_.Put(',');
        out_.Put('\n');
        out_.PutRepeat(' ', 2 * counts_.size());
    }
    void Open(char bracket) {
        Separate();
        out_.Put(bracket);
        counts_.push_back(0);
    }
    void Close(char bracket) {
        bool empty = counts_.back() == 0;
        counts_.pop_back();
        if (!empty) {
            out_.Put('\n');
            out_.PutRepeat(' ', 2 * counts_.size());
        }
        out_.Put(bracket);
    }

    Writer& out_;
    std::vector<std::size_t> counts_;  // members written so far, per open object or array
    bool pendingKey_;
    bool inline_ = false;
    std::size_t inlineCount_ = 0;
};

void WriteStructShape(JsonBuilder& json, const MetaStruct& shape);

// The "of" member of a list: its element structure, or {"kind": <scalar kind>}.
void WriteListOf(JsonBuilder& json, const MetaList& list) {
    json.Key("of");
    if (list.GetTemplate()) {
        WriteStructShape(json, *list.GetTemplate());
        return;
    }
    json.BeginObject();
    json.Member("kind", MetaKindName(list.GetElementType()));
    json.EndObject();
}

void WriteStructShape(JsonBuilder& json, const MetaStruct& shape) {
    json.BeginObject();
    json.Member("kind", "struct");
    json.Member("name", shape.GetName());
    json.Key("fields");
    json.BeginArray();
    const std::vector<MetaStruct::Field>& fields = shape.GetFields();
    for (std::size_t i = 0; i < fields.size(); ++i) {
        const MetaObject& value = *fields[i].second;
        json.BeginObject();
        json.Member("name", fields[i].first);
        if (value.GetType() != MetaObj::MetaTypeList) {
            json.Member("kind", MetaKindName(value.GetType()));
        } else if (static_cast<const MetaList&>(value).GetElementType() ==
                   MetaObj::MetaTypeString) {
            json.Member("kind", "string-list");
        } else {
            // Lists of structures or of other scalars: the list form, as for a whole result.
            json.Member("kind", "list");
            WriteListOf(json, static_cast<const MetaList&>(value));
        }
        json.EndObject();
    }
    json.EndArray();
    json.EndObject();
}

void WriteShape(JsonBuilder& json, const MetaObject& shape) {
    if (shape.GetType() == MetaObj::MetaTypeStruct) {
        WriteStructShape(json, static_cast<const MetaStruct&>(shape));
        return;
    }
    json.BeginObject();
    json.Member("kind", MetaKindName(shape.GetType()));
    if (shape.GetType() == MetaObj::MetaTypeList) {
        WriteListOf(json, static_cast<const MetaList&>(shape));
    }
    json.EndObject();
}

void WriteParameters(JsonBuilder& json, const CallSpec::InputSpec& spec) {
    json.BeginArray();
    const std::vector<boost::shared_ptr<CallSpec::ParameterSpec> >& parameters =
        spec.GetParameters();
    for (std::size_t i = 0; i < parameters.size(); ++i) {
        const CallSpec::ParameterSpec& parameter = *parameters[i];
        json.BeginObject();
        json.Member("name", parameter.GetName());
        json.Member("short", parameter.GetShortName(), true);
        json.Member("kind", KindName(parameter.GetType()));
        json.Key("required");
        json.Bool(parameter.IsRequired());
        json.Member("help", parameter.GetHelp());
        json.Key("constraints");
        json.BeginArray();
        const std::vector<boost::shared_ptr<CallSpec::ParameterConstraint> >& constraints =
            parameter.GetConstraints();
        for (std::size_t c = 0; c < constraints.size(); ++c) {
            json.BeginObject();
            if (constraints[c]->GetType() == CallSpec::ConstraintIntRange) {
                json.Member("kind", "int-range");
                json.Key("min");
                json.Int(constraints[c]->GetLow());
                json.Key("max");
                json.Int(constraints[c]->GetHigh());
            } else {
                json.Member("kind", "regex");
                json.Member("pattern", constraints[c]->GetPattern());
            }
            json.EndObject();
        }
        json.EndArray();
        json.EndObject();
    }
    json.EndArray();
}

void WriteCommand(JsonBuilder& json, AutoCli::Command& command) {
    json.Key("metadata");
    json.BeginObject();
    const std::vector<AutoCli::Command::KeyValue>& metadata = command.GetMetaData();
    for (std::size_t i = 0; i < metadata.size(); ++i) {
        json.Member(metadata[i].first, metadata[i].second);
    }
    json.EndObject();
    json.Member("formatter", command.GetDefaultOutputFormatter(), true);
    json.Key("output_params");
    json.BeginArray();
    const std::vector<AutoCli::Command::KeyValue>& params = command.GetDefaultOutputParameters();
    for (std::size_t i = 0; i < params.size(); ++i) {
        json.BeginInlineArray();
        json.String(params[i].first);
        json.String(params[i].second);
        json.EndInlineArray();
    }
    json.EndArray();
    json.Key("parameters");
    WriteParameters(json, *command.GetInputSpec());
    json.Key("output");
    boost::shared_ptr<MetaObject> shape = command.GetOutputSpec()->GetResultTemplate();
    if (shape) {
        WriteShape(json, *shape);
    } else {
        json.Null();
    }
}

void WriteNode(JsonBuilder& json, const boost::shared_ptr<AutoCli::NamespaceNode>& node,
               std::vector<std::string>& path) {
    json.BeginObject();
    json.Member("name", path.empty() ? std::string() : path.back());
    json.Member("path", JoinWords(path));
    boost::shared_ptr<AutoCli::Command> command =
        node->IsCommand() ? boost::dynamic_pointer_cast<AutoCli::Command>(node)
                          : boost::shared_ptr<AutoCli::Command>();
    json.Member("kind", command ? "command" : "namespace");
    json.Member("description", node->GetDescription());
    if (command) {
        WriteCommand(json, *command);
    } else {
        json.Key("children");
        json.BeginArray();
        const std::vector<AutoCli::NamespaceNode::Child>& children = node->GetChildren();
        for (std::size_t i = 0; i < children.size(); ++i) {
            path.push_back(children[i].first);
            WriteNode(json, children[i].second, path);
            path.pop_back();
        }
        json.EndArray();
    }
    json.EndObject();
}

}  // namespace

void WriteSchema(Writer& out, const boost::shared_ptr<AutoCli::NamespaceNode>& node,
                 const std::vector<std::string>& path) {
    JsonBuilder json(out);
    std::vector<std::string> words = path;
    WriteNode(json, node, words);
    out.Put('\n');
}

}  // namespace Engine
}  // namespace Kitbase
