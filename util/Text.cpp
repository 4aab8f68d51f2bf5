// Text helpers: UTF-8, edit distance, suggestions and the terminal escape form.
#include "util/Text.h"

#include <algorithm>
#include <utility>

namespace quarn {
namespace util {

std::size_t Utf8SequenceLength(const unsigned char* p, std::size_t left) {
    if (left == 0) return 0;
    unsigned char c = p[0];
    if (c < 0x80) return 1;
    std::size_t length;
    unsigned char low = 0x80, high = 0xBF;  // bounds of the second byte
    if (c >= 0xC2 && c <= 0xDF) {
        length = 2;
    } else if (c >= 0xE0 && c <= 0xEF) {
        length = 3;
        if (c == 0xE0) low = 0xA0;   // no overlong forms
        if (c == 0xED) high = 0x9F;  // no surrogates
    } else if (c >= 0xF0 && c <= 0xF4) {
        length = 4;
        if (c == 0xF0) low = 0x90;   // no overlong forms
        if (c == 0xF4) high = 0x8F;  // nothing beyond U+10FFFF
    } else {
        return 0;
    }
    if (left < length) return 0;
    if (p[1] < low || p[1] > high) return 0;
    for (std::size_t i = 2; i < length; ++i) {
        if ((p[i] & 0xC0) != 0x80) return 0;
    }
    return length;
}

bool IsValidUtf8(const char* text, std::size_t size) {
    const unsigned char* p = reinterpret_cast<const unsigned char*>(text);
    std::size_t i = 0;
    while (i < size) {
        if (p[i] < 0x80) {
            ++i;
            continue;
        }
        std::size_t length = Utf8SequenceLength(p + i, size - i);
        if (length == 0) return false;
        i += length;
    }
    return true;
}

namespace {
char Lower(char c) { return (c >= 'A' && c <= 'Z') ? static_cast<char>(c - 'A' + 'a') : c; }
}  // namespace

std::size_t EditDistance(const std::string& a, const std::string& b, bool ignoreCase) {
    const std::size_t n = a.size(), m = b.size();
    auto same = [ignoreCase](char x, char y) { return ignoreCase ? Lower(x) == Lower(y) : x == y; };
    // Three rows suffice for the transposition rule.
    std::vector<std::size_t> before(m + 1), previous(m + 1), current(m + 1);
    for (std::size_t j = 0; j <= m; ++j) previous[j] = j;
    for (std::size_t i = 1; i <= n; ++i) {
        current[0] = i;
        for (std::size_t j = 1; j <= m; ++j) {
            std::size_t best = std::min(previous[j] + 1, current[j - 1] + 1);
            best = std::min(best, previous[j - 1] + (same(a[i - 1], b[j - 1]) ? 0 : 1));
            if (i > 1 && j > 1 && same(a[i - 1], b[j - 2]) && same(a[i - 2], b[j - 1])) {
                best = std::min(best, before[j - 2] + 1);
            }
            current[j] = best;
        }
        before.swap(previous);
        previous.swap(current);
    }
    return previous[m];
}

std::size_t SuggestionLimit(std::size_t wordLength) {
    return wordLength <= 3 ? 1 : (wordLength <= 6 ? 2 : 3);
}

namespace {

// The distance NearestNames ranks a candidate by.
std::size_t Distance(const std::string& word, const std::string& candidate,
                     const NearestOptions& options, std::size_t limit) {
    const std::size_t n = word.size(), m = candidate.size();
    // A word longer than the candidate by more than the limit (say a pasted value) can be
    // neither near, nor its prefix, nor its tail: the length difference rules it out cheaply.
    if (options.limited && n > m + limit) return n - m;
    std::size_t distance = EditDistance(word, candidate, options.ignoreCase);
    if (options.prefixes && n >= 2 && m > n &&
        EditDistance(word, candidate.substr(0, n), options.ignoreCase) == 0) {
        distance = std::min<std::size_t>(distance, 1);
    }
    if (options.tails && m > n) {
        distance = std::min(distance,
                            EditDistance(word, candidate.substr(m - n), options.ignoreCase) + 1);
    }
    return distance;
}

}  // namespace

std::vector<std::string> NearestNames(const std::string& word,
                                      const std::vector<std::string>& candidates,
                                      const NearestOptions& options) {
    const std::size_t limit = SuggestionLimit(word.size());
    std::vector<std::pair<std::size_t, std::size_t> > ranked;  // (distance, candidate index)
    for (std::size_t i = 0; i < candidates.size(); ++i) {
        std::size_t distance = Distance(word, candidates[i], options, limit);
        if (!options.limited || distance <= limit) ranked.push_back(std::make_pair(distance, i));
    }
    std::stable_sort(ranked.begin(), ranked.end());
    std::vector<std::string> names;
    for (std::size_t i = 0; i < ranked.size() && names.size() < options.count; ++i) {
        if (options.nearestOnly && ranked[i].first != ranked[0].first) break;
        names.push_back(candidates[ranked[i].second]);
    }
    return names;
}

namespace {

const char kHex[] = "0123456789abcdef";

// Bytes of the escape for the sequence at p (0 when it is kept as it is), and how many input
// bytes it covers.
std::size_t EscapeAt(const unsigned char* p, std::size_t left, Backslash backslash, char* escape,
                     std::size_t* covers) {
    unsigned char c = p[0];
    *covers = 1;
    if (c >= 0x20 && c < 0x7f) {
        if (c != '\\' || backslash == Backslash::kKeep) return 0;
        escape[0] = escape[1] = '\\';
        return 2;
    }
    if (c == '\n' || c == '\r' || c == '\t') {
        escape[0] = '\\';
        escape[1] = c == '\n' ? 'n' : (c == '\r' ? 'r' : 't');
        return 2;
    }
    if (c >= 0x80) {
        std::size_t length = Utf8SequenceLength(p, left);
        bool c1 = length == 2 && c == 0xC2 && p[1] < 0xA0;  // U+0080 to U+009F
        if (length != 0 && !c1) {
            *covers = length;
            return 0;
        }
        if (c1) {
            *covers = 2;
            const char e[8] = {'\\', 'x', 'c', '2', '\\', 'x', kHex[p[1] >> 4], kHex[p[1] & 15]};
            std::copy(e, e + 8, escape);
            return 8;
        }
    }
    escape[0] = '\\';
    escape[1] = 'x';
    escape[2] = kHex[c >> 4];
    escape[3] = kHex[c & 15];
    return 4;
}

}  // namespace

// Bytes that are kept without a closer look: printable ASCII (the backslash apart).
struct PlainBytes {
    bool plain[256];
    PlainBytes() {
        for (int c = 0; c < 256; ++c) plain[c] = c >= 0x20 && c < 0x7f && c != '\\';
    }
};
const PlainBytes kPlain;

bool NeedsEscape(const char* text, std::size_t size, Backslash backslash) {
    const unsigned char* p = reinterpret_cast<const unsigned char*>(text);
    char escape[8];
    std::size_t i = 0;
    while (i < size) {
        if (kPlain.plain[p[i]]) {
            ++i;
            continue;
        }
        std::size_t covers;
        if (EscapeAt(p + i, size - i, backslash, escape, &covers) != 0) return true;
        i += covers;
    }
    return false;
}

void EscapeTo(std::string& out, const char* text, std::size_t size, Backslash backslash) {
    const unsigned char* p = reinterpret_cast<const unsigned char*>(text);
    char escape[8];
    std::size_t run = 0;  // start of the pending run of bytes kept as they are
    std::size_t i = 0;
    while (i < size) {
        if (kPlain.plain[p[i]]) {
            ++i;
            continue;
        }
        std::size_t covers;
        std::size_t length = EscapeAt(p + i, size - i, backslash, escape, &covers);
        if (length == 0) {
            i += covers;
            continue;
        }
        out.append(text + run, i - run);
        out.append(escape, length);
        i += covers;
        run = i;
    }
    out.append(text + run, size - run);
}

std::string Quote(const std::string& text, std::size_t maxColumns) {
    const unsigned char* p = reinterpret_cast<const unsigned char*>(text.data());
    std::size_t end = 0, columns = 0;
    while (end < text.size() && columns < maxColumns) {
        std::size_t length = p[end] < 0x80 ? 1 : Utf8SequenceLength(p + end, text.size() - end);
        end += length == 0 ? 1 : length;
        ++columns;
    }
    std::string quoted = "'";
    EscapeTo(quoted, text.data(), end);
    if (end < text.size()) quoted += "...";
    quoted += "'";
    return quoted;
}

}  // namespace util
}  // namespace quarn
