// Command-word resolution and the unknown-word line.
#include "cli/Resolve.h"

#include "cli/Cli.h"
#include "engine/Text.h"

namespace Kitbase {
namespace Cli {

namespace {

std::string UnknownWord(const AutoCli::NamespaceNode& node, const std::vector<std::string>& path,
                        const std::string& word) {
    std::vector<std::string> names;
    for (const AutoCli::NamespaceNode::Child& child : node.GetChildren()) {
        names.push_back(child.first);
    }
    std::string where =
        path.empty() ? std::string() : " under '" + Engine::JoinWords(path) + "'";
    std::string message = "unknown command " + Engine::Quote(word) + where;
    if (names.empty()) {
        return message + (path.empty() ? "; no plug-in has registered any command"
                                       : "; it is empty");
    }
    std::vector<std::string> near = Engine::NearestNames(word, names);
    if (!near.empty()) {
        return message + "; did you mean " + Engine::JoinNames(Engine::QuoteEach(near), " or ") +
               "?";
    }
    return message + "; valid: " + Engine::JoinNames(names, " and ");
}

}  // namespace

bool Resolve(const boost::shared_ptr<AutoCli::NamespaceNode>& root,
             const std::vector<std::string>& words, Resolved* resolved, std::string* error) {
    boost::shared_ptr<AutoCli::NamespaceNode> node = root;
    std::size_t next = 0;
    resolved->path.clear();
    while (next < words.size() && !node->IsCommand() &&
           !(words[next].size() > 0 && words[next][0] == '-')) {
        boost::shared_ptr<AutoCli::NamespaceNode> child = node->GetChild(words[next]);
        if (!child) {
            *error = UnknownWord(*node, resolved->path, words[next]);
            return false;
        }
        resolved->path.push_back(words[next]);
        node = child;
        ++next;
    }
    resolved->node = node;
    resolved->rest.assign(words.begin() + static_cast<std::ptrdiff_t>(next), words.end());
    return true;
}

std::string UsageText(const std::vector<std::string>& path, bool command) {
    std::string usage = std::string(kProgramName) + " [global options]";
    if (!path.empty()) usage += " " + Engine::JoinWords(path);
    usage += command ? " [options]" : " <namespace|command> ... [options]";
    return usage;
}

}  // namespace Cli
}  // namespace Kitbase
