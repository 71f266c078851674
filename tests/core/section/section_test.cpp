// Files with sections: headers, reading, rewriting, appending.
#include "tavo_section.h"

#include "support/owned_container.h"
#include "support/test.h"

using test::Fault;
using test::HashOf;
using test::LastFault;
using test::Owned;
using test::Pairs;
using test::Settings;

namespace {

class SectionTest : public testing::Test {
  protected:
    SectionTest() { test::ForgetFault(); }

    const test::ScratchDir dir_;
    const std::string file_ = dir_ / "file";
    const char *path_ = file_.c_str();
};

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
    for (const Row &row : rows) {
        const int length = static_cast<int>(std::strlen(row.line));
        EXPECT_EQ(TLIBIFileIsSection(row.line, length), row.header) << row.line;
        EXPECT_EQ(TLIBIFileMatchSection(row.line, length, "net"), row.heads_net) << row.line;
    }
    EXPECT_EQ(TLIBIFileIsSection("[net]x", 5), 1) << "the length counts, not the NUL";
    EXPECT_EQ(TLIBIFileMatchSection("[net]", 4, "net"), 0);
    EXPECT_EQ(TLIBIFileMatchSection("[]", 2, ""), 1);
    EXPECT_EQ(TLIBErrGet(), ERR_SUCCESS);
    EXPECT_EQ(TLIBIFileIsSection(nullptr, 1), 0);
}

TEST_F(SectionTest, ReadsTheFirstSectionOfAName)
{
    test::WriteFile(file_, "top=0\n[net]x\n[other]\na=9\n[net] \n a = \"1 2\" \nb=1\nb=2\n#c=3\nno sign\n=d\nempty=\n"
                           "e=x=y\n[broken\nlost=1\n[net]\na=second\n");
    Owned<TLIBSZHASH> hash = HashOf({{"kept", "yes"}});
    EXPECT_EQ(TLIBFileGetSection(path_, "net", hash), 5);
    EXPECT_EQ(Pairs(hash), (test::PairMap{{"kept", "yes"}, {"a", "1 2"}, {"b", "2"}, {"empty", ""}, {"e", "x=y"}}));
    Owned<TLIBSZHASH> none = HashOf({});
    EXPECT_EQ(TLIBFileGetSection(path_, "absent", none), 0);
    EXPECT_EQ(TLIBErrGet(), ERR_SUCCESS);

    EXPECT_EQ(TLIBFileGetSection((dir_ / "missing").c_str(), "net", none), -1);
    EXPECT_EQ(LastFault(), (Fault{ERR_OPEN_FAILED, "file_get_section", 62}));
}

TEST_F(SectionTest, ListsSections)
{
    test::WriteFile(file_, "[a]\nx=1\n[ b ] \n[broken\n[]\n[c]d]\n" + ("[" + std::string(1020, 'n') + "]\n"));
    Owned<TLIBSZLIST> list = test::ListOf({"held before"});
    EXPECT_EQ(TLIBFileEnumSection(path_, list), 6);
    EXPECT_THAT(test::Items(list), testing::ElementsAre("held before", "a", " b ", "", "c]d", std::string(1020, 'n')));

    TLIBSzListRemoveAll(list);
    test::WriteFile(file_, "[a]\n[" + std::string(1021, 'n') + "]\n[b]\n");
    EXPECT_EQ(TLIBFileEnumSection(path_, list), -1);
    EXPECT_EQ(TLIBErrGet(), ERR_SUCCESS) << "a header that is too long sets no code";
    EXPECT_EQ(TLIBFileEnumSection("/", list), -1);
    EXPECT_EQ(LastFault(), (Fault{ERR_OPEN_FAILED, "file_enum_section"}));
}

constexpr const char *kText = "top=0\n[net]\nold=1\n# stays\n[broken\nlost=1\n[other]\no=1\n[net]\nold=2\n;too\n";

TEST_F(SectionTest, SetReplacesEverySectionOfTheName)
{
    test::WriteFile(file_, kText, 0640);
    const Owned<TLIBSZHASH> hash = HashOf({{"a", "1"}, {"b", "two words"}, {"c", ""}});
    EXPECT_EQ(ErrTLIBFileSetSection(path_, "net", nullptr, hash, 1, nullptr), 1);
    EXPECT_EQ(test::ReadFile(file_),
              "top=0\n[net]\n" + Settings(hash) + "# stays\n[other]\no=1\n[net]\n" + Settings(hash) + ";too\n");
    struct stat st;
    ASSERT_EQ(::stat(path_, &st), 0);
    EXPECT_EQ(st.st_mode & 07777, 0640u);

    EXPECT_EQ(ErrTLIBFileSetSection(path_, "other", "renamed", HashOf({{"x", "y"}}), 1, "%s = \"%s\"%%\n"), 1);
    EXPECT_THAT(test::ReadFile(file_), testing::HasSubstr("# stays\n[renamed]\nx = \"y\"%\n[net]\n"));
    EXPECT_THAT(dir_.Names(), testing::ElementsAre("file"));
}

