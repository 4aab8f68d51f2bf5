// Resolving the command words: from the root of the tree down to a namespace or a command.
//
// Words are matched exactly, case included, and stop at the first word that starts with '-' or
// at a command; the words left over are the command's (or namespace's) options. An unknown word
// is refused with one line naming the nearest children (or all of them). The resolved node is
// shared with the tree, which the plug-in set keeps alive.
#pragma once

#include <kitbase/AutoCli.h>

#include <boost/shared_ptr.hpp>

#include <string>
#include <vector>

namespace Kitbase {
namespace Cli {

struct Resolved {
    boost::shared_ptr<AutoCli::NamespaceNode> node;
    std::vector<std::string> path;  // the words that led to node
    std::vector<std::string> rest;  // the words after them
};

// words: the arguments after the leading global options. False with *error set (the unknown
// word's line) when a word names no child.
bool Resolve(const boost::shared_ptr<AutoCli::NamespaceNode>& root,
             const std::vector<std::string>& words, Resolved* resolved, std::string* error);

// The usage line's text after "Usage: " for the node at path.
std::string UsageText(const std::vector<std::string>& path, bool command);

}  // namespace Cli
}  // namespace Kitbase
