// Whole lines by number and by key, and the other edits of a whole file.
#include "tavo_file.h"

#include "core/file_story.h"
#include "support/owned_container.h"
#include "support/test.h"

namespace {

using LinesTest = test::FileStory;

TEST_F(LinesTest, AreRead)
{
    Before("first\n\nkey=1\n key=2\nlast");
    char line[8] = "?";
    for (const int number : {1, 2, 4, 5}) {
        TELL(TLIBFileGetLine(path_, number, line, sizeof line));
        story_.Show("line", line);
        TELL(TLIBFileGetLine(path_, number, nullptr, 0));
    }
    TELL(TLIBFileGetLine(path_, 6, line, 6));
    TELL(TLIBFileGetLine(path_, 1, line, 5));
    TELL(TLIBFileGetLine(folder_, 1, line, 6));
    story_.Show("line", line);
    TELL(TLIBFileGetLineByKey(path_, "key", line, 6));
    story_.Show("line", line);
    TELL(TLIBFileGetLineByKey(path_, "none", line, 6));
    TELL(TLIBFileGetLineByKey(path_, "key", line, 5));
    story_.Show("line", line);
    TELL(TLIBFileMatchLineNo(path_, "key"));
    TELL(TLIBFileMatchLineNo(path_, "none"));
    TELL(TLIBFileMatchLineNo(folder_, "key"));
}

TEST_F(LinesTest, AreEdited)
{
    constexpr const char *text = "one\nkey=1\nkey=2\nend";
    EDIT(text, TLIBFileSetLine(path_, 1, "x\n"));
    EDIT(text, TLIBFileSetLine(path_, 4, ""));
    EDIT(text, TLIBFileSetLine(path_, 5, "x"));
    EDIT(text, TLIBFileSetLine(path_, 1, "x\ny"));
    EDIT(text, TLIBFileSetLine(path_, 1, "x\n\n"));
    EDIT(text, TLIBFileSetLineByKey(path_, "key", "# none"));
    EDIT(text, TLIBFileSetLineByKey(path_, "end", "x"));
    EDIT(text, TLIBFileSetLineByKey(path_, "key", "x\ny"));
    EDIT(text, TLIBFileAddLine(path_, 0, "x"));
    EDIT(text, TLIBFileAddLine(path_, 1, "x"));
    EDIT(text, TLIBFileAddLine(path_, 4, "x\n"));
    EDIT(text, TLIBFileAddLine(path_, 5, "x"));
    EDIT(text, TLIBFileAddLineByKey(path_, "key", "x"));
    EDIT(text, TLIBFileAddLineByKey(path_, "none", "x"));
    EDIT(text, TLIBFileReplaceSubStr(path_, "ke", "mon%s"));
    EDIT(text, TLIBFileReplaceSubStr(path_, "e", ""));
    EDIT(text, TLIBFileReplaceSubStr(path_, "absent", "x"));
    EDIT(text, TLIBFileComment(path_, "key"));
    EDIT(text, TLIBFileComment(path_, "one"));
    TELL(TLIBFileAddLine(missing_path_, 0, "x"));
    TELL(TLIBFileSetLine(missing_path_, 1, "x"));
    TELL(TLIBFileComment(missing_path_, "key"));
    TELL(TLIBFileReplaceSubStr(missing_path_, "a", "b"));
}

TEST_F(LinesTest, AreReadIntoAList)
{
    test::WriteFile(file_, "one\n\n" + std::string(5000, 'x') + "\nend");
    test::Owned<TLIBSZLIST> list = test::ListOf({});
    EXPECT_EQ(TLIBFileReadLines(path_, list), 4);
    test::WriteFile(file_, "more\n");
    EXPECT_EQ(TLIBFileReadLines(path_, list), 5);
    EXPECT_THAT(test::Items(list), testing::ElementsAre("one", "", std::string(5000, 'x'), "end", "more"));
}

TEST_F(LinesTest, AByteOrderMarkIsStripped)
{
    EDIT("\xEF\xBB\xBF\xEF\xBB\xBFkey=1\n", TLIBFileUTF8BomStrip(path_));
    TELL(TLIBFileUTF8BomStrip(path_));
    TELL(TLIBFileUTF8BomStrip(path_));
    TELL(TLIBFileUTF8BomStrip(folder_));
}

TEST_F(LinesTest, TouchCreatesOnly)
{
    TELL(TLIBFileTouch(missing_path_));
    Before("kept");
    const timespec long_ago[2] = {{1000, 0}, {1000, 0}};
    ASSERT_EQ(::utimensat(AT_FDCWD, path_, long_ago, 0), 0);
    TELL(TLIBFileTouch(path_));
    EXPECT_EQ(Facts().st_mtime, 1000);
    TELL(TLIBFileTouch(folder_));
}

TEST_F(LinesTest, ATemporaryFileIsOpened)
{
    std::string name = dir_ / "temp.XXXXXX", bad = dir_ / "temp";
    FILE *stream = TLIBFileTempFileOpen(name.data());
    ASSERT_NE(stream, nullptr);
    EXPECT_NE(name, dir_ / "temp.XXXXXX");
    EXPECT_EQ(std::fputs("text", stream), 1);
    EXPECT_EQ(std::fclose(stream), 0);
    EXPECT_EQ(test::ReadFile(name), "text");
    EXPECT_EQ(TLIBFileTempFileOpen(nullptr), nullptr);
    EXPECT_EQ(test::LastFault(), (test::Fault{ERR_BAD_PARAMETERS, "file_tempfile_open", 40}));
    EXPECT_EQ(TLIBFileTempFileOpen(bad.data()), nullptr);
    EXPECT_EQ(test::LastFault(), (test::Fault{ERR_OPEN_FAILED, "file_tempfile_open", 45}));
}

TEST_F(LinesTest, ATemporaryNameIsComposed)
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
    EXPECT_EQ(test::LastFault(), (test::Fault{ERR_BAD_PARAMETERS, "file_tmp_name", 50}));
    EXPECT_STREQ(next, "kept");
    EXPECT_EQ(TLIBFileITmpName("/tmp/x", next, fits), 0);
    EXPECT_EQ(next, start + std::to_string(count + 3)) << "a name that did not fit counts";
    EXPECT_EQ(TLIBFileITmpName(nullptr, next, fits), -1);
    EXPECT_EQ(test::LastFault(), (test::Fault{ERR_BAD_PARAMETERS, "file_tmp_name", 40}));
    EXPECT_EQ(TLIBFileITmpName("x", next, -1), -1);
}

}  // namespace
