// One key of a settings file: read, set, appended, removed.
#include "tavo_file.h"

#include "core/file_story.h"
#include "support/test.h"

using test::Fault;
using test::LastFault;

using namespace std::string_view_literals;

namespace {

using KeyValueTest = test::FileStory;

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
    test::ForgetFault();
    for (const Row &row : rows) {
        test::WriteFile(file_, row.text);
        char value[32] = "";
        EXPECT_EQ(TLIBFileGetKeyValue(path_, row.key, value, sizeof value, row.flags), row.result) << row.text;
        EXPECT_STREQ(value, row.value) << row.text;
        EXPECT_EQ(TLIBFileGetKeyValue(path_, row.key, nullptr, 0, row.flags), row.result) << row.text;
    }
    EXPECT_EQ(TLIBErrGet(), ERR_SUCCESS);
}

TEST_F(KeyValueTest, GetFailsWithoutTouchingTheBuffer)
{
    test::WriteFile(file_, "key=0123456789\nkey2=" + std::string(100000, 'x') + "\n");
    char value[16] = "untouched";
    const auto get = [&](const char *path, const char *key, int size, char *to) {
        story_.Tell(key + std::string(" of ") + path + " into " + std::to_string(size),
                    [&] { return TLIBFileGetKeyValue(path, key, to, size, 0); });
        story_.Show("value", value);
        ShowLine();
    };
    for (const char *path : {missing_path_, folder_, "/dev/zero"})
        get(path, "key", 16, value);
    for (const char *key : {"key2", "absent", ""})
        get(path_, key, 16, value);
    for (const int size : {10, -1})
        get(path_, "key", size, value);
    get(path_, "key", 1, nullptr);
    get(path_, "key", 11, value);
    get(path_, "key2", 0, nullptr);
}

TEST_F(KeyValueTest, IsSetOnceAndOtherLinesKeepTheirBytes)
{
    EDIT("a=1\nkey=old\nb=2\n", TLIBFileSetKeyValue(path_, "key", "new", nullptr));
    EDIT("key=1\n\n#key=2\n key = 3\nb=4\nkey=5", TLIBFileSetKeyValue(path_, "key", "n", nullptr));
    EDIT("a=1\n", TLIBFileSetKeyValue(path_, "key", "v", nullptr));
    EDIT("a=1", TLIBFileSetKeyValue(path_, "key", "v", nullptr));
    EDIT("", TLIBFileSetKeyValue(path_, "key", "", nullptr));
    EDIT("key=old\n", TLIBFileSetKeyValue(path_, "key", "a b", "%s=\"%s\"\n"));
    EDIT("key=old\n", TLIBFileSetKeyValue(path_, "key", "%n%s", "%%%s=%s\n"));
    EDIT("key=old\n", TLIBFileSetKeyValue(path_, "key", "50%d", "%s%s"));
    EDIT("no sign\n[net]\n\tx = y \r\n", TLIBFileSetKeyValue(path_, "key", "v", nullptr));
    EDIT("a\0b=c\n\xFF\xFE\nkey=1\n\0\0tail"sv, TLIBFileSetKeyValue(path_, "key", "2", nullptr));
    TELL(TLIBFileSetKeyValue(missing_path_, "key", "v", nullptr));
    EXPECT_EQ(Facts("missing").st_mode & 07777, 0644u);
}

TEST_F(KeyValueTest, WritersRefuseUnreadableValues)
{
    test::WriteFile(file_, "key=1\n");
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
        EXPECT_EQ(TLIBFileSetKeyValue(path_, row.key, row.value, row.format), -1);
        EXPECT_EQ(LastFault(), (Fault{ERR_BAD_PARAMETERS, "file_set_key_value"}));
        EXPECT_EQ(TLIBFileAppendKey(path_, row.key, row.value, row.format), -1);
        EXPECT_EQ(LastFault(), (Fault{ERR_BAD_PARAMETERS, "file_append_key"}));
    }
    EXPECT_EQ(test::ReadFile(file_), "key=1\n");
}

TEST_F(KeyValueTest, AppendsInPlaceUnlessTheKeyIsThere)
{
    Before("a=1\nb=2");
    ASSERT_EQ(::link(path_, (dir_ / "same file").c_str()), 0);
    TELL(TLIBFileAppendKey(path_, "c", "3", nullptr));
    TELL(TLIBFileAppendKey(path_, "b", "9", nullptr));
    ShowLine();
    TELL(TLIBFileAppendKey(missing_path_, "key", "v", "%s: %s\n"));
    TELL(TLIBFileAppendKey(folder_, "c", "3", nullptr));
    TELL(TLIBFileAppendKey((dir_ / "none/file").c_str(), "c", "3", nullptr));
}

TEST_F(KeyValueTest, RemovesEveryLineOfAKey)
{
    EDIT("key=1\n#key=2\nkeys=3\n key=4\nend", TLIBFileRemoveKey(path_, "key"));
    const ino_t before = Facts().st_ino;
    TELL(TLIBFileRemoveKey(path_, "key"));
    EXPECT_EQ(Facts().st_ino, before) << "not rewritten";
    TELL(TLIBFileRemoveKey(missing_path_, "key"));
}

TEST_F(KeyValueTest, ChecksAValueOrALine)
{
    Before("a=yes\na=no\nb=\n");
    TELL(BlTAVOFileCheckKeyValue(path_, "a", "yes"));
    TELL(BlTAVOFileCheckKeyValue(path_, "b", ""));
    for (const char *other : {"no", "YES", "yes "})
        TELL(BlTAVOFileCheckKeyValue(path_, "a", other));
    TELL(BlTAVOFileCheckKeyValue(path_, "c", ""));
    TELL(BlTAVOFileCheckKeyValue(missing_path_, "a", "yes"));
    TELL(TLIBILineKeyMatch(" key = v\n", "key"));
    TELL(TLIBILineKeyMatch("#key=v\n", "key"));
    TELL(TLIBILineKeyMatch("key\n", "key"));
}

}  // namespace
