// The command tree: namespace nodes and commands.
//
// The framework owns one root NamespaceNode. Plug-ins extend the tree from their entry point
//   extern "C" void AutoCli_RegisterNamespaces(boost::shared_ptr<Kitbase::AutoCli::NamespaceNode>);
// by creating Namespace nodes and Command objects and attaching them under names; a node keeps
// its children in attachment order and shares ownership of them. Nodes are created by New() and
// must be owned by a boost::shared_ptr from the start (enable_shared_from_this).
//
// A Command is a leaf that describes itself (description, metadata, default formatter and its
// parameters) and executes through three hooks that every command class implements. Attaching two
// children under one name, or a name with blanks, is a programming error (std::invalid_argument).
#pragma once

#include <kitbase/CallSpec.h>
#include <kitbase/Export.h>
#include <kitbase/MetaObj.h>

#include <boost/enable_shared_from_this.hpp>
#include <boost/shared_ptr.hpp>

#include <string>
#include <utility>
#include <vector>

namespace Kitbase {
namespace AutoCli {

class KITBASE_API NamespaceNode : public boost::enable_shared_from_this<NamespaceNode> {
public:
    typedef std::pair<std::string, boost::shared_ptr<NamespaceNode> > Child;

    virtual ~NamespaceNode();

    virtual void SetDescription(const std::string& text);
    const std::string& GetDescription() const { return description_; }

    // The child namespace of that name; a new, empty namespace is created and attached when the
    // node has no such child yet.
    virtual boost::shared_ptr<NamespaceNode> SubNamespace(const std::string& name);
    virtual void RegisterNamespaceNode(const boost::shared_ptr<NamespaceNode>& child,
                                       const std::string& name);

    const std::vector<Child>& GetChildren() const { return children_; }
    // The child of that name, or null.
    boost::shared_ptr<NamespaceNode> GetChild(const std::string& name) const;
    virtual bool IsCommand() const { return false; }

protected:
    NamespaceNode() {}

private:
    NamespaceNode(const NamespaceNode&);
    NamespaceNode& operator=(const NamespaceNode&);

    std::string description_;
    std::vector<Child> children_;
};

// An inner node of the tree.
class KITBASE_API Namespace : public virtual NamespaceNode {
public:
    static boost::shared_ptr<Namespace> New();
    ~Namespace();

private:
    Namespace() {}
};

// The base of every command. GetInputSpec, GetOutputSpec and Execute are what the framework
// calls; they call the hooks in that order of slots.
class KITBASE_API Command : public virtual NamespaceNode {
public:
    typedef std::pair<std::string, std::string> KeyValue;

    virtual ~Command();

    virtual boost::shared_ptr<CallSpec::InputSpec> GetInputSpecInternal() = 0;
    virtual boost::shared_ptr<CallSpec::OutputSpec> GetOutputSpecInternal() = 0;
    virtual void ExecuteInternal(const boost::shared_ptr<CallSpec::Input>& input,
                                 const boost::shared_ptr<CallSpec::Output>& output) = 0;

    boost::shared_ptr<CallSpec::InputSpec> GetInputSpec();
    boost::shared_ptr<CallSpec::OutputSpec> GetOutputSpec();
    void Execute(const boost::shared_ptr<CallSpec::Input>& input,
                 const boost::shared_ptr<CallSpec::Output>& output);

    // Settings made by the command's constructor. Setting a key again replaces its value in place.
    void SetDefaultOutputFormatter(const std::string& name);
    void SetDefaultOutputParameter(const std::string& key, const std::string& value);
    void SetMetaDataField(const std::string& key, const std::string& value);

    const std::string& GetDefaultOutputFormatter() const { return formatter_; }  // "" when none
    const std::vector<KeyValue>& GetDefaultOutputParameters() const { return output_params_; }
    const std::vector<KeyValue>& GetMetaData() const { return metadata_; }
    // The metadata value of that key, or "".
    std::string GetMetaDataField(const std::string& key) const;

    bool IsCommand() const { return true; }

protected:
    Command() {}

private:
    std::string formatter_;
    std::vector<KeyValue> output_params_;
    std::vector<KeyValue> metadata_;
};

}  // namespace AutoCli
}  // namespace Kitbase

// The entry point every plug-in exports with C linkage.
typedef void (*AutoCli_RegisterNamespacesFn)(boost::shared_ptr<Kitbase::AutoCli::NamespaceNode>);
