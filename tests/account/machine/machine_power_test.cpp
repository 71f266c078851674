// The disk with the account files and the home folders loses its power, again and again, while users are added, renamed and
// deleted. The renamed ones are known to every service of the appliance. After each start every file in which users are
// named says the same. Each run of the machine is a child with a mount namespace of its own, in which the files are on
// that disk and /tmp is empty.
#include "tavo_group.h"
#include "tavo_user.h"

#include "account/group/group_fixture.h"
#include "account/user/user_fixture.h"
#include "support/machine.h"
#include "support/rounds.h"
#include "support/test.h"

#include <atomic>
#include <random>

#include <sched.h>
#include <sys/mman.h>
#include <sys/mount.h>

namespace {

namespace fs = std::filesystem;
using test::FileText;
using test::Lines;

constexpr int kBatch = 10;
constexpr int kLag = 5;  // so many batches later those who were renamed are deleted
constexpr char kHash[] = "$1$ab$cdefghijklmnopqrstuv./";

constexpr char kPulledBay[] = "2";

std::string PulledDisk()
{
    const std::string names = test::Told("ls /sys/bus/scsi/devices/$(sed -n " + std::string(kPulledBay) +
                                         "p /usr/lib/tavo-machine/bays)/block");
    return "/dev/" + names.substr(0, names.find('\n'));
}

// A file system on that disk with copies of these folders, each in a folder of its own below /volume1.
using FoldersOnDisk = std::vector<std::pair<std::string, std::string>>;  // "/etc", "/volume1/etc"

void PutOnPulledDisk(const FoldersOnDisk &folders)
{
    const std::string disk = PulledDisk();
    std::string script = "mkfs.ext4 -q -F " + disk + " && mkdir -p /volume1 && mount " + disk + " /volume1";
    for (const auto &[folder, place] : folders)
        script += " && mkdir -p " + folder + " && cp -a " + folder + " " + place;
    test::Told(script + " && umount /volume1");
}

// Only in a child.
bool StartFromDisk(const std::string &disk, const FoldersOnDisk &folders)
{
    if (::unshare(CLONE_NEWNS) != 0 || ::mount(nullptr, "/", nullptr, MS_REC | MS_PRIVATE, nullptr) != 0 ||
        ::mount(disk.c_str(), "/volume1", "ext4", 0, nullptr) != 0)
        return false;
    for (const auto &[folder, place] : folders)
        if (::mount(place.c_str(), folder.c_str(), nullptr, MS_BIND, nullptr) != 0)
            return false;
    return ::mount("tmp", "/tmp", "tmpfs", 0, "mode=1777") == 0;
}

// What was reported as done, in memory that no disk takes along.
struct Journal {
    std::atomic<int> committed;
    std::atomic<int> begun;  // with what is under way
};

Journal *SharedJournal()
{
    void *memory = ::mmap(nullptr, sizeof(Journal), PROT_READ | PROT_WRITE, MAP_SHARED | MAP_ANONYMOUS, -1, 0);
    return memory == MAP_FAILED ? nullptr : static_cast<Journal *>(memory);
}

bool HasEnded(pid_t child)
{
    siginfo_t ended = {};
    return ::waitid(P_PID, static_cast<id_t>(child), &ended, WEXITED | WNOHANG | WNOWAIT) == 0 && ended.si_pid == child;
}

enum RunEnding : int { kDone, kCutShort, kNotWhole, kNotStarted };

// Runs the machine until all is done, with so many pulls before the end: each comes after at least one more step of
// `most` that were committed in this run.
void PullWhileRunning(Journal &journal, int pulls, int most,
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
            EXPECT_TRUE(test::Comes([&] { return journal.committed >= wanted || HasEnded(child); }));
            ::usleep(static_cast<useconds_t>(random() % 200'000));
            test::Happen("pull " + std::string(kPulledBay));
        }
        int status = 0;
        ::waitpid(child, &status, 0);
        ASSERT_EQ(status, (run < pulls ? kCutShort : kDone) << 8) << "run " << run;
        if (run == pulls)
            break;
        test::Happen("plug " + std::string(kPulledBay));
    }
    test::Told("e2fsck -fn " + PulledDisk());
}

const FoldersOnDisk kFolders = {
    {"/etc", "/volume1/etc"}, {"/usr/tavo/etc", "/volume1/tavo"}, {"/var/services/homes", "/volume1/homes"}};

// One change of a batch.
struct Step {
    enum Kind { adds, renames, removes } kind;
    int batch;
};

std::vector<Step> StepsFor(int batches)
{
    std::vector<Step> steps;
    for (int batch = 0; batch < batches + kLag; ++batch) {
        if (batch < batches) {
            steps.push_back({Step::adds, batch});
            steps.push_back({Step::renames, batch});
        }
        if (batch >= kLag)
            steps.push_back({Step::removes, batch - kLag});
    }
    return steps;
}

const char *const kUser = "user";  // known everywhere
const char *const kRenamed = "renamed";
const char *const kAdded = "added";  // later, so that no other file names them

std::string NameOf(const char *kind, int number)
{
    return kind + std::to_string(number);
}

bool IsOurs(const std::string &name)
{
    return name.starts_with(kUser) || name.starts_with(kRenamed) || name.starts_with(kAdded);
}

std::set<std::string> Ours(std::set<std::string> names)
{
    std::erase_if(names, [](const std::string &name) { return !IsOurs(name); });
    return names;
}

// The first field of every line.
std::set<std::string> NamesIn(const char *path)
{
    std::set<std::string> names;
    for (const std::string &line : Lines(FileText(path)))
        names.insert(line.substr(0, line.find(':')));
    return names;
}

// Who there is after so many steps: the numbers of the users by their names.
std::map<std::string, int> UsersAfter(const std::vector<Step> &steps, int done, int users)
{
    std::map<std::string, int> found;
    for (int i = 0; i < users; ++i)
        found[NameOf(kUser, i)] = i;
    for (int at = 0; at < done; ++at) {
        const Step &step = steps[static_cast<size_t>(at)];
        for (int i = step.batch * kBatch, end = i + kBatch; i < end; ++i) {
            if (step.kind == Step::adds)
                found[NameOf(kAdded, i)] = i;
            if (step.kind == Step::renames)
                found.erase(NameOf(kUser, i)), found[NameOf(kRenamed, i)] = i;
            if (step.kind == Step::removes)
                found.erase(NameOf(kRenamed, i));
        }
    }
    return found;
}

bool Carry(const Step &step)
{
    test::Changes changes;
    std::vector<std::string> doomed;
    for (int i = step.batch * kBatch, end = i + kBatch; i < end; ++i) {
        doomed.push_back(NameOf(kRenamed, i));
        changes.emplace_back(step.kind == Step::adds ? "" : NameOf(kUser, i),
                             NameOf(step.kind == Step::adds ? kAdded : kRenamed, i));
    }
    return (step.kind == Step::removes ? test::DeleteUsers(doomed) : test::SetUsers(changes, kHash)) == 0;  // it stays
}

// The accounts, and a line about each of them in every file that knows accounts.
void MakeUsers(int users)
{
    fs::create_directories("/var/services/homes");
    fs::create_directories("/usr/tavo/etc/private");
    test::WriteFile("/etc/tavoinfo.conf", "userHomeEnable=\"yes\"\n");
    std::vector<std::string> names;
    test::Changes changes;
    std::vector<test::User> made;
    std::vector<const TAVOUSER *> records;
    std::string list;
    std::string lines;
    std::string secrets;
    for (int i = 0; i < users; ++i) {
        names.push_back(NameOf(kUser, i));
        changes.emplace_back("", names.back());
        made.push_back(test::MakeUser({.name = names.back()}));
        records.push_back(made.back().get());
        list += (i ? "," : "") + names.back();
        lines += names.back() + "\n";
        secrets += names.back() + ":secret" + std::to_string(i) + "\n";
    }
    ASSERT_EQ(test::SetUsers(changes, ""), 0);
    const std::vector<const char *> hashes(records.size(), kHash);
    const std::vector<const char *> samba(records.size(), "0123456789ABCDEF0123456789ABCDEF");
    ASSERT_EQ(TAVOUserSetPasswd(records.data(), hashes.data(), samba.data(), samba.data(), users), 0);
    ASSERT_EQ(test::AddGroup("crew", -1, names), 0);
    test::WriteFile("/usr/tavo/etc/share.conf", "[homes]\n\tpath=\"/volume1/homes\"\n");
    test::WriteFile("/usr/tavo/etc/smb.conf", "[x]\n\tvalid users = " + list + "\n");
    test::WriteFile("/usr/tavo/etc/netbkp.users", lines);
    test::WriteFile("/etc/ftpchroot", lines);
    test::WriteFile("/etc/rsyncd.secrets", secrets, 0600);
    for (int i = 0; i < users; ++i)
        test::WriteFile("/var/services/homes/" + names[static_cast<size_t>(i)] + "/file", std::to_string(i));
}

std::set<std::string> Split(const std::string &list)
{
    std::set<std::string> names;
    std::istringstream rest(list);
    for (std::string name; std::getline(rest, name, ',');)
        names.insert(name);
    return names;
}

// The rest of the line that begins so.
std::string After(const std::string &text, const std::string &begin)
{
    const size_t at = ("\n" + text).find("\n" + begin);
    return at == text.npos ? "" : text.substr(at + begin.size(), text.find('\n', at) - at - begin.size());
}

// What the files say otherwise, one line each.
std::string WrongIn(const std::map<std::string, int> &users, const std::set<std::string> &ftp)
{
    std::string wrong;
    const auto expect = [&](bool condition, const std::string &otherwise) {
        if (!condition)
            wrong += "  " + otherwise + "\n";
    };
    std::set<std::string> all;
    std::set<std::string> known;
    for (const auto &user : users) {
        all.insert(user.first);
        if (!user.first.starts_with(kAdded))
            known.insert(user.first);
    }
    for (const char *path : test::kAccountFiles)
        expect(Ours(NamesIn(path)) == all, std::string(path) + " names other users");
    for (const char *path : {"/usr/tavo/etc/netbkp.users", "/etc/rsyncd.secrets"})
        expect(NamesIn(path) == known, std::string(path) + " names other users");
    // Nothing is taken from this list when a user is deleted.
    expect(NamesIn("/etc/ftpchroot") == ftp, "/etc/ftpchroot names other users");
    const std::string crew = After(test::GroupFile(), "crew:");
    expect(Split(crew.substr(crew.rfind(':') + 1)) == known, "the group has other members");
    expect(Split(After(FileText("/usr/tavo/etc/smb.conf"), "\tvalid users = ")) == known, "smb.conf names other users");
    std::set<std::string> homes;
    for (const auto &home : fs::directory_iterator("/volume1/homes"))
        homes.insert(home.path().filename());
    expect(Ours(homes) == all, "there are other homes");
    const std::string shadow = FileText("/etc/shadow");
    const std::string secrets = FileText("/etc/rsyncd.secrets");
    for (const auto &[name, number] : users) {
        const bool added = !known.contains(name);
        expect(After(shadow, name + ":").starts_with(added ? "$1$" : kHash + std::string(":")),
               "the password of " + name);
        if (added)
            continue;
        expect(FileText(("/volume1/homes/" + name + "/file").c_str()) == std::to_string(number), "the home of " + name);
        expect(After(secrets, name + ":") == "secret" + std::to_string(number), "the backup password of " + name);
    }
    expect(!fs::exists("/etc/.tavoaccount.commit"), "a change is left to do");
    for (const char *folder : {"/etc", "/usr/tavo/etc", "/usr/tavo/etc/private"})
        for (const auto &entry : fs::directory_iterator(folder))
            expect(!entry.path().filename().string().ends_with(".tmp"), entry.path().string() + " is left");
    expect(!fs::exists("/volume1/@tmp") || fs::is_empty("/volume1/@tmp"), "a deleted home is left");
    return wrong;
}

// The files after the change that finishes what was cut short: those of all steps that were reported, or with the one
// that was under way.
bool IsWhole(const std::vector<Step> &steps, int users, Journal &journal)
{
    const bool finished = TAVOGroupDescSet("users", "Every local user") == 0;
    const auto ours = Ours(NamesIn("/etc/passwd"));
    std::string wrong = finished ? "" : "  the next change fails\n";
    for (const int done : {journal.begun.load(), journal.committed.load()}) {
        const auto expected = UsersAfter(steps, done, users);
        const bool is_it = std::equal(ours.begin(), ours.end(), expected.begin(), expected.end(),
                                      [](const std::string &name, const auto &user) { return name == user.first; });
        if (done != journal.committed && !is_it)
            continue;
        std::set<std::string> ftp;
        for (int i = 0; i < users; ++i)
            ftp.insert(NameOf(expected.contains(NameOf(kUser, i)) ? kUser : kRenamed, i));
        wrong += WrongIn(expected, ftp);
        std::fprintf(stderr, "%d steps were reported, %d begun; %d have happened: %s\n%s", journal.committed.load(),
                     journal.begun.load(), done, wrong.empty() ? "whole" : "NOT WHOLE", wrong.c_str());
        journal.committed = journal.begun = done;
        break;
    }
    return wrong.empty();
}

[[noreturn]] void RunMachine(const std::string &disk, const std::vector<Step> &steps, int users, Journal &journal)
{
    if (!StartFromDisk(disk, kFolders)) {
        std::perror("start");
        ::_exit(kNotStarted);
    }
    if (!IsWhole(steps, users, journal))
        ::_exit(kNotWhole);
    while (journal.committed < static_cast<int>(steps.size())) {
        journal.begun = journal.committed + 1;
        if (!Carry(steps[static_cast<size_t>(journal.committed)]))
            ::_exit(kCutShort);
        journal.committed = journal.begun.load();
    }
    ::_exit(IsWhole(steps, users, journal) ? kDone : kNotWhole);
}

using MachinePower = test::MachineTest;

TEST_F(MachinePower, ThePlugIsPulledWhileUsersAreAddedRenamedAndDeleted)
{
    const int pulls = std::max(test::Rounds(20), 2);
    const int batches = std::max(test::Rounds(50), 8);
    const int users = batches * kBatch;
    const std::vector<Step> steps = StepsFor(batches);
    fs::create_directories("/etc.defaults");
    test::WriteFile("/etc.defaults/tavoinfo.conf", "maxaccounts=\"2048\"\nnetbkp=\"yes\"\n");
    ASSERT_NO_FATAL_FAILURE(MakeUsers(users));
    PutOnPulledDisk(kFolders);
    Journal *journal = SharedJournal();
    ASSERT_NE(journal, nullptr);
    PullWhileRunning(*journal, pulls, static_cast<int>(steps.size()) / pulls / 2,
                     [&](const std::string &disk, unsigned) { RunMachine(disk, steps, users, *journal); });
    EXPECT_EQ(journal->committed, static_cast<int>(steps.size()));
}

}  // namespace
