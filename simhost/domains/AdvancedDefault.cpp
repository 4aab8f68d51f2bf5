// Expands AdvancedOptions.def, the compact description of the default host's advanced options,
// into the default tree: branches in order, then every option, series expanded number-major.
#include <simhost/domains/Advanced.h>

#include <cstdint>
#include <string>

namespace simhost {
namespace advanced {
namespace {

#define HOST_CHARS "abcdefghijklmnopqrstuvwxyzABCDEFGHIJKLMNOPQRSTUVWXYZ0123456789-."
#define ID_CHARS "abcdefghijklmnopqrstuvwxyzABCDEFGHIJKLMNOPQRSTUVWXYZ0123456789_-"
#define LOWER_CHARS "abcdefghijklmnopqrstuvwxyz_"
#define PATH_CHARS "abcdefghijklmnopqrstuvwxyzABCDEFGHIJKLMNOPQRSTUVWXYZ0123456789/_-."
#define HEX_CHARS "0123456789abcdefABCDEF:"
#define ADDRESS_CHARS "0123456789abcdefABCDEF.:"
#define MODEL_CHARS "abcdefghijklmnopqrstuvwxyzABCDEFGHIJKLMNOPQRSTUVWXYZ0123456789 ,-_."

enum class Row { kBranch, kInt, kString, kKind, kSeries, kField, kEnd };

struct Entry {
    Row row;
    bool user;
    std::uint32_t path;  // the branch of a series; the suffix of a field
    std::uint32_t text;  // valid characters; the prefix of a series
    std::int64_t a;      // min; kind; first number of a series
    std::int64_t b;      // max; last number of a series
    std::int64_t c;      // integer default
    std::int64_t d;      // integer value
    std::uint32_t text_default;
    std::uint32_t text_value;
    std::uint32_t description;
};

// The rows, their texts held as offsets (TextTable.inc).
#define BRANCH(path) TEXT(path_, path) ENTRY(Row::kBranch, false, AT(path_), 0, 0, 0, 0, 0, 0, 0, 0)
#define INT_ROW(user, path, min, max, def, value, doc) \
    TEXT(path_, path) TEXT(doc_, doc)                 \
    ENTRY(Row::kInt, user, AT(path_), 0, min, max, def, value, 0, 0, AT(doc_))
#define INT(...) INT_ROW(false, __VA_ARGS__)
#define USER_INT(...) INT_ROW(true, __VA_ARGS__)
#define STR_ROW(user, path, valid, def, value, doc)                                          \
    TEXT(path_, path) TEXT(text_, valid) TEXT(def_, def) TEXT(value_, value) TEXT(doc_, doc) \
    ENTRY(Row::kString, user, AT(path_), AT(text_), 0, 0, 0, 0, AT(def_), AT(value_), AT(doc_))
#define STR(...) STR_ROW(false, __VA_ARGS__)
#define USER_STR(...) STR_ROW(true, __VA_ARGS__)
#define KIND(path, kind, value, doc)                      \
    TEXT(path_, path) TEXT(value_, value) TEXT(doc_, doc) \
    ENTRY(Row::kKind, false, AT(path_), 0, kind, 0, 0, 0, 0, AT(value_), AT(doc_))
#define SERIES(branch, prefix, first, last) \
    TEXT(path_, branch) TEXT(text_, prefix) \
    ENTRY(Row::kSeries, false, AT(path_), AT(text_), first, last, 0, 0, 0, 0, 0)
#define FIELD(suffix, min, max, def, doc) \
    TEXT(path_, suffix) TEXT(doc_, doc)   \
    ENTRY(Row::kField, false, AT(path_), 0, min, max, def, def, 0, 0, AT(doc_))
#define END() ENTRY(Row::kEnd, false, 0, 0, 0, 0, 0, 0, 0, 0, 0)
#define SIMHOST_TEXT_TABLE "AdvancedOptions.def"
#include "TextTable.inc"
#undef BRANCH
#undef INT_ROW
#undef INT
#undef USER_INT
#undef STR_ROW
#undef STR
#undef USER_STR
#undef KIND
#undef SERIES
#undef FIELD
#undef END

std::string Replace(std::string text, const std::string& from, const std::string& to) {
    for (std::size_t at = text.find(from); at != std::string::npos; at = text.find(from, at + to.size()))
        text.replace(at, from.size(), to);
    return text;
}

Option Integer(const std::string& path, const Entry& entry) {
    Option option;
    option.path = path;
    option.kind = kInteger;
    option.min = static_cast<std::uint32_t>(entry.a);
    option.max = static_cast<std::uint32_t>(entry.b);
    option.default_value = static_cast<std::uint32_t>(entry.c);
    option.value = static_cast<std::uint32_t>(entry.d);
    option.description = Text(entry.description);
    option.user = entry.user;
    return option;
}

// The options of one series: for each number, one per field (the entries after `series` up to
// its END).
void ExpandSeries(const Entry* series, const Entry* fields_end, std::vector<Option>& out) {
    for (std::int64_t n = series->a; n <= series->b; ++n) {
        const std::string number = std::to_string(n);
        for (const Entry* field = series + 1; field != fields_end; ++field) {
            const std::string path =
                std::string(Text(series->path)) + "/" + Text(series->text) + number + Text(field->path);
            Option option = Integer(path, *field);
            option.description = Replace(Text(field->description), "%n", number);
            out.push_back(std::move(option));
        }
    }
}

DefaultTree Expand() {
    DefaultTree tree;
    const Entry* end = kEntries + sizeof kEntries / sizeof kEntries[0];
    for (const Entry* entry = kEntries; entry != end; ++entry) {
        switch (entry->row) {
        case Row::kBranch:
            tree.branches.push_back(Text(entry->path));
            break;
        case Row::kInt:
            tree.options.push_back(Integer(Text(entry->path), *entry));
            break;
        case Row::kString:
        case Row::kKind: {
            Option option;
            option.path = Text(entry->path);
            option.kind = entry->row == Row::kString ? kString : static_cast<int>(entry->a);
            option.valid_characters = Text(entry->text);
            option.text_default = Text(entry->text_default);
            option.text = Text(entry->text_value);
            option.description = Text(entry->description);
            option.user = entry->user;
            tree.options.push_back(std::move(option));
            break;
        }
        case Row::kSeries: {
            const Entry* fields_end = entry + 1;
            while (fields_end != end && fields_end->row == Row::kField) ++fields_end;
            ExpandSeries(entry, fields_end, tree.options);
            if (fields_end == end) return tree;
            entry = fields_end;  // the series' END
            break;
        }
        case Row::kField:
        case Row::kEnd:
            break;
        }
    }
    return tree;
}

}  // namespace

const DefaultTree& Defaults() {
    static const DefaultTree tree = Expand();
    return tree;
}

}  // namespace advanced
}  // namespace simhost
