// A plug-in that fails in two ways: one of its commands cannot build its parameters, and its
// registration throws after attaching that much.
#include <kitbase/AutoCli.h>

#include <stdexcept>

namespace {

class BrokenSpec : public Kitbase::AutoCli::Command {
public:
    static boost::shared_ptr<BrokenSpec> New() {
        return boost::shared_ptr<BrokenSpec>(new BrokenSpec());
    }
    boost::shared_ptr<Kitbase::CallSpec::InputSpec> GetInputSpecInternal() {
        throw std::logic_error("no parameters today");
    }
    boost::shared_ptr<Kitbase::CallSpec::OutputSpec> GetOutputSpecInternal() {
        return Kitbase::CallSpec::OutputSpec::New();
    }
    void ExecuteInternal(const boost::shared_ptr<Kitbase::CallSpec::Input>&,
                         const boost::shared_ptr<Kitbase::CallSpec::Output>&) {}

private:
    BrokenSpec() { SetDescription("Cannot describe its parameters."); }
};

}  // namespace

extern "C" __attribute__((visibility("default"))) void AutoCli_RegisterNamespaces(
    boost::shared_ptr<Kitbase::AutoCli::NamespaceNode> root) {
    boost::shared_ptr<Kitbase::AutoCli::NamespaceNode> half = root->SubNamespace("half");
    half->SetDescription("Registered before the failure.");
    half->RegisterNamespaceNode(BrokenSpec::New(), "broken");
    throw std::runtime_error("registration broke halfway");
}
