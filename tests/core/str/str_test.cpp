// Tokens, trimming, colon encoding, and UTF-8 without regard to case.
#include "tavo_str.h"

#include "support/story.h"
#include "support/test.h"

#include <random>

using test::Fault;
using test::LastFault;
using Texts = std::vector<std::string>;

namespace {

Texts Tokens(char *(*cut)(char **, const char *), std::string text, const char *delimiters)
{
    Texts tokens;
    char *cursor = text.data();
    while (const char *token = cut(&cursor, delimiters))
        tokens.push_back(token);
    EXPECT_EQ(cursor, nullptr);
    return tokens;
}

TEST(StrTok, SkipsEmptyTokensWhereSepReturnsThem)
{
    test::Story story_{TEST_GOLDEN, {}};
    const struct {
        const char *text, *delimiters;
    } rows[] = {{"a=b", "="}, {"==a==b=", "="}, {"a, b;c", ",;"}, {"", "="}, {"::", ":"}, {"no delimiter", ""}};
    for (const auto &row : rows) {
        const Texts tokens = Tokens(TLIBStrTok, row.text, row.delimiters);
        story_.Show(row.text, tokens);
        EXPECT_EQ(Tokens(TLIBIStrTok, row.text, row.delimiters), tokens) << row.text;
        story_.Show("separated", Tokens(TLIBStrSep, row.text, row.delimiters));
    }
    char text[] = "=x";
    char *cursor = text;
    char *none = nullptr;
    for (const auto cut : {TLIBStrTok, TLIBIStrTok, TLIBStrSep}) {
        EXPECT_EQ(cut(nullptr, "="), nullptr);
        EXPECT_EQ(cut(&cursor, nullptr), nullptr);
        EXPECT_EQ(cut(&none, "="), nullptr);
    }
    EXPECT_EQ(cursor, text);
    EXPECT_STREQ(text, "=x");
}

TEST(StrTrimSpace, WhiteSpaceThenOnePairOfQuotes)
{
    test::Story story_{TEST_GOLDEN, {}};
    for (const char *text : {" \t\r\nabc\n", "", " \n\t ", "\"a b\"", " \" a \" ", "\"", "\"\"", "\"a", "a\"",
                             "\"\"a\"\"", "\va\f", "a b", "  \"\"\"  ", "'a'"}) {
        std::string source = text;
        char target[16];
        std::memset(target, '#', sizeof target);
        const int length = TLIBStrTrimSpace(source.data(), target);
        story_.Show(text, target);
        EXPECT_EQ(length, static_cast<int>(std::strlen(target))) << text;
        EXPECT_EQ(target[length + 1], '#');
        EXPECT_EQ(source, text);
        for (const bool with_target : {false, true}) {
            source = text;
            EXPECT_EQ(TLIBStrTrimSpace(source.data(), with_target ? source.data() : nullptr), length);
            EXPECT_STREQ(source.c_str(), target);
        }
    }
}

TEST(StrTrimSpace, RefusesOverlap)
{
    char text[32] = "       ab  ";
    for (char *target : {text + 8, text + 1, text + 11}) {
        test::ForgetFault();
        EXPECT_EQ(TLIBStrTrimSpace(text, target), -1) << target - text;
        EXPECT_EQ(LastFault(), (Fault{ERR_BAD_PARAMETERS, "str_trim_space"}));
    }
    EXPECT_EQ(TLIBStrTrimSpace(text + 2, text), -1) << "the result would run into the source";
    EXPECT_STREQ(text, "       ab  ");
    EXPECT_EQ(TLIBStrTrimSpace(nullptr, text), -1);
    EXPECT_EQ(TLIBStrTrimSpace(text, text + 12), 2);
    EXPECT_STREQ(text + 12, "ab");
    EXPECT_EQ(TLIBStrTrimSpace(text + 4, text), 2) << "beside each other";
    EXPECT_STREQ(text, "ab");
}

TEST(StrColon, EncodesWhatAFieldCannotHold)
{
    test::Story story_{TEST_GOLDEN, {}};
    for (const char *text : {"", "Tom's NAS (50% full)", "a:b::", "two\nlines\r", "%3A", "%25", "%", "%2", "%%3A",
                             "%:", "%2:", "%3a", "Zo\xc3\xab \xff"}) {
        char buffer[64];
        const int length = TLIBStrEncodeColon(text, nullptr, 0);
        EXPECT_EQ(TLIBStrEncodeColon(text, buffer, length), length);
        EXPECT_EQ(length, static_cast<int>(std::strlen(buffer)) + 1) << text;
        story_.Show(text, buffer);
        EXPECT_EQ(TLIBStrDecodeColon(buffer, nullptr, 0), static_cast<int>(std::strlen(text)) + 1);
        EXPECT_EQ(TLIBStrDecodeColon(buffer, buffer, sizeof buffer), static_cast<int>(std::strlen(text)) + 1);
        EXPECT_STREQ(buffer, text);
    }
}

TEST(StrColon, EveryTextComesBack)
{
    std::mt19937 random(7);
    const std::string likely = "%%%::\n\r0123AaDd5";
    for (int round = 0; round < 20000; ++round) {
        std::string text(random() % 24, ' ');
        for (char &byte : text)
            byte = random() % 4 ? likely[random() % likely.size()] : static_cast<char>(1 + random() % 255);
        char encoded[80];
        char decoded[80];
        ASSERT_GT(TLIBStrEncodeColon(text.c_str(), encoded, sizeof encoded), 0);
        ASSERT_EQ(std::strpbrk(encoded, ":\r\n"), nullptr) << text;
        ASSERT_EQ(TLIBStrDecodeColon(encoded, decoded, sizeof decoded), static_cast<int>(text.size()) + 1);
        ASSERT_EQ(decoded, text);
    }
}

TEST(StrColon, RefusesAndWritesNothing)
{
    char buffer[16] = "#######";
    const struct {
        int result;
        Fault fault;
    } rows[] = {
        {TLIBStrEncodeColon("a:b", buffer, 5), LastFault()},   {TLIBStrDecodeColon("a%3Ab", buffer, 3), LastFault()},
        {TLIBStrEncodeColon(nullptr, buffer, 8), LastFault()}, {TLIBStrEncodeColon("a", nullptr, 8), LastFault()},
        {TLIBStrEncodeColon("a", buffer, -1), LastFault()},    {TLIBStrDecodeColon(nullptr, buffer, 8), LastFault()},
        {TLIBStrEncodeColon(buffer, buffer, 8), LastFault()},  {TLIBStrDecodeColon(buffer + 2, buffer, 8), LastFault()},
    };
    for (const auto &row : rows)
        EXPECT_EQ(row.result, -1);
    EXPECT_EQ(rows[0].fault, (Fault{ERR_NOT_ENOUGH_MEMORY, "str_encode_colon"}));
    EXPECT_EQ(rows[1].fault, (Fault{ERR_NOT_ENOUGH_MEMORY, "str_decode_colon"}));
    EXPECT_EQ(rows[2].fault, (Fault{ERR_BAD_PARAMETERS, "str_encode_colon"}));
    EXPECT_EQ(rows[7].fault, (Fault{ERR_BAD_PARAMETERS, "str_decode_colon"}));
    EXPECT_STREQ(buffer, "#######");
}

TEST(Utf8Upper, FollowsTheUnicodeTables)
{
    test::Story story_{TEST_GOLDEN, {}};
    for (const char *text :
         {"", "admin", "Ünïcode", "straße", "ﬃ", "ıi", "λόγος", "ŉ", "用户1", "𐐨", "_-. $", "ΐΐΐΐΐΐΐ"}) {
        char buffer[128];
        std::strcpy(buffer, text);
        const int length = TLIBUnicodeUTF8StrUpper(text, nullptr, 0);
        EXPECT_EQ(TLIBUnicodeUTF8StrUpper(buffer, buffer, length), length);
        EXPECT_EQ(length, static_cast<int>(std::strlen(buffer)) + 1) << text;
        story_.Show(text, buffer);
        test::ForgetFault();
        const std::string upper = buffer;
        EXPECT_EQ(TLIBUnicodeUTF8StrUpper(text, buffer, length - 1), -1);
        EXPECT_EQ(LastFault(), (Fault{ERR_NOT_ENOUGH_MEMORY, "unicode_utf8_str_upper"}));
        EXPECT_EQ(buffer, upper);
    }
}

TEST(Utf8, RefusesInvalidUtf8)
{
    const char *const rows[] = {"\xff", "a\xc3",    "\xc3(", "\xc0\x80", "\xed\xa0\x80", "\xf4\x90\x80\x80",
                                "\x80", "b\xe2\x82"};
    for (const char *text : rows) {
        char buffer[16] = "#";
        test::ForgetFault();
        EXPECT_EQ(TLIBUnicodeUTF8StrUpper(text, buffer, sizeof buffer), -1);
        EXPECT_EQ(LastFault(), (Fault{ERR_BAD_PARAMETERS, "unicode_utf8_str_upper"}));
        EXPECT_STREQ(buffer, "#");
        EXPECT_EQ(TLIBUnicodeUTF8StrCountChar(text), -1);
        EXPECT_EQ(LastFault(), (Fault{ERR_BAD_PARAMETERS, "unicode_utf8_str_count_char"}));
        // Also after the place that decides the order.
        for (const std::string before : {"", "z", "Ä"}) {
            EXPECT_EQ(TLIBUnicodeUTF8StrCaseCmp((before + text).c_str(), "a"), -2);
            EXPECT_EQ(TLIBUnicodeUTF8StrCaseCmp("a", (before + text).c_str()), -2);
        }
        EXPECT_EQ(TLIBUnicodeUTF8StrCaseCmp(text, text), -2);
    }
    EXPECT_EQ(LastFault(), (Fault{ERR_BAD_PARAMETERS, "unicode_utf8_str_case_cmp"}));
    EXPECT_EQ(TLIBUnicodeUTF8StrCaseCmp(nullptr, "a"), -2);
    EXPECT_EQ(TLIBUnicodeUTF8StrCaseCmp("a", nullptr), -2);
    EXPECT_EQ(TLIBUnicodeUTF8StrCountChar(nullptr), -1);
    EXPECT_EQ(TLIBUnicodeUTF8StrUpper(nullptr, nullptr, 0), -1);
    EXPECT_EQ(TLIBUnicodeUTF8StrUpper("a", nullptr, 5), -1);
}

TEST(Utf8CountChar, CountsCodePoints)
{
    EXPECT_EQ(TLIBUnicodeUTF8StrCountChar(""), 0);
    EXPECT_EQ(TLIBUnicodeUTF8StrCountChar("abc"), 3);
    EXPECT_EQ(TLIBUnicodeUTF8StrCountChar("äß用𐐀"), 4);
}

TEST(Utf8CaseCmp, OrdersFoldedText)
{
    const struct {
        const char *left;
        const char *right;
        int order;
    } rows[] = {
        {"", "", 0},       {"", "a", -1},    {"Admin", "aDMIN", 0},
        {"a", "B", -1},    {"_", "A", -1},   {"abc", "ABCD", -1},
        {"Ä", "ä", 0},     {"ß", "SS", 0},   {"Straße", "STRASSEN", -1},
        {"ﬃ", "ffi", 0},   {"ﬃ", "ffj", -1}, {"ΣΊΣΥΦΟΣ", "σίσυφος", 0},
        {"z", "ä", -1},    {"𐐀", "𐐨", 0},    {"\xef\xbf\xbd", "𐐀", -1},
        {"ffi", "ﬃb", -1}, {"İ", "i̇", 0},    {"K", "k", 0},
    };
    for (const auto &row : rows) {
        EXPECT_EQ(TLIBUnicodeUTF8StrCaseCmp(row.left, row.right), row.order) << row.left << " " << row.right;
        EXPECT_EQ(TLIBUnicodeUTF8StrCaseCmp(row.right, row.left), -row.order) << row.left << " " << row.right;
    }
}

}  // namespace
