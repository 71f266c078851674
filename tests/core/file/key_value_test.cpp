// One key of a settings file: read, set, appended, removed.
#include "tavo_file.h"

#include "support/test.h"

using test::Fault;
using test::ForgetFault;
using test::LastFault;

using namespace std::string_literals;

namespace {

class KeyValueTest : public testing::Test {
  protected:
    KeyValueTest() { ForgetFault(); }

    void Write(std::string_view text) { test::WriteFile(file_, text); }
    std::string Text() const { return test::ReadFile(file_); }

    const test::ScratchDir dir_;
    const std::string file_ = dir_ / "settings.conf";
};

TEST_F(KeyValueTest, GetsTheFirstOrTheLastValue)
{
    struct Row {
        const char *text, *key;
        int flags, result;
        const char *value;
    };
    constexpr Row rows[] = {
        {"key = \"a b\" \n", "key", 0, 4, "a b"},
        {"key=1\nkey=22\n", "key", 0, 2, "1"},
        {"key=1\nkey=22\n", "key", 1, 3, "22"},
        {"key=1\nkey=22\n", "key", 2, 2, "1"},
        {"key=1\nkey=\n", "key", 1, 1, ""},
        {"#key=0\n;key=0\n key=1\n", "key", 0, 2, "1"},
        {"=x\n", "x", 0, 1, ""},
        {"abc\nabc=\n", "abc", 0, 1, ""},
        {"a=1\nlast=no newline", "last", 0, 11, "no newline"},
    };
    for (const Row &row : rows) {
        Write(row.text);
        char value[32] = "";
        EXPECT_EQ(TLIBFileGetKeyValue(file_.c_str(), row.key, value, sizeof value, row.flags), row.result) << row.text;
        EXPECT_STREQ(value, row.value) << row.text;
        EXPECT_EQ(TLIBFileGetKeyValue(file_.c_str(), row.key, nullptr, 0, row.flags), row.result) << row.text;
    }
    EXPECT_EQ(TLIBErrGet(), ERR_SUCCESS);
}

TEST_F(KeyValueTest, GetFailsWithoutTouchingTheBuffer)
{
    Write("key=0123456789\nkey2=" + std::string(100000, 'x') + "\n");
    struct Row {
        const char *path, *key;
        int size, flags, result, code, line;
    };
    const std::string missing = dir_ / "missing";
    const Row rows[] = {
        {missing.c_str(), "key", 16, 0, -1, ERR_OPEN_FAILED, 56},
        {dir_.Path().c_str(), "key", 16, 0, -1, ERR_OPEN_FAILED, 56},
        {"/dev/zero", "key", 16, 0, -1, ERR_OPEN_FAILED, 56},
        {file_.c_str(), "key", 10, 0, -1, ERR_NOT_ENOUGH_MEMORY, 88},
        {file_.c_str(), "key", -1, 0, -1, ERR_NOT_ENOUGH_MEMORY, 88},
        {file_.c_str(), "key2", 16, 0, -1, ERR_NOT_ENOUGH_MEMORY, 88},
        {file_.c_str(), "absent", 16, 0, 0, ERR_KEY_NOT_FOUND, 108},
        {file_.c_str(), "", 16, 0, 0, ERR_KEY_NOT_FOUND, 108},
    };
    for (const Row &row : rows) {
        ForgetFault();
        char value[32] = "untouched";
        EXPECT_EQ(TLIBFileGetKeyValue(row.path, row.key, value, row.size, row.flags), row.result);
        EXPECT_EQ(LastFault(), (Fault{row.code, "file_get_key_value", row.line}));
        EXPECT_STREQ(value, "untouched");
    }
    EXPECT_EQ(TLIBFileGetKeyValue(file_.c_str(), "key", nullptr, 1, 0), -1);
    char value[11];
    EXPECT_EQ(TLIBFileGetKeyValue(file_.c_str(), "key", value, sizeof value, 0), 11);
    EXPECT_EQ(TLIBFileGetKeyValue(file_.c_str(), "key2", nullptr, 0, 0), 100001);
}

TEST_F(KeyValueTest, SetReplacesTheFirstAndDropsTheRest)
{
    struct Row {
        const char *before, *key, *value, *format, *after;
    };
    constexpr Row rows[] = {
        {"a=1\nkey=old\nb=2\n", "key", "new", nullptr, "a=1\nkey=new\nb=2\n"},
        {"key=1\n\n#key=2\n key = 3\nb=4\nkey=5", "key", "n", nullptr, "key=n\n\n#key=2\nb=4\n"},
        {"a=1\n", "key", "v", nullptr, "a=1\nkey=v\n"},
        {"a=1", "key", "v", nullptr, "a=1\nkey=v\n"},
        {"", "key", "", nullptr, "key=\n"},
        {"key=old\n", "key", "a b", "%s=\"%s\"\n", "key=\"a b\"\n"},
        {"key=old\n", "key", "%n%s", "%%%s=%s\n", "%key=%n%s\n"},
        {"key=old\n", "key", "50%d", "%s%s", "key50%d"},
        {"no sign\n[net]\n\tx = y \r\n", "key", "v", nullptr, "no sign\n[net]\n\tx = y \r\nkey=v\n"},
    };
    for (const Row &row : rows) {
        Write(row.before);
        EXPECT_EQ(TLIBFileSetKeyValue(file_.c_str(), row.key, row.value, row.format), 1) << row.before;
        EXPECT_EQ(Text(), row.after);
    }
    EXPECT_THAT(dir_.Names(), testing::ElementsAre("settings.conf"));
    EXPECT_EQ(TLIBErrGet(), ERR_SUCCESS);
}

TEST_F(KeyValueTest, SetKeepsTheBytesOfOtherLines)
{
    const std::string before = "a\0b=c\n\xFF\xFE\nkey=1\n\0\0tail"s;
    Write(before);
    EXPECT_EQ(TLIBFileSetKeyValue(file_.c_str(), "key", "2", nullptr), 1);
    std::string after = before;
    after.replace(after.find("key=1"), 5, "key=2");
    EXPECT_EQ(Text(), after);
}

TEST_F(KeyValueTest, SetAndAppendCreateAMissingFile)
{
    const mode_t old = ::umask(022);
    EXPECT_EQ(TLIBFileSetKeyValue((dir_ / "set").c_str(), "key", "v", nullptr), 1);
    EXPECT_EQ(TLIBFileAppendKey((dir_ / "append").c_str(), "key", "v", "%s: %s\n"), 1);
    ::umask(old);
    EXPECT_EQ(test::ReadFile(dir_ / "set"), "key=v\n");
    EXPECT_EQ(test::ReadFile(dir_ / "append"), "key: v\n");
    struct stat st;
    ASSERT_EQ(::stat((dir_ / "set").c_str(), &st), 0);
    EXPECT_EQ(st.st_mode & 07777, 0644u);
    EXPECT_THAT(dir_.Names(), testing::ElementsAre("append", "set"));
}

TEST_F(KeyValueTest, WritersRefuseUnreadableValues)
{
    Write("key=1\n");
    struct Row {
        const char *key, *value, *format;
    };
    constexpr Row rows[] = {
        {"", "v", nullptr},        {"a=b", "v", nullptr},      {"#a", "v", nullptr},        {";a", "v", nullptr},
        {"[a", "v", nullptr},      {" a", "v", nullptr},       {"a\t", "v", nullptr},       {"\"a\"", "v", nullptr},
        {"a\nb", "v", nullptr},    {"key", "v\nb=c", nullptr}, {"key", "v\r", nullptr},     {"key", "v", "%s=%s%s\n"},
        {"key", "v", "%s=%n%s\n"}, {"key", "v", "%s=\n"},      {"key", "v", "%s=%s\n%d"},   {"key", "v", "%s=%100s\n"},
        {"key", "v", ""},          {"key", "v", "%s=%ls\n"},   {"key", "v", "%1$s=%2$s\n"}, {"key", "v", "%s=%s%"},
        {"k\r", "v", nullptr},
    };
    for (const Row &row : rows) {
        ForgetFault();
        EXPECT_EQ(TLIBFileSetKeyValue(file_.c_str(), row.key, row.value, row.format), -1);
        EXPECT_EQ(LastFault(), (Fault{ERR_BAD_PARAMETERS, "file_set_key_value"}));
        ForgetFault();
        EXPECT_EQ(TLIBFileAppendKey(file_.c_str(), row.key, row.value, row.format), -1);
        EXPECT_EQ(LastFault(), (Fault{ERR_BAD_PARAMETERS, "file_append_key"}));
    }
    EXPECT_EQ(Text(), "key=1\n");
}

TEST_F(KeyValueTest, AppendsInPlaceUnlessTheKeyIsThere)
{
    Write("a=1\nb=2");
    ASSERT_EQ(::link(file_.c_str(), (dir_ / "same file").c_str()), 0);
    EXPECT_EQ(TLIBFileAppendKey(file_.c_str(), "c", "3", nullptr), 1);
    EXPECT_EQ(TLIBErrGet(), ERR_SUCCESS);
    EXPECT_EQ(TLIBFileAppendKey(file_.c_str(), "b", "9", nullptr), 0);
    EXPECT_EQ(LastFault(), (Fault{ERR_KEY_EXISTS, "file_append_key", 104}));
    EXPECT_EQ(test::ReadFile(dir_ / "same file"), "a=1\nb=2\nc=3\n");

    EXPECT_EQ(TLIBFileAppendKey(dir_.Path().c_str(), "c", "3", nullptr), -1);
    EXPECT_EQ(LastFault(), (Fault{ERR_BAD_PARAMETERS, "file_append_key"}));
    EXPECT_EQ(TLIBFileAppendKey((dir_ / "none/file").c_str(), "c", "3", nullptr), -1);
    EXPECT_EQ(LastFault(), (Fault{ERR_OPEN_FAILED, "file_append_key"}));
}

TEST_F(KeyValueTest, RemovesEveryLineOfAKey)
{
    Write("key=1\n#key=2\nkeys=3\n key=4\nend");
    EXPECT_EQ(TLIBFileRemoveKey(file_.c_str(), "key"), 1);
    EXPECT_EQ(Text(), "#key=2\nkeys=3\nend");
    struct stat before, after;
    ASSERT_EQ(::stat(file_.c_str(), &before), 0);
    EXPECT_EQ(TLIBFileRemoveKey(file_.c_str(), "key"), 0);
    EXPECT_EQ(LastFault(), (Fault{ERR_KEY_NOT_FOUND, "file_remove_key"}));
    ASSERT_EQ(::stat(file_.c_str(), &after), 0);
    EXPECT_EQ(before.st_ino, after.st_ino);
    EXPECT_EQ(TLIBFileRemoveKey((dir_ / "missing").c_str(), "key"), -1);
    EXPECT_EQ(LastFault(), (Fault{ERR_OPEN_FAILED, "file_remove_key"}));
}

TEST_F(KeyValueTest, ChecksAValue)
{
    Write("a=yes\na=no\nb=\n");
    const std::string missing = dir_ / "missing";
    struct Row {
        const char *path, *key, *value;
        int result, code;
    };
    const Row rows[] = {
        {file_.c_str(), "a", "yes", 1, 0},
        {file_.c_str(), "b", "", 1, 0},
        {file_.c_str(), "a", "no", 0, 0},
        {file_.c_str(), "a", "YES", 0, 0},
        {file_.c_str(), "a", "yes ", 0, 0},
        {file_.c_str(), "c", "", 0, ERR_KEY_NOT_FOUND},
        {missing.c_str(), "a", "yes", 0, ERR_OPEN_FAILED},
    };
    for (const Row &row : rows) {
        ForgetFault();
        EXPECT_EQ(BlTAVOFileCheckKeyValue(row.path, row.key, row.value), row.result) << row.value;
        EXPECT_EQ(TLIBErrGet(), row.code) << row.value;
    }
}

TEST_F(KeyValueTest, MatchesALine)
{
    EXPECT_EQ(TLIBILineKeyMatch(" key = v\n", "key"), 1);
    EXPECT_EQ(TLIBILineKeyMatch("#key=v\n", "key"), 0);
    EXPECT_EQ(TLIBILineKeyMatch("key\n", "key"), 0);
    EXPECT_EQ(TLIBErrGet(), ERR_SUCCESS);
    EXPECT_EQ(TLIBILineKeyMatch(nullptr, "key"), 0);
    EXPECT_EQ(LastFault(), (Fault{ERR_BAD_PARAMETERS, "file_line_key_match"}));
    ForgetFault();
    EXPECT_EQ(TLIBILineKeyMatch("key=v", nullptr), 0);
    EXPECT_EQ(TLIBErrGet(), ERR_BAD_PARAMETERS);
}

}  // namespace
