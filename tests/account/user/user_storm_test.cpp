// Sixteen programs change accounts at once, each now through the library and now with the system's own useradd,
// usermod, passwd and userdel. Every change that one of them saw succeed has happened, and stays.
#include "tavo_group.h"
#include "tavo_user.h"

#include "account/group/group_fixture.h"
#include "account/user/user_fixture.h"
#include "support/machine.h"
#include "support/rounds.h"
#include "support/test.h"

#include <atomic>

#include <crypt.h>
#include <sys/mman.h>

using test::GetUser;

namespace {

constexpr int kWorkers = 16;
constexpr int kSteps = 12;     // of a cycle, one operation each
constexpr int kCycles = 30;    // 16 x 30 x 12: 5,760 operations
constexpr int kPatience = 20;  // how often a program tries again when another one holds the lock

const std::string kBusy = "locked all the time";
constexpr char kAddedHash[] = "$1$ab$cdefghijklmnopqrstuv./";

// In memory that all of them share.
struct Score {
    std::atomic<int> operations;
    std::atomic<int> busy;  // refusals because of a lock
};

bool HaveTools()
{
    for (const char *tool : {"/usr/sbin/useradd", "/usr/sbin/usermod", "/usr/sbin/userdel"})
        if (test::Shell(std::string(tool) + " --help").status != 0)
            return false;
    // The one of a userland that is a single program takes no lock.
    return test::Shell("/usr/bin/passwd --help").output.find("--expire") != std::string::npos;
}

bool IsPassword(const std::string &password, const std::string &hash)
{
    crypt_data data = {};
    const char *made = ::crypt_r(password.c_str(), hash.c_str(), &data);
    return made && hash == made;
}

std::string Field(const std::string &line, size_t index)
{
    size_t at = 0;
    for (; index > 0 && at != line.npos; --index)
        at = line.find(':', at) + 1;
    return line.substr(at, line.find(':', at) - at);
}

class Worker {
  public:
    Worker(int number, Score &score) : number_(number), score_(score) {}

    bool Work(int cycles)
    {
        for (int cycle = 0; cycle < cycles; ++cycle)
            if (!Cycle(cycle))
                return false;
        return true;
    }

    static std::string Ours(int worker, int cycle) { return Name('w', worker, cycle); }
    static std::string Theirs(int worker, int cycle) { return Name('t', worker, cycle); }

  private:
    static std::string Name(char kind, int worker, int cycle)
    {
        return kind + std::to_string(worker) + "_" + std::to_string(cycle);
    }

    // An account that the library adds and the tools change, and one the other way round; and a group of the first.
    bool Cycle(int cycle)
    {
        const std::string ours = Ours(number_, cycle);
        const std::string theirs = Theirs(number_, cycle);
        const std::string kept = ours + "r";
        const std::string password = "Pw-" + ours;
        return Library("add " + ours, [&] { return test::AddUser({.name = ours, .password = "first"}); }) &&
               Library("group " + ours, [&] { return test::AddGroup(ours, -1, {ours}); }) &&
               Tool("printf '" + password + "\\n" + password + "\\n' | /usr/bin/passwd " + ours) &&
               Holds(ours, [&](const TAVOUSER &user) { return IsPassword(password, user.szPasswd); }) &&
               Library("describe " + ours, [&] { return test::CodeOf(TAVOGroupDescSet(ours.c_str(), "text")); }) &&
               Library("rename " + ours, [&] { return test::Rename(ours, kept); }) &&
               Holds(kept, [&](const TAVOUSER &user) { return IsPassword(password, user.szPasswd); }) &&
               Tool("/usr/sbin/useradd -M -N -g 100 -p '" + std::string(kAddedHash) + "' " + theirs) &&
               Holds(theirs, [&](const TAVOUSER &user) { return std::string(kAddedHash) == user.szPasswd; }) &&
               Library("rename " + theirs, [&] { return test::Rename(theirs, theirs + "r"); }) &&
               Library("regroup " + kept, [&] { return test::SetGroup(ours.c_str(), kept, -1, {kept}); }) &&
               Tool("/usr/sbin/usermod -c 'by usermod' " + kept) &&
               Library("change " + kept, [&] { return SetMail(kept); }) &&
               (cycle % 2 == 0 ? Library("delete " + theirs, [&] { return test::DeleteUser(theirs + "r"); }) &&
                                     Library("ungroup " + kept, [&] { return test::DeleteGroups({kept.c_str()}); })
                               : Tool("/usr/sbin/userdel " + theirs + "r") && Count());
    }

    // As any program changes one thing of an account: it reads the record and stores it again.
    static int SetMail(const std::string &name)
    {
        const test::User user = GetUser(name);
        if (!user)
            return TLIBErrGet();
        TAVOUSER changed = *user;
        changed.szMail = const_cast<char *>("somebody@example.com");
        return test::SetUser(name, &changed);
    }

    // Tries again while another program holds the lock. An attempt returns what went wrong.
    bool Retry(const std::string &what, const std::function<std::string()> &attempt)
    {
        std::string wrong = kBusy;
        for (int tries = 0; tries < kPatience && wrong == kBusy; ++tries) {
            TLIBErrSet(ERR_SUCCESS);
            wrong = attempt();
            score_.busy += wrong == kBusy;
        }
        if (!wrong.empty())
            std::fprintf(stderr, "worker %d: %s: %s\n", number_, what.c_str(), wrong.c_str());
        return wrong.empty();
    }

