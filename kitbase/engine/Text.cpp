// Text helpers: parsing, UTF-8, escaping, wrapping and suggestions.
#include "engine/Text.h"

#include <algorithm>
#include <charconv>

namespace Kitbase {
namespace Engine {

bool ParseInt64(const std::string& text, long long* value) {
    const char* begin = text.data();
    const char* end = begin + text.size();
    if (begin != end && *begin == '+') ++begin;  // from_chars takes '-' but not '+'
    if (begin == end || !((*begin >= '0' && *begin <= '9') ||
                          (*begin == '-' && begin == text.data()))) {
        return false;
    }
    long long parsed = 0;
    std::from_chars_result result = std::from_chars(begin, end, parsed, 10);
    if (result.ec != std::errc() || result.ptr != end) return false;
    *value = parsed;
    return true;
}

namespace {
bool EqualsNoCase(const std::string& text, const char* word) {
    std::size_t i = 0;
    for (; word[i] != '\0'; ++i) {
        if (i >= text.size()) return false;
        char c = text[i];
        if (c >= 'A' && c <= 'Z') c = static_cast<char>(c - 'A' + 'a');
        if (c != word[i]) return false;
    }
    return i == text.size();
}

char Lower(char c) { return (c >= 'A' && c <= 'Z') ? static_cast<char>(c - 'A' + 'a') : c; }
}  // namespace

bool ParseBool(const std::string& text, bool* value) {
    if (EqualsNoCase(text, "true") || EqualsNoCase(text, "yes") || text == "1") {
        *value = true;
        return true;
    }
    if (EqualsNoCase(text, "false") || EqualsNoCase(text, "no") || text == "0") {
        *value = false;
        return true;
    }
    return false;
}

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
        if (c == 0xE0) low = 0xA0;        // no overlong forms
        if (c == 0xED) high = 0x9F;       // no surrogates
    } else if (c >= 0xF0 && c <= 0xF4) {
        length = 4;
        if (c == 0xF0) low = 0x90;        // no overlong forms
        if (c == 0xF4) high = 0x8F;       // nothing beyond U+10FFFF
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

std::size_t DisplayWidth(const char* text, std::size_t size) {
    std::size_t width = 0;
    for (std::size_t i = 0; i < size; ++i) {
        if ((static_cast<unsigned char>(text[i]) & 0xC0) != 0x80) ++width;
    }
    return width;
}

std::size_t OffsetOfColumn(const char* text, std::size_t size, std::size_t columns) {
    std::size_t seen = 0;
    for (std::size_t i = 0; i < size; ++i) {
        if ((static_cast<unsigned char>(text[i]) & 0xC0) != 0x80) {
            if (seen == columns) return i;
            ++seen;
        }
    }
    return size;
}

namespace {

const char kReplacement[] = "\xEF\xBF\xBD";  // U+FFFD

// Byte classes for the JSON escaper: 0 copied as is, 1 escaped, 2 start of a multibyte sequence.
struct JsonClasses {
    unsigned char table[256];
    JsonClasses() {
        for (int i = 0; i < 256; ++i) table[i] = i < 0x20 ? 1 : (i < 0x80 ? 0 : 2);
        table[static_cast<unsigned char>('"')] = 1;
        table[static_cast<unsigned char>('\\')] = 1;
    }
};
const JsonClasses kJson;

}  // namespace

void PutJsonString(Writer& out, const char* text, std::size_t size) {
    static const char kHex[] = "0123456789abcdef";
    const unsigned char* p = reinterpret_cast<const unsigned char*>(text);
    out.Put('"');
    std::size_t run = 0;  // start of the pending run of bytes copied as they are
    std::size_t i = 0;
    while (i < size) {
        unsigned char cls = kJson.table[p[i]];
        if (cls == 0) {
            ++i;
            continue;
        }
        if (cls == 2) {
            std::size_t length = Utf8SequenceLength(p + i, size - i);
            if (length != 0) {
                i += length;
                continue;
            }
        }
        out.Put(text + run, i - run);
        unsigned char c = p[i];
        if (cls == 2) {
            out.Put(kReplacement, 3);
        } else {
            out.Put('\\');
            if (c == '"' || c == '\\') {
                out.Put(static_cast<char>(c));
            } else {
                char escape[5] = {'u', '0', '0', kHex[c >> 4], kHex[c & 15]};
                out.Put(escape, 5);
            }
        }
        ++i;
        run = i;
    }
    out.Put(text + run, size - run);
    out.Put('"');
}

void PutXmlText(Writer& out, const char* text, std::size_t size, bool attribute) {
    const unsigned char* p = reinterpret_cast<const unsigned char*>(text);
    std::size_t run = 0;
    std::size_t i = 0;
    while (i < size) {
        unsigned char c = p[i];
        const char* entity = nullptr;
        std::size_t skip = 1;
        if (c >= 0x80) {
            std::size_t length = Utf8SequenceLength(p + i, size - i);
            // U+FFFE and U+FFFF are well-formed UTF-8 but not XML characters.
            bool nonCharacter = length == 3 && c == 0xEF && p[i + 1] == 0xBF && p[i + 2] >= 0xBE;
            if (length != 0 && !nonCharacter) {
                i += length;
                continue;
            }
            entity = kReplacement;
            if (nonCharacter) skip = 3;
        } else if (c == '&') {
            entity = "&amp;";
        } else if (c == '<') {
            entity = "&lt;";
        } else if (c == '>') {
            entity = "&gt;";
        } else if (c == '"' && attribute) {
            entity = "&quot;";
        } else if (c == '\r') {
            entity = "&#13;";
        } else if (c == '\n' || c == '\t') {
            if (attribute) entity = c == '\n' ? "&#10;" : "&#9;";
        } else if (c < 0x20) {
            entity = kReplacement;
        }
        if (entity == nullptr) {
            i += skip;
            continue;
        }
        out.Put(text + run, i - run);
        out.PutText(entity);
        i += skip;
        run = i;
    }
    out.Put(text + run, size - run);
}

std::vector<std::string> WrapWords(const std::string& text, std::size_t width) {
    std::vector<std::string> lines;
    if (width == 0) width = 1;
    std::size_t start = 0;
    while (true) {
        std::size_t newline = text.find('\n', start);
        std::string paragraph =
            text.substr(start, newline == std::string::npos ? std::string::npos : newline - start);
        std::string line;
        std::size_t lineWidth = 0;
        std::size_t pos = 0;
        bool any = false;
        while (pos < paragraph.size()) {
            if (paragraph[pos] == ' ') {
                ++pos;
                continue;
            }
            std::size_t end = paragraph.find(' ', pos);
            if (end == std::string::npos) end = paragraph.size();
            std::string word = paragraph.substr(pos, end - pos);
            pos = end;
            std::size_t wordWidth = DisplayWidth(word);
            if (lineWidth > 0 && lineWidth + 1 + wordWidth <= width) {
                line += ' ';
                line += word;
                lineWidth += 1 + wordWidth;
                continue;
            }
            if (lineWidth > 0) {
                lines.push_back(line);
                any = true;
            }
            // A word wider than the line is cut into line-wide pieces.
            while (wordWidth > width) {
                std::size_t cut = OffsetOfColumn(word.data(), word.size(), width);
                lines.push_back(word.substr(0, cut));
                any = true;
                word.erase(0, cut);
                wordWidth = DisplayWidth(word);
            }
            line = word;
            lineWidth = wordWidth;
        }
        if (lineWidth > 0 || !any) lines.push_back(line);
        if (newline == std::string::npos) break;
        start = newline + 1;
    }
    return lines;
}

std::vector<std::string> SplitCommaList(const std::string& text) {
    std::vector<std::string> items;
    std::size_t start = 0;
    while (start <= text.size()) {
        std::size_t comma = text.find(',', start);
        if (comma == std::string::npos) comma = text.size();
        std::size_t first = start, last = comma;
        while (first < last && (text[first] == ' ' || text[first] == '\t')) ++first;
        while (last > first && (text[last - 1] == ' ' || text[last - 1] == '\t')) --last;
        if (last > first) items.push_back(text.substr(first, last - first));
        start = comma + 1;
    }
    return items;
}

std::size_t EditDistance(const std::string& a, const std::string& b) {
    const std::size_t n = a.size(), m = b.size();
    // Three rows suffice for the transposition rule.
    std::vector<std::size_t> before(m + 1), previous(m + 1), current(m + 1);
    for (std::size_t j = 0; j <= m; ++j) previous[j] = j;
    for (std::size_t i = 1; i <= n; ++i) {
        current[0] = i;
        for (std::size_t j = 1; j <= m; ++j) {
            std::size_t cost = Lower(a[i - 1]) == Lower(b[j - 1]) ? 0 : 1;
            std::size_t best = std::min(previous[j] + 1, current[j - 1] + 1);
            best = std::min(best, previous[j - 1] + cost);
            if (i > 1 && j > 1 && Lower(a[i - 1]) == Lower(b[j - 2]) &&
                Lower(a[i - 2]) == Lower(b[j - 1])) {
                best = std::min(best, before[j - 2] + 1);
            }
            current[j] = best;
        }
        before.swap(previous);
        previous.swap(current);
    }
    return previous[m];
}

std::vector<std::string> NearestNames(const std::string& word,
                                      const std::vector<std::string>& candidates) {
    const std::size_t limit = word.size() <= 3 ? 1 : (word.size() <= 6 ? 2 : 3);
    std::vector<std::pair<std::size_t, std::size_t> > ranked;  // (distance, candidate index)
    for (std::size_t i = 0; i < candidates.size(); ++i) {
        const std::string& candidate = candidates[i];
        std::size_t distance = EditDistance(word, candidate);
        bool prefix = word.size() >= 2 && candidate.size() > word.size() &&
                      EditDistance(word, candidate.substr(0, word.size())) == 0;
        if (distance <= limit || prefix) {
            ranked.push_back(std::make_pair(prefix ? std::min<std::size_t>(distance, 1) : distance,
                                            i));
        }
    }
    std::stable_sort(ranked.begin(), ranked.end());
    std::vector<std::string> names;
    for (std::size_t i = 0; i < ranked.size() && names.size() < 5; ++i) {
        if (ranked[i].first != ranked[0].first) break;
        names.push_back(candidates[ranked[i].second]);
    }
    return names;
}

std::string Quote(const std::string& text) {
    static const char kHex[] = "0123456789abcdef";
    const std::size_t kMaxColumns = 80;
    std::string quoted = "'";
    std::size_t columns = 0;
    for (std::size_t i = 0; i < text.size(); ++i) {
        unsigned char c = static_cast<unsigned char>(text[i]);
        if ((c & 0xC0) != 0x80 && ++columns > kMaxColumns) {
            quoted += "...";
            break;
        }
        if (c == '\n') {
            quoted += "\\n";
        } else if (c == '\t') {
            quoted += "\\t";
        } else if (c < 0x20 || c == 0x7f) {
            quoted += "\\x";
            quoted += kHex[c >> 4];
            quoted += kHex[c & 15];
        } else {
            quoted += static_cast<char>(c);
        }
    }
    quoted += "'";
    return quoted;
}

std::vector<std::string> QuoteEach(const std::vector<std::string>& names) {
    std::vector<std::string> quoted;
    for (std::size_t i = 0; i < names.size(); ++i) quoted.push_back(Quote(names[i]));
    return quoted;
}

std::string JoinWords(const std::vector<std::string>& words) {
    std::string joined;
    for (std::size_t i = 0; i < words.size(); ++i) {
        if (i > 0) joined += ' ';
        joined += words[i];
    }
    return joined;
}

const std::string* FindKey(const std::vector<KeyValue>& list, const std::string& key) {
    for (std::size_t i = 0; i < list.size(); ++i) {
        if (list[i].first == key) return &list[i].second;
    }
    return nullptr;
}

void SetKey(std::vector<KeyValue>& list, const std::string& key, const std::string& value) {
    for (std::size_t i = 0; i < list.size(); ++i) {
        if (list[i].first == key) {
            list[i].second = value;
            return;
        }
    }
    list.push_back(KeyValue(key, value));
}

std::string JoinNames(const std::vector<std::string>& names, const char* last) {
    std::string joined;
    for (std::size_t i = 0; i < names.size(); ++i) {
        if (i > 0) joined += (i + 1 == names.size()) ? last : ", ";
        joined += names[i];
    }
    return joined;
}

}  // namespace Engine
}  // namespace Kitbase
