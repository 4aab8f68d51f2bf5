// Text helpers shared by the parser, the formatters, help and the schema writer: strict number
// and boolean parsing, UTF-8 measuring and repair, JSON and XML escaping into a Writer, the
// terminal escape form into a Writer, word wrapping and comma lists. UTF-8 checks, suggestions
// and quoting of user text live in quarnutil (util/Text.h), which libkitbase links privately.
//
// Everything here is a pure function of its arguments; nothing throws except std::bad_alloc.
#pragma once

#include "engine/Writer.h"

#include <kitbase/Export.h>

#include <cstddef>
#include <string>
#include <utility>
#include <vector>

namespace Kitbase {
namespace Engine {

// Decimal 64-bit signed integer with an optional sign and nothing else (no blanks, no prefix).
// False on empty text, junk or overflow; *value is untouched then.
KITBASE_API bool ParseInt64(const std::string& text, long long* value);
// true/false/yes/no/1/0 in any case. False for any other text.
KITBASE_API bool ParseBool(const std::string& text, bool* value);

// Columns the text takes on a terminal, counted as one per code point (bytes that are not UTF-8
// continuation bytes).
KITBASE_API std::size_t DisplayWidth(const char* text, std::size_t size);
inline std::size_t DisplayWidth(const std::string& text) {
    return DisplayWidth(text.data(), text.size());
}
// The byte offset just past the first `columns` code points of text (or size when shorter).
KITBASE_API std::size_t OffsetOfColumn(const char* text, std::size_t size, std::size_t columns);

// A JSON string literal (quotes included), escaped per RFC 8259: '"' and '\\' as \" and \\,
// newline, carriage return, tab, backspace and form feed as \n, \r, \t, \b and \f, every other
// control character as \u00XX, and every byte that is not part of well-formed UTF-8 replaced by
// U+FFFD, so the output is always valid JSON.
KITBASE_API void PutJsonString(Writer& out, const char* text, std::size_t size);
inline void PutJsonString(Writer& out, const std::string& text) {
    PutJsonString(out, text.data(), text.size());
}
// XML character data (attribute false) or an attribute value (attribute true) without quotes:
// markup characters as entities, carriage return (and in attributes tab and newline) as
// character references, and characters XML 1.0 cannot carry (other control characters, U+FFFE,
// U+FFFF, malformed UTF-8) as U+FFFD.
KITBASE_API void PutXmlText(Writer& out, const char* text, std::size_t size, bool attribute);
inline void PutXmlText(Writer& out, const std::string& text, bool attribute) {
    PutXmlText(out, text.data(), text.size(), attribute);
}

// Text for a terminal in the one visible escape form (util/Text.h: \n, \r, \t, \xNN; with
// Backslash::kEscape also \\): control characters, C1 characters and malformed UTF-8 never reach
// the terminal raw. Text that needs no escape is written straight through.
KITBASE_API void PutEscaped(Writer& out, const char* text, std::size_t size,
                            bool escapeBackslash = false);
inline void PutEscaped(Writer& out, const std::string& text, bool escapeBackslash = false) {
    PutEscaped(out, text.data(), text.size(), escapeBackslash);
}
// The same, escaping through scratch (reused between calls, so a long run of cells that need
// escaping costs no allocation each).
KITBASE_API void PutEscaped(Writer& out, const std::string& text, bool escapeBackslash,
                            std::string& scratch);
// Columns that text takes once escaped.
KITBASE_API std::size_t EscapedWidth(const char* text, std::size_t size);
// The text escaped, as a string (for messages).
KITBASE_API std::string Escaped(const std::string& text);

// Splits text into lines of at most width columns, breaking at blanks where possible and inside a
// word only when the word alone is wider than the line. Existing newlines are kept as breaks.
KITBASE_API std::vector<std::string> WrapWords(const std::string& text, std::size_t width);

// The comma-separated items of text, each trimmed of blanks; empty items are dropped.
KITBASE_API std::vector<std::string> SplitCommaList(const std::string& text);

// User text for a one-line message: in single quotes, escaped, and cut to 80 columns with "...".
KITBASE_API std::string Quote(const std::string& text);
// The names near word ("did you mean"), by the rules of util::NearestNames' defaults.
KITBASE_API std::vector<std::string> NearestNames(const std::string& word,
                                                  const std::vector<std::string>& candidates);

// Each name in single quotes, for listing names in a message.
KITBASE_API std::vector<std::string> QuoteEach(const std::vector<std::string>& names);

// The words joined by one blank: a command path as users type it.
KITBASE_API std::string JoinWords(const std::vector<std::string>& words);

// Ordered key/value lists (metadata, output parameters): the value of key, or null; and setting
// a key, which replaces its value in place or adds it last.
typedef std::pair<std::string, std::string> KeyValue;
KITBASE_API const std::string* FindKey(const std::vector<KeyValue>& list, const std::string& key);
KITBASE_API void SetKey(std::vector<KeyValue>& list, const std::string& key,
                        const std::string& value);

// "a", "a or b", "a, b or c" (with the given last separator, e.g. " or ").
KITBASE_API std::string JoinNames(const std::vector<std::string>& names, const char* last);

}  // namespace Engine
}  // namespace Kitbase