    static std::string Wrong(int code)
    {
        return code == 0 ? "" : code == ERR_LOCK_FAILED ? kBusy : "code " + std::to_string(code);
    }

    bool Library(const std::string &what, const std::function<int()> &change)
    {
        return Retry(what, [&] { return Wrong(change()); }) && Count();
    }

    bool Tool(const std::string &command)
    {
        const auto attempt = [&] {
            const test::CommandResult result = test::Shell(command);
            const bool busy = result.output.find("try again later") != result.output.npos ||
                              result.output.find("lock busy") != result.output.npos;
            return result.status == 0 ? "" : busy ? kBusy : std::to_string(result.status) + "\n" + result.output;
        };
        return Retry(command, attempt) && Count();
    }

    bool Holds(const std::string &name, const std::function<bool(const TAVOUSER &)> &expected)
    {
        return Retry(name, [&] {
            const test::User user = GetUser(name);
            return !user             ? Wrong(TLIBErrGet())
                   : expected(*user) ? ""
                                     : "not what it was just made: " + std::string(user->szPasswd) + " " + user->szDesc;
        });
    }

    bool Count()
    {
        ++score_.operations;
        return true;
    }

    const int number_;
    Score &score_;
};

void CheckKept(const std::string &name, const std::string &password)
{
    const test::User user = GetUser(name);
    ASSERT_TRUE(user) << name;
    EXPECT_TRUE(IsPassword(password, user->szPasswd)) << name;
    EXPECT_STREQ(user->szDesc, "by usermod") << name;
    EXPECT_STREQ(user->szMail, "somebody@example.com") << name;
}

TEST(UserStorm, WorkersAndTheSystemsTools)
{
    if (!HaveTools())
        GTEST_SKIP() << "no useradd and passwd here";
    const int cycles = std::max(test::Rounds(kCycles), 1);
    const auto before = test::Lines(test::FileText("/etc/passwd"));
    auto *score =
        static_cast<Score *>(::mmap(nullptr, sizeof(Score), PROT_READ | PROT_WRITE, MAP_SHARED | MAP_ANONYMOUS, -1, 0));
    ASSERT_NE(score, MAP_FAILED);
    std::vector<pid_t> children;
    for (int number = 0; number < kWorkers; ++number) {
        children.push_back(::fork());
        if (children.back() == 0)
            ::_exit(Worker(number, *score).Work(cycles) ? 0 : 1);
    }
    for (const pid_t child : children) {
        int status = 0;
        ::waitpid(child, &status, 0);
        EXPECT_EQ(status, 0);
    }
    EXPECT_EQ(score->operations, kWorkers * cycles * kSteps);
    RecordProperty("operations", score->operations);
    RecordProperty("refusals_by_lock", score->busy);
    ::munmap(score, sizeof *score);

    std::map<std::string, std::string> expected;
    for (const std::string &line : before)
        expected[Field(line, 0)] = "";
    for (int worker = 0; worker < kWorkers; ++worker)
        for (int cycle = 0; cycle < cycles; ++cycle)
            expected[Worker::Ours(worker, cycle) + "r"] = "Pw-" + Worker::Ours(worker, cycle);
    // One more change, after which every file has been written by the library.
    ASSERT_EQ(test::AddUser({.name = "last", .password = "x"}), 0);
    expected["last"] = "";
    std::map<std::string, std::string> found;
    std::map<std::string, std::string> owners;
    for (const std::string &line : test::Lines(test::FileText("/etc/passwd"))) {
        const std::string name = Field(line, 0);
        const auto account = expected.find(name);
        ASSERT_NE(account, expected.end()) << name << " should not be there";
        EXPECT_TRUE(found.insert(*account).second) << name << " is there twice";
        if (!name.starts_with('w'))
            continue;
        EXPECT_TRUE(owners.emplace(Field(line, 2), name).second) << "one user id for two: " << line;
        for (const char *path : test::kAccountFiles)
            EXPECT_NE(test::LineOf(path, name), "") << name << " in " << path;
        CheckKept(name, account->second);
    }
    EXPECT_EQ(found, expected);
    std::map<std::string, std::string> groups;  // by their ids
    for (const std::string &line : test::Lines(test::GroupFile()))
        if (const std::string name = Field(line, 0); name.starts_with('w')) {
            EXPECT_TRUE(groups.emplace(Field(line, 2), name).second) << "one group id for two: " << line;
            EXPECT_EQ(Field(line, 3), name) << "the member was renamed with its groups";
            EXPECT_NE(("\n" + test::DescFile()).find("\n" + name + ":text\n"), std::string::npos) << name;
        }
    EXPECT_EQ(int(groups.size()), kWorkers * (cycles / 2)) << "those of every other cycle";
    for (const char *path : test::kAccountFiles)
        EXPECT_EQ(test::FileText(path).find("\nt"), std::string::npos) << "a deleted account in " << path;
}

}  // namespace
