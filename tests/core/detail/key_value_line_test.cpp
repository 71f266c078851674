// The lines of settings files: which key a line sets, to what, and what may be written.
#include "core/detail/key_value_line.h"

#include "support/test.h"

using namespace std::string_view_literals;

namespace {

TEST(KeyValueLine, SetsItsKeyToItsValue)
{
    struct Row {
        std::string_view line;
        std::string_view key;  // empty: sets none
        std::string_view value;
    };
    constexpr Row rows[] = {
        {"runsamba=yes\n", "runsamba", "yes"},
        {"runsamba=yes", "runsamba", "yes"},
        {"key = \"a b\" \n", "key", "a b"},
        {"\t key\t=\r\n", "key", ""},
        {"key==v\n", "key", "=v"},
        {"key=a=b\n", "key", "a=b"},
        {"=x\n", "x", ""},
        {"==x=y\n", "x", "y"},
        {"\"key\"=v\n", "key", "v"},
        {"key=\"\n", "key", "\""},
        {"key=\"\"\n", "key", ""},
        {"key=\" v \"\n", "key", " v "},
        {"key=\"\"v\"\"\n", "key", "\"v\""},
        {"key='v'\n", "key", "'v'"},
        {"key=v\0w\n"sv, "key", "v"},
        {"two words=v\n", "two words", "v"},
        {" #key=v\n", "#key", "v"},
        {"[a=b]\n", "[a", "b]"},
        {"#key=v\n", "", ""},
        {";key=v\n", "", ""},
        {"key\n", "", ""},
        {"\n", "", ""},
        {"", "", ""},
        {"=\n", "", ""},
        {"  =v\n", "", ""},
        {"ke\0y=v\n"sv, "ke\0y"sv, "v"},
    };
    for (const Row &row : rows) {
        EXPECT_EQ(tavo::LineKey(row.line), row.key) << row.line;
        if (row.key.empty())
            continue;
        EXPECT_TRUE(tavo::LineSetsKey(row.line, row.key)) << row.line;
        EXPECT_EQ(tavo::LineValue(row.line), row.value) << row.line;
    }
}

TEST(KeyValueLine, SetsNoOtherKey)
{
    for (const std::string_view key : {"", "KEY", "ke", "keyy", " key", "v", "key=v"})
        EXPECT_FALSE(tavo::LineSetsKey("key=v\n", key)) << key;
    EXPECT_TRUE(tavo::LineSetsKey("\"\"q\"\"=v\n", "\"q\"")) << "only one pair of quotes is taken off";
}

TEST(KeyValueLine, SplitsAtAnySeparator)
{
    struct Row {
        std::string_view line, separators, key, value;  // no key: skipped
    };
    constexpr Row rows[] = {
        {"nameserver 10.0.0.1\n", " \t", "nameserver", "10.0.0.1"},
        {"  search  a.example b.example\n", " \t", "search", "a.example b.example"},
        {"a = b = c\n", "=", "a", "b = c"},
        {"a:b=c\n", ":=", "a", "b=c"},
        {"a= \n", "=", "a", ""},
        {"a=\n", "=", "", ""},
        {"a\n", "=", "", ""},
        {" =b\n", "=", "", ""},
        {"#a=b\n", "=", "", ""},
        {"", "=", "", ""},
    };
    for (const Row &row : rows) {
        const auto pair = tavo::SplitLine(row.line, row.separators);
        ASSERT_EQ(pair.has_value(), !row.key.empty()) << row.line;
        if (pair) {
            EXPECT_EQ(pair->key, row.key) << row.line;
            EXPECT_EQ(pair->value, row.value) << row.line;
        }
    }
}

TEST(KeyValueLine, TakesKeysThatAreFoundAgain)
{
    for (const std::string_view key : {"k", "two words", "k#", "k]", "\"k", "\xC3\xA4", "%s"})
        EXPECT_TRUE(tavo::IsWritableKey(key)) << key;
}

}  // namespace
