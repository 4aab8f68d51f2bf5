// Text helpers shared by the command framework and the simulated host: UTF-8 checks, the edit
// distance and "did you mean" choice behind suggestions, and the one visible escape form used
// wherever user or host text reaches a terminal (messages, the simple, table and keyvalue
// formatters).
//
// Pure functions of their arguments: nothing is kept, nothing throws except std::bad_alloc.
// Part of the static library quarnutil (#include "util/Text.h"), linked privately.
#pragma once

#include <cstddef>
#include <string>
#include <vector>

namespace quarn {
namespace util {

// Length of the well-formed UTF-8 sequence starting at text (1 to 4), or 0 when the bytes there
// are not one (stray continuation byte, overlong form, surrogate, beyond U+10FFFF, cut short).
std::size_t Utf8SequenceLength(const unsigned char* text, std::size_t left);
// Whether the whole text is well-formed UTF-8.
bool IsValidUtf8(const char* text, std::size_t size);
inline bool IsValidUtf8(const std::string& text) { return IsValidUtf8(text.data(), text.size()); }

// Optimal string alignment distance: insertions, deletions, substitutions and swaps of
// neighbours, each costing 1. With ignoreCase, ASCII letters compare without regard to case.
std::size_t EditDistance(const std::string& a, const std::string& b, bool ignoreCase = true);

// How NearestNames chooses.
struct NearestOptions {
    // At most this many names are returned.
    std::size_t count = 5;
    // Only candidates within SuggestionLimit(word) (or that the word begins, see prefixes) are
    // near; false ranks every candidate.
    bool limited = true;
    // Only the names at the smallest distance found; false returns the nearest `count` names.
    bool nearestOnly = true;
    // A candidate that the word (2 characters at least) begins counts as distance 1.
    bool prefixes = true;
    // A word given without its leading parts (e.g. "GetUuid" for "Info::GetUuid") also
    // compares with each longer candidate's tail of the same length, at distance + 1.
    bool tails = false;
    bool ignoreCase = true;
};
// The largest distance at which a word of that length still counts as near: 1 for up to 3
// characters, 2 up to 6, 3 beyond.
std::size_t SuggestionLimit(std::size_t wordLength);
// The candidates nearest to word, ordered by distance, ties in the candidates' order.
std::vector<std::string> NearestNames(const std::string& word,
                                      const std::vector<std::string>& candidates,
                                      const NearestOptions& options = NearestOptions());

// The escape form for text shown on a terminal: newline, carriage return and tab as \n, \r and
// \t; every other control character (C0, DEL, and the C1 range U+0080 to U+009F) and every
// byte that is not part of well-formed UTF-8 as \xNN per byte (lower-case hex); with
// backslashes set, '\' as \\ too (so the text can be decoded back). Everything else is kept.
enum class Backslash { kKeep, kEscape };
// Whether text holds anything EscapeTo would change.
bool NeedsEscape(const char* text, std::size_t size, Backslash backslash = Backslash::kKeep);
// Appends the escaped text to out.
void EscapeTo(std::string& out, const char* text, std::size_t size,
              Backslash backslash = Backslash::kKeep);
inline std::string Escape(const std::string& text, Backslash backslash = Backslash::kKeep) {
    std::string out;
    EscapeTo(out, text.data(), text.size(), backslash);
    return out;
}

// User text for a one-line message: escaped as above, in single quotes, and cut after
// maxColumns code points of the original with "..." (so a huge value is never echoed whole).
std::string Quote(const std::string& text, std::size_t maxColumns = 80);

}  // namespace util
}  // namespace quarn
