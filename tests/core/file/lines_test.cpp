// Whole lines by number and by key, and the other edits of a whole file.
#include "tavo_file.h"

#include "support/owned_container.h"
#include "support/test.h"

using test::Fault;
using test::LastFault;

namespace {

class LinesTest : public testing::Test {
  protected:
    LinesTest() { test::ForgetFault(); }

    const test::ScratchDir dir_;
    const std::string file_ = dir_ / "file";
    const char *path_ = file_.c_str();
};

TEST_F(LinesTest, GetsALine)
{
    test::WriteFile(file_, "first\n\nkey=1\n key=2\nlast");
    struct Row {
        int number, result;
        const char *line;
    };
    for (const Row row : {Row{1, 6, "first"}, Row{2, 1, ""}, Row{4, 7, " key=2"}, Row{5, 5, "last"}}) {
        char line[8] = "?";
        EXPECT_EQ(TLIBFileGetLine(path_, row.number, line, sizeof line), row.result);
        EXPECT_STREQ(line, row.line);
        EXPECT_EQ(TLIBFileGetLine(path_, row.number, nullptr, 0), row.result);
    }
    char line[6] = "?";
    EXPECT_EQ(TLIBFileGetLineByKey(path_, "key", line, sizeof line), 6);
    EXPECT_STREQ(line, "key=1");
    EXPECT_EQ(TLIBFileMatchLineNo(path_, "key"), 3);
    EXPECT_EQ(TLIBErrGet(), ERR_SUCCESS);
}

TEST_F(LinesTest, ReadersRefuse)
{
    test::WriteFile(file_, "first\nkey=1\n");
    char line[6] = "?";
    const auto check = [](int result, int expected, const Fault &fault) {
        EXPECT_EQ(result, expected);
        EXPECT_EQ(LastFault(), fault);
    };
    check(TLIBFileGetLine(path_, 3, line, 6), 0, {ERR_KEY_NOT_FOUND, "file_get_line"});
    check(TLIBFileGetLine(path_, 1, line, 5), -1, {ERR_NOT_ENOUGH_MEMORY, "file_get_line"});
    check(TLIBFileGetLine("/", 1, line, 6), -1, {ERR_OPEN_FAILED, "file_get_line"});
    check(TLIBFileGetLineByKey(path_, "none", line, 6), 0, {ERR_KEY_NOT_FOUND, "file_get_line_by_key"});
    check(TLIBFileGetLineByKey(path_, "key", line, 5), -1, {ERR_NOT_ENOUGH_MEMORY, "file_get_line_by_key"});
    check(TLIBFileMatchLineNo(path_, "none"), 0, {ERR_KEY_NOT_FOUND, "file_match_line_no"});
    check(TLIBFileMatchLineNo("/", "key"), -1, {ERR_OPEN_FAILED, "file_match_line_no"});
    EXPECT_STREQ(line, "?");
}

TEST_F(LinesTest, EditsALine)
{
    constexpr const char *before = "one\nkey=1\nkey=2\nend";
    const auto check = [&](auto &&edit, int result, const char *after, int code = 0) {
        test::WriteFile(file_, before);
        test::ForgetFault();
        EXPECT_EQ(edit(), result) << after;
        EXPECT_EQ(test::ReadFile(file_), after);
        EXPECT_EQ(TLIBErrGet(), code) << after;
    };
    check([&] { return TLIBFileSetLine(path_, 1, "x\n"); }, 1, "x\nkey=1\nkey=2\nend");
    check([&] { return TLIBFileSetLine(path_, 4, ""); }, 1, "one\nkey=1\nkey=2\n\n");
    check([&] { return TLIBFileSetLine(path_, 5, "x"); }, 0, before, ERR_KEY_NOT_FOUND);
    check([&] { return TLIBFileSetLine(path_, 1, "x\ny"); }, -1, before, ERR_BAD_PARAMETERS);
    check([&] { return TLIBFileSetLine(path_, 1, "x\n\n"); }, -1, before, ERR_BAD_PARAMETERS);
    check([&] { return TLIBFileSetLineByKey(path_, "key", "# none"); }, 1, "one\n# none\nkey=2\nend");
    check([&] { return TLIBFileSetLineByKey(path_, "end", "x"); }, 0, before, ERR_KEY_NOT_FOUND);
    check([&] { return TLIBFileSetLineByKey(path_, "key", "x\ny"); }, -1, before, ERR_BAD_PARAMETERS);
    check([&] { return TLIBFileAddLine(path_, 0, "x"); }, 1, "one\nkey=1\nkey=2\nend\nx\n");
    check([&] { return TLIBFileAddLine(path_, 1, "x"); }, 1, "x\none\nkey=1\nkey=2\nend");
    check([&] { return TLIBFileAddLine(path_, 4, "x\n"); }, 1, "one\nkey=1\nkey=2\nx\nend");
    check([&] { return TLIBFileAddLine(path_, 5, "x"); }, 0, before, ERR_KEY_NOT_FOUND);
    check([&] { return TLIBFileAddLineByKey(path_, "key", "x"); }, 1, "one\nx\nkey=1\nkey=2\nend");
    check([&] { return TLIBFileAddLineByKey(path_, "none", "x"); }, 0, before, ERR_KEY_NOT_FOUND);
    check([&] { return TLIBFileReplaceSubStr(path_, "ke", "mon%s"); }, 2, "one\nmon%sy=1\nmon%sy=2\nend");
    check([&] { return TLIBFileReplaceSubStr(path_, "e", ""); }, 4, "on\nky=1\nky=2\nnd");
    check([&] { return TLIBFileReplaceSubStr(path_, "absent", "x"); }, 0, before);
    check([&] { return TLIBFileComment(path_, "key"); }, 1, "one\n;key=1\n;key=2\nend");
    check([&] { return TLIBFileComment(path_, "one"); }, 0, before, ERR_KEY_NOT_FOUND);
    EXPECT_THAT(dir_.Names(), testing::ElementsAre("file"));

    const std::string missing = dir_ / "missing";
    EXPECT_EQ(TLIBFileAddLine(missing.c_str(), 0, "x"), -1);
    EXPECT_EQ(LastFault(), (Fault{ERR_OPEN_FAILED, "file_add_line"}));
    EXPECT_EQ(TLIBFileSetLine(missing.c_str(), 1, "x"), -1);
    EXPECT_EQ(LastFault(), (Fault{ERR_OPEN_FAILED, "file_set_line"}));
    EXPECT_EQ(TLIBFileComment(missing.c_str(), "key"), -1);
    EXPECT_EQ(LastFault(), (Fault{ERR_OPEN_FAILED, "file_comment"}));
    EXPECT_EQ(TLIBFileReplaceSubStr(missing.c_str(), "a", "b"), -1);
    EXPECT_EQ(LastFault(), (Fault{ERR_OPEN_FAILED, "file_replace_sub_str"}));
}

TEST_F(LinesTest, ReadsEveryLineIntoAList)
{
    test::WriteFile(file_, "one\n\n" + std::string(5000, 'x') + "\nend");
    test::Owned<TLIBSZLIST> list = test::ListOf({"held before"});
    EXPECT_EQ(TLIBFileReadLines(path_, list), 5);
    EXPECT_THAT(test::Items(list), testing::ElementsAre("held before", "one", "", std::string(5000, 'x'), "end"));
}

TEST_F(LinesTest, StripsAByteOrderMark)
{
    test::WriteFile(file_, "\xEF\xBB\xBF\xEF\xBB\xBFkey=1\n");
    EXPECT_EQ(TLIBFileUTF8BomStrip(path_), 1);
    EXPECT_EQ(TLIBFileUTF8BomStrip(path_), 1);
    EXPECT_EQ(TLIBFileUTF8BomStrip(path_), 0);
    EXPECT_EQ(test::ReadFile(file_), "key=1\n");
    EXPECT_EQ(TLIBErrGet(), ERR_SUCCESS);
    EXPECT_EQ(TLIBFileUTF8BomStrip(dir_.Path().c_str()), -1);
    EXPECT_EQ(LastFault(), (Fault{ERR_OPEN_FAILED, "file_utf8bom_strip"}));
}

TEST_F(LinesTest, TouchCreatesOnly)
{
    EXPECT_EQ(TLIBFileTouch(path_), 0);
    EXPECT_EQ(test::ReadFile(file_), "");
    test::WriteFile(file_, "kept");
    const timespec long_ago[2] = {{1000, 0}, {1000, 0}};
    ASSERT_EQ(::utimensat(AT_FDCWD, path_, long_ago, 0), 0);
    EXPECT_EQ(TLIBFileTouch(path_), 0);
    struct stat st;
    ASSERT_EQ(::stat(path_, &st), 0);
    EXPECT_EQ(st.st_mtime, 1000);
    EXPECT_EQ(test::ReadFile(file_), "kept");
    EXPECT_EQ(TLIBFileTouch(dir_.Path().c_str()), -1);
    EXPECT_EQ(LastFault(), (Fault{ERR_OPEN_FAILED, "file_touch"}));
}

TEST_F(LinesTest, OpensATemporaryFile)
{
    std::string name = dir_ / "temp.XXXXXX";
    FILE *stream = TLIBFileTempFileOpen(name.data());
    ASSERT_NE(stream, nullptr);
    EXPECT_NE(name, dir_ / "temp.XXXXXX");
    EXPECT_EQ(std::fputs("text", stream), 1);
    EXPECT_EQ(std::fclose(stream), 0);
    EXPECT_EQ(test::ReadFile(name), "text");
    EXPECT_EQ(TLIBFileTempFileOpen(nullptr), nullptr);
    EXPECT_EQ(LastFault(), (Fault{ERR_BAD_PARAMETERS, "file_tempfile_open", 40}));
    std::string bad = dir_ / "temp";
    EXPECT_EQ(TLIBFileTempFileOpen(bad.data()), nullptr);
    EXPECT_EQ(LastFault(), (Fault{ERR_OPEN_FAILED, "file_tempfile_open", 45}));
}

TEST_F(LinesTest, ComposesATemporaryName)
{
    char name[64] = "", next[64] = "";
    const std::string start = "/tmp/x" + std::to_string(::getpid()) + "-";
    ASSERT_EQ(TLIBFileITmpName("/tmp/x", name, sizeof name), 0);
    ASSERT_EQ(TLIBFileITmpName("/tmp/x", next, sizeof next), 0);
    ASSERT_TRUE(std::string(name).starts_with(start));
    const int count = std::stoi(name + start.size());
    EXPECT_EQ(next, start + std::to_string(count + 1));

    const int fits = static_cast<int>((start + std::to_string(count + 2)).size()) + 1;
    std::strcpy(next, "kept");
    EXPECT_EQ(TLIBFileITmpName("/tmp/x", next, fits - 1), -1);
    EXPECT_EQ(LastFault(), (Fault{ERR_BAD_PARAMETERS, "file_tmp_name", 50}));
    EXPECT_STREQ(next, "kept");
    EXPECT_EQ(TLIBFileITmpName("/tmp/x", next, fits), 0);
    EXPECT_EQ(next, start + std::to_string(count + 3)) << "a name that did not fit counts";
    EXPECT_EQ(TLIBFileITmpName(nullptr, next, fits), -1);
    EXPECT_EQ(LastFault(), (Fault{ERR_BAD_PARAMETERS, "file_tmp_name", 40}));
    EXPECT_EQ(TLIBFileITmpName("x", next, -1), -1);
}

}  // namespace
