// The locks: counting, refusals, time-outs, forked children, and traps in /tmp.
#include "tavo_lock.h"

#include "support/descriptors.h"
#include "support/failing_malloc.h"
#include "support/own_child.h"
#include "support/planted_name.h"
#include "support/story.h"
#include "support/test.h"

#include <climits>
#include <ctime>

#include <sys/file.h>
#include <sys/prctl.h>
#include <sys/syscall.h>

namespace fs = std::filesystem;
using test::Fault;
using test::LastFault;
using testing::ElementsAre;
using testing::EndsWith;

namespace {

constexpr long long kRetry = 50'000'000;  // nanoseconds

// Sleeps are recorded, not slept; both hooks may change the state or fail.
std::vector<long long> sleeps;
std::function<bool(timespec *left)> on_sleep;         // false: interrupted
std::function<bool(int fd, int operation)> on_flock;  // false: errno has the reason

}  // namespace

extern "C" {

int nanosleep(const struct timespec *wanted, struct timespec *left)
{
    sleeps.push_back(wanted->tv_sec * 1'000'000'000LL + wanted->tv_nsec);
    return on_sleep && !on_sleep(left) ? -1 : 0;
}

int flock(int fd, int operation)
{
    if (on_flock && !on_flock(fd, operation))
        return -1;
    return static_cast<int>(syscall(SYS_flock, fd, operation));
}
}

namespace {

TLIBLOCKFILE &Entry(unsigned bit)
{
    TLIBLOCKFILE *entry = rgslckList;
    while (entry->fLockBit != bit)
        ++entry;
    return *entry;
}

class Lock : public testing::Test {
  protected:
    void SetUp() override
    {
        if (test::RootForm().empty())
            GTEST_SKIP() << "only in an appliance root";
        Forget();
    }
    void TearDown() override { Forget(); }

    static void Forget()
    {
        on_sleep = nullptr;
        on_flock = nullptr;
        sleeps.clear();
        ErrTLIBFileCloseLock();
        fs::remove_all("/tmp/lock");
        test::ForgetFault();
    }
};

// Another program's lock: another open file, which excludes this process like any other.
class ForeignHold {
  public:
    ForeignHold(unsigned bit, int operation)
    {
        EXPECT_EQ(ErrTLIBILockCheckDir(), 0);
        fd_ = ::open(Entry(bit).szPath, O_RDONLY | O_CLOEXEC);
        EXPECT_EQ(syscall(SYS_flock, fd_, operation | LOCK_NB), 0);
    }
    ~ForeignHold() { Release(); }
    void Release()
    {
        if (fd_ >= 0)
            ::close(fd_);
        fd_ = -1;
    }

  private:
    int fd_ = -1;
};

// What another program would find.
bool IsFree(unsigned bit, int operation)
{
    const int fd = ::open(Entry(bit).szPath, O_RDONLY | O_CLOEXEC);
    const bool free = syscall(SYS_flock, fd, operation | LOCK_NB) == 0;
    ::close(fd);
    return free;
}

TEST(LockTable, KeepsItsOrder)
{
    test::Story story_{TEST_GOLDEN, {}};
    for (const TLIBLOCKFILE &entry : rgslckList) {
        char bit[16];
        std::snprintf(bit, sizeof bit, "0x%X", entry.fLockBit);
        story_.Show(entry.szPath, std::string(bit));
        EXPECT_EQ(entry.pfLock, nullptr) << entry.szPath;
        EXPECT_EQ(entry.nRef + entry.nMode, 0) << entry.szPath;
    }
}

TEST_F(Lock, NestsUntilTheLastUnlock)
{
    ASSERT_EQ(ErrTLIBFileLock(0x806, 0), 0);
    ASSERT_EQ(ErrTLIBFileLock(0x816, 0), 0);
    EXPECT_EQ(Entry(0x800).nRef, 2);
    EXPECT_EQ(Entry(0x800).nMode, 6);
    EXPECT_EQ(Entry(0x10).nRef, 1);
    EXPECT_NE(::fcntl(::fileno(Entry(0x800).pfLock), F_GETFD) & FD_CLOEXEC, 0);

    EXPECT_EQ(ErrTLIBFileUnlock(0x800), 0);
    EXPECT_FALSE(IsFree(0x800, LOCK_SH));
    EXPECT_EQ(ErrTLIBFileUnlock(0xF | 0x800 | 0x20), 0) << "the low bits and locks that are not held do not count";
    EXPECT_EQ(Entry(0x800).pfLock, nullptr);
    EXPECT_EQ(Entry(0x800).nRef, 0);
    EXPECT_TRUE(IsFree(0x800, LOCK_EX));
    EXPECT_FALSE(IsFree(0x10, LOCK_SH));
    EXPECT_EQ(ErrTLIBFileUnlock(0x10), 0);

    ASSERT_EQ(ErrTLIBFileLock(0x805, 0), 0);
    EXPECT_TRUE(IsFree(0x800, LOCK_SH));
    EXPECT_FALSE(IsFree(0x800, LOCK_EX));
    EXPECT_EQ(TLIBErrGet(), ERR_SUCCESS);
}

TEST_F(Lock, SharedDoesNotBecomeExclusive)
{
    const struct {
        unsigned held;
        unsigned wanted;
        bool refused;
    } rows[] = {{5, 6, true},  {5, 2, true},  {1, 6, true},  {1, 2, true}, {5, 5, false},
                {5, 1, false}, {6, 5, false}, {2, 1, false}, {2, 6, false}};
    for (const auto &row : rows) {
        SCOPED_TRACE(std::to_string(row.held) + " to " + std::to_string(row.wanted));
        ASSERT_EQ(ErrTLIBFileLock(0x20 | row.held, 0), 0);
        test::ForgetFault();
        // A request takes lock_tavoinfo before lock_gr, so it must give lock_tavoinfo back.
        EXPECT_EQ(ErrTLIBFileLock(0x820 | row.wanted, 60), row.refused ? -1 : 0);
        EXPECT_EQ(Entry(0x20).nRef, row.refused ? 1 : 2);
        EXPECT_EQ(Entry(0x20).nMode, static_cast<int>(row.held));
        EXPECT_EQ(Entry(0x800).pfLock == nullptr, row.refused);
        EXPECT_EQ(LastFault(), (row.refused ? Fault{ERR_LOCK_FAILED, "file_lock", 87} : Fault{}));
        ErrTLIBFileCloseLock();
    }
    EXPECT_TRUE(sleeps.empty()) << "waiting cannot help";
}

TEST_F(Lock, TriesAgainTwentyTimesASecond)
{
    ForeignHold busy(0x100, LOCK_EX);
    const int descriptors = test::OpenDescriptors();
    const struct {
        int timeout;
        size_t retries;
    } rows[] = {{0, 0}, {1, 20}, {3, 60}, {-1, 0}, {INT_MIN, 0}};
    for (const auto &row : rows) {
        sleeps.clear();
        test::ForgetFault();
        EXPECT_EQ(ErrTLIBFileLock(0x906, row.timeout), -1);
        EXPECT_EQ(sleeps, std::vector<long long>(row.retries, kRetry)) << row.timeout;
        EXPECT_EQ(LastFault(), (Fault{ERR_LOCK_FAILED, "file_lock", 87}));
        EXPECT_EQ(test::OpenDescriptors(), descriptors);
        EXPECT_EQ(Entry(0x800).pfLock, nullptr) << "all or nothing";
        EXPECT_EQ(Entry(0x100).pfLock, nullptr);
        EXPECT_EQ(Entry(0x100).nRef, 0);
    }

    // The last retry counts, and a limit of many years does not overflow.
    for (const int timeout : {1, INT_MAX}) {
        ForeignHold again(0x400, LOCK_SH);
        sleeps.clear();
        on_sleep = [&](timespec *) {
            if (sleeps.size() == 20)
                again.Release();
            return true;
        };
        EXPECT_EQ(ErrTLIBFileLock(0x406, timeout), 0);
        EXPECT_EQ(sleeps.size(), 20u);
        ErrTLIBFileUnlock(0x400);
    }
}

// Programs have children that die during a wait. A child's death says nothing about the lock and shortens no wait.
TEST_F(Lock, SignalsNeitherFailNorShortenAWait)
{
    ForeignHold busy(0x100, LOCK_EX);
    on_sleep = [](timespec *left) {
        if (sleeps.back() != kRetry)
            return true;
        *left = {0, kRetry / 4};
        errno = EINTR;
        return false;
    };
    EXPECT_EQ(ErrTLIBFileLock(0x106, 1), -1);
    EXPECT_EQ(sleeps.size(), 40u);
    EXPECT_EQ(sleeps[1], kRetry / 4);
    busy.Release();

    int interruptions = 3;
    on_flock = [&](int, int) {
        errno = EINTR;
        return interruptions-- <= 0;
    };
    for (const unsigned mode : {1u, 2u, 5u, 6u}) {
        interruptions = 3;
        EXPECT_EQ(ErrTLIBFileLock(0x100 | mode, 0), 0);
        ErrTLIBFileUnlock(0x100);
    }
}

TEST_F(Lock, RefusesInvalidRequests)
{
    for (const unsigned request : {0x800u, 0x803u, 0x804u, 0x807u, 0x808u, 0x80Cu, 0x80Eu, 0x1000806u}) {
        test::ForgetFault();
        EXPECT_EQ(ErrTLIBFileLock(request, 0), -1) << std::hex << request;
        EXPECT_EQ(LastFault(), (Fault{ERR_LOCK_FAILED, "file_lock", 87}));
        EXPECT_EQ(Entry(0x800).pfLock, nullptr);
    }
}

TEST_F(Lock, OutOfMemoryTakesNothing)
{
    const int descriptors = test::OpenDescriptors();
    test::EachAllocation faults;
    while (faults.Next()) {
        faults.Arm();
        const int result = ErrTLIBFileLock(0x916, 0);
        if (result == 0)
            ErrTLIBFileUnlock(0x910);
        faults.Disarm();
        EXPECT_EQ(result, faults.Fired() ? -1 : 0);
        EXPECT_EQ(faults.LeftAllocated(), 0);
        EXPECT_EQ(test::OpenDescriptors(), descriptors);
        if (faults.Fired()) {
            EXPECT_EQ(LastFault(), (Fault{ERR_LOCK_FAILED, "file_lock", 87}));
        }
    }
    EXPECT_EQ(faults.Count(), 3) << "a stream for each lock";
}

TEST_F(Lock, UnlockReportsAndStillCloses)
{
    ASSERT_EQ(ErrTLIBFileLock(0x836, 0), 0);
    on_flock = [](int, int operation) {
        errno = EIO;
        return operation != LOCK_UN;
    };
    EXPECT_EQ(ErrTLIBFileUnlock(0x830), -1);
    EXPECT_EQ(LastFault(), (Fault{ERR_UNLOCK_FAILED, "file_unlock", 38}));
    for (const unsigned bit : {0x800u, 0x10u, 0x20u}) {
        EXPECT_EQ(Entry(bit).pfLock, nullptr);
        EXPECT_TRUE(IsFree(bit, LOCK_EX));
    }
}

TEST_F(Lock, ForkedChildrenLeaveTheirParentsLocksAlone)
{
    ASSERT_EQ(ErrTLIBFileLock(0x816, 0), 0);
    ASSERT_EQ(ErrTLIBFileLock(0x806, 0), 0);
    EXPECT_TRUE(test::InChild([] {
        return ErrTLIBFileCloseLock() == 0 && !Entry(0x800).pfLock && Entry(0x800).nRef == 0 &&
               ErrTLIBFileLock(0x806, 0) == -1;
    }));
    EXPECT_FALSE(IsFree(0x800, LOCK_SH)) << "closing in a child frees nothing";
    EXPECT_TRUE(test::InChild([] {
        return ErrTLIBFileResetLock(0x800) == 0 && Entry(0x800).nRef == 1 && !Entry(0x10).pfLock &&
               Entry(0x10).nRef == 0;
    }));
    EXPECT_FALSE(IsFree(0x10, LOCK_SH));
    EXPECT_EQ(Entry(0x800).nRef, 2);
}

TEST_F(Lock, CloseReportsAFailure)
{
    ASSERT_EQ(ErrTLIBFileLock(0x836, 0), 0);
    ::close(::fileno(Entry(0x20).pfLock));
    EXPECT_EQ(ErrTLIBFileResetLock(0x800), -1);
    EXPECT_EQ(LastFault(), (Fault{ERR_UNLOCK_FAILED, "file_reset_lock"}));
    EXPECT_EQ(Entry(0x20).pfLock, nullptr);
    EXPECT_EQ(Entry(0x10).pfLock, nullptr);
    ::close(::fileno(Entry(0x800).pfLock));
    EXPECT_EQ(ErrTLIBFileCloseLock(), -1);
    EXPECT_EQ(LastFault(), (Fault{ERR_UNLOCK_FAILED, "file_close_lock"}));
    EXPECT_EQ(Entry(0x800).pfLock, nullptr);
}

TEST_F(Lock, CreatesDirectoryAndFilesUnderEveryUmask)
{
    const mode_t mask = ::umask(0777);
    EXPECT_EQ(ErrTLIBFileLock(0x806, 0), 0);
    ::umask(mask);
    ErrTLIBFileUnlock(0x800);
    ASSERT_EQ(::chmod("/tmp/lock/lock_pw", 0644), 0) << "as earlier releases made them";
    EXPECT_EQ(ErrTLIBILockCheckDir(), 0);
    struct stat st;
    ASSERT_EQ(::stat("/tmp/lock", &st), 0);
    EXPECT_EQ(st.st_mode, S_IFDIR | 0755u);
    for (const TLIBLOCKFILE *entry = rgslckList; entry->fLockBit; ++entry) {
        ASSERT_EQ(::lstat(entry->szPath, &st), 0) << entry->szPath;
        EXPECT_EQ(st.st_mode, S_IFREG | 0600u) << entry->szPath;
        EXPECT_EQ(st.st_size, 0);
    }
    ASSERT_EQ(::unlink("/tmp/lock/lock_smb"), 0);
    EXPECT_EQ(ErrTLIBILockCheckDir(), 0);
    EXPECT_TRUE(fs::is_regular_file("/tmp/lock/lock_smb"));
}

TEST_F(Lock, RefusesTraps)
{
    const Fault directory = {ERR_CREATE_FAILED, "lock_check_dir", 37}, file = {ERR_OPEN_FAILED, "lock_check_dir", 45};
    const struct {
        const char *plant;
        Fault fault;
    } rows[] = {{"ln -s /tmp/elsewhere lock", directory},
                {"ln -s /tmp/nowhere lock", directory},
                {": >lock", directory},
                {"mkfifo lock", directory},
                {"mkdir -m 1777 lock", directory},
                {"mkdir -m 775 lock", directory},
                {"mkdir lock && ln -s /tmp/elsewhere/victim lock/lock_pw", file},
                {"mkdir lock && ln -s /tmp/nowhere lock/lock_pw", file},
                {"mkdir lock && mkfifo lock/lock_pw", file},
                {"mkdir -p lock/lock_pw", file},
                {"mkdir lock && : >lock/lock_pw && chown 1000 lock/lock_pw", file}};
    fs::create_directory("/tmp/elsewhere");
    ASSERT_EQ(::chmod("/tmp/elsewhere", 0700), 0);
    test::WriteFile("/tmp/elsewhere/victim", "kept");
    for (const auto &row : rows) {
        ASSERT_EQ(std::system(("cd /tmp && " + std::string(row.plant)).c_str()), 0) << row.plant;
        test::ForgetFault();
        EXPECT_EQ(ErrTLIBFileLock(0x806, 0), -1) << row.plant;
        EXPECT_EQ(LastFault(), row.fault) << row.plant;
        EXPECT_FALSE(fs::exists("/tmp/nowhere")) << row.plant;
        fs::remove_all("/tmp/lock");
    }
    EXPECT_EQ(std::distance(fs::directory_iterator("/tmp/elsewhere"), {}), 1);
    EXPECT_EQ(test::ReadFile("/tmp/elsewhere/victim"), "kept");
    struct stat st;
    ASSERT_EQ(::stat("/tmp/elsewhere", &st), 0);
    EXPECT_EQ(st.st_mode & 07777u, 0700u);
    fs::remove_all("/tmp/elsewhere");
}

// Another user may have created the name before the appliance does. That must not stop root, and root must not touch
// unknown files.
TEST_F(Lock, MovesAsideFilesOfOtherUsers)
{
    for (const test::Plant plant : test::kPlants) {
        test::PlantAt("/tmp/lock", plant);
        struct stat before, after;
        ASSERT_EQ(::lstat("/tmp/lock", &before), 0);
        const test::CapturedLog log;
        EXPECT_EQ(ErrTLIBFileLock(0x806, 0), 0) << plant;
        EXPECT_EQ(TLIBErrGet(), ERR_SUCCESS) << plant;
        const std::string aside = test::MovedAside("/tmp/lock");
        ASSERT_EQ(::lstat(aside.c_str(), &after), 0) << plant;
        EXPECT_EQ(after.st_ino, before.st_ino) << plant;
        EXPECT_THAT(log.Texts(), ElementsAre(EndsWith(" /tmp/lock did not belong to root and was renamed to " + aside)))
            << plant;
        test::RemovePlanted(aside);
        Forget();
    }
    EXPECT_EQ(test::ReadFile("/tmp/lock.target"), "kept");
    test::RemovePlanted("/tmp/lock");
}

// Every reader of a file can hold its lock for ever, so no other user may open one.
TEST_F(Lock, OtherUsersFailAtOnce)
{
    ASSERT_EQ(ErrTLIBILockCheckDir(), 0);
    EXPECT_EQ(test::InChild([] {
                  const test::CapturedLog log;
                  if (::setresuid(1000, 1000, 1000) != 0 || ::open("/tmp/lock/lock_pw", O_RDONLY) >= 0)
                      return 1;
                  const bool refused = ErrTLIBFileLock(0x815, 60) == -1 &&
                                       LastFault() == Fault{ERR_LOCK_FAILED, "file_lock", 87} && sleeps.empty();
                  return refused && log.Texts().size() == 1 &&
                                 log.Texts()[0].ends_with("Gave up on /tmp/lock/lock_tavoinfo: it cannot be opened, "
                                                          "errno=13")
                             ? 0
                             : 2;
              }),
              0);
}

TEST_F(Lock, ATimeOutLogsTheLockAndItsHolder)
{
    SKIP_WITHOUT_PROC();
    ASSERT_EQ(ErrTLIBILockCheckDir(), 0);
    for (const int operation : {LOCK_EX, LOCK_SH}) {
        test::OwnChild holder([&] {
            ::prctl(PR_SET_NAME, "busy daemon");
            const int fd = ::open("/tmp/lock/lock_host", O_RDONLY);
            syscall(SYS_flock, fd, operation);
            ::pause();
        });
        ASSERT_TRUE(test::Eventually([] { return !IsFree(0x100, LOCK_EX); }));
        const test::CapturedLog log;
        EXPECT_EQ(ErrTLIBFileLock(0x906, 1), -1);
        EXPECT_THAT(log.Texts(), ElementsAre(EndsWith("Gave up on /tmp/lock/lock_host: process " +
                                                      std::to_string(holder.Pid()) + " (busy daemon) holds it")));
    }
    ASSERT_EQ(ErrTLIBFileLock(0x105, 0), 0);
    const test::CapturedLog log;
    EXPECT_EQ(ErrTLIBFileLock(0x106, 5), -1);
    EXPECT_THAT(log.Texts(), ElementsAre(EndsWith(
                                 "Gave up on /tmp/lock/lock_host: this process holds it shared, which does not become "
                                 "exclusive")));
}

// A cleaner of /tmp, or a second instance of the appliance's start-up, removes the files of a lock that is being taken.
// The next program locks a new file, so a lock on the old one would exclude no other process.
TEST_F(Lock, LocksTheFileUnderItsCurrentName)
{
    for (const bool whole_directory : {false, true}) {
        int cleanings = 3;
        on_flock = [&](int, int) {
            if (cleanings-- > 0)
                fs::remove_all(whole_directory ? "/tmp/lock" : "/tmp/lock/lock_tavoinfo");
            return true;
        };
        ASSERT_EQ(ErrTLIBFileLock(0x806, 0), 0);
        on_flock = nullptr;
        EXPECT_FALSE(IsFree(0x800, LOCK_SH));
        EXPECT_EQ(ErrTLIBFileUnlock(0x800), 0);
    }
}

}  // namespace
