#include <simhost/domains/Keyboard.h>

#include "util/Text.h"

#include <strings.h>

namespace simhost {
namespace keyboard {

Keyboard Keyboard::Default() {
    Keyboard keyboard;
    keyboard.current = "English (US)";
    keyboard.configured = "English (US)";
    keyboard.available = {
        "English (US)",         "English (US, International)", "English (UK)",
        "English (Ireland)",    "German",                      "German (Switzerland)",
        "French",               "French (Switzerland)",        "French (Belgium)",
        "French (Canada)",      "Dutch",                       "Danish",
        "Norwegian",            "Swedish",                     "Finnish",
        "Icelandic",            "Spanish",                     "Spanish (Latin America)",
        "Portuguese",           "Portuguese (Brazil)",         "Italian",
        "Polish",               "Czech",                       "Slovak",
        "Hungarian",            "Slovenian",                   "Croatian",
        "Estonian",             "Latvian",                     "Lithuanian",
        "Greek",                "Turkish",                     "Russian",
        "Ukrainian",            "Japanese",                    "Korean",
        "Chinese (Traditional)",
    };
    return keyboard;
}

std::string Keyboard::Check() const {
    for (std::size_t i = 0; i < available.size(); ++i)
        for (std::size_t j = 0; j < i; ++j)
            if (strcasecmp(available[i].c_str(), available[j].c_str()) == 0)
                return "available[" + std::to_string(i) + "]: '" + available[i] + "' appears twice";
    if (!current.empty() && FindLayout(*this, current) != current)
        return "current: '" + current + "' is not an available layout";
    if (!configured.empty() && FindLayout(*this, configured) != configured)
        return "configured: '" + configured + "' is not an available layout";
    return "";
}

std::optional<std::string> FindLayout(const Keyboard& keyboard, const std::string& name) {
    for (const std::string& layout : keyboard.available)
        if (strcasecmp(layout.c_str(), name.c_str()) == 0 && layout.size() == name.size()) return layout;
    return std::nullopt;
}

HostError UnknownLayout(const Keyboard& keyboard, const std::string& name) {
    std::vector<std::string> nearest = quarn::util::NearestNames(name, keyboard.available);
    std::string text = "Unknown keyboard layout " + quarn::util::Quote(name);
    if (!nearest.empty()) {
        text += " (nearest:";
        for (std::size_t i = 0; i < nearest.size(); ++i) text += (i ? ", " : " ") + nearest[i];
        text += ")";
    } else if (keyboard.available.empty()) {
        text += "; this host offers no layouts";
    } else {
        text += "; this host offers:";
        for (std::size_t i = 0; i < keyboard.available.size(); ++i)
            text += (i ? ", " : " ") + keyboard.available[i];
    }
    return HostError(text);
}

}  // namespace keyboard
}  // namespace simhost
