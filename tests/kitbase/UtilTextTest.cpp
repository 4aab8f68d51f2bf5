// quarnutil's text helpers: strict UTF-8, the edit distance and suggestion choice (as quarncli
// and the simulated host use them), the terminal escape form and quoting of user text.
#include "util/Text.h"

#include <gtest/gtest.h>

namespace {

using namespace quarn::util;

TEST(UtilText, Utf8IsCheckedStrictly) {
    auto length = [](const std::string& bytes) {
        return Utf8SequenceLength(reinterpret_cast<const unsigned char*>(bytes.data()),
                                  bytes.size());
    };
    EXPECT_EQ(1u, length("a"));
    EXPECT_EQ(2u, length("\xC3\xA9"));          // é
    EXPECT_EQ(3u, length("\xE2\x82\xAC"));      // €
    EXPECT_EQ(4u, length("\xF0\x9F\x98\x80"));  // emoji
    EXPECT_EQ(0u, length("\x80"));              // stray continuation
    EXPECT_EQ(0u, length("\xC0\xAF"));          // overlong
    EXPECT_EQ(0u, length("\xE0\x80\xAF"));      // overlong
    EXPECT_EQ(0u, length("\xED\xA0\x80"));      // surrogate
    EXPECT_EQ(0u, length("\xF4\x90\x80\x80"));  // beyond U+10FFFF
    EXPECT_EQ(0u, length("\xE2\x82"));          // cut short
    EXPECT_EQ(0u, length("\xFF"));
    EXPECT_TRUE(IsValidUtf8(std::string("plain \xC3\xA9 \xF0\x9F\x98\x80 and a NUL \0", 20)));
    EXPECT_TRUE(IsValidUtf8(""));
    EXPECT_FALSE(IsValidUtf8("ok then \xE2\x82"));
    EXPECT_FALSE(IsValidUtf8("\xED\xA0\x80"));
}

TEST(UtilText, EditDistanceCountsSwapsAndMayIgnoreCase) {
    EXPECT_EQ(1u, EditDistance("verison", "version"));
    EXPECT_EQ(0u, EditDistance("MODULE", "module"));
    EXPECT_EQ(1u, EditDistance("Module", "module", false));
    EXPECT_EQ(3u, EditDistance("", "abc"));
    EXPECT_EQ(3u, EditDistance("kitten", "sitting"));
}

TEST(UtilText, NearestNamesFindTyposTranspositionsAndPrefixes) {
    std::vector<std::string> children = {"boot", "settings", "module", "coredump", "version",
                                         "maintenanceMode", "mirafs"};
    EXPECT_EQ((std::vector<std::string>{"version"}), NearestNames("verison", children));
    EXPECT_EQ((std::vector<std::string>{"maintenanceMode"}),
              NearestNames("maintenancemode", children));
    EXPECT_EQ((std::vector<std::string>{"module"}), NearestNames("mod", children));
    // A single letter is too short to guess from; two letters already name a prefix.
    EXPECT_TRUE(NearestNames("m", {"module", "mirafs"}).empty());
    EXPECT_EQ((std::vector<std::string>{"mirafs"}), NearestNames("mi", {"module", "mirafs"}));
    // Only the nearest are named, in the candidates' order.
    EXPECT_EQ((std::vector<std::string>{"set", "get"}),
              NearestNames("bet", {"set", "list", "get"}));
    EXPECT_TRUE(NearestNames("zzzzzz", children).empty());
    EXPECT_TRUE(NearestNames("boo", {}).empty());
    // A pasted value far longer than any name is ruled out without a full comparison.
    EXPECT_TRUE(NearestNames(std::string(131072, 'v'), children).empty());
}

TEST(UtilText, NearestNamesCanRankEveryNameAndMatchTails) {
    // As the simulated host suggests operations: a name without its namespaces finds its
    // qualified form, and the nearest few are named however far.
    std::vector<std::string> operations = {"Info::System::GetUuid", "Info::System::SetUuid",
                                           "Time::GetClock", "QuillUserLib_Init"};
    NearestOptions options;
    options.limited = false;
    options.nearestOnly = false;
    options.tails = true;
    options.count = 2;
    options.ignoreCase = false;
    EXPECT_EQ((std::vector<std::string>{"Info::System::GetUuid", "Info::System::SetUuid"}),
              NearestNames("GetUuid", operations, options));
    EXPECT_EQ((std::vector<std::string>{"QuillUserLib_Init", "Time::GetClock"}),
              NearestNames("QuillUserLib_Int", operations, options));
    options.count = 10;
    EXPECT_EQ(4u, NearestNames("zzz", operations, options).size());
}

TEST(UtilText, EscapeShowsControlsC1AndBadBytesVisibly) {
    EXPECT_EQ("plain text, \xC3\xA9t\xC3\xA9 \xE2\x82\xAC", Escape("plain text, \xC3\xA9t\xC3\xA9 \xE2\x82\xAC"));
    EXPECT_EQ("a\\nb\\rc\\td", Escape("a\nb\rc\td"));
    // A terminal escape sequence arrives as inert text.
    EXPECT_EQ("\\x1b[31mred\\x1b[0m", Escape("\x1b[31mred\x1b[0m"));
    EXPECT_EQ("\\x00\\x07\\x7f", Escape(std::string("\0\a\x7f", 3)));
    // C1 controls (U+009B is a one-character escape introducer) and malformed UTF-8, byte by byte.
    EXPECT_EQ("\\xc2\\x9b2J", Escape("\xC2\x9B" "2J"));
    EXPECT_EQ("\\xff\\xe2\\x82!", Escape("\xFF\xE2\x82!"));
    // Backslashes are kept for people and escaped where the text must decode back.
    EXPECT_EQ("C:\\dir", Escape("C:\\dir"));
    EXPECT_EQ("C:\\\\dir\\n", Escape("C:\\dir\n", Backslash::kEscape));
    EXPECT_FALSE(NeedsEscape("C:\\dir \xC3\xA9", 9));
    EXPECT_TRUE(NeedsEscape("C:\\dir", 6, Backslash::kEscape));
    EXPECT_TRUE(NeedsEscape("\xC2\x85", 2));
}

TEST(UtilText, QuoteEscapesAndShortensUserText) {
    EXPECT_EQ("'abc'", Quote("abc"));
    EXPECT_EQ("''", Quote(""));
    EXPECT_EQ("'a\\nb\\tc\\x01'", Quote("a\nb\tc\x01"));
    EXPECT_EQ("'" + std::string(80, 'x') + "...'", Quote(std::string(131072, 'x')));
    // The cut counts characters, and never splits one.
    std::string accents;
    for (int i = 0; i < 81; ++i) accents += "\xC3\xA9";
    EXPECT_EQ("'" + accents.substr(0, 160) + "...'", Quote(accents));
    EXPECT_EQ("'ab...'", Quote("abc", 2));
}

}  // namespace