TEST_F(SectionTest, RemoveLeavesTheComments)
{
    constexpr const char *after = "top=0\n# stays\n[other]\no=1\n;too\n";
    test::WriteFile(file_, kText);
    EXPECT_EQ(ErrTLIBFileRemoveSection(path_, "net"), 1);
    EXPECT_EQ(test::ReadFile(file_), after);
    test::WriteFile(file_, kText);
    EXPECT_EQ(ErrTLIBFileSetSection(path_, "net", nullptr, HashOf({{"a", "1"}}), 0, nullptr), 1);
    EXPECT_EQ(test::ReadFile(file_), after) << "without the flag Set only removes";
}

TEST_F(SectionTest, AnAbsentSectionIsNotAdded)
{
    test::WriteFile(file_, kText);
    EXPECT_EQ(ErrTLIBFileSetSection(path_, "absent", nullptr, HashOf({{"a", "1"}}), 1, nullptr), 0);
    EXPECT_EQ(LastFault(), (Fault{ERR_KEY_NOT_FOUND, "file_modify_section"}));
    EXPECT_EQ(ErrTLIBFileRemoveSection(path_, "Net"), 0);
    EXPECT_EQ(test::ReadFile(file_), kText);
}

TEST_F(SectionTest, SetRefuses)
{
    test::WriteFile(file_, kText);
    const Owned<TLIBSZHASH> hash = HashOf({{"a", "1"}});
    struct Row {
        const char *new_name;
        test::PairMap pairs;
        const char *format;
        Fault fault;
    };
    const Row rows[] = {
        {nullptr, {{"a", "1"}}, "%s%s\n", {ERR_BAD_PARAMETERS, "file_hash_2_file", 54}},
        {nullptr, {{"a", "1\n[pw]"}}, nullptr, {ERR_BAD_PARAMETERS, "file_hash_2_file"}},
        {nullptr, {{"[a", "1"}}, nullptr, {ERR_BAD_PARAMETERS, "file_hash_2_file"}},
        {"ne]w", {{"a", "1"}}, nullptr, {ERR_BAD_PARAMETERS, "file_hash_2_file"}},
        {"new\n", {{"a", "1"}}, nullptr, {ERR_BAD_PARAMETERS, "file_hash_2_file"}},
    };
    for (const Row &row : rows) {
        EXPECT_EQ(ErrTLIBFileSetSection(path_, "net", row.new_name, HashOf(row.pairs), 1, row.format), -1);
        EXPECT_EQ(LastFault(), row.fault);
    }
    EXPECT_EQ(ErrTLIBFileSetSection(path_, "net", nullptr, nullptr, 1, nullptr), -1);
    EXPECT_EQ(LastFault(), (Fault{ERR_BAD_PARAMETERS, "file_set_section", 42}));
    EXPECT_EQ(ErrTLIBFileSetSection(path_, nullptr, nullptr, hash, 1, nullptr), -1);
    EXPECT_EQ(LastFault(), (Fault{ERR_BAD_PARAMETERS, "file_modify_section"}));
    EXPECT_EQ(ErrTLIBFileRemoveSection((dir_ / "missing").c_str(), "net"), -1);
    EXPECT_EQ(LastFault(), (Fault{ERR_OPEN_FAILED, "file_modify_section"}));
    EXPECT_EQ(test::ReadFile(file_), kText);
    EXPECT_THAT(dir_.Names(), testing::ElementsAre("file"));
}

TEST_F(SectionTest, AddAppends)
{
    const Owned<TLIBSZHASH> hash = HashOf({{"a", "1"}, {"b", "2"}});
    EXPECT_EQ(ErrTLIBFileAddSection(path_, "net", hash, nullptr), 0);
    test::WriteFile(dir_ / "torn", "[a]\nx=1");
    EXPECT_EQ(ErrTLIBFileAddSection((dir_ / "torn").c_str(), "a", hash, nullptr), 0);
    EXPECT_EQ(test::ReadFile(file_), "[net]\n" + Settings(hash));
    EXPECT_EQ(test::ReadFile(dir_ / "torn"), "[a]\nx=1\n[a]\n" + Settings(hash));

    for (const char *name : {"a]", "a\nb", "a\r"})
        EXPECT_EQ(ErrTLIBFileAddSection(path_, name, hash, nullptr), -1);
    EXPECT_EQ(LastFault(), (Fault{ERR_BAD_PARAMETERS, "file_add_section"}));
    EXPECT_EQ(ErrTLIBFileAddSection(path_, "net", hash, "%s=%d\n"), -1);
    EXPECT_EQ(LastFault(), (Fault{ERR_BAD_PARAMETERS, "file_add_section"}));
    EXPECT_EQ(ErrTLIBFileAddSection("/", "net", hash, nullptr), -1);
    EXPECT_EQ(LastFault(), (Fault{ERR_OPEN_FAILED, "file_add_section"}));
    EXPECT_EQ(test::ReadFile(file_), "[net]\n" + Settings(hash));
}

TEST_F(SectionTest, WritesAHashToAStream)
{
    const Owned<TLIBSZHASH> hash = HashOf({{"a", "1"}, {"b", "2"}});
    FILE *stream = std::fopen(path_, "we");
    EXPECT_EQ(ErrTLIBIFileHash2File(stream, nullptr, hash, nullptr), 0);
    EXPECT_EQ(ErrTLIBIFileHash2File(stream, "n", HashOf({}), "%s = %s\n"), 0);
    std::fclose(stream);
    EXPECT_EQ(test::ReadFile(file_), Settings(hash) + "[n]\n");

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
