// The common parts of all verbs of tavoctl: exit statuses, refusals, tables and JSON, failures, questions, completion.

#include "command_story.h"
#include "support/test.h"
#include "support/text_lines.h"

#include <nlohmann/json.hpp>

namespace {

using nlohmann::json;
using test::ReadFile;
using test::ScratchDir;
using test::Tavoctl;
using test::TavoctlAtTerminal;
using test::Words;
using test::WriteFile;
using testing::HasSubstr;
using testing::StartsWith;

// tavoctl is a program of its own: where only the entering program can start one, there is nothing to test.
class NeedsPrograms : public testing::Environment {
    void SetUp() override
    {
        if (test::RootLacks("foreign-exec"))
            GTEST_SKIP() << "no program can be started here";
    }
};
[[maybe_unused]] const testing::Environment *const needs = testing::AddGlobalTestEnvironment(new NeedsPrograms);

// Beyond what the contract over all verbs asks of each.
TEST(TavoctlFrame, WrongCommandLinesAreUsageAndSayNothingOnStandardOutput)
{
    test::CommandStory story({"/tmp/new"});
    story.Run({
        {},
        {"nonsense"},
        {"conf"},
        {"conf", "nonsense"},
        {"conf", "get", "a", "b"},
        {"conf", "get", "--file"},
        {"conf", "get", "--file", "/etc/hosts", "--defaults", "a"},
        {"conf", "set", "--timeout", "-1", "key", "value"},
        {"conf", "set", "bad=key", "value"},
        {"conf", "set", "key", "two\nlines"},
        {"section", "list"},
        {"section", "set", "--file", "/etc/tavoinfo.conf", "name"},
        {"section", "add", "--file", "/tmp/new", "name", "no pair"},
        {"section", "add", "--file", "/tmp/new", "bad]name", "a=b"},
        {"lock", "run", "tavoinfo"},
        {"lock", "run", "nonsense", "--", "true"},
        {"lock", "run", "0x806", "--", "true"},
        {"lock", "run", "0", "--", "true"},
        {"proc", "run", "--timeout", "0", "true"},
        {"error", "list", "--output", "nonsense"},
        {"error", "list", "--output", ""},
        {"user", "show"},
        {"user", "add", "eve", "--empty-password", "--unknown-password"},
        {"user", "add", "eve", "--empty-password", "--expires", "1969/12/31"},
        {"user", "add", "eve", "--empty-password", "--uid", "1024"},
        {"user", "add", "eve", "--empty-password", "--mail", "two\nlines"},
        {"user", "add", "eve"},  // and no password on standard input
        {"user", "modify", "admin"},
        {"user", "delete", "--yes", "nobody"},
        {"group", "modify", "users", "--join", "admin"},
        {"group", "modify", "administrators"},
        {"group", "delete", "--yes", "administrators"},
        {"group", "rename", "users", "folks"},
        {"quota", "on", "0"},
        {"quota", "set", "admin", "1", "--", "-1M"},
        {"quota", "set", "admin", "1", "nan"},
        {"quota", "set", "admin", "1", "1KB"},
    });
}

TEST(TavoctlFrame, FailureNamesCodePlaceAttemptAndHintOnOneLine)
{
    test::CommandStory story({});
    story.Run({{"conf", "get", "no_such_key"},
               {"conf", "get", "--verbose", "no_such_key"},
               {"conf", "get", "--json", "no_such_key"}});
}

TEST(TavoctlFrame, ForeignMachineIsNotChanged)
{
    const std::string before = ReadFile("/etc/tavoinfo.conf");
    std::filesystem::rename("/etc.defaults/tavoinfo.conf", "/root/defaults");
    test::CommandStory story({"/etc", "/root", "/usr/tavo/etc"});
    story.Run({
        {"conf", "set", "key", "value"},
        {"conf", "append", "key", "value"},
        {"conf", "remove", "runsamba"},
        {"conf", "comment", "runsamba"},
        {"section", "add", "--file", "/root/sections", "name", "a=b"},
        {"section", "remove", "--yes", "--file", "/etc/tavoinfo.conf", "name"},
        {"lock", "run", "tavoinfo", "--", "/bin/touch", "/root/ran"},
        {"proc", "run", "/bin/touch", "/root/ran"},
        {"user", "add", "--empty-password", "eve"},
        {"user", "delete", "--yes", "admin"},
        {"user", "import", "/dev/null"},
        {"group", "add", "eves"},
        {"quota", "off", "1"},
        // Looking is allowed, and so is meaning it.
        {"conf", "set", "--dry-run", "key", "value"},
        {"conf", "set", "--force-host", "key", "value"},
    });
    EXPECT_EQ(test::Facts({"version", "--json"}).at("appliance"), false);

    std::filesystem::rename("/root/defaults", "/etc.defaults/tavoinfo.conf");
    WriteFile("/etc/tavoinfo.conf", before);
}

TEST(TavoctlFrame, ColumnsAlignByCharacters)
{
    test::CommandStory story({});
    const std::string file = "/root/columns";
    WriteFile(file, "k=v\nschl\xC3\xBCssel=gr\xC3\xB6\xC3\x9F"
                    "e\n# comment\nlong_key_name=\n");
    story.Run({"conf", "list", "--file", file});
    WriteFile(file, "# nothing\n");
    story.Run({{"conf", "list", "--file", file}, {"conf", "list", "--json", "--file", file}});
}

TEST(TavoctlFrame, ControlCharactersNeverReachATerminal)
{
    const ScratchDir dir;
    if (test::RootLacks("pts"))
        GTEST_SKIP() << "no terminals here";
    // Escape, a C1 control, bytes that are no UTF-8, an override of direction, delete.
    const std::string value = "a\x1b[31mb\xC2\x9B"
                              "2Jc\xFF\xC0\x80"
                              "d\xE2\x80\xAE"
                              "e\x7F";
    const std::string shown = R"(a\x1b[31mb\xc2\x9b2Jc\xff\xc0\x80d\xe2\x80\xaee\x7f)";
    WriteFile(dir / "f", "k=" + value + "\n");
    const Words get = {"conf", "get", "--file", dir / "f", "k"};
    const Words list = {"conf", "list", "--file", dir / "f"};

    EXPECT_EQ(TavoctlAtTerminal(get).out, shown + "\r\n");
    EXPECT_EQ(Tavoctl(get).out, value + "\n");  // a script gets the bytes
    EXPECT_THAT(Tavoctl(list).out, HasSubstr(shown));
    EXPECT_EQ(TavoctlAtTerminal({"conf", "set", "--dry-run", "--file", dir / "f", "n", "\x1b[0m"}).out.find('\x1b'),
              std::string::npos);
    EXPECT_THAT(Tavoctl({"conf", "get", "--file", dir / "f", "\x1b]0;x\x07"}).err,
                testing::AllOf(HasSubstr(R"(\x1b]0;x\x07)"), testing::Not(HasSubstr("\x1b"))));

    Words as_json = get;
    as_json.emplace_back("--json");
    const std::string text = Tavoctl(as_json).out;
    for (const char c : text)
        EXPECT_TRUE(c == '\n' || (c >= ' ' && c < 0x7F)) << static_cast<int>(c);
    EXPECT_THAT(json::parse(text).at("value").get<std::string>(), StartsWith("a\x1b[31mb"));
}

TEST(TavoctlFrame, QuestionsAreAskedAtATerminalOnly)
{
    const ScratchDir dir;
    if (test::RootLacks("pts"))
        GTEST_SKIP() << "no terminals here";
    const std::string text = "[a]\nk=v\n[b]\nk=v\n";
    const Words remove = {"section", "remove", "--file", dir / "f", "b"};

    WriteFile(dir / "f", text);
    EXPECT_EQ(Tavoctl(remove).status, 2);
    EXPECT_EQ(ReadFile(dir / "f"), text);
    for (const char *answer : {"n\n", "\n", "maybe\n"}) {
        const test::Ran ran = TavoctlAtTerminal(remove, answer);
        EXPECT_EQ(ran.status, 1) << answer;
        EXPECT_THAT(ran.out, HasSubstr("Remove section [b] of " + dir / "f" + "? [y/N] "));
        EXPECT_EQ(ReadFile(dir / "f"), text) << answer;
    }
    for (const char *answer : {"y\n", "Y\n", "yes\n"}) {
        WriteFile(dir / "f", text);
        EXPECT_EQ(TavoctlAtTerminal(remove, answer).status, 0) << answer;
        EXPECT_EQ(ReadFile(dir / "f"), "[a]\nk=v\n") << answer;
    }
}

TEST(TavoctlFrame, AnAnswerThatCannotBeWrittenIsAFailure)
{
    const ScratchDir dir;
    const std::string file = dir / "f";
    const auto status = [&](const std::string &words, const std::string &redirections) {
        return test::ShellStatus(std::system(("/usr/bin/tavoctl " + words + " " + redirections).c_str()));
    };
    WriteFile(file, "k=v\n");
    for (const std::string &words : {"conf list --file " + file, std::string("--help"), std::string("conf --help"),
                                     std::string("conf list --help"), std::string("--man-page")}) {
        EXPECT_EQ(status(words, ">/dev/full 2>/dev/null"), 1) << words;
        EXPECT_EQ(status(words, ">&- 2>/dev/null"), 1) << words;
    }
    // Whatever the caller has closed, no message goes into a file, and a change that has nothing to say succeeds.
    for (int closed = 0; closed < 8; ++closed) {
        const std::string redirections = std::string(closed & 1 ? " 0<&-" : " 0</dev/null") +
                                         (closed & 2 ? " 1>&-" : " 1>/dev/null") +
                                         (closed & 4 ? " 2>&-" : " 2>/dev/null");
        EXPECT_EQ(status("conf list --file " + file, redirections), closed & 2 ? 1 : 0) << redirections;
        WriteFile(file, "k=v\n");
        EXPECT_EQ(status("conf set --file " + file + " k w", redirections), 0) << redirections;
        EXPECT_EQ(ReadFile(file), "k=w\n") << redirections;
        EXPECT_NE(status("conf get --file " + file + " absent", redirections), 0) << redirections;
        EXPECT_EQ(ReadFile(file), "k=w\n") << redirections;
    }
}

TEST(TavoctlFrame, TablesShowTheChosenColumnsInTheWidthOfTheTerminal)
{
    const ScratchDir dir;
    const std::string file = dir / "f";
    WriteFile(file, "k=v\nlong_key=" + std::string(100, 'x') + "\n");
    EXPECT_EQ(Tavoctl({"conf", "list", "--output", "value,KEY", "--noheadings", "--file", file}).out,
              "v" + std::string(99, ' ') + "  k\n" + std::string(100, 'x') + "  long_key\n");
    // Characters of East Asian scripts take two columns, also where the environment names no such locale.
    WriteFile(file, "k=\xE6\x97\xA5\xE6\x9C\xAC\nl=ab\n");
    EXPECT_EQ(Tavoctl({"conf", "list", "--output", "value,key", "--noheadings", "--file", file}).out,
              "\xE6\x97\xA5\xE6\x9C\xAC  k\nab    l\n");
    if (test::RootLacks("pts"))
        return;
    WriteFile(file, "k=v\nlong_key=" + std::string(100, 'x') + "\n");
    for (const Words &words :
         {Words{"conf", "list", "--file", file}, {"error", "list"}, {"--help"}, {"net", "--help"}}) {
        for (const std::string &line : test::Lines(TavoctlAtTerminal(words).out))
            EXPECT_LE(line.size(), 81u) << line;  // with the carriage return
    }
    // Only the widest column takes several lines.
    EXPECT_THAT(TavoctlAtTerminal({"error", "list"}).out,
                HasSubstr("\n0xD400  ERR_SERVICE_STD_ACTION       the script"));
}

TEST(TavoctlFrame, ColoursAndThePagerAreForTerminals)
{
    if (test::RootLacks("pts"))
        GTEST_SKIP() << "needs a terminal";
    const ScratchDir dir;
    WriteFile(dir / "f", "a=degraded\nb=2\nc=3\n");
    const Words list = {"conf", "list", "--file", dir / "f"};
    const struct {
        const char *variable, *value;
        unsigned short rows;
        bool coloured, paged;
    } cases[] = {
        {"TERM", "xterm", 0, true, false}, {"TERM", "xterm", 5, true, false},
        {"TERM", "xterm", 4, true, true},  {"TERM", "dumb", 3, false, true},
        {"NO_COLOR", "1", 3, false, true}, {"PAGER", "", 3, true, false},
        {"PAGER", "cat", 3, true, false},  {"PAGER", "/no/such/program 2>/dev/null", 3, true, false},
    };
    for (const auto &[variable, value, rows, coloured, paged] : cases) {
        ::unsetenv("NO_COLOR");
        ::setenv("TERM", "xterm", 1);
        ::setenv("PAGER", "sed 's/^/paged /'", 1);
        ::setenv(variable, value, 1);
        const std::string out = TavoctlAtTerminal(list, {}, rows).out;
        EXPECT_THAT(out, testing::AllOf(HasSubstr("degraded"), HasSubstr("3"))) << variable << value << rows;
        EXPECT_EQ(out.find("\x1b[") != out.npos, coloured) << variable << value << rows << out;
        EXPECT_EQ(out.starts_with("paged "), paged) << variable << value << rows << out;
        EXPECT_THAT(Tavoctl(list).out, testing::Not(testing::AnyOf(HasSubstr("\x1b"), HasSubstr("paged"))));
    }
    // A pager that ends before it has read everything costs neither the rest of the answer nor the exit status.
    std::string large = "a=degraded\n";
    for (int i = 0; i < 9000; ++i)
        large += "key" + std::to_string(i) + "=some value\n";
    WriteFile(dir / "f", large);
    for (const char *pager : {"/no/such/program 2>/dev/null", "head -n 2"}) {
        ::setenv("PAGER", pager, 1);
        const test::Ran ran = TavoctlAtTerminal(list, {}, 3);
        EXPECT_THAT(ran.out, HasSubstr("degraded")) << pager;
        EXPECT_EQ(ran.status, 0) << pager;
    }
}

TEST(TavoctlFrame, MistypedWordsAreSuggested)
{
    test::CommandStory story({});
    story.Run({
        {"cnof", "get"},
        {"conf", "gte"},
        {"conf", "get", "--defautls", "x"},
        {"conf", "get", "runsmaba"},
        {"lock", "run", "tavoinof", "--", "true"},
        {"error", "explain", "ERR_KEY_NOT_FUOND"},
        {"error", "list", "--output", "nam"},
    });
}

TEST(TavoctlFrame, ErrorCodesAreTheLibrarysOwn)
{
    const json list = test::Facts({"error", "list", "--json"});
    std::vector<bool> listed(static_cast<std::size_t>(errNum));
    for (const json &row : list) {
        const int code = std::stoi(row.at("code").get<std::string>(), nullptr, 16);
        EXPECT_EQ(code % 0x100, 0);
        EXPECT_NE(row.at("meaning"), "");
        const auto index = static_cast<std::size_t>(code / 0x100);
        if (index >= listed.size())
            continue;
        listed[index] = true;
        // A code whose slot is empty has its name from the header only.
        const std::string name = rgszErrMsg[index];
        EXPECT_TRUE(name.empty() || row.at("name") == name) << row << name;
    }
    for (std::size_t i = 0; i < listed.size(); ++i)
        EXPECT_TRUE(listed[i] || !*rgszErrMsg[i]) << rgszErrMsg[i];

    test::CommandStory story({});
    story.Run({"error", "explain", "--json", "0x0400"});
    for (const char *form : {"1024", "0X400", "ERR_LOCK_FAILED", "err_lock_failed", "Lock_Failed",  // one code
                             "0x0401", "-1024", "0x", "1024 ", "ERR_", "99999999999"})
        story.Run({"error", "explain", "--", form});
}

TEST(TavoctlFrame, VersionNamesMachineAndLibrary)
{
    const json version = test::Facts({"version", "--json"});
    EXPECT_EQ(version.at("machine").get<std::string>() + "\n", [] {
        std::ifstream in("/proc/sys/kernel/arch");
        std::ostringstream arch;
        arch << in.rdbuf();
        return sizeof(void *) == 8 && in.is_open() ? arch.str() : "armv7l\n";
    }());
    EXPECT_THAT(version.at("library_file").get<std::string>(), HasSubstr("libtavosdk.so.1"));
    EXPECT_THAT(version.at("library").get<std::string>(), StartsWith("1"));
    EXPECT_EQ(version.at("appliance"), true);
    EXPECT_EQ(Tavoctl({"--version"}).out, Tavoctl({"version"}).out);
}

TEST(TavoctlFrame, CompletionKnowsVerbsOptionsAndNames)
{
    test::CommandStory story({});
    story.Run({
        {"--complete", "er"},
        {"--complete", "conf", "co"},
        {"--complete", "conf", "get", "--de"},
        {"--complete", "conf", "get", "runsam"},
        {"--complete", "conf", "get", "--file", "runsam"},
        {"--complete", "conf", "get", "--file", "/etc/x", "runsam"},
        {"--complete", "conf", "get", "runsamba", "run"},
        {"--complete", "lock", "run", "--timeout", "5", "tavo"},
        {"--complete", "error", "explain", "ERR_KEY_N"},
        {"--complete", "proc", "signal", "/tmp/pid", "HU"},
        {"--complete", "version", "--j"},
        {"--complete", "nonsense", "ge"},
    });
}

}  // namespace
