// Help text, listings and the terminal width.
#include "engine/Help.h"

#include "engine/OptionParser.h"
#include "engine/Text.h"

#include <kitbase/CallSpec.h>

#include <cstdlib>
#include <sys/ioctl.h>
#include <unistd.h>

namespace Kitbase {
namespace Engine {

std::size_t TerminalWidth(int fd) {
    struct winsize size;
    if (isatty(fd) && ioctl(fd, TIOCGWINSZ, &size) == 0 && size.ws_col > 0) return size.ws_col;
    const char* columns = std::getenv("COLUMNS");
    long long value = 0;
    if (columns != nullptr && ParseInt64(columns, &value) && value > 0 && value <= 100000) {
        return static_cast<std::size_t>(value);
    }
    return 80;
}

namespace {

const std::size_t kRowIndent = 2;
const std::size_t kMaxNameColumn = 28;  // longer names put their text on the next line
const std::size_t kMinTextWidth = 20;

void WriteParagraph(Writer& out, const std::string& text, std::size_t width) {
    std::vector<std::string> lines = WrapWords(text, width);
    for (std::size_t i = 0; i < lines.size(); ++i) {
        out.Put(lines[i]);
        out.Put('\n');
    }
}

}  // namespace

void WriteRows(Writer& out, const std::vector<HelpRow>& rows, std::size_t width) {
    std::size_t nameColumn = 0;
    for (std::size_t i = 0; i < rows.size(); ++i) {
        std::size_t w = DisplayWidth(rows[i].name);
        if (w <= kMaxNameColumn && w > nameColumn) nameColumn = w;
    }
    const std::size_t textColumn = kRowIndent + nameColumn + 2;
    const std::size_t textWidth =
        width > textColumn + kMinTextWidth ? width - textColumn : kMinTextWidth;
    for (std::size_t i = 0; i < rows.size(); ++i) {
        out.PutRepeat(' ', kRowIndent);
        out.Put(rows[i].name);
        std::size_t w = DisplayWidth(rows[i].name);
        if (rows[i].text.empty()) {
            out.Put('\n');
            continue;
        }
        std::vector<std::string> lines = WrapWords(rows[i].text, textWidth);
        std::size_t first = 0;
        if (w <= nameColumn) {
            out.PutRepeat(' ', textColumn - kRowIndent - w);
            out.Put(lines[0]);
            first = 1;
        }
        out.Put('\n');
        for (std::size_t l = first; l < lines.size(); ++l) {
            out.PutRepeat(' ', textColumn);
            out.Put(lines[l]);
            out.Put('\n');
        }
    }
}

void WriteNamespaceHelp(Writer& out, const AutoCli::NamespaceNode& node, const std::string& usage,
                        std::size_t width) {
    out.PutText("Usage: ");
    out.Put(usage);
    out.Put('\n');
    if (!node.GetDescription().empty()) {
        out.Put('\n');
        WriteParagraph(out, node.GetDescription(), width);
    }
    std::vector<HelpRow> namespaces, commands;
    const std::vector<AutoCli::NamespaceNode::Child>& children = node.GetChildren();
    for (std::size_t i = 0; i < children.size(); ++i) {
        HelpRow row = {children[i].first, children[i].second->GetDescription()};
        (children[i].second->IsCommand() ? commands : namespaces).push_back(row);
    }
    if (!namespaces.empty()) {
        out.PutText("\nAvailable namespaces:\n");
        WriteRows(out, namespaces, width);
    }
    if (!commands.empty()) {
        out.PutText("\nAvailable commands:\n");
        WriteRows(out, commands, width);
    }
    if (children.empty()) out.PutText("\nThis namespace is empty.\n");
}

namespace {

std::string ParameterText(const CallSpec::ParameterSpec& parameter) {
    std::string text = parameter.GetHelp();
    if (!text.empty() && text[text.size() - 1] != '.') text += '.';
    std::vector<std::string> notes;
    if (parameter.IsRequired()) notes.push_back("Required.");
    if (parameter.GetType() == CallSpec::ParameterTypeBool) {
        notes.push_back("Takes true, false, yes, no, 1 or 0.");
    } else if (parameter.GetType() == CallSpec::ParameterTypeFlag) {
        notes.push_back("Flag: takes no value.");
    }
    const std::vector<boost::shared_ptr<CallSpec::ParameterConstraint> >& constraints =
        parameter.GetConstraints();
    for (std::size_t i = 0; i < constraints.size(); ++i) {
        if (constraints[i]->GetType() == CallSpec::ConstraintIntRange) {
            notes.push_back("Range: " + std::to_string(constraints[i]->GetLow()) + " to " +
                            std::to_string(constraints[i]->GetHigh()) + ".");
        } else {
            notes.push_back("Must match: " + constraints[i]->GetPattern());
        }
    }
    for (std::size_t i = 0; i < notes.size(); ++i) {
        if (!text.empty()) text += ' ';
        text += notes[i];
    }
    return text;
}

}  // namespace

void WriteCommandHelp(Writer& out, const AutoCli::Command& command,
                      const CallSpec::InputSpec& spec, const std::string& usage,
                      std::size_t width) {
    out.PutText("Usage: ");
    out.Put(usage);
    out.Put('\n');
    if (!command.GetDescription().empty()) {
        out.Put('\n');
        WriteParagraph(out, command.GetDescription(), width);
    }
    const std::vector<boost::shared_ptr<CallSpec::ParameterSpec> >& parameters =
        spec.GetParameters();
    if (parameters.empty()) {
        out.PutText("\nThis command takes no options.\n");
        return;
    }
    std::vector<HelpRow> rows;
    for (std::size_t i = 0; i < parameters.size(); ++i) {
        const CallSpec::ParameterSpec& parameter = *parameters[i];
        HelpRow row;
        if (!parameter.GetShortName().empty()) row.name = "-" + parameter.GetShortName() + ", ";
        row.name += "--" + parameter.GetName();
        if (parameter.GetType() != CallSpec::ParameterTypeFlag) {
            row.name += std::string(" <") + KindName(parameter.GetType()) + ">";
        }
        row.text = ParameterText(parameter);
        rows.push_back(row);
    }
    out.PutText("\nOptions:\n");
    WriteRows(out, rows, width);
}

}  // namespace Engine
}  // namespace Kitbase
