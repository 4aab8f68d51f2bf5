// A plug-in with an entry point and nothing to register: what bench_startup_floor opens.
#include <boost/shared_ptr.hpp>

namespace Kitbase {
namespace AutoCli {
class NamespaceNode;
}
}  // namespace Kitbase

extern "C" __attribute__((visibility("default"))) void AutoCli_RegisterNamespaces(
    boost::shared_ptr<Kitbase::AutoCli::NamespaceNode>) {}
