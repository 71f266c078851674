// The disk with the account files loses its power, again and again. Each run of the machine is a child with a mount
// namespace of its own, in which the files lie on that disk and /tmp is empty.
#ifndef TESTS_ACCOUNT_MACHINE_MACHINE_POWER_H
#define TESTS_ACCOUNT_MACHINE_MACHINE_POWER_H

#include "support/machine.h"
#include "support/scratch_dir.h"

#include <gtest/gtest.h>

#include <atomic>
#include <functional>
#include <random>
#include <set>
#include <sstream>
#include <string>
#include <utility>
#include <vector>

#include <sched.h>
#include <sys/mman.h>
#include <sys/mount.h>
#include <sys/wait.h>
#include <unistd.h>

namespace test {

inline constexpr char kPulledBay[] = "2";

inline std::string PulledDisk()
{
    const std::string names =
        Told("ls /sys/bus/scsi/devices/$(sed -n " + std::string(kPulledBay) + "p /usr/lib/tavo-machine/bays)/block");
    return "/dev/" + names.substr(0, names.find('\n'));
}

// A file system on that disk with copies of these folders, each in a folder of its own below /volume1.
using FoldersOnDisk = std::vector<std::pair<std::string, std::string>>;  // "/etc", "/volume1/etc"

inline void PutOnPulledDisk(const FoldersOnDisk &folders)
{
    const std::string disk = PulledDisk();
    std::string script = "mkfs.ext4 -q -F " + disk + " && mkdir -p /volume1 && mount " + disk + " /volume1";
    for (const auto &[folder, place] : folders)
        script += " && mkdir -p " + folder + " && cp -a " + folder + " " + place;
    Told(script + " && umount /volume1");
}

// Only in a child.
inline bool StartFromDisk(const std::string &disk, const FoldersOnDisk &folders)
{
    if (::unshare(CLONE_NEWNS) != 0 || ::mount(nullptr, "/", nullptr, MS_REC | MS_PRIVATE, nullptr) != 0 ||
        ::mount(disk.c_str(), "/volume1", "ext4", 0, nullptr) != 0)
        return false;
    for (const auto &[folder, place] : folders)
        if (::mount(place.c_str(), folder.c_str(), nullptr, MS_BIND, nullptr) != 0)
            return false;
    return ::mount("tmp", "/tmp", "tmpfs", 0, "mode=1777") == 0;
}

// The first field of every line.
inline std::set<std::string> NamesIn(const char *path)
{
    std::set<std::string> names;
    std::istringstream lines(ReadFile(path));
    for (std::string line; std::getline(lines, line);)
        names.insert(line.substr(0, line.find(':')));
    return names;
}

// What was reported as done, in memory that no disk takes along.
struct Journal {
    std::atomic<int> committed;
    std::atomic<int> begun;  // with what is under way
};

inline Journal *SharedJournal()
{
    void *memory = ::mmap(nullptr, sizeof(Journal), PROT_READ | PROT_WRITE, MAP_SHARED | MAP_ANONYMOUS, -1, 0);
    return memory == MAP_FAILED ? nullptr : static_cast<Journal *>(memory);
}

inline bool HasEnded(pid_t child)
{
    siginfo_t ended = {};
    return ::waitid(P_PID, static_cast<id_t>(child), &ended, WEXITED | WNOHANG | WNOWAIT) == 0 && ended.si_pid == child;
}

enum RunEnding : int { kDone, kCutShort, kNotWhole, kNotStarted };

// Runs the machine until all is done, with so many pulls before the end: each comes after at least one more step of
// `most` that were committed in this run.
inline void PullWhileRunning(Journal &journal, int pulls, int most,
                             const std::function<void(const std::string &disk, unsigned seed)> &run_machine)
{
    std::mt19937 random(20);
    for (int run = 0;; ++run) {
        ASSERT_FALSE(testing::Test::HasFailure());
        const std::string disk = PulledDisk();
        const int before = journal.committed;
        const pid_t child = ::fork();
        if (child == 0) {
            run_machine(disk, static_cast<unsigned>(run));
            ::_exit(kNotStarted);
        }
        if (run < pulls) {
            const int wanted = before + 1 + static_cast<int>(random() % static_cast<unsigned>(most));
            EXPECT_TRUE(Comes([&] { return journal.committed >= wanted || HasEnded(child); }));
            ::usleep(static_cast<useconds_t>(random() % 200'000));
            Happen("pull " + std::string(kPulledBay));
        }
        int status = 0;
        ::waitpid(child, &status, 0);
        ASSERT_EQ(status, (run < pulls ? kCutShort : kDone) << 8) << "run " << run;
        if (run == pulls)
            break;
        Happen("plug " + std::string(kPulledBay));
    }
    Told("e2fsck -fn " + PulledDisk());
}

}  // namespace test

#endif
