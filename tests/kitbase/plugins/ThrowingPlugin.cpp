// A plug-in whose registration attaches a namespace and then throws.
#include <kitbase/AutoCli.h>

#include <stdexcept>

extern "C" __attribute__((visibility("default"))) void AutoCli_RegisterNamespaces(
    boost::shared_ptr<Kitbase::AutoCli::NamespaceNode> root) {
    root->SubNamespace("half")->SetDescription("Registered before the failure.");
    throw std::runtime_error("registration broke halfway");
}
