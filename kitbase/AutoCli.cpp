// The command tree: namespaces, commands and their attachment.
#include <kitbase/AutoCli.h>

#include "engine/Text.h"

#include <stdexcept>

namespace Kitbase {
namespace AutoCli {

namespace {

// A child name is one command-line word: not empty, no white space, and not starting with a dash
// (it would be read as an option).
void CheckChildName(const std::string& name) {
    if (name.empty()) throw std::invalid_argument("a tree node cannot have an empty name");
    if (name[0] == '-') {
        throw std::invalid_argument("tree node name '" + name + "' starts with a dash");
    }
    for (std::string::size_type i = 0; i < name.size(); ++i) {
        unsigned char c = static_cast<unsigned char>(name[i]);
        if (c <= ' ' || c == 0x7f) {
            throw std::invalid_argument("tree node name '" + name +
                                        "' contains a blank or control character");
        }
    }
}

// Whether target is node itself or lies below it; guards the tree against cycles.
bool Reaches(const NamespaceNode* node, const NamespaceNode* target) {
    if (node == target) return true;
    const std::vector<NamespaceNode::Child>& children = node->GetChildren();
    for (std::size_t i = 0; i < children.size(); ++i) {
        if (Reaches(children[i].second.get(), target)) return true;
    }
    return false;
}

}  // namespace

NamespaceNode::~NamespaceNode() {}

void NamespaceNode::SetDescription(const std::string& text) { description_ = text; }

boost::shared_ptr<NamespaceNode> NamespaceNode::SubNamespace(const std::string& name) {
    boost::shared_ptr<NamespaceNode> existing = GetChild(name);
    if (existing) {
        if (existing->IsCommand()) {
            throw std::invalid_argument("'" + name + "' is a command, not a namespace");
        }
        return existing;
    }
    boost::shared_ptr<NamespaceNode> created = Namespace::New();
    RegisterNamespaceNode(created, name);
    return created;
}

void NamespaceNode::RegisterNamespaceNode(const boost::shared_ptr<NamespaceNode>& child,
                                          const std::string& name) {
    CheckChildName(name);
    if (!child) throw std::invalid_argument("null node attached as '" + name + "'");
    if (IsCommand()) {
        throw std::invalid_argument("cannot attach '" + name + "' below a command");
    }
    if (GetChild(name)) {
        throw std::invalid_argument("a child named '" + name + "' is already attached");
    }
    if (Reaches(child.get(), this)) {
        throw std::invalid_argument("attaching '" + name + "' would make the tree a cycle");
    }
    children_.push_back(Child(name, child));
}

boost::shared_ptr<NamespaceNode> NamespaceNode::GetChild(const std::string& name) const {
    for (std::size_t i = 0; i < children_.size(); ++i) {
        if (children_[i].first == name) return children_[i].second;
    }
    return boost::shared_ptr<NamespaceNode>();
}

boost::shared_ptr<Namespace> Namespace::New() {
    return boost::shared_ptr<Namespace>(new Namespace());
}

Namespace::~Namespace() {}

// ---- commands ----

Command::~Command() {}

// A command that hands back no parameter list is treated as one without parameters, and one
// without a result shape as one whose result has no template.
boost::shared_ptr<CallSpec::InputSpec> Command::GetInputSpec() {
    boost::shared_ptr<CallSpec::InputSpec> spec = GetInputSpecInternal();
    return spec ? spec : CallSpec::InputSpec::New();
}

boost::shared_ptr<CallSpec::OutputSpec> Command::GetOutputSpec() {
    boost::shared_ptr<CallSpec::OutputSpec> spec = GetOutputSpecInternal();
    return spec ? spec : CallSpec::OutputSpec::New();
}

void Command::Execute(const boost::shared_ptr<CallSpec::Input>& input,
                      const boost::shared_ptr<CallSpec::Output>& output) {
    if (!input || !output) throw std::invalid_argument("Execute without input or output");
    ExecuteInternal(input, output);
}

void Command::SetDefaultOutputFormatter(const std::string& name) { formatter_ = name; }

void Command::SetDefaultOutputParameter(const std::string& key, const std::string& value) {
    Engine::SetKey(output_params_, key, value);
}

void Command::SetMetaDataField(const std::string& key, const std::string& value) {
    Engine::SetKey(metadata_, key, value);
}

std::string Command::GetMetaDataField(const std::string& key) const {
    const std::string* value = Engine::FindKey(metadata_, key);
    return value ? *value : std::string();
}

}  // namespace AutoCli
}  // namespace Kitbase
