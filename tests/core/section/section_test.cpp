// Files with sections: headers, reading, rewriting, appending.
#include "tavo_section.h"

#include "core/file_story.h"
#include "support/owned_container.h"
#include "support/test.h"

using test::Fault;
using test::HashOf;
using test::LastFault;
using test::Owned;

namespace {

using SectionTest = test::FileStory;

TEST_F(SectionTest, KnowsHeaders)
{
    struct Row {
        const char *line;
        int header, heads_net;
    };
    constexpr Row rows[] = {
        {"[net]\n", 1, 1}, {"[net]", 1, 1},    {"[net] \t\r\n", 1, 1}, {"[ net ]\n", 1, 0},
        {"[Net]\n", 1, 0}, {"[nets]\n", 1, 0}, {"[ne]\n", 1, 0},       {"[net]]\n", 1, 0},
        {"[net\n", 0, 0},  {" [net]\n", 0, 0}, {"[net] x\n", 0, 0},    {"[net]x]\n", 1, 0},
        {"[]\n", 1, 0},    {"]\n", 0, 0},      {"\n", 0, 0},           {"", 0, 0},
    };
    test::ForgetFault();
    for (const Row &row : rows) {
        const int length = static_cast<int>(std::strlen(row.line));
        EXPECT_EQ(TLIBIFileIsSection(row.line, length), row.header) << row.line;
        EXPECT_EQ(TLIBIFileMatchSection(row.line, length, "net"), row.heads_net) << row.line;
    }
    EXPECT_EQ(TLIBIFileIsSection("[net]x", 5), 1) << "the length counts, not the NUL";
    EXPECT_EQ(TLIBIFileMatchSection("[net]", 4, "net"), 0);
    EXPECT_EQ(TLIBIFileMatchSection("[]", 2, ""), 1);
    EXPECT_EQ(TLIBErrGet(), ERR_SUCCESS);
}

TEST_F(SectionTest, ReadsTheFirstSectionOfAName)
{
    Before("top=0\n[net]x\n[other]\na=9\n[net] \n|=first slot\n a = \"1 2\" \nb=1\nb=2\n#c=3\nno "
           "sign\n=d\nempty=\ne=x=y\n[broken\n"
           "lost=1\n[net]\na=second\n");
    Owned<TLIBSZHASH> hash = HashOf({{"kept", "yes"}});
    TELL(TLIBFileGetSection(path_, "net", hash));
    for (const auto &[key, value] : test::Pairs(hash))
        story_.Show(key, value);
    TELL(TLIBFileGetSection(path_, "absent", HashOf({})));
    TELL(TLIBFileGetSection(missing_path_, "net", hash));
    ShowLine();
}

TEST_F(SectionTest, ListsSections)
{
    Owned<TLIBSZLIST> list = test::ListOf({});
    story_.Mask("n{1021}", "(1,021 n)");
    story_.Mask("n{1020}", "(1,020 n)");
    EDIT("[a]\nx=1\n[ b ] \n[broken\n[]\n[c]d]\n[" + std::string(1020, 'n') + "]\n", TLIBFileEnumSection(path_, list));
    TELL(TLIBFileEnumSection(path_, list));
    story_.Show("list", test::Items(list));
    // A header that is too long sets no code.
    EDIT("[a]\n[" + std::string(1021, 'n') + "]\n[b]\n", TLIBFileEnumSection(path_, list));
    TELL(TLIBFileEnumSection(folder_, list));
}

constexpr const char *kText = "top=0\n[net]\nold=1\n# stays\n[broken\nlost=1\n[other]\no=1\n[net]\nold=2\n;too\n";

TEST_F(SectionTest, RewritesEverySectionOfTheName)
{
    const Owned<TLIBSZHASH> hash = HashOf({{"a", "1"}, {"b", "two words"}, {"c", ""}});
    EDIT(kText, ErrTLIBFileSetSection(path_, "net", nullptr, hash, 1, nullptr));
    EXPECT_EQ(Facts().st_mode & 07777, 0640u);
    TELL(ErrTLIBFileSetSection(path_, "other", "renamed", HashOf({{"x", "y"}}), 1, "%s = \"%s\"%%\n"));
    EDIT(kText, ErrTLIBFileRemoveSection(path_, "net"));
    // Without the flag it only removes.
    EDIT(kText, ErrTLIBFileSetSection(path_, "net", nullptr, hash, 0, nullptr));
    EDIT(kText, ErrTLIBFileSetSection(path_, "absent", nullptr, hash, 1, nullptr));
    EDIT(kText, ErrTLIBFileRemoveSection(path_, "Net"));
}

TEST_F(SectionTest, RefusesWhatCannotBeReadAgain)
{
    const Owned<TLIBSZHASH> hash = HashOf({{"a", "1"}});
    EDIT(kText, ErrTLIBFileSetSection(path_, "net", nullptr, hash, 1, "%s%s\n"));
    ShowLine();
    TELL(ErrTLIBFileSetSection(path_, "net", nullptr, HashOf({{"a", "1\n[pw]"}}), 1, nullptr));
    TELL(ErrTLIBFileSetSection(path_, "net", nullptr, HashOf({{"[a", "1"}}), 1, nullptr));
    TELL(ErrTLIBFileSetSection(path_, "net", "ne]w", hash, 1, nullptr));
    TELL(ErrTLIBFileSetSection(path_, "net", "new\n", hash, 1, nullptr));
    TELL(ErrTLIBFileSetSection(path_, "net", nullptr, nullptr, 1, nullptr));
    ShowLine();
    TELL(ErrTLIBFileSetSection(path_, nullptr, nullptr, hash, 1, nullptr));
    TELL(ErrTLIBFileRemoveSection(missing_path_, "net"));
    for (const char *name : {"a]", "a\nb", "a\r"})
        TELL(ErrTLIBFileAddSection(path_, name, hash, nullptr));
    TELL(ErrTLIBFileAddSection(path_, "net", hash, "%s=%d\n"));
    TELL(ErrTLIBFileAddSection(folder_, "net", hash, nullptr));
}

TEST_F(SectionTest, Appends)
{
    const Owned<TLIBSZHASH> hash = HashOf({{"a", "1"}, {"|", "first slot"}, {"{", "last slot"}});
    TELL(ErrTLIBFileAddSection(missing_path_, "net", hash, nullptr));
    EDIT("[a]\nx=1", ErrTLIBFileAddSection(path_, "a", hash, nullptr));
}

TEST_F(SectionTest, WritesAHashToAStream)
{
    const Owned<TLIBSZHASH> hash = HashOf({{"a", "1"}, {"b", "2"}});
    FILE *stream = std::fopen(path_, "we");
    std::setvbuf(stream, nullptr, _IONBF, 0);
    TELL(ErrTLIBIFileHash2File(stream, nullptr, hash, nullptr));
    TELL(ErrTLIBIFileHash2File(stream, "n", HashOf({}), "%s = %s\n"));
    std::fclose(stream);

    stream = std::fopen("/dev/full", "we");
    std::setvbuf(stream, nullptr, _IONBF, 0);
    EXPECT_EQ(ErrTLIBIFileHash2File(stream, "n", hash, nullptr), -1);
    EXPECT_EQ(LastFault(), (Fault{ERR_WRITE_FAILED, "file_hash_2_file", 60}));
    EXPECT_EQ(ErrTLIBIFileHash2File(stream, nullptr, hash, nullptr), -1);
    EXPECT_EQ(LastFault(), (Fault{ERR_WRITE_FAILED, "file_hash_2_file", 74}));
    EXPECT_EQ(ErrTLIBIFileHash2File(stream, nullptr, hash, "=%s%s\n"), -1);
    EXPECT_EQ(LastFault(), (Fault{ERR_BAD_PARAMETERS, "file_hash_2_file", 54}));
    EXPECT_EQ(ErrTLIBIFileHash2File(nullptr, nullptr, hash, nullptr), -1);
    std::fclose(stream);
}

TEST_F(SectionTest, ChecksFormats)
{
    test::ForgetFault();
    for (const char *format :
         {static_cast<const char *>(nullptr), "%s=%s\n", "%s = \"%s\"\n", "  %s=%%%s%%\nx", "%s==%s;\n", "%%s %s=%s\n"})
        EXPECT_EQ(TLIBIFileCheckFormat(format), 0) << format;
    EXPECT_EQ(TLIBErrGet(), ERR_SUCCESS);
    for (const char *format : {"", "%s=%s", "%s%s\n", "=%s%s\n", "%s=\n", "%s\n=%s", "%s=%s\n%s", "%n%s=%s\n",
                               "%s%d=%s\n", "%%s=%s\n", "%s=%%s\n", "%s=%s\n%", "%%s=%s%s\n"}) {
        test::ForgetFault();
        EXPECT_EQ(TLIBIFileCheckFormat(format), -1) << format;
        EXPECT_EQ(LastFault(), (Fault{ERR_BAD_PARAMETERS, "file_check_format"})) << format;
    }
}

}  // namespace
