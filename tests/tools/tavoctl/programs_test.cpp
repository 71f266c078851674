// tavoctl lock run and proc: programs, their exit statuses, and who holds a lock meanwhile.
#include "tavo_lock.h"

#include "run_tavoctl.h"
#include "support/test.h"

#include <nlohmann/json.hpp>

#include <chrono>

namespace {

using nlohmann::json;
using test::ScratchDir;
using test::Tavoctl;
using test::WriteFile;

constexpr unsigned at_once = TAVO_LOCK_EXCLUSIVE | TAVO_LOCK_NONBLOCKING;

bool IsFree(unsigned lock)
{
    if (ErrTLIBFileLock(lock | at_once, 0) != 0)
        return false;
    ErrTLIBFileUnlock(lock);
    return true;
}

// Waits for a file that a program is about to make.
void Await(const std::string &path)
{
    ASSERT_TRUE(test::Eventually([&] { return std::filesystem::exists(path); })) << path;
}

TEST(TavoctlPrograms, LockRunGivesTheStatusOfItsProgram)
{
    const ScratchDir dir;
    WriteFile(dir / "text", "no program");
    const struct {
        test::Words words;
        int status;
        const char *out;
    } cases[] = {
        {{"lock", "run", "tavoinfo", "--", "echo", "a", "--", "-n"}, 0, "a -- -n\n"},
        {{"lock", "run", "tavoinfo", "echo", "--json"}, 0, "--json\n"},
        {{"lock", "run", "lock_pw,gr", "--", "sh", "-c", "exit 7"}, 7, ""},
        {{"lock", "run", "48", "--", "sh", "-c", "kill -9 $$"}, 137, ""},
        {{"lock", "run", "0x30", "--", "no-such-program"}, 127, ""},
        {{"lock", "run", "tavoinfo", "--", "/no/such/program"}, 127, ""},
        {{"lock", "run", "tavoinfo", "--", dir / "text"}, 126, ""},
    };
    for (const auto &[words, status, out] : cases) {
        const test::Ran ran = Tavoctl(words);
        EXPECT_EQ(ran.status, status) << testing::PrintToString(words) << ran;
        EXPECT_EQ(ran.out, out);
        EXPECT_TRUE(IsFree(TAVO_LOCK_TAVOINFO | TAVO_LOCK_USER | TAVO_LOCK_GROUP));
    }
}

TEST(TavoctlPrograms, LockRunHoldsExactlyItsLocksWhileTheProgramRuns)
{
    const ScratchDir dir;
    test::RunningTavoctl holder(
        {"lock", "run", "pw,smb", "--", "sh", "-c",
         "touch " + dir / "begun" + "; while [ ! -e " + dir / "end" + " ]; do sleep 0.05; done"});
    Await(dir / "begun");
    EXPECT_FALSE(IsFree(TAVO_LOCK_USER));
    EXPECT_FALSE(IsFree(TAVO_LOCK_SMB));
    EXPECT_TRUE(IsFree(TAVO_LOCK_GROUP));
    const auto start = std::chrono::steady_clock::now();
    EXPECT_EQ(Tavoctl({"lock", "run", "--timeout", "0", "gr,pw", "--", "touch", dir / "never"}).status, 4);
    EXPECT_LT(std::chrono::steady_clock::now() - start, std::chrono::seconds(1));
    EXPECT_EQ(Tavoctl({"lock", "run", "--timeout", "1", "--shared", "pw", "--", "touch", dir / "never"}).status, 4);
    EXPECT_GE(std::chrono::steady_clock::now() - start, std::chrono::milliseconds(900));

    test::RunningTavoctl waiting({"lock", "run", "--timeout", "10", "pw", "--", "touch", dir / "later"});
    ::usleep(200'000);
    EXPECT_FALSE(std::filesystem::exists(dir / "later"));
    WriteFile(dir / "end", "");
    EXPECT_EQ(holder.Wait().status, 0);
    EXPECT_EQ(waiting.Wait().status, 0);
    EXPECT_EQ(dir.Names(), (std::vector<std::string>{"begun", "end", "later"}));
}

TEST(TavoctlPrograms, WhoWatchesSeesWhatIsWaitedFor)
{
    if (test::RootLacks("pts"))
        GTEST_SKIP() << "no terminals here";
    ASSERT_EQ(ErrTLIBFileLock(TAVO_LOCK_USER | at_once, 0), 0);
    const test::Ran ran = test::TavoctlAtTerminal({"lock", "run", "--timeout", "1", "pw", "--", "true"});
    EXPECT_EQ(ran.status, 4);
    EXPECT_THAT(ran.out, testing::HasSubstr("waiting for the lock pw: 1 s left"));
    EXPECT_EQ(ErrTLIBFileUnlock(TAVO_LOCK_USER), 0);
}

TEST(TavoctlPrograms, SharedLocksAreShared)
{
    EXPECT_EQ(Tavoctl({"lock", "run", "--shared", "pw", "--", "/usr/bin/tavoctl", "lock", "run", "--shared",
                       "--timeout", "0", "pw", "--", "true"})
                  .status,
              0);
    EXPECT_EQ(Tavoctl({"lock", "run", "--shared", "pw", "--", "/usr/bin/tavoctl", "lock", "run", "--timeout", "0", "pw",
                       "--", "true"})
                  .status,
              4);
}

TEST(TavoctlPrograms, ARequestToEndGoesToTheProgramAndTheLockStaysUntilItHasEnded)
{
    const ScratchDir dir;
    test::RunningTavoctl holder({"lock", "run", "pw", "--", "sh", "-c",
                                 "trap 'touch " + dir / "asked" + "; while [ ! -e " + dir / "end" +
                                     " ]; do sleep 0.05; done; exit 5' TERM; touch " + dir / "begun" +
                                     "; while :; do sleep 0.05; done"});
    Await(dir / "begun");
    ASSERT_EQ(::kill(holder.Pid(), SIGTERM), 0);
    Await(dir / "asked");
    EXPECT_FALSE(IsFree(TAVO_LOCK_USER));
    WriteFile(dir / "end", "");
    EXPECT_EQ(holder.Wait().status, 5);
    EXPECT_TRUE(IsFree(TAVO_LOCK_USER));
}

TEST(TavoctlPrograms, LockListIsTheTable)
{
    const json locks = test::Facts({"lock", "list", "--json"});
    std::size_t i = 0;
    for (const TLIBLOCKFILE *lock = rgslckList; lock->fLockBit; ++lock, ++i) {
        ASSERT_LT(i, locks.size());
        EXPECT_EQ(locks[i].at("file"), lock->szPath);
        EXPECT_EQ(std::stoul(locks[i].at("mask").get<std::string>(), nullptr, 16), lock->fLockBit);
        EXPECT_EQ("/tmp/lock/lock_" + locks[i].at("lock").get<std::string>(), lock->szPath);
    }
    EXPECT_EQ(i, locks.size());
}

TEST(TavoctlPrograms, ProcRunIsAClean30ArgumentChildWithALimit)
{
    const ScratchDir dir;
    EXPECT_EQ(Tavoctl({"proc", "run", "sh", "-c", "exit 9"}).status, 9);
    EXPECT_EQ(Tavoctl({"proc", "run", "--timeout", "5", "--", "sh", "-c", "exit 9"}).status, 9);
    EXPECT_EQ(Tavoctl({"proc", "run", "no-such-program"}).status, 127);

    test::IsRefused({"proc", "run", "sh", "-c", "kill -9 $$"}, "ERR_OP_FAILURE", 1);
    const auto start = std::chrono::steady_clock::now();
    test::IsRefused({"proc", "run", "--timeout", "1", "/bin/sleep", "20"}, "ERR_TIMER_EXPIRED", 1);
    EXPECT_LT(std::chrono::steady_clock::now() - start, std::chrono::seconds(5));

    ::setenv("SECRET", "1", 1);
    test::Words words = {"proc", "run", "sh", "-c", "echo $# \"$PWD\" \"$SECRET\" >" + dir / "out" + "; echo loud",
                         "x"};
    for (int i = 1; i <= 27; ++i)
        words.push_back(std::to_string(i));
    const test::Ran silent = Tavoctl(words);
    ::unsetenv("SECRET");
    EXPECT_EQ(silent.status, 0);
    EXPECT_EQ(silent.out, "");
    EXPECT_EQ(test::ReadFile(dir / "out"), "27 / \n");
    words.push_back("28");
    EXPECT_EQ(Tavoctl(words).status, 2);
}

TEST(TavoctlPrograms, ProcFindsAndSignals)
{
    const ScratchDir dir;
    const pid_t pid = ::fork();
    if (pid == 0) {
        ::execl("/bin/sleep", "sleep", "98.7654", nullptr);
        ::_exit(125);
    }
    WriteFile(dir / "pid", std::to_string(pid) + "\n");
    json found;
    for (int i = 0; i < 200 && found.empty(); ++i) {
        const test::Ran ran = Tavoctl({"proc", "find", "--json", "sleep 98.7654"});
        if (ran.status == 0)
            found = test::Facts(ran);
    }
    EXPECT_EQ(found, (json{{{"pid", pid}, {"command", "sleep 98.7654"}}}));
    EXPECT_EQ(Tavoctl({"proc", "find", "no-such-process-anywhere"}).status, 3);

    EXPECT_EQ(Tavoctl({"proc", "signal", dir / "pid", "0"}).status, 0);
    EXPECT_EQ(Tavoctl({"proc", "signal", "--dry-run", dir / "pid"}).status, 0);
    EXPECT_EQ(Tavoctl({"proc", "signal", dir / "pid", "SIGUSR1"}).status, 0);
    int status = 0;
    ASSERT_EQ(::waitpid(pid, &status, 0), pid);
    EXPECT_EQ(test::ShellStatus(status), 128 + SIGUSR1);

    test::IsRefused({"proc", "signal", dir / "pid"}, "process " + std::to_string(pid) + " is gone", 3);
    EXPECT_EQ(Tavoctl({"proc", "signal", dir / "none"}).status, 3);
    WriteFile(dir / "pid", "no number\n");
    EXPECT_EQ(Tavoctl({"proc", "signal", dir / "pid"}).status, 3);
}

}  // namespace
