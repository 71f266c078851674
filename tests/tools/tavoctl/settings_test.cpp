// tavoctl conf and section: their changes of the files.
#include "tavo_lock.h"

#include "command_story.h"
#include "support/test.h"

namespace {

using test::ReadFile;
using test::ScratchDir;
using test::Tavoctl;
using test::Words;
using test::WriteFile;

constexpr char settings[] = "# ours\nname=\"a nas\"\nmode=one\nmode=two\nempty=\n";
constexpr char sections[] = "; head\n[a]\nk=1\n# note\nl=2\n[b]\nk=3\n";

// The words with "--file FILE" after the verb.
Words In(const std::string &file, Words words)
{
    words.insert(words.begin() + 2, {"--file", file});
    return words;
}

// Everything in the folder is part of the story.
constexpr char kFolder[] = "/root/settings";
constexpr char kFile[] = "/root/settings/f";

class TavoctlSettings : public testing::Test {
  protected:
    void SetUp() override { ASSERT_EQ(::mkdir(kFolder, 0755), 0); }
    void TearDown() override { std::filesystem::remove_all(kFolder); }
};

TEST_F(TavoctlSettings, ChangesAreShownFirstAndThenMadeOrRefused)
{
    const struct {
        Words words;
        const char *before;
    } changes[] = {
        {{"conf", "set", "mode", "three"}, settings},
        {{"conf", "set", "--quote", "new", "x y"}, settings},
        {{"conf", "set", "name", "--", "-5"}, "name=1\n"},
        {{"conf", "set", "list", "x"}, ""},  // a key that is named like a verb
        {{"conf", "set", "new", "1"}, "# ours\na=\"x\"\nb=\"\"\n"},
        {{"conf", "append", "new", "1"}, settings},
        {{"conf", "append", "new", "1"}, "torn=line"},
        {{"conf", "append", "mode", "1"}, settings},
        {{"conf", "remove", "mode"}, settings},
        {{"conf", "remove", "none"}, settings},
        {{"conf", "comment", "mode"}, settings},
        {{"conf", "comment", "none"}, settings},
        {{"section", "set", "a", "k=9"}, "[a]\nk=1\n# note\n[b]\nk=3\n"},
        {{"section", "set", "b", "k=a=b"}, sections},
        {{"section", "set", "--replace", "a", "n=1"}, sections},
        {{"section", "set", "--rename", "c", "b"}, sections},
        {{"section", "set", "c", "k=1"}, sections},
        {{"section", "set", "a", "=1"}, sections},
        // Lines that a rewrite would lose are a reason to refuse.
        {{"section", "set", "a", "k=2"}, "[a]\nk=1\n[broken\nl=2\n"},
        {{"section", "set", "a", "k=2"}, "[a]\nk=1\ninclude other\n"},
        {{"section", "set", "a", "k=2"}, "[a]\nk=1\n[a]\nk=3\n"},
        {{"section", "add", "c", "x=1"}, sections},
        {{"section", "add", "c"}, sections},
        {{"section", "add", "a", "x=1"}, sections},
        {{"section", "remove", "--yes", "a"}, sections},
        {{"section", "remove", "--yes", "c"}, sections},
    };
    test::CommandStory story({kFolder});
    for (const auto &[words, before] : changes) {
        WriteFile(kFile, before, 0640);
        const ino_t inode = test::InodeOf(kFile);
        Words planned = In(kFile, words);
        planned.insert(planned.begin() + 2, "--dry-run");
        story.Run(planned);
        EXPECT_EQ(test::InodeOf(kFile), inode) << testing::PrintToString(words);
        story.Run(In(kFile, words));
        struct stat state = {};
        EXPECT_EQ(::stat(kFile, &state), 0);
        EXPECT_EQ(state.st_mode & 07777u, 0640u) << testing::PrintToString(words);
    }
    for (const auto &entry : std::filesystem::directory_iterator("/tmp"))
        EXPECT_THAT(entry.path().filename().string(), testing::Not(testing::StartsWith("tavoctl.")));
}

TEST_F(TavoctlSettings, DryRunPrintsAUnifiedDiff)
{
    std::string lines;
    for (int i = 1; i <= 20; ++i)
        lines += "k" + std::to_string(i) + "=" + std::to_string(i) + "\n";
    WriteFile(kFile, "x=1\n" + lines + "x=2\nend=no newline");
    test::CommandStory story({kFolder});
    story.Run({{"conf", "set", "--dry-run", "--file", kFile, "x", "3"},
               {"conf", "set", "--dry-run", "--file", "/root/settings/new", "x", "3"},
               {"conf", "set", "--dry-run", "--file", kFile, "k5", "5"},
               {"conf", "set", "--dry-run", "--file", "/no/such/folder/f", "x", "3"}});
}

TEST_F(TavoctlSettings, JsonSaysWhatWasChanged)
{
    WriteFile(kFile, settings);
    const ino_t inode = test::InodeOf(kFile);
    test::CommandStory story({kFolder});
    story.Run(In(kFile, {"conf", "set", "--json", "empty", ""}));
    EXPECT_EQ(test::InodeOf(kFile), inode) << "what is so already is not written again";
    story.Run(In(kFile, {"conf", "remove", "--json", "--dry-run", "mode"}));
    story.Run(In(kFile, {"conf", "remove", "--json", "mode"}));
}

TEST_F(TavoctlSettings, ReportsMissingPermission)
{
    const ScratchDir dir;
    const std::string path = dir / "f";
    WriteFile(path, settings, 0644);
    if (test::RootLacks("uids"))
        GTEST_SKIP() << "nobody else to become";
    ASSERT_EQ(::chmod(dir.Path().c_str(), 0755), 0);
    for (const Words &words : std::vector<Words>{{"conf", "set", "mode", "x"}, {"conf", "remove", "mode"}}) {
        const test::Ran ran = test::AsNobody([&] { return Tavoctl(In(path, words)); });
        EXPECT_EQ(ran.status, 5) << ran;
        EXPECT_THAT(ran.err, testing::HasSubstr("run it as root"));
    }
    EXPECT_EQ(ReadFile(path), settings);
    // His own file is his own business.
    ASSERT_EQ(::chown(path.c_str(), 65534, 65534), 0);
    ASSERT_EQ(::chown(dir.Path().c_str(), 65534, 65534), 0);
    EXPECT_EQ(test::AsNobody([&] {
                  return Tavoctl(In(path, {"conf", "set", "--json", "empty", "no more"}));
              }).status,
              0);
    EXPECT_THAT(ReadFile(path), testing::HasSubstr("empty=no more\n"));
}

TEST_F(TavoctlSettings, ReadingShowsTheFactsAsTextAndAsJson)
{
    test::CommandStory story({kFolder});
    WriteFile(kFile, settings);
    for (const Words &words : {Words{"conf", "get", "name"},
                               {"conf", "get", "mode"},
                               {"conf", "get", "--last", "mode"},
                               {"conf", "get", "empty"},
                               {"conf", "get", "--json", "name"},
                               {"conf", "list", "--json"}})
        story.Run(In(kFile, words));
    WriteFile(kFile, sections);
    for (const Words &words : {Words{"section", "list"},
                               {"section", "list", "--json"},
                               {"section", "get", "a"},
                               {"section", "get", "b", "k"},
                               {"section", "get", "--json", "b", "k"},
                               {"section", "get", "b", "l"},
                               {"section", "get", "c"}})
        story.Run(In(kFile, words));
    WriteFile(kFile, "[only]\n");
    story.Run(In(kFile, {"section", "get", "only"}));
}

TEST_F(TavoctlSettings, MissingFileIsNotFoundUnlessItIsToBeMade)
{
    test::CommandStory story({kFolder});
    for (const Words &words : {Words{"conf", "get", "k"},
                               {"conf", "list"},
                               {"conf", "remove", "k"},
                               {"conf", "comment", "k"},
                               {"section", "list"},
                               {"section", "get", "a"},
                               {"section", "set", "a", "k=1"},
                               {"section", "remove", "--yes", "a"},
                               {"conf", "set", "k", "v"}})
        story.Run(In(kFile, words));
    story.Run(In("/root/settings/sections", {"section", "add", "a", "k=v"}));
    story.Run(In(kFolder, {"conf", "get", "k"}));
    story.Run(In("/no/such/folder/f", {"conf", "set", "k", "v"}));
}

TEST_F(TavoctlSettings, SystemSettingsAreChangedUnderTheirLock)
{
    const std::string before = ReadFile("/etc/tavoinfo.conf");
    const ScratchDir dir;
    std::filesystem::create_symlink("/etc/tavoinfo.conf", dir / "link");
    ASSERT_EQ(ErrTLIBFileLock(TAVO_LOCK_TAVOINFO | TAVO_LOCK_SHARED, 0), 0);
    for (const Words &words : std::vector<Words>{{"conf", "set", "--timeout", "0", "k", "v"},
                                                 {"conf", "append", "--timeout", "0", "k", "v"},
                                                 {"conf", "remove", "--timeout", "0", "runsamba"},
                                                 {"conf", "comment", "--timeout", "0", "runsamba"},
                                                 {"conf", "set", "--timeout", "0", "--file", dir / "link", "k", "v"}}) {
        test::IsRefused(words, "ERR_LOCK_FAILED (0x0400); another program holds it");
    }
    EXPECT_EQ(ReadFile("/etc/tavoinfo.conf"), before);
    // Neither looking nor another file asks for it.
    EXPECT_EQ(Tavoctl({"conf", "get", "runsamba"}).status, 0);
    EXPECT_EQ(Tavoctl({"conf", "set", "--dry-run", "--timeout", "0", "k", "v"}).status, 0);
    EXPECT_EQ(Tavoctl({"conf", "set", "--timeout", "0", "--file", dir / "f", "k", "v"}).status, 0);

    std::filesystem::rename("/etc/tavoinfo.conf", "/etc/aside");
    test::IsRefused({"conf", "set", "--timeout", "0", "--file", "/tmp/../etc/tavoinfo.conf", "k", "v"},
                    "ERR_LOCK_FAILED");
    std::filesystem::rename("/etc/aside", "/etc/tavoinfo.conf");

    // Who waits long enough gets it.
    test::RunningTavoctl waiting({"conf", "set", "k", "v"});
    ::usleep(200'000);
    EXPECT_EQ(ReadFile("/etc/tavoinfo.conf"), before);
    ASSERT_EQ(ErrTLIBFileUnlock(TAVO_LOCK_TAVOINFO), 0);
    EXPECT_EQ(waiting.Wait().status, 0);
    EXPECT_EQ(ReadFile("/etc/tavoinfo.conf"), before + "k=\"v\"\n");
    WriteFile("/etc/tavoinfo.conf", before);
}

}  // namespace
