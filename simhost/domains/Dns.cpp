// The naming rules of the DNS configuration: RFC 1123 host name labels, domains of such labels,
// and fully qualified names. Each refusal says what is wrong with the value and the rule.
#include <simhost/domains/Dns.h>

#include <util/Text.h>

#include <cstdio>

namespace simhost {
namespace dns {
namespace {

const char kHostRule[] =
    "a host name is 1 to 63 letters, digits and '-', not starting or ending with '-' (RFC 1123)";
const char kDomainRule[] =
    "a domain name is labels of 1 to 63 letters, digits and '-' (not starting or ending with "
    "'-') joined by dots, at most 253 characters in all";
const char kFqdnRule[] =
    "a fully qualified domain name is the host name and its domain joined by dots: at least two "
    "labels of 1 to 63 letters, digits and '-' (not starting or ending with '-'), at most 253 "
    "characters in all";

bool IsLabelCharacter(unsigned char c) {
    return (c >= 'a' && c <= 'z') || (c >= 'A' && c <= 'Z') || (c >= '0' && c <= '9') || c == '-';
}

// What is wrong with the characters of text (dots allowed or not), or "".
std::string CharacterProblem(const std::string& text, bool dots) {
    for (unsigned char c : text) {
        if (IsLabelCharacter(c) || (dots && c == '.')) continue;
        if (c < 0x20 || c == 0x7f) {
            char hex[8];
            std::snprintf(hex, sizeof hex, "\\x%02x", c);
            return std::string("it contains the control character ") + hex;
        }
        if (c == ' ') return "it contains a blank";
        if (c >= 0x80) return "it contains a character that is not ASCII";
        if (c == '.') return "it contains a dot; a host name is a single label, without its domain";
        return std::string("it contains '") + static_cast<char>(c) + "'";
    }
    return "";
}

// What is wrong with one label (its characters already checked), or "".
std::string LabelProblem(const std::string& label, const std::string& subject) {
    if (label.empty()) return subject + " is empty";
    if (label.size() > kLabelMax)
        return subject + " is " + std::to_string(label.size()) + " characters long";
    if (label.front() == '-') return subject + " starts with '-'";
    if (label.back() == '-') return subject + " ends with '-'";
    return "";
}

// What is wrong with dot-separated labels, at least `minimum` of them, or "".
std::string LabelsProblem(const std::string& text, std::size_t minimum) {
    if (text.empty()) return "it is empty";
    if (text.size() > kNameMax)
        return "it is " + std::to_string(text.size()) + " characters long";
    std::string problem = CharacterProblem(text, true);
    if (!problem.empty()) return problem;
    if (text.front() == '.' || text.back() == '.' || text.find("..") != std::string::npos)
        return "it has an empty label (a dot at the start or the end, or two dots in a row)";
    std::size_t count = 0;
    for (std::size_t start = 0; start <= text.size(); ++count) {
        std::size_t dot = text.find('.', start);
        if (dot == std::string::npos) dot = text.size();
        const std::string label = text.substr(start, dot - start);
        problem = LabelProblem(label, "its label " + quarn::util::Quote(label, 20));
        if (!problem.empty()) return problem;
        start = dot + 1;
    }
    if (count < minimum) return "it has no domain part";
    return "";
}

std::string Refusal(const char* what, const std::string& text, const std::string& problem,
                    const char* rule) {
    if (problem.empty()) return "";
    return std::string("Invalid ") + what + " " + quarn::util::Quote(text, 64) + ": " + problem +
           "; " + rule;
}

}  // namespace

std::string HostNameProblem(const std::string& text) {
    std::string problem = text.empty() ? "it is empty" : CharacterProblem(text, false);
    if (problem.empty()) problem = LabelProblem(text, "it");
    return Refusal("host name", text, problem, kHostRule);
}

std::string DomainProblem(const std::string& text) {
    return Refusal("domain name", text, LabelsProblem(text, 1), kDomainRule);
}

std::string FqdnProblem(const std::string& text) {
    return Refusal("fully qualified domain name", text, LabelsProblem(text, 2), kFqdnRule);
}

}  // namespace dns
}  // namespace simhost
