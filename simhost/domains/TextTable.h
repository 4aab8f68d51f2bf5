// Constant tables of texts that hold no addresses.
//
// A table of `const char*` holds the address of each text, which a position-independent program
// fixes up at every start, copying each page of the table as it writes it: the default host's
// tables of advanced options and modules would cost every run of every command eight such pages
// and 2,500 fix-ups, though few commands read them. A table built with these macros
// holds offsets instead, into one constant struct of character arrays, and stays in read-only
// memory that nothing touches until it is read.
//
// A table's definition file (an X-macro file with one entry per line) is included three times,
// its entry macros written in terms of TEXT(field, "text"):
//   1. with TEXT defined as SIMHOST_TEXT_MEMBER, inside `struct Texts { char none[1]; ... };`
//      (one character array per text, named by its field and its line);
//   2. with TEXT defined as SIMHOST_TEXT_VALUE, inside `constexpr Texts kTexts = {"", ...};`;
//   3. for the entries, each text given as SIMHOST_TEXT_AT(Texts, field), an offset that
//      SIMHOST_TEXT(kTexts, offset) turns back into the text. Offset 0 is the empty text.
#ifndef SIMHOST_DOMAINS_TEXTTABLE_H
#define SIMHOST_DOMAINS_TEXTTABLE_H

#include <cstddef>
#include <cstdint>

#define SIMHOST_TEXT_CAT2(a, b) a##b
#define SIMHOST_TEXT_CAT(a, b) SIMHOST_TEXT_CAT2(a, b)
#define SIMHOST_TEXT_MEMBER(field, text) char SIMHOST_TEXT_CAT(field, __LINE__)[sizeof(text)];
#define SIMHOST_TEXT_VALUE(field, text) text,
#define SIMHOST_TEXT_AT(Texts, field) \
    static_cast<std::uint32_t>(offsetof(Texts, SIMHOST_TEXT_CAT(field, __LINE__)))
#define SIMHOST_TEXT(texts, offset) (reinterpret_cast<const char*>(&(texts)) + (offset))

#endif  // SIMHOST_DOMAINS_TEXTTABLE_H
