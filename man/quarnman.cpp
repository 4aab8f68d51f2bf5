// quarnman: writes the manual pages from what the programs say of themselves, so the pages
// cannot drift from the programs.
//
//   quarnman cli SCHEMA HELP          quarncli(1): synopsis, global options, exit status, files
//   quarnman reference SCHEMA         quarncli-NAME(1): every command below the namespace NAME
//   quarnman host HELP...             quarnhost(1): the general help, then each subcommand's
//
// SCHEMA is the output of `quarncli --schema NAME`, HELP the output of a program's --help. The
// page goes to standard output; a file that cannot be read or parsed is one line on standard
// error and exit status 1.
#include <nlohmann/json.hpp>

#include <cctype>
#include <fstream>
#include <iostream>
#include <sstream>
#include <string>
#include <vector>

namespace {

using nlohmann::json;

const char kDate[] = "2026";
const char kSource[] = "quarn";

std::string ReadFile(const std::string& path) {
    std::ifstream in(path, std::ios::binary);
    if (!in) throw std::runtime_error("cannot read " + path);
    std::ostringstream text;
    text << in.rdbuf();
    return text.str();
}

// Text as a roff line: backslashes written as \e, a line that would start with a control
// character (. or ') made plain with \&, and break points after / and |.
std::string Roff(const std::string& text) {
    std::string out;
    bool lineStart = true;
    for (char c : text) {
        if (lineStart && (c == '.' || c == '\'')) out += "\\&";
        if (c == '\\') {
            out += "\\e";
        } else if (c == '-') {
            out += "\\-";
        } else {
            out += c;
            // Long formats (user/auth-hash|...) may break after a separator.
            if (c == '/' || c == '|') out += "\\:";
        }
        lineStart = c == '\n';
    }
    return out;
}

void Header(std::ostream& out, const std::string& name, const std::string& summary) {
    std::string upper;
    for (char c : name) upper += static_cast<char>(std::toupper(static_cast<unsigned char>(c)));
    out << ".TH " << upper << " 1 \"" << kDate << "\" \"" << kSource << "\" \"User Commands\"\n"
        // Left-aligned and unhyphenated: help texts hold long formats and option names.
        << ".ad l\n.nh\n"
        << ".SH NAME\n" << Roff(name) << " \\- " << Roff(summary) << "\n";
}

// Text shown as it is (a program's own help).
void Verbatim(std::ostream& out, const std::string& text) {
    out << ".nf\n" << Roff(text);
    if (!text.empty() && text.back() != '\n') out << '\n';
    out << ".fi\n";
}

bool IsPlainWord(const std::string& word) {
    for (char c : word) {
        if (!std::islower(static_cast<unsigned char>(c)) && c != '-') return false;
    }
    return !word.empty();
}

std::string KindWord(const std::string& kind) {
    if (kind == "flag") return "";
    return " <" + kind + ">";
}

void Command(std::ostream& out, const json& node) {
    out << ".SS " << Roff(node.value("path", "")) << "\n";
    out << Roff(node.value("description", "")) << "\n";
    const json& parameters = node["parameters"];
    if (parameters.is_array() && !parameters.empty()) {
        out << ".RS\n";
        for (const json& p : parameters) {
            out << ".TP\n\\fB";
            if (p["short"].is_string()) out << "\\-" << Roff(p["short"].get<std::string>()) << ", ";
            out << "\\-\\-" << Roff(p.value("name", "")) << "\\fR"
                << Roff(KindWord(p.value("kind", ""))) << "\n";
            std::string help = p.value("help", "");
            if (p.value("required", false)) help += " (required)";
            out << Roff(help) << "\n";
        }
        out << ".RE\n";
    }
}

void Walk(std::ostream& out, const json& node) {
    if (node.value("kind", "") == "command") {
        Command(out, node);
        return;
    }
    // A namespace is listed with what it is for, then what it holds.
    out << ".SS " << Roff(node.value("path", "")) << "\n\\fI"
        << Roff(node.value("description", "")) << "\\fR\n";
    if (node.contains("children")) {
        for (const json& child : node["children"]) Walk(out, child);
    }
}

// Every namespace below node with its description, for the overview.
void Namespaces(std::ostream& out, const json& node) {
    if (node.value("kind", "") != "namespace") return;
    out << ".TP\n\\fB" << Roff(node.value("path", "")) << "\\fR\n"
        << Roff(node.value("description", "")) << "\n";
    for (const json& child : node["children"]) Namespaces(out, child);
}

int Cli(const std::string& schemaPath, const std::string& helpPath) {
    json schema = json::parse(ReadFile(schemaPath));
    std::string help = ReadFile(helpPath);
    std::string top = schema.value("name", "system");
    std::ostream& out = std::cout;
    Header(out, "quarncli", "administer a host from the command line");
    out << ".SH SYNOPSIS\n\\fBquarncli\\fR [\\fIglobal options\\fR] \\fInamespace\\fR ... "
           "\\fIcommand\\fR [\\fIoptions\\fR]\n"
        << ".SH DESCRIPTION\n"
        << "quarncli runs the commands its plug-ins register in one tree of namespaces. Naming a "
           "namespace lists what it holds; naming a command runs it against the host and prints "
           "its result with a formatter. Every command and option is described in "
           "\\fBquarncli\\-" << Roff(top) << "\\fR(1).\n"
        << ".SH USAGE\n";
    Verbatim(out, help);
    out << ".SH NAMESPACES\n";
    Namespaces(out, schema);
    out << ".SH EXIT STATUS\n"
        << ".TP\n0\nThe command succeeded (or the listing or help was shown).\n"
        << ".TP\n1\nThe command failed; its message is on standard error.\n"
        << ".TP\n2\nThe command line was wrong (unknown word or option, refused value).\n"
        << ".SH ENVIRONMENT\n.TP\nQUARN_HOST_STATE\nThe simulated host's state directory "
           "(\\-\\-host\\-state overrides it).\n"
        << ".TP\nCOLUMNS\nThe width tables and help fit when standard output is no terminal.\n"
        << ".SH FILES\n.TP\n\\fI/usr/lib/quarncli/plugins/\\fR\nThe plug-ins loaded by default "
           "(lib/quarncli/plugins beside the program's bin/).\n"
        << ".TP\n\\fI~/.local/state/quarncli/host\\fR\nThe default simulated host.\n"
        << ".SH SEE ALSO\n\\fBquarncli\\-" << Roff(top) << "\\fR(1), \\fBquarnhost\\fR(1)\n";
    return 0;
}

int Reference(const std::string& schemaPath) {
    json schema = json::parse(ReadFile(schemaPath));
    std::string top = schema.value("name", "system");
    std::ostream& out = std::cout;
    Header(out, "quarncli-" + top, "the commands of the \"" + top + "\" namespace");
    out << ".SH SYNOPSIS\n\\fBquarncli\\fR [\\fIglobal options\\fR] \\fB" << Roff(top)
        << "\\fR \\fInamespace\\fR ... \\fIcommand\\fR [\\fIoptions\\fR]\n"
        << ".SH DESCRIPTION\n" << Roff(schema.value("description", "")) << "\n"
        << ".SH COMMANDS\n";
    for (const json& child : schema["children"]) Walk(out, child);
    out << ".SH SEE ALSO\n\\fBquarncli\\fR(1)\n";
    return 0;
}

int Host(const std::vector<std::string>& helpPaths) {
    std::ostream& out = std::cout;
    Header(out, "quarnhost", "create, inspect and fault the simulated host");
    out << ".SH SYNOPSIS\n\\fBquarnhost\\fR [\\fIoptions\\fR] \\fIsubcommand\\fR "
           "[\\fIoptions\\fR]\n.SH DESCRIPTION\n";
    for (std::size_t i = 0; i < helpPaths.size(); ++i) {
        std::string text = ReadFile(helpPaths[i]);
        if (i == 1) out << ".SH SUBCOMMANDS\n";
        if (i > 0) {
            // "Usage: quarnhost fault add [OPTIONS] ..." names the subcommand: its words are
            // the lower-case ones up to the first other one.
            std::string::size_type at = text.find("Usage: ");
            std::string name;
            if (at != std::string::npos) {
                std::istringstream words(text.substr(at + 7));
                std::string word;
                while (words >> word && IsPlainWord(word)) name += (name.empty() ? "" : " ") + word;
            }
            out << ".SS " << Roff(name) << "\n";
        }
        Verbatim(out, text);
    }
    out << ".SH SEE ALSO\n\\fBquarncli\\fR(1)\n";
    return 0;
}

}  // namespace

int main(int argc, char** argv) {
    std::vector<std::string> args(argv + 1, argv + argc);
    try {
        if (args.size() == 3 && args[0] == "cli") return Cli(args[1], args[2]);
        if (args.size() == 2 && args[0] == "reference") return Reference(args[1]);
        if (args.size() >= 2 && args[0] == "host") {
            return Host(std::vector<std::string>(args.begin() + 1, args.end()));
        }
    } catch (const std::exception& e) {
        std::cerr << "quarnman: " << e.what() << "\n";
        return 1;
    }
    std::cerr << "usage: quarnman cli SCHEMA HELP | reference SCHEMA | host HELP...\n";
    return 2;
}
