// Text helpers: parsing, UTF-8, escaping, wrapping and suggestions.
#include "engine/Text.h"

#include "util/Text.h"

#include <algorithm>
#include <charconv>

namespace Kitbase {
namespace Engine {

using quarn::util::Utf8SequenceLength;

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

// The two-character escapes JSON has (after the backslash), or 0 for the \u00XX form.
char ShortJsonEscape(unsigned char c) {
    switch (c) {
        case '"': return '"';
        case '\\': return '\\';
        case '\n': return 'n';
        case '\r': return 'r';
        case '\t': return 't';
        case '\b': return 'b';
        case '\f': return 'f';
        default: return 0;
    }
}

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
            char shortForm = ShortJsonEscape(c);
            if (shortForm != 0) {
                out.Put(shortForm);
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

std::vector<std::string> NearestNames(const std::string& word,
                                      const std::vector<std::string>& candidates) {
    return quarn::util::NearestNames(word, candidates);
}

std::string Quote(const std::string& text) { return quarn::util::Quote(text); }

void PutEscaped(Writer& out, const char* text, std::size_t size, bool escapeBackslash) {
    quarn::util::Backslash backslash =
        escapeBackslash ? quarn::util::Backslash::kEscape : quarn::util::Backslash::kKeep;
    if (!quarn::util::NeedsEscape(text, size, backslash)) {
        out.Put(text, size);
        return;
    }
    std::string escaped;
    quarn::util::EscapeTo(escaped, text, size, backslash);
    out.Put(escaped);
}

void PutEscaped(Writer& out, const std::string& text, bool escapeBackslash,
                std::string& scratch) {
    quarn::util::Backslash backslash =
        escapeBackslash ? quarn::util::Backslash::kEscape : quarn::util::Backslash::kKeep;
    if (!quarn::util::NeedsEscape(text.data(), text.size(), backslash)) {
        out.Put(text);
        return;
    }
    scratch.clear();
    quarn::util::EscapeTo(scratch, text.data(), text.size(), backslash);
    out.Put(scratch);
}

std::size_t EscapedWidth(const char* text, std::size_t size) {
    if (!quarn::util::NeedsEscape(text, size)) return DisplayWidth(text, size);
    std::string escaped;
    quarn::util::EscapeTo(escaped, text, size);
    return DisplayWidth(escaped);
}

std::string Escaped(const std::string& text) { return quarn::util::Escape(text); }

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
