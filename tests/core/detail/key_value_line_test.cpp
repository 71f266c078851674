// The lines of settings files: which key a line sets, to what, and what may be written.
#include "core/detail/key_value_line.h"

#include "support/story.h"
#include "support/test.h"

using namespace std::string_view_literals;

namespace {

TEST(KeyValueLine, SetsItsKeyToItsValue)
{
    test::Story story_{TEST_GOLDEN, {}};
    for (const std::string_view line : {"runsamba=yes\n"sv,
                                        "runsamba=yes"sv,
                                        "key = \"a b\" \n"sv,
                                        "\t key\t=\r\n"sv,
                                        "key==v\n"sv,
                                        "key=a=b\n"sv,
                                        "=x\n"sv,
                                        "==x=y\n"sv,
                                        "\"key\"=v\n"sv,
                                        "key=\"\n"sv,
                                        "key=\"\"\n"sv,
                                        "key=\" v \"\n"sv,
                                        "key=\"\"v\"\"\n"sv,
                                        "key='v'\n"sv,
                                        "key=v\0w\n"sv,
                                        "two words=v\n"sv,
                                        " #key=v\n"sv,
                                        "[a=b]\n"sv,
                                        "#key=v\n"sv,
                                        ";key=v\n"sv,
                                        "key\n"sv,
                                        "\n"sv,
                                        ""sv,
                                        "=\n"sv,
                                        "  =v\n"sv,
                                        "ke\0y=v\n"sv}) {
        const std::string key(tavo::LineKey(line));
        story_.Show(std::string(line), key.empty() ? "sets none" : key + ": " + std::string(tavo::LineValue(line)));
        EXPECT_TRUE(key.empty() || tavo::LineSetsKey(line, key)) << line;
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
    test::Story story_{TEST_GOLDEN, {}};
    const struct {
        const char *line, *separators;
    } rows[] = {{"nameserver 10.0.0.1\n", " \t"},
                {"  search  a.example b.example\n", " \t"},
                {"a = b = c\n", "="},
                {"a:b=c\n", ":="},
                {"a= \n", "="},
                {"a=\n", "="},
                {"a\n", "="},
                {" =b\n", "="},
                {"#a=b\n", "="},
                {"", "="}};
    for (const auto &row : rows) {
        const auto pair = tavo::SplitLine(row.line, row.separators);
        story_.Show(row.line, pair ? std::string(pair->key) + ": " + std::string(pair->value) : "skipped");
    }
}

TEST(KeyValueLine, TakesKeysThatAreFoundAgain)
{
    for (const std::string_view key : {"k", "two words", "k#", "k]", "\"k", "\xC3\xA4", "%s"})
        EXPECT_TRUE(tavo::IsWritableKey(key)) << key;
}

}  // namespace
