// The host's direct console (Tolmar): the welcome message it shows above its menu.
//
// Scenario section "console" (optional):
//   welcome_message  UTF-8 text of at most 4096 bytes; line breaks (LF, CR) and tabs are kept,
//                    other control characters are refused; "" shows no banner. Default: a
//                    short two-line banner naming the lab.
// Setting the message through the host layer also refuses an empty text (WelcomeMessageProblem
// makes every refusal text, naming what is wrong and the rule).
#pragma once

#include <simhost/Export.h>
#include <simhost/Mapping.h>
#include <simhost/State.h>

#include <string>

namespace simhost {
namespace console {

// A console banner of 4096 bytes fills about fifty lines of eighty columns: more than a
// console screen shows.
constexpr std::size_t kWelcomeMessageMax = 4096;

// "" when text may be set as the welcome message (allow_empty: as a stored state), else the
// refusal message.
SIMHOST_API std::string WelcomeMessageProblem(const std::string& text, bool allow_empty = false);

inline bool IsStorableWelcomeMessage(const std::string& text) {
    return WelcomeMessageProblem(text, true).empty();
}

struct Console {
    static constexpr char kSection[] = "console";
    static constexpr StateKind kKind = StateKind::kSingleton;

    std::string welcome_message;

    static Console Default() {
        return {"Corvane Labs - rack B4\nAuthorised administrators only. Changes are logged.\n"};
    }
};

template <class V>
void Describe(V& v, Console& s) {
    v("welcome_message", s.welcome_message,
      Pattern{IsStorableWelcomeMessage,
              "expected UTF-8 text of at most 4096 bytes without control characters other than "
              "tab, line feed and carriage return"});
}

}  // namespace console
}  // namespace simhost
