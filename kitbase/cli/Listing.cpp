// Namespace listings: help-style text, or the children in a formatter.
#include "cli/Listing.h"

#include "cli/Cli.h"
#include "cli/Resolve.h"
#include "engine/Format.h"
#include "engine/FormatCheck.h"
#include "engine/Help.h"
#include "engine/Text.h"

#include <kitbase/MetaObj.h>

namespace Kitbase {
namespace Cli {

namespace {

using MetaObj::MetaList;
using MetaObj::MetaString;
using MetaObj::MetaStruct;

boost::shared_ptr<MetaStruct> ChildTemplate() {
    boost::shared_ptr<MetaStruct> child = MetaStruct::New("Child");
    child->SetField("Name", MetaString::New());
    child->SetField("Kind", MetaString::New());
    child->SetField("Description", MetaString::New());
    return child;
}

boost::shared_ptr<MetaList> Children(const AutoCli::NamespaceNode& node) {
    boost::shared_ptr<MetaList> list = MetaList::New(MetaObj::MetaTypeStruct, ChildTemplate());
    for (const AutoCli::NamespaceNode::Child& child : node.GetChildren()) {
        boost::shared_ptr<MetaStruct> row = MetaStruct::New("Child");
        row->SetField("Name", child.first);
        row->SetField("Kind", child.second->IsCommand() ? "command" : "namespace");
        row->SetField("Description", child.second->GetDescription());
        list->AddStruct(row);
    }
    return list;
}

void WriteGlobalOptions(Engine::Writer& out, std::size_t width) {
    std::vector<Engine::HelpRow> rows;
    for (const GlobalOptionInfo& entry : GlobalOptionTable()) {
        Engine::HelpRow row;
        if (entry.alias != nullptr) row.name = std::string(entry.alias) + ", ";
        row.name += entry.name;
        if (entry.placeholder != nullptr) row.name += std::string(" ") + entry.placeholder;
        row.text = entry.help;
        rows.push_back(row);
    }
    out.PutText("\nGlobal options (before or after the command words):\n");
    Engine::WriteRows(out, rows, width);
}

}  // namespace

int ListNamespace(Console& console, const AutoCli::NamespaceNode& node,
                  const std::vector<std::string>& path, const GlobalOptions& options) {
    boost::shared_ptr<MetaList> shape = MetaList::New(MetaObj::MetaTypeStruct, ChildTemplate());
    std::string error;
    if (!Engine::CheckFormatParams(options.formatParams, shape.get(), &error)) {
        console.Error(error);
        return console.Finish(kExitUsage);
    }
    std::size_t width = Engine::TerminalWidth(console.OutFd());
    if (!options.formatterSet) {
        Engine::WriteNamespaceHelp(console.Out(), node, UsageText(path, false), width);
        if (path.empty()) WriteGlobalOptions(console.Out(), width);
        return console.Finish(kExitOk);
    }
    Engine::FormatParams params(options.formatParams);
    boost::shared_ptr<MetaList> children = Children(node);
    Engine::RenderRequest request;
    request.result = children.get();
    request.resultTemplate = shape.get();
    request.params = &params;
    request.width = width;
    Engine::Render(options.formatter, request, console.Out());
    return console.Finish(kExitOk);
}

}  // namespace Cli
}  // namespace Kitbase
