// tavoctl conf and section: their changes of the files.
#include "tavo_lock.h"

#include "run_tavoctl.h"
#include "support/test.h"

#include <nlohmann/json.hpp>

namespace {

using nlohmann::json;
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

struct Change {
    Words words;
    std::string before;
    int status;
    std::string after;
};

const Change changes[] = {
    {{"conf", "set", "mode", "three"}, settings, 0, "# ours\nname=\"a nas\"\nmode=three\nempty=\n"},
    {{"conf", "set", "--quote", "new", "x y"}, settings, 0, std::string(settings) + "new=\"x y\"\n"},
    {{"conf", "set", "name", "--", "-5"}, "name=1\n", 0, "name=-5\n"},
    {{"conf", "set", "list", "x"}, "", 0, "list=x\n"},  // a key that is named like a verb
    {{"conf", "set", "new", "1"}, "# ours\na=\"x\"\nb=\"\"\n", 0, "# ours\na=\"x\"\nb=\"\"\nnew=\"1\"\n"},
    {{"conf", "append", "new", "1"}, settings, 0, std::string(settings) + "new=1\n"},
    {{"conf", "append", "new", "1"}, "torn=line", 0, "torn=line\nnew=1\n"},
    {{"conf", "append", "mode", "1"}, settings, 1, settings},
    {{"conf", "remove", "mode"}, settings, 0, "# ours\nname=\"a nas\"\nempty=\n"},
    {{"conf", "remove", "none"}, settings, 3, settings},
    {{"conf", "comment", "mode"}, settings, 0, "# ours\nname=\"a nas\"\n;mode=one\n;mode=two\nempty=\n"},
    {{"conf", "comment", "none"}, settings, 3, settings},
    {{"section", "set", "a", "k=9"}, "[a]\nk=1\n# note\n[b]\nk=3\n", 0, "[a]\nk=9\n# note\n[b]\nk=3\n"},
    {{"section", "set", "b", "k=a=b"}, sections, 0, "; head\n[a]\nk=1\n# note\nl=2\n[b]\nk=a=b\n"},
    {{"section", "set", "--replace", "a", "n=1"}, sections, 0, "; head\n[a]\nn=1\n# note\n[b]\nk=3\n"},
    {{"section", "set", "--rename", "c", "b"}, sections, 0, "; head\n[a]\nk=1\n# note\nl=2\n[c]\nk=3\n"},
    {{"section", "set", "c", "k=1"}, sections, 3, sections},
    {{"section", "set", "a", "=1"}, sections, 2, sections},
    // Lines that a rewrite would lose are a reason to refuse.
    {{"section", "set", "a", "k=2"}, "[a]\nk=1\n[broken\nl=2\n", 1, "[a]\nk=1\n[broken\nl=2\n"},
    {{"section", "set", "a", "k=2"}, "[a]\nk=1\ninclude other\n", 1, "[a]\nk=1\ninclude other\n"},
    {{"section", "set", "a", "k=2"}, "[a]\nk=1\n[a]\nk=3\n", 1, "[a]\nk=1\n[a]\nk=3\n"},
    {{"section", "add", "c", "x=1"}, sections, 0, std::string(sections) + "[c]\nx=1\n"},
    {{"section", "add", "c"}, sections, 0, std::string(sections) + "[c]\n"},
    {{"section", "add", "a", "x=1"}, sections, 1, sections},
    {{"section", "remove", "--yes", "a"}, sections, 0, "; head\n# note\n[b]\nk=3\n"},
    {{"section", "remove", "--yes", "c"}, sections, 3, sections},
};

std::vector<std::string> Split(const std::string &text)
{
    std::vector<std::string> lines;
    for (std::size_t at = 0; at < text.size(); at += lines.back().size())
        lines.push_back(text.substr(at, std::min(text.find('\n', at), text.size() - 1) - at + 1));
    return lines;
}

// Applies a unified diff at exactly its line numbers; fails the test where it does not fit.
std::string Patched(const std::string &text, const std::string &diff)
{
    const std::vector<std::string> before = Split(text);
    const std::vector<std::string> lines = Split(diff);
    std::string after;
    std::size_t at = 0;
    for (std::size_t i = 2; i < lines.size(); ++i) {
        const char mark = lines[i][0];
        std::string line = lines[i].substr(1);
        if (i + 1 < lines.size() && lines[i + 1][0] == '\\')
            line.pop_back();
        if (mark == '@') {
            const std::size_t begin = std::stoul(lines[i].substr(4));
            const bool empty = lines[i].find(",0 +") != std::string::npos;
            for (; at + 1 < begin + (empty ? 1 : 0); ++at)
                after += before.at(at);
        } else if (mark == ' ' || mark == '-') {
            EXPECT_EQ(before.at(at), line) << diff;
            ++at;
        }
        if (mark == ' ' || mark == '+')
            after += line;
    }
    for (; at < before.size(); ++at)
        after += before[at];
    return after;
}

TEST(TavoctlSettings, ChangesAreShownFirstAndThenMadeOrRefused)
{
    for (const Change &change : changes) {
        const ScratchDir dir;
        const std::string path = dir / "f";
        WriteFile(path, change.before, 0640);
        const ino_t inode = test::InodeOf(path);
        Words words = In(path, change.words);
        words.insert(words.begin() + 2, "--dry-run");
        const test::Ran planned = Tavoctl(words);
        EXPECT_EQ(planned.status, change.status) << testing::PrintToString(words) << planned;
        EXPECT_EQ(ReadFile(path), change.before);
        EXPECT_EQ(test::InodeOf(path), inode);
        EXPECT_EQ(change.status == 0 ? Patched(change.before, planned.out) : planned.out,
                  change.status == 0 ? change.after : "");

        const test::Ran ran = Tavoctl(In(path, change.words));
        EXPECT_EQ(ran.status, change.status) << testing::PrintToString(change.words) << ran;
        EXPECT_EQ(ReadFile(path), change.after) << testing::PrintToString(change.words);
        EXPECT_EQ(ran.out, "");
        EXPECT_EQ(ran.err.empty(), ran.status == 0) << ran.err;
        EXPECT_EQ(dir.Names(), std::vector<std::string>{"f"});
        struct stat state = {};
        EXPECT_EQ(::stat(path.c_str(), &state), 0);
        EXPECT_EQ(state.st_mode & 07777u, 0640u);
    }
    for (const auto &entry : std::filesystem::directory_iterator("/tmp"))
        EXPECT_THAT(entry.path().filename().string(), testing::Not(testing::StartsWith("tavoctl.")));
}

TEST(TavoctlSettings, DryRunPrintsAUnifiedDiff)
{
    const ScratchDir dir;
    const std::string path = dir / "f";
    std::string lines;
    for (int i = 1; i <= 20; ++i)
        lines += "k" + std::to_string(i) + "=" + std::to_string(i) + "\n";
    WriteFile(path, "x=1\n" + lines + "x=2\nend=no newline");
    EXPECT_EQ(Tavoctl({"conf", "set", "--dry-run", "--file", path, "x", "3"}).out,
              "--- " + path + "\n+++ " + path +
                  "\n"
                  "@@ -1,4 +1,4 @@\n-x=1\n+x=3\n k1=1\n k2=2\n k3=3\n"
                  "@@ -19,5 +19,4 @@\n k18=18\n k19=19\n k20=20\n-x=2\n end=no newline\n"
                  "\\ No newline at end of file\n");
    EXPECT_EQ(Tavoctl({"conf", "set", "--dry-run", "--file", dir / "new", "x", "3"}).out,
              "--- /dev/null\n+++ " + dir / "new" + "\n@@ -0,0 +1 @@\n+x=3\n");
    EXPECT_EQ(Tavoctl({"conf", "set", "--dry-run", "--file", path, "k5", "5"}).out, "");
    EXPECT_EQ(Tavoctl({"conf", "set", "--dry-run", "--file", "/no/such/folder/f", "x", "3"}).status, 1);
    EXPECT_EQ(dir.Names(), std::vector<std::string>{"f"});
}

TEST(TavoctlSettings, JsonSaysWhatWasChanged)
{
    const ScratchDir dir;
    const std::string path = dir / "f";
    WriteFile(path, settings);
    const ino_t inode = test::InodeOf(path);
    const json same = test::Facts(In(path, {"conf", "set", "--json", "empty", ""}));
    EXPECT_EQ(same, (json{{"changed", false}, {"changes", json::array()}}));
    EXPECT_EQ(test::InodeOf(path), inode) << "what is so already is not written again";

    const json planned = test::Facts(In(path, {"conf", "remove", "--json", "--dry-run", "mode"}));
    EXPECT_EQ(planned.at("dry_run"), true);
    EXPECT_EQ(ReadFile(path), settings);
    const json done = test::Facts(In(path, {"conf", "remove", "--json", "mode"}));
    EXPECT_EQ(done.at("changed"), true);
    EXPECT_EQ(done.at("diff"), planned.at("diff"));
    EXPECT_EQ(Patched(settings, done.at("diff")), ReadFile(path));
}

TEST(TavoctlSettings, ReportsMissingPermission)
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

TEST(TavoctlSettings, ReadingShowsTheFactsAsTextAndAsJson)
{
    const ScratchDir dir;
    const std::string path = dir / "f";
    WriteFile(path, settings);
    EXPECT_EQ(Tavoctl(In(path, {"conf", "get", "name"})).out, "a nas\n");
    EXPECT_EQ(Tavoctl(In(path, {"conf", "get", "mode"})).out, "one\n");
    EXPECT_EQ(Tavoctl(In(path, {"conf", "get", "--last", "mode"})).out, "two\n");
    EXPECT_EQ(Tavoctl(In(path, {"conf", "get", "empty"})).out, "\n");
    EXPECT_EQ(test::Facts(In(path, {"conf", "get", "--json", "name"})),
              (json{{"file", path}, {"key", "name"}, {"value", "a nas"}}));
    EXPECT_EQ(test::Facts(In(path, {"conf", "list", "--json"})),
              (json{{{"line", 2}, {"key", "name"}, {"value", "a nas"}},
                    {{"line", 3}, {"key", "mode"}, {"value", "one"}},
                    {{"line", 4}, {"key", "mode"}, {"value", "two"}},
                    {{"line", 5}, {"key", "empty"}, {"value", ""}}}));

    WriteFile(path, sections);
    EXPECT_EQ(Tavoctl(In(path, {"section", "list"})).out, "SECTION\na\nb\n");
    EXPECT_EQ(test::Facts(In(path, {"section", "list", "--json"})), (json{{{"section", "a"}}, {{"section", "b"}}}));
    EXPECT_EQ(Tavoctl(In(path, {"section", "get", "a"})).out, "KEY  VALUE\nk    1\nl    2\n");
    EXPECT_EQ(Tavoctl(In(path, {"section", "get", "b", "k"})).out, "3\n");
    EXPECT_EQ(test::Facts(In(path, {"section", "get", "--json", "b", "k"})),
              (json{{"file", path}, {"section", "b"}, {"key", "k"}, {"value", "3"}}));
    EXPECT_EQ(Tavoctl(In(path, {"section", "get", "b", "l"})).status, 3);
    EXPECT_EQ(Tavoctl(In(path, {"section", "get", "c"})).status, 3);

    WriteFile(path, "[only]\n");
    EXPECT_EQ(Tavoctl(In(path, {"section", "get", "only"})).status, 0);
}

TEST(TavoctlSettings, MissingFileIsNotFoundUnlessItIsToBeMade)
{
    const ScratchDir dir;
    for (const Words &words : std::vector<Words>{{"conf", "get", "k"},
                                                 {"conf", "list"},
                                                 {"conf", "remove", "k"},
                                                 {"conf", "comment", "k"},
                                                 {"section", "list"},
                                                 {"section", "get", "a"},
                                                 {"section", "set", "a", "k=1"},
                                                 {"section", "remove", "--yes", "a"}})
        EXPECT_EQ(Tavoctl(In(dir / "none", words)).status, 3) << testing::PrintToString(words);
    EXPECT_THAT(dir.Names(), testing::IsEmpty());
    EXPECT_EQ(Tavoctl(In(dir.Path(), {"conf", "get", "k"})).status, 2);
    EXPECT_EQ(Tavoctl(In("/no/such/folder/f", {"conf", "set", "k", "v"})).status, 1);

    EXPECT_EQ(Tavoctl(In(dir / "conf", {"conf", "set", "k", "v"})).status, 0);
    EXPECT_EQ(ReadFile(dir / "conf"), "k=v\n");
    EXPECT_EQ(Tavoctl(In(dir / "sections", {"section", "add", "a", "k=v"})).status, 0);
    EXPECT_EQ(ReadFile(dir / "sections"), "[a]\nk=v\n");
}

TEST(TavoctlSettings, SystemSettingsAreChangedUnderTheirLock)
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
