// Text helpers and the buffered writer: number and boolean parsing, UTF-8 repair and escaping,
// wrapping, suggestions, and write failures.
#include "engine/Text.h"
#include "engine/Writer.h"

#include <gtest/gtest.h>
#include <nlohmann/json.hpp>

#include <cerrno>
#include <fcntl.h>
#include <unistd.h>

namespace {

using namespace Kitbase::Engine;

std::string Json(const std::string& text) {
    std::string out;
    {
        Writer writer(&out);
        PutJsonString(writer, text);
    }
    return out;
}

std::string Xml(const std::string& text, bool attribute) {
    std::string out;
    {
        Writer writer(&out);
        PutXmlText(writer, text, attribute);
    }
    return out;
}

TEST(Text, ParseInt64TakesOnlyWholeDecimalNumbers) {
    long long value = 99;
    EXPECT_TRUE(ParseInt64("0", &value));
    EXPECT_EQ(0, value);
    EXPECT_TRUE(ParseInt64("-42", &value));
    EXPECT_EQ(-42, value);
    EXPECT_TRUE(ParseInt64("+42", &value));
    EXPECT_EQ(42, value);
    EXPECT_TRUE(ParseInt64("9223372036854775807", &value));
    EXPECT_EQ(9223372036854775807LL, value);
    EXPECT_TRUE(ParseInt64("-9223372036854775808", &value));
    EXPECT_EQ(-9223372036854775807LL - 1, value);

    value = 7;
    for (const char* bad : {"", "-", "+", "9223372036854775808", "-9223372036854775809",
                            "12x", " 1", "1 ", "0x10", "1e3", "+-1", "--1", "1.0", "١"}) {
        EXPECT_FALSE(ParseInt64(bad, &value)) << bad;
    }
    EXPECT_EQ(7, value);
}

TEST(Text, ParseBoolTakesSixSpellingsInAnyCase) {
    bool value = false;
    for (const char* yes : {"true", "TRUE", "True", "yes", "YeS", "1"}) {
        value = false;
        EXPECT_TRUE(ParseBool(yes, &value)) << yes;
        EXPECT_TRUE(value) << yes;
    }
    for (const char* no : {"false", "FALSE", "no", "No", "0"}) {
        value = true;
        EXPECT_TRUE(ParseBool(no, &value)) << no;
        EXPECT_FALSE(value) << no;
    }
    for (const char* bad : {"", "y", "n", "on", "off", "2", "01", "truee", " true"}) {
        EXPECT_FALSE(ParseBool(bad, &value)) << bad;
    }
}

TEST(Text, DisplayWidthCountsCodePoints) {
    EXPECT_EQ(3u, DisplayWidth("a\xC3\xA9\xE2\x82\xAC"));
    EXPECT_EQ(8u, EscapedWidth("a\tb\x1b", 4));  // the escapes are what shows
}

TEST(Text, JsonStringsAreEscapedAndAlwaysValid) {
    EXPECT_EQ("\"plain\"", Json("plain"));
    EXPECT_EQ("\"q\\\"b\\\\\"", Json("q\"b\\"));
    // The short escapes where JSON has them, \u00XX for the other control characters.
    EXPECT_EQ("\"\\n\\r\\t\\b\\f\\u0001\\u001b\\u001f\"", Json("\n\r\t\b\f\x01\x1b\x1f"));
    EXPECT_EQ("\"\xC3\xA9\"", Json("\xC3\xA9"));
    // Each byte that is not well-formed UTF-8 becomes U+FFFD; the rest is kept.
    EXPECT_EQ("\"a\xEF\xBF\xBD" "b\xEF\xBF\xBD(\"", Json("a\xFF" "b\xC3" "\x28"));
    std::string nasty("x\0y\xC0\xAF\xED\xA0\x80\"\x7f", 10);
    nlohmann::json parsed = nlohmann::json::parse(Json(nasty));
    EXPECT_EQ(std::string("x\0y", 3) + "\xEF\xBF\xBD\xEF\xBF\xBD\xEF\xBF\xBD\xEF\xBF\xBD"
                                       "\xEF\xBF\xBD\"\x7f",
              parsed.get<std::string>());
}

TEST(Text, XmlTextAndAttributesAreEscaped) {
    EXPECT_EQ("a &amp; b &lt;c&gt; \"q\" 'x'", Xml("a & b <c> \"q\" 'x'", false));
    EXPECT_EQ("&quot;q&quot; &amp; tab&#9;nl&#10;cr&#13;", Xml("\"q\" & tab\tnl\ncr\r", true));
    EXPECT_EQ("line1\nline2&#13;", Xml("line1\nline2\r", false));
    EXPECT_EQ("\xEF\xBF\xBD-\xEF\xBF\xBD-\xEF\xBF\xBD", Xml("\x01-\xFF-\xEF\xBF\xBF", false));
}

TEST(Text, WrapWordsBreaksAtBlanksAndCutsLongWords) {
    EXPECT_EQ((std::vector<std::string>{"the quick", "brown fox"}),
              WrapWords("the quick brown fox", 10));
    EXPECT_EQ((std::vector<std::string>{"abcdefghij", "klm end"}),
              WrapWords("abcdefghijklm end", 10));
    EXPECT_EQ((std::vector<std::string>{"one", "", "two"}), WrapWords("one\n\ntwo", 10));
    EXPECT_EQ((std::vector<std::string>{""}), WrapWords("", 10));
    // Widths count code points, not bytes.
    EXPECT_EQ((std::vector<std::string>{"\xC3\xA9\xC3\xA9\xC3\xA9 \xC3\xA9\xC3\xA9"}),
              WrapWords("\xC3\xA9\xC3\xA9\xC3\xA9 \xC3\xA9\xC3\xA9", 6));
}

TEST(Text, CommaListsAreTrimmed) {
    EXPECT_EQ((std::vector<std::string>{"Name", "Is Loaded", "Size"}),
              SplitCommaList(" Name ,Is Loaded,, Size,"));
    EXPECT_TRUE(SplitCommaList("").empty());
    EXPECT_TRUE(SplitCommaList(" , ").empty());
}

TEST(Text, NamesJoinForMessages) {
    EXPECT_EQ("a, b or c", JoinNames({"a", "b", "c"}, " or "));
    EXPECT_EQ("a", JoinNames({"a"}, " or "));
    EXPECT_EQ((std::vector<std::string>{"'x'", "'\\n'"}), QuoteEach({"x", "\n"}));
}

TEST(Writer, LargeAndSmallPiecesArriveInOrder) {
    std::string target;
    {
        Writer writer(&target, 8);
        writer.Put('<');
        writer.Put(std::string(20, 'a'));
        writer.PutRepeat('-', 13);
        writer.PutInt(-9223372036854775807LL - 1);
        writer.PutText("end");
    }
    EXPECT_EQ("<" + std::string(20, 'a') + std::string(13, '-') + "-9223372036854775808end",
              target);
}

TEST(Writer, AFailedWriteIsReportedAndNothingThrows) {
    int fd = open("/dev/full", O_WRONLY);
    ASSERT_GE(fd, 0);
    {
        Writer writer(fd, 16);
        writer.Put(std::string(100, 'x'));
        EXPECT_FALSE(writer.Flush());
        EXPECT_EQ(ENOSPC, writer.ErrorCode());
        writer.PutText("more");  // dropped quietly
    }
    close(fd);
}

}  // namespace
