// Rules for every registered verb of tavoctl: the exit statuses.
#include "tavo_lock.h"

#include "run_tavoctl.h"
#include "support/file_snapshot.h"
#include "support/test.h"

#include <nlohmann/json.hpp>

namespace {

using nlohmann::json;
using test::Tavoctl;
using test::Words;
using testing::HasSubstr;

json Verbs()
{
    static const json verbs = json::parse(Tavoctl({"--registry"}).out).at("verbs");
    return verbs;
}

std::string NameOf(const json &verb)
{
    return verb.at("family").get<std::string>() + " " + verb.at("verb").get<std::string>();
}

bool HasTrait(const json &verb, const char *trait)
{
    return verb.at("traits").get<std::string>().find(trait) != std::string::npos;
}

bool IsOption(const json &argument)
{
    return argument.at("name").get<std::string>().starts_with("--");
}

// A call of the verb with a sample for everything that is required, and the value for one argument.
Words CallOf(const json &verb, const std::string &name = {}, const std::string &value = {})
{
    Words words = {verb.at("family")};
    if (verb.at("verb") != "")
        words.push_back(verb.at("verb"));
    if (HasTrait(verb, "destroys"))
        words.emplace_back("--yes");
    Words places;
    for (const json &argument : verb.at("arguments")) {
        const bool wanted = argument.at("name") == name;
        const std::string word = wanted                             ? value
                                 : argument.at("name") == "PROGRAM" ? "true"
                                                                    : argument.at("sample").get<std::string>();
        if (IsOption(argument) && wanted)
            words.insert(words.end(), {name, word});
        else if (!IsOption(argument) && (wanted || argument.at("required")))
            places.push_back(word);
    }
    words.insert(words.end(), places.begin(), places.end());
    return words;
}

TEST(TavoctlContract, WithoutRightsAVerbSaysSo)
{
    if (test::RootLacks("uids"))
        GTEST_SKIP() << "nobody else to become";
    int changing = 0;
    for (const json &verb : Verbs()) {
        if (verb.at("family") == "discover" || verb.at("family") == "watch" || HasTrait(verb, "runs_program"))
            continue;  // ten seconds; for ever; a program of the caller's
        const test::Ran ran = test::AsNobody([&] { return Tavoctl(CallOf(verb)); });
        const bool changes = HasTrait(verb, "changes") && !HasTrait(verb, "by_anybody");
        changing += changes;
        if (changes) {
            EXPECT_EQ(ran.status, 5) << NameOf(verb) << ran;
        }
        EXPECT_NE(ran.status, 4) << NameOf(verb) << ran;
        if (ran.status == 5) {
            EXPECT_THAT(ran.err, HasSubstr("run it as root")) << NameOf(verb);
        }
    }
    EXPECT_GE(changing, 40);
    EXPECT_EQ(test::AsNobody([] { return Tavoctl({"user", "list"}); }).status, 5);
    EXPECT_EQ(test::AsNobody([] { return Tavoctl({"conf", "set", "runsamba", "no"}); }).status, 5);
    // The file that may not be opened is the one that is meant. Root makes the folder of the locks.
    ASSERT_EQ(std::system("rm -rf /tmp/lock; tavoctl lock run tavoinfo true"), 0);
    test::WriteFile("/dev/sdq", "");
    ASSERT_EQ(::chmod("/dev/sdq", 0600), 0);
    test::WriteFile("/tmp/root.pid", std::to_string(::getpid()) + "\n");
    for (const auto &[words, reason] : {std::pair(Words{"lock", "run", "tavoinfo", "true"}, "to open /tmp/lock, "),
                                        {Words{"service", "status", "samba"}, "to open /tmp/lock, "},
                                        {Words{"disk", "temperature", "--wake", "sdq"}, "Permission denied; "},
                                        {Words{"disk", "health", "sdq"}, "Permission denied; "},
                                        {Words{"proc", "signal", "/tmp/root.pid", "0"}, "Operation not permitted; "},
                                        {Words{"state", "diff", "/etc/shadow"}, "Permission denied; "}}) {
        const test::Ran ran = test::AsNobody([&words = words] { return Tavoctl(words); });
        EXPECT_EQ(ran.status, 5) << ran;
        EXPECT_THAT(ran.err, HasSubstr(std::string(reason))) << ran;
        EXPECT_THAT(ran.err, HasSubstr("run it as root")) << ran;
    }
    ::unlink("/dev/sdq");
}

TEST(TavoctlContract, AWrongArgumentIsNamedWithWhatIsAllowed)
{
    int wrong = 0;
    for (const json &verb : Verbs()) {
        for (const json &argument : verb.at("arguments")) {
            if (argument.at("wrong").is_null())
                continue;
            const std::string value = argument.at("wrong");
            const test::Ran ran = Tavoctl(CallOf(verb, argument.at("name"), value));
            EXPECT_EQ(ran.status, 2) << NameOf(verb) << " " << argument.at("name") << ran;
            EXPECT_THAT(ran.err, HasSubstr("cannot take " + value + " as " + argument.at("name").get<std::string>()))
                << NameOf(verb);
            EXPECT_THAT(ran.err, HasSubstr("allowed: ")) << NameOf(verb);
            EXPECT_EQ(ran.out, "");
            ++wrong;
        }
        Words words = CallOf(verb);
        words.insert(words.begin() + (verb.at("verb") == "" ? 1 : 2), "--no-such-option");
        if (!HasTrait(verb, "runs_program")) {  // there a program begins
            EXPECT_EQ(Tavoctl(words).status, 2) << NameOf(verb);
        }
        const auto &arguments = verb.at("arguments");
        if (std::any_of(arguments.begin(), arguments.end(), [](const json &a) { return a.at("required"); })) {
            EXPECT_EQ(Tavoctl({verb.at("family"), verb.at("verb")}).status, 2) << NameOf(verb);
        }
    }
    EXPECT_GE(wrong, 60);
}

// The first required argument names something that must be there.
TEST(TavoctlContract, MissingObjectsAreNotFound)
{
    const std::set<std::string> kinds = {"user", "group", "setting", "service", "disk", "array", "code", "file"};
    // These make what is not there, or ask the machine's own tools first.
    const std::set<std::string> other = {"conf set", "conf append", "raid create", "raid assemble"};
    int asked = 0;
    for (const json &verb : Verbs()) {
        const auto &arguments = verb.at("arguments");
        const auto first =
            std::find_if(arguments.begin(), arguments.end(), [](const json &a) { return a.at("required"); });
        if (first == arguments.end() || !kinds.contains(first->at("kind")) || other.contains(NameOf(verb)))
            continue;
        Words words = CallOf(verb);
        if (NameOf(verb) == "user modify" || NameOf(verb) == "group modify")
            words.insert(words.end(), {"--description", "x"});
        const test::Ran ran = Tavoctl(words);
        EXPECT_EQ(ran.status, 3) << testing::PrintToString(words) << ran;
        ++asked;
    }
    EXPECT_GE(asked, 30);
}

// All verbs at once, because many wait some seconds for the lock.
TEST(TavoctlContract, AHeldLockIsBusyAndNothingChanges)
{
    constexpr unsigned all = 0xFFFFF0;
    const test::FileSnapshot before({"/etc", "/usr/tavo/etc"});
    ASSERT_EQ(ErrTLIBFileLock(all | TAVO_LOCK_EXCLUSIVE | TAVO_LOCK_NONBLOCKING, 0), 0);
    std::vector<std::pair<Words, std::unique_ptr<test::RunningTavoctl>>> running;
    for (const json &verb : Verbs()) {
        if (verb.at("family") == "discover" || verb.at("family") == "watch")
            continue;  // ten seconds; for ever
        if (verb.at("family") == "net" && (test::RootLacks("net") || test::RootLacks("uts")))
            continue;  // this network and name are those of the whole machine
        Words words = CallOf(verb);
        const auto &arguments = verb.at("arguments");
        if (std::any_of(arguments.begin(), arguments.end(), [](const json &a) { return a.at("name") == "--timeout"; }))
            words.insert(words.begin() + (verb.at("verb") == "" ? 1 : 2), {"--timeout", "0"});
        running.emplace_back(words, std::make_unique<test::RunningTavoctl>(words));
    }
    int busy = 0;
    for (const auto &[words, program] : running) {
        const test::Ran ran = program->Wait();
        const bool refused = ran.err.find("ERR_LOCK_FAILED") != std::string::npos;
        EXPECT_EQ(ran.status == 4, refused) << testing::PrintToString(words) << ran;
        busy += refused;
    }
    EXPECT_GE(busy, 25);
    EXPECT_EQ(ErrTLIBFileUnlock(all), 0);
    const test::KeptFiles after = before.Now();
    for (const auto &[path, file] : before.Files())
        EXPECT_TRUE(after.contains(path) && after.at(path).SameContent(file)) << path;
    EXPECT_EQ(after.size(), before.Files().size());
}

TEST(TavoctlContract, EveryVerbHasHelpWithAnExampleNoWiderThanATerminal)
{
    const std::string families = Tavoctl({"--help"}).out;
    for (const json &verb : Verbs()) {
        const std::string family = verb.at("family"), name = verb.at("verb");
        const std::string command = "tavoctl " + family + (name.empty() ? "" : " " + name);
        const test::Ran ran = Tavoctl(name.empty() ? Words{family, "--help"} : Words{family, name, "--help"});
        EXPECT_EQ(ran.status, 0) << command;
        EXPECT_THAT(ran.out, AllOf(testing::StartsWith("usage: " + command), HasSubstr("Examples:\n  " + command)));
        EXPECT_THAT(families, HasSubstr("  " + family + " "));
        EXPECT_THAT("\n" + Tavoctl({"--complete", family, ""}).out, HasSubstr("\n" + name)) << command;
        std::istringstream lines(ran.out.substr(0, ran.out.find("\nExamples:")) + Tavoctl({family, "--help"}).out);
        for (std::string line; std::getline(lines, line);)
            EXPECT_LE(line.size(), 80u) << command << ": " << line;
    }
}

TEST(TavoctlContract, LimitedCallersGetAMessage)
{
    const auto status = [](const std::string &command) {
        return test::ShellStatus(std::system(command.c_str()));
    };
    // A file that may not grow: the old one stays, and nothing is left beside it.
    const std::string before = test::ReadFile("/etc/tavoinfo.conf");
    EXPECT_EQ(status("cd /etc && ls -A > /tmp/names; ulimit -f 0; tavoctl conf set key value 2>/tmp/err"), 1);
    EXPECT_EQ(test::ReadFile("/etc/tavoinfo.conf"), before);
    EXPECT_EQ(status("cd /etc && ls -A | cmp - /tmp/names"), 0);
    // A lack of descriptors is not reported as a lock of another program.
    EXPECT_EQ(status("exec >/dev/null 2>/tmp/err; ulimit -n 4; exec tavoctl user list"), 1);
    EXPECT_THAT(test::ReadFile("/tmp/err"), testing::Not(HasSubstr("another program")));
}

}  // namespace
