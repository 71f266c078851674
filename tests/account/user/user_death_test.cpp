// A program that changes accounts dies at random moments, against others. What the next program
// finds is the state before or after the change, whole, and no account that was committed is ever lost.
#include "tavo_user.h"

#include "account/user/user_fixture.h"
#include "support/rounds.h"

#include <gtest/gtest.h>

#include <functional>
#include <map>
#include <random>
#include <set>

#include <shadow.h>
#include <signal.h>
#include <sys/mman.h>
#include <sys/wait.h>
#include <unistd.h>

using test::AddUser;
using test::GetUser;

namespace {

// The accounts that stand in the stores, as any program reads them.
std::map<std::string, std::string> StoredPasswords()
{
    std::map<std::string, std::string> passwords;
    for (const std::string &line : test::Lines(test::FileText("/etc/passwd"))) {
        const std::string name = line.substr(0, line.find(':'));
        const test::User user = GetUser(name);
        passwords[name] = user ? user->szPasswd : "(none)";
    }
    return passwords;
}

void CheckFiles(const std::set<std::string> &committed)
{
    const auto lines = test::Lines(test::FileText("/etc/passwd"));
    ASSERT_EQ(lines.at(0), "root:x:0:0:System administrator:/root:/bin/sh");
    for (const std::string &line : lines)
        ASSERT_EQ(std::count(line.begin(), line.end(), ':'), 6) << line;
    const auto passwords = StoredPasswords();
    for (const std::string &name : committed) {
        for (const char *path : test::kAccountFiles)
            ASSERT_NE(test::LineOf(path, name), "") << name << " in " << path;
        ASSERT_TRUE(passwords.at(name).starts_with("$1$")) << name;
    }
    for (const auto &[name, password] : passwords)
        ASSERT_NE(password, "(none)") << name;
}

// What the child of the next test has committed and is about to change, in memory that outlives it.
struct Journal {
    volatile int done;
    volatile bool busy;
};

TEST(UserDeath, AtRandomMoments)
{
    auto *journal = static_cast<Journal *>(
        ::mmap(nullptr, sizeof(Journal), PROT_READ | PROT_WRITE, MAP_SHARED | MAP_ANONYMOUS, -1, 0));
    ASSERT_NE(journal, MAP_FAILED);
    std::mt19937 random(7);
    // Step s of the child: accounts are added, renamed (their names say so), and deleted two rounds later, each time
    // all of a batch in one call.
    const auto names_of = [](int round, const std::string &suffix) {
        std::vector<std::string> names;
        for (const char *member : {"x", "y", "z"})
            names.push_back("user" + std::to_string(round) + member + suffix);
        return names;
    };
    const auto step = [&](int s) {
        const auto names = names_of(s / 3, s % 3 == 0 ? "" : "b");
        const auto old_names = names_of(s / 3, "");
        if (s % 3 == 2 && s < 6)
            return;
        const auto doomed = names_of(s / 3 - 2, "b");
        std::vector<test::User> users;
        std::vector<const TAVOUSER *> records;
        std::vector<const char *> old;
        std::vector<const char *> gone;
        for (size_t i = 0; i < names.size(); ++i) {
            users.push_back(test::MakeUser({.name = names[i], .password = "x"}));
            records.push_back(users.back().get());
            old.push_back(s % 3 == 0 ? nullptr : old_names[i].c_str());
            gone.push_back(doomed[i].c_str());
        }
        if (s % 3 == 2)
            TAVOUserDelete(gone.data(), static_cast<int>(gone.size()));
        else
            TAVOUserSet(old.data(), records.data(), static_cast<int>(records.size()));
    };
    const auto names_after = [&](int s) {
        std::set<std::string> names;
        for (int i = 0; i < s; ++i) {
            for (const std::string &name : names_of(i / 3 - (i % 3 == 2 ? 2 : 0), i % 3 == 2 ? "b" : "")) {
                if (i % 3 == 0)
                    names.insert(name);
                else
                    names.erase(name);
                if (i % 3 == 1)
                    names.insert(name + "b");
            }
        }
        return names;
    };
    int done = 0;
    unsigned span = 4000;  // microseconds in which death comes: some steps, however quick the machine is
    for (int round = 0; round < test::Rounds(2000); ++round) {
        const int before = done;
        journal->done = done;
        journal->busy = false;
        const pid_t child = ::fork();
        if (child == 0) {
            for (int s = done;; ++s) {
                journal->busy = true;
                step(s);
                journal->done = s + 1;
                journal->busy = false;
            }
        }
        ::usleep(useconds_t(random() % span));
        ::kill(child, SIGKILL);
        int status = 0;
        ::waitpid(child, &status, 0);
        done = journal->done;
        // The step that was under way either happened or did not.
        ASSERT_TRUE(GetUser("root"));
        std::set<std::string> found;
        for (const std::string &line : test::Lines(test::FileText("/etc/passwd")))
            if (line.starts_with("user"))
                found.insert(line.substr(0, line.find(':')));
        if (found != names_after(done)) {
            ASSERT_TRUE(journal->busy);
            ASSERT_EQ(found, names_after(done + 1)) << "round " << round << " step " << done;
            ++done;
        }
        ASSERT_NO_FATAL_FAILURE(CheckFiles(found));
        if (done == before && span < 1'000'000)
            span *= 2;
        else if (done > before + 8)
            span /= 2;
    }
    ::munmap(journal, sizeof *journal);
    EXPECT_GT(done, test::Rounds(2000) / 10);
}

// Each worker adds, renames and deletes accounts of its own; one more edits the files as the system's tools do, under
// the system's lock. Every change that a worker saw succeed has happened.
TEST(UserConcurrency, WorkersAndTheSystemsTools)
{
    constexpr int workers = 16;
    const int steps = test::Rounds(5000 / workers);
    const auto until_unlocked = [](const std::function<int()> &change) {
        int code = ERR_LOCK_FAILED;
        for (int tries = 0; tries < 20 && code == ERR_LOCK_FAILED; ++tries)
            code = change();
        return code;
    };
    std::vector<pid_t> children;
    for (int worker = 0; worker < workers; ++worker) {
        children.push_back(::fork());
        if (children.back() != 0)
            continue;
        for (int s = 0; s < steps; ++s) {
            const std::string name = "w" + std::to_string(worker) + "_" + std::to_string(s / 3);
            const int code = until_unlocked([&] {
                return s % 3 == 0   ? AddUser({.name = name, .uid = 4000 + worker * 1000 + s})
                       : s % 3 == 1 ? test::Rename(name, name + "r")
                       : s % 2 == 0 ? test::DeleteUser(name + "r")
                                    : 0;
            });
            if (code != 0)
                ::_exit(code / 0x100);
        }
        ::_exit(0);
    }
    children.push_back(::fork());
    if (children.back() == 0) {
        for (int s = 0; s < steps; ++s) {
            if (::lckpwdf() != 0)
                ::_exit(1);
            const std::string passwd =
                test::FileText("/etc/passwd") + "ext" + std::to_string(s) + ":x:900:100::/:/bin/sh\n";
            test::WriteFile("/etc/passwd.ext", passwd);
            std::filesystem::rename("/etc/passwd.ext", "/etc/passwd");
            ::ulckpwdf();
            ::usleep(20000);
        }
        ::_exit(0);
    }
    for (const pid_t child : children) {
        int status = 0;
        ::waitpid(child, &status, 0);
        EXPECT_EQ(WIFEXITED(status) ? WEXITSTATUS(status) * 0x100 : status, 0)
            << "the code of what a worker could not do";
    }
    std::set<std::string> expected;
    for (int worker = 0; worker < workers; ++worker)
        for (int s = 0; s < steps; ++s) {
            const std::string name = "w" + std::to_string(worker) + "_" + std::to_string(s / 3);
            if (s % 3 == 0)
                expected.insert(name);
            else if (s % 3 == 1)
                expected.erase(name), expected.insert(name + "r");
            else if (s % 2 == 0)
                expected.erase(name + "r");
        }
    for (int s = 0; s < steps; ++s)
        expected.insert("ext" + std::to_string(s));
    ASSERT_TRUE(GetUser("root"));
    std::set<std::string> found;
    for (const std::string &line : test::Lines(test::FileText("/etc/passwd")))
        if (line.starts_with("w") || line.starts_with("ext"))
            found.insert(line.substr(0, line.find(':')));
    EXPECT_EQ(found, expected);
}

}  // namespace
