// The schema writer behind `quarncli --schema [WORD...]`: the command tree below a node as JSON.
//
// Every node: name, path (words joined by one blank; "" for the root), kind ("namespace" or
// "command") and description; a namespace adds children in attachment order; a command adds
// metadata, formatter, output_params, parameters (with their constraints) and the shape of its
// output, taken from the command's InputSpec and OutputSpec. Those are built here, one command
// after the other; an exception a command throws while building them passes to the caller.
#pragma once

#include "engine/Writer.h"

#include <kitbase/AutoCli.h>
#include <kitbase/Export.h>

#include <boost/shared_ptr.hpp>

#include <string>
#include <vector>

namespace Kitbase {
namespace Engine {

// path: the words that lead to node (empty for the root); node's name is the last of them.
KITBASE_API void WriteSchema(Writer& out, const boost::shared_ptr<AutoCli::NamespaceNode>& node,
                             const std::vector<std::string>& path);

}  // namespace Engine
}  // namespace Kitbase
