// The disk with the account files loses its power while users are added. Each child here is one run of the machine: a
// mount namespace of its own, in which the files lie on that disk and /tmp is empty.
#include "support/machine.h"
#include "support/scratch_dir.h"

#include "tavo_user.h"

#include <algorithm>
#include <atomic>
#include <cstdio>
#include <random>
#include <set>
#include <sstream>

#include <sched.h>
#include <sys/mman.h>
#include <sys/mount.h>
#include <sys/stat.h>
#include <sys/wait.h>
#include <unistd.h>

namespace {

constexpr int kUsers = 500;
constexpr int kPulls = 6;
constexpr int kLargestBatch = 12;
constexpr char kBay[] = "2";
constexpr const char *kFiles[] = {"/etc/passwd", "/etc/shadow", "/etc/tavouser.conf",
                                  "/usr/tavo/etc/private/smbpasswd"};

// What was reported as done, in memory that no disk takes along.
struct Journal {
    std::atomic<int> committed;  // users 0 to this
    std::atomic<int> begun;      // and to this the batch that is under way
};

std::string NameOf(int number)
{
    return "user" + std::to_string(number);
}

std::string DiskInBay()
{
    const std::string names =
        test::Told("ls /sys/bus/scsi/devices/$(sed -n " + std::string(kBay) + "p /usr/lib/tavo-machine/bays)/block");
    return "/dev/" + names.substr(0, names.find('\n'));
}

std::set<std::string> NamesIn(const char *path)
{
    std::set<std::string> names;
    std::istringstream lines(test::ReadFile(path));
    for (std::string line; std::getline(lines, line);)
        names.insert(line.substr(0, line.find(':')));
    return names;
}

bool Starts(const std::string &disk)
{
    return ::unshare(CLONE_NEWNS) == 0 && ::mount(nullptr, "/", nullptr, MS_REC | MS_PRIVATE, nullptr) == 0 &&
           ::mount(disk.c_str(), "/volume1", "ext4", 0, nullptr) == 0 &&
           ::mount("/volume1/etc", "/etc", nullptr, MS_BIND, nullptr) == 0 &&
           ::mount("/volume1/private", "/usr/tavo/etc/private", nullptr, MS_BIND, nullptr) == 0 &&
           ::mount("tmp", "/tmp", "tmpfs", 0, "mode=1777") == 0;
}

// Every user that was reported is there, of the batch that was cut short all or none, and each in all files.
bool AllAreThere(Journal &journal)
{
    TAVOUSER *root = nullptr;
    const bool opened = TAVOUserGet("root", &root) == 0;  // repairs what was cut short
    TAVOUserFree(root);
    const auto names = NamesIn(kFiles[0]);
    const int found = static_cast<int>(
        std::count_if(names.begin(), names.end(), [](const std::string &name) { return name.starts_with("user"); }));
    bool whole = opened && names.contains("root") && (found == journal.committed || found == journal.begun);
    for (int i = 0; i < found; ++i) {
        const std::string name = NameOf(i);
        TAVOUSER *user = nullptr;
        whole = whole && TAVOUserGet(name.c_str(), &user) == 0 && std::string(user->szPasswd).starts_with("$1$");
        TAVOUserFree(user);
    }
    for (const char *path : kFiles) {
        const auto present = NamesIn(path);
        for (int i = 0; i < kUsers; ++i)
            whole = whole && present.contains(NameOf(i)) == (i < found);
    }
    std::fprintf(stderr, "%d users were reported, %d begun; %d are there: %s\n", journal.committed.load(),
                 journal.begun.load(), found, whole ? "whole" : "NOT WHOLE");
    journal.committed = journal.begun = found;
    return whole;
}

bool AddBatch(int first, int count)
{
    std::vector<std::string> names;
    for (int i = first; i < first + count; ++i)
        names.push_back(NameOf(i));
    std::vector<TAVOUSER> users(names.size());
    std::vector<const TAVOUSER *> records;
    for (size_t i = 0; i < names.size(); ++i) {
        users[i].szName = names[i].data();
        users[i].szPasswd = names[i].data();
        users[i].nUid = users[i].nGid = users[i].nExpired = -1;
        records.push_back(&users[i]);
    }
    const std::vector<const char *> old_names(records.size());
    TLIBErrSet(ERR_SUCCESS);
    return TAVOUserSet(old_names.data(), records.data(), count) == 0 && TLIBErrGet() == ERR_SUCCESS;
}

enum Ending : int { kDone, kCutShort, kNotWhole, kNotStarted };

// One run of the machine: look at what is there, go on adding until all are there or the disk is gone.
[[noreturn]] void RunMachine(const std::string &disk, Journal &journal, unsigned seed)
{
    if (!Starts(disk)) {
        std::perror("start");
        ::_exit(kNotStarted);
    }
    if (!AllAreThere(journal))
        ::_exit(kNotWhole);
    std::mt19937 random(seed);
    while (journal.committed < kUsers) {
        const int count = std::min(1 + static_cast<int>(random() % kLargestBatch), kUsers - journal.committed);
        journal.begun = journal.committed + count;
        if (!AddBatch(journal.committed, count))
            ::_exit(kCutShort);
        journal.committed = journal.begun.load();
    }
    ::_exit(kDone);
}

bool HasEnded(pid_t child)
{
    siginfo_t ended = {};
    return ::waitid(P_PID, static_cast<id_t>(child), &ended, WEXITED | WNOHANG | WNOWAIT) == 0 && ended.si_pid == child;
}

class MachinePower : public test::MachineTest {
  protected:
    void SetUp() override
    {
        test::MachineTest::SetUp();
        if (IsSkipped())
            return;
        const std::string disk = DiskInBay();
        test::Told("mkfs.ext4 -q -F " + disk + " && mkdir -p /volume1 /usr/tavo/etc/private && mount " + disk +
                   " /volume1 && cp -a /etc /volume1/etc && cp -a /usr/tavo/etc/private /volume1/private && "
                   "umount /volume1");
        journal_ = static_cast<Journal *>(
            ::mmap(nullptr, sizeof(Journal), PROT_READ | PROT_WRITE, MAP_SHARED | MAP_ANONYMOUS, -1, 0));
        ASSERT_NE(journal_, MAP_FAILED);
    }
    Journal *journal_ = nullptr;
};

TEST_F(MachinePower, ThePlugIsPulledWhileUsersAreAdded)
{
    std::mt19937 random(20);
    for (int run = 0;; ++run) {
        ASSERT_FALSE(HasFailure());
        const std::string disk = DiskInBay();
        const int before = journal_->committed;
        const pid_t child = ::fork();
        if (child == 0)
            RunMachine(disk, *journal_, static_cast<unsigned>(run));
        if (run < kPulls) {
            // Not before something was added, and so that all pulls come before the end.
            const int wanted = before + 1 + static_cast<int>(random() % (kUsers / kPulls / 2));
            EXPECT_TRUE(test::Comes([&] { return journal_->committed >= wanted || HasEnded(child); }));
            ::usleep(static_cast<useconds_t>(random() % 200'000));
            test::Happen("pull " + std::string(kBay));
        }
        int status = 0;
        ::waitpid(child, &status, 0);
        ASSERT_EQ(status, (run < kPulls ? kCutShort : kDone) << 8) << "run " << run;
        if (run == kPulls)
            break;
        test::Happen("plug " + std::string(kBay));
    }
    EXPECT_EQ(journal_->committed, kUsers);
    test::Told("e2fsck -fn " + DiskInBay());
}

}  // namespace
