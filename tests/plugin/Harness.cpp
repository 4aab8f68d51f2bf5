#include "Harness.h"

#include <norlithctl/RavelException.h>
#include <norlithctl/Testing.h>
#include <simhost/Trace.h>

#include <gtest/gtest.h>

#include <sstream>
#include <stdexcept>

namespace plugintest {

void* Plugin() {
    static void* handle = dlopen(SYSTEM_PLUGIN, RTLD_NOW | RTLD_LOCAL);
    return handle;
}
namespace {

using Kitbase::AutoCli::NamespaceNode;

void Collect(const boost::shared_ptr<NamespaceNode>& node, const std::string& path,
             std::vector<std::string>& paths) {
    if (node->IsCommand()) paths.push_back(path);
    for (const NamespaceNode::Child& child : node->GetChildren())
        Collect(child.second, path + " " + child.first, paths);
}

std::vector<FaultCase>& Registry() {
    static std::vector<FaultCase> cases;
    return cases;
}

}  // namespace

boost::shared_ptr<NamespaceNode> BuildTree() {
    boost::shared_ptr<NamespaceNode> root = Kitbase::AutoCli::Namespace::New();
    AutoCli_RegisterNamespaces(root);
    return root;
}

CommandPtr FindCommand(const std::string& path) {
    boost::shared_ptr<NamespaceNode> node = BuildTree();
    std::istringstream words(path);
    std::string word;
    while (words >> word) {
        node = node->GetChild(word);
        if (!node) throw std::invalid_argument("no node at '" + path + "'");
    }
    CommandPtr command = boost::dynamic_pointer_cast<Kitbase::AutoCli::Command>(node);
    if (!command) throw std::invalid_argument("'" + path + "' is not a command");
    return command;
}

std::vector<std::string> CommandPaths(boost::shared_ptr<NamespaceNode> root) {
    std::vector<std::string> paths;
    boost::shared_ptr<NamespaceNode> system = (root ? root : BuildTree())->GetChild("system");
    Collect(system, "system", paths);
    return paths;
}

Run Execute(const CommandPtr& command, const InputPtr& input) {
    Run run;
    run.output = Kitbase::CallSpec::Output::New();
    long before = NorlithCtl::Testing::LiveObjects();
    try {
        command->Execute(input ? input : Kitbase::CallSpec::Input::New(), run.output);
    } catch (const Ravel::Lib::RavelException& error) {
        run.escaped = true;
        run.exception = error.GetMessage(0);
    } catch (const std::exception& error) {
        run.escaped = true;
        run.exception = error.what();
    }
    run.leaked = NorlithCtl::Testing::LiveObjects() - before;
    return run;
}

Run ExecuteClean(const CommandPtr& command,
                 const std::function<void(Kitbase::CallSpec::Input&)>& fill) {
    InputPtr input = Kitbase::CallSpec::Input::New();
    if (fill) fill(*input);
    simhost::trace::Take();
    Run run = Execute(command, input);
    EXPECT_FALSE(run.escaped) << run.exception;
    EXPECT_EQ(run.leaked, 0);
    return run;
}

const std::vector<FaultCase>& FaultCases() { return Registry(); }

bool RegisterFaultCase(FaultCase fault_case) {
    Registry().push_back(std::move(fault_case));
    return true;
}

}  // namespace plugintest
