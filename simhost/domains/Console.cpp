#include <simhost/domains/Console.h>

#include <util/Text.h>

#include <cstdio>

namespace simhost {
namespace console {

std::string WelcomeMessageProblem(const std::string& text, bool allow_empty) {
    const std::string rule =
        "; a welcome message is UTF-8 text of 1 to " + std::to_string(kWelcomeMessageMax) +
        " bytes, where tabs and line breaks are kept and other control characters are not allowed";
    if (text.empty())
        return allow_empty ? "" : "The welcome message is empty" + rule;
    if (text.size() > kWelcomeMessageMax)
        return "The welcome message is " + std::to_string(text.size()) + " bytes long" + rule;
    if (!quarn::util::IsValidUtf8(text)) {
        std::size_t at = 0;
        while (at < text.size()) {
            std::size_t length = quarn::util::Utf8SequenceLength(
                reinterpret_cast<const unsigned char*>(text.data()) + at, text.size() - at);
            if (length == 0) break;
            at += length;
        }
        return "The welcome message is not valid UTF-8 (byte " + std::to_string(at + 1) +
               " is not part of a UTF-8 character)" + rule;
    }
    for (std::size_t i = 0; i < text.size(); ++i) {
        const unsigned char c = static_cast<unsigned char>(text[i]);
        if ((c < 0x20 && c != '\t' && c != '\n' && c != '\r') || c == 0x7f) {
            char hex[8];
            std::snprintf(hex, sizeof hex, "\\x%02x", c);
            return "The welcome message contains the control character " + std::string(hex) +
                   " at byte " + std::to_string(i + 1) + rule;
        }
    }
    return "";
}

}  // namespace console
}  // namespace simhost
