// The disk with the account files and the home folders loses its power while users are renamed and deleted, who are known to
// every service of the appliance. After each start every file in which they are named says the same.
#include "tavo_group.h"
#include "tavo_user.h"

#include "machine_power.h"
#include "support/rounds.h"

#include <algorithm>
#include <cstdio>
#include <filesystem>
#include <map>

namespace {

namespace fs = std::filesystem;
using test::Journal;
using test::NamesIn;

constexpr int kBatch = 10;
constexpr int kLag = 5;  // so many batches later those who were renamed are deleted
constexpr char kHash[] = "$1$ab$cdefghijklmnopqrstuv./";

const test::FoldersOnDisk kFolders = {
    {"/etc", "/volume1/etc"}, {"/usr/tavo/etc", "/volume1/tavo"}, {"/var/services/homes", "/volume1/homes"}};

// A batch of users, who are either renamed or deleted.
struct Step {
    bool removes;
    int batch;
};

std::vector<Step> StepsFor(int batches)
{
    std::vector<Step> steps;
    for (int batch = 0; batch < batches + kLag; ++batch) {
        if (batch < batches)
            steps.push_back({false, batch});
        if (batch >= kLag)
            steps.push_back({true, batch - kLag});
    }
    return steps;
}

std::string NameOf(int number, bool renamed)
{
    return (renamed ? "renamed" : "user") + std::to_string(number);
}

bool IsOurs(const std::string &name)
{
    return name.starts_with("renamed") || name.starts_with("user");
}

// Who there is after so many steps: the numbers of the users by their names.
std::map<std::string, int> UsersAfter(const std::vector<Step> &steps, int done, int users)
{
    std::map<std::string, int> found;
    for (int i = 0; i < users; ++i)
        found[NameOf(i, false)] = i;
    for (int at = 0; at < done; ++at)
        for (int i = steps[static_cast<size_t>(at)].batch * kBatch, end = i + kBatch; i < end; ++i) {
            found.erase(NameOf(i, steps[static_cast<size_t>(at)].removes));
            if (!steps[static_cast<size_t>(at)].removes)
                found[NameOf(i, true)] = i;
        }
    return found;
}

bool Carry(const Step &step)
{
    std::vector<std::string> names;
    std::vector<std::string> old_names;
    for (int i = step.batch * kBatch; i < (step.batch + 1) * kBatch; ++i) {
        names.push_back(NameOf(i, true));
        old_names.push_back(NameOf(i, false));
    }
    std::vector<TAVOUSER> users(names.size());
    std::vector<const TAVOUSER *> records;
    std::vector<const char *> doomed;
    std::vector<const char *> old;
    for (size_t i = 0; i < names.size(); ++i) {
        users[i].szName = names[i].data();
        users[i].szPasswd = const_cast<char *>(kHash);  // stays
        users[i].nUid = users[i].nGid = users[i].nExpired = -1;
        records.push_back(&users[i]);
        old.push_back(old_names[i].c_str());
        doomed.push_back(names[i].c_str());
    }
    TLIBErrSet(ERR_SUCCESS);
    const int result =
        step.removes ? TAVOUserDelete(doomed.data(), kBatch) : TAVOUserSet(old.data(), records.data(), kBatch);
    return result == 0 && TLIBErrGet() == ERR_SUCCESS;
}

// The accounts, and a line about each of them in every file that knows accounts.
void MakeUsers(int users)
{
    fs::create_directories("/var/services/homes");
    fs::create_directories("/usr/tavo/etc/private");
    test::WriteFile("/etc/tavoinfo.conf", "userHomeEnable=\"yes\"\n");
    std::vector<std::string> names;
    for (int i = 0; i < users; ++i)
        names.push_back(NameOf(i, false));
    std::vector<TAVOUSER> added(names.size());
    std::vector<const TAVOUSER *> records;
    std::vector<const char *> hashes(names.size(), kHash);
    const std::vector<const char *> samba(names.size(), "0123456789ABCDEF0123456789ABCDEF");
    std::vector<char *> members;
    std::string list;
    std::string lines;
    std::string secrets;
    for (size_t i = 0; i < names.size(); ++i) {
        added[i].szName = names[i].data();
        added[i].nUid = added[i].nGid = added[i].nExpired = -1;
        records.push_back(&added[i]);
        members.push_back(names[i].data());
        list += (i ? "," : "") + names[i];
        lines += names[i] + "\n";
        secrets += names[i] + ":secret" + std::to_string(i) + "\n";
    }
    members.push_back(nullptr);
    const std::vector<const char *> none(names.size());
    ASSERT_EQ(TAVOUserSet(none.data(), records.data(), users), 0);
    ASSERT_EQ(TAVOUserSetPasswd(records.data(), hashes.data(), samba.data(), samba.data(), users), 0);
    TAVOGROUP group = {};
    group.szName = const_cast<char *>("crew");
    group.nGid = -1;
    group.rgszMember = members.data();
    ASSERT_EQ(TAVOGroupSet(nullptr, &group), 0);
    test::WriteFile("/usr/tavo/etc/share.conf", "[homes]\n\tpath=\"/volume1/homes\"\n");
    test::WriteFile("/usr/tavo/etc/smb.conf", "[x]\n\tvalid users = " + list + "\n");
    test::WriteFile("/usr/tavo/etc/netbkp.users", lines);
    test::WriteFile("/etc/ftpchroot", lines);
    test::WriteFile("/etc/rsyncd.secrets", secrets, 0600);
    for (size_t i = 0; i < names.size(); ++i)
        test::WriteFile("/var/services/homes/" + names[i] + "/file", std::to_string(i));
}

class Inspection {
  public:
    explicit Inspection(const std::map<std::string, int> &users) : users_(users) {}

    void Names(const std::string &where, const std::set<std::string> &found)
    {
        std::set<std::string> ours;
        std::copy_if(found.begin(), found.end(), std::inserter(ours, ours.end()), IsOurs);
        std::set<std::string> wanted;
        for (const auto &user : users_)
            wanted.insert(user.first);
        Expect(ours == wanted, where + " names other users");
    }
    void Expect(bool condition, const std::string &otherwise)
    {
        if (!condition)
            wrong_ += "  " + otherwise + "\n";
    }
    const std::string &Wrong() const { return wrong_; }

  private:
    const std::map<std::string, int> &users_;
    std::string wrong_;
};

std::set<std::string> Split(const std::string &list)
{
    std::set<std::string> names;
    std::istringstream rest(list);
    for (std::string name; std::getline(rest, name, ',');)
        names.insert(name);
    return names;
}

std::string After(const std::string &text, const std::string &begin)
{
    const size_t at = text.find(begin);
    if (at == text.npos)
        return "";
    const size_t first = at + begin.size();
    return text.substr(first, text.find('\n', first) - first);
}

std::string WrongIn(const std::map<std::string, int> &users, const std::set<std::string> &ftp)
{
    Inspection look(users);
    for (const char *path : {"/etc/passwd", "/etc/shadow", "/etc/tavouser.conf", "/usr/tavo/etc/private/smbpasswd",
                             "/usr/tavo/etc/netbkp.users", "/etc/rsyncd.secrets"})
        look.Names(path, NamesIn(path));
    // Nothing is taken from this list when a user is deleted.
    look.Expect(NamesIn("/etc/ftpchroot") == ftp, "/etc/ftpchroot names other users");
    const std::string crew = After(test::ReadFile("/etc/group"), "\ncrew:");
    look.Names("/etc/group", Split(crew.substr(std::min(crew.rfind(':') + 1, crew.size()))));
    look.Names("smb.conf", Split(After(test::ReadFile("/usr/tavo/etc/smb.conf"), "valid users = ")));
    std::set<std::string> homes;
    for (const auto &home : fs::directory_iterator("/volume1/homes"))
        homes.insert(home.path().filename());
    look.Names("/volume1/homes", homes);
    const std::string shadow = test::ReadFile("/etc/shadow");
    const std::string secrets = test::ReadFile("/etc/rsyncd.secrets");
    for (const auto &[name, number] : users) {
        const std::string file = "/volume1/homes/" + name + "/file";
        look.Expect(fs::exists(file) && test::ReadFile(file) == std::to_string(number), "the home of " + name);
        look.Expect(shadow.find("\n" + name + ":" + kHash + ":") != shadow.npos, "the password of " + name);
        look.Expect(("\n" + secrets).find("\n" + name + ":secret" + std::to_string(number) + "\n") != secrets.npos,
                    "the backup password of " + name);
    }
    look.Expect(!fs::exists("/etc/.tavoaccount.commit"), "a change is left to do");
    for (const char *folder : {"/etc", "/usr/tavo/etc", "/usr/tavo/etc/private"})
        for (const auto &entry : fs::directory_iterator(folder))
            look.Expect(!entry.path().filename().string().ends_with(".tmp"), entry.path().string() + " is left");
    look.Expect(!fs::exists("/volume1/@tmp") || fs::is_empty("/volume1/@tmp"), "a deleted home is left");
    return look.Wrong();
}

// The files after the change that finishes what was cut short: those of all steps that were reported, or with the one
// that was under way.
bool IsWhole(const std::vector<Step> &steps, int users, Journal &journal)
{
    const bool finished = TAVOGroupDescSet("users", "Every local user") == 0;
    const auto names = NamesIn("/etc/passwd");
    const auto ours = std::count_if(names.begin(), names.end(), IsOurs);
    std::string wrong = finished ? "" : "  the next change fails\n";
    for (const int done : {journal.begun.load(), journal.committed.load()}) {
        const auto expected = UsersAfter(steps, done, users);
        const bool is_it =
            ours == static_cast<long>(expected.size()) &&
            std::all_of(expected.begin(), expected.end(), [&](const auto &user) { return names.contains(user.first); });
        if (done != journal.committed && !is_it)
            continue;
        std::set<std::string> ftp;
        for (int i = 0; i < users; ++i)
            ftp.insert(NameOf(i, !expected.contains(NameOf(i, false))));
        wrong += WrongIn(expected, ftp);
        std::fprintf(stderr, "%d steps were reported, %d begun; %d have happened: %s\n%s", journal.committed.load(),
                     journal.begun.load(), done, wrong.empty() ? "whole" : "NOT WHOLE", wrong.c_str());
        journal.committed = journal.begun = done;
        break;
    }
    return wrong.empty();
}

[[noreturn]] void Rename(const std::string &disk, const std::vector<Step> &steps, int users, Journal &journal)
{
    if (!test::StartFromDisk(disk, kFolders)) {
        std::perror("start");
        ::_exit(test::kNotStarted);
    }
    if (!IsWhole(steps, users, journal))
        ::_exit(test::kNotWhole);
    while (journal.committed < static_cast<int>(steps.size())) {
        journal.begun = journal.committed + 1;
        if (!Carry(steps[static_cast<size_t>(journal.committed)]))
            ::_exit(test::kCutShort);
        journal.committed = journal.begun.load();
    }
    ::_exit(IsWhole(steps, users, journal) ? test::kDone : test::kNotWhole);
}

using MachinePower = test::MachineTest;

TEST_F(MachinePower, ThePlugIsPulledWhileUsersAreRenamedAndDeleted)
{
    const int pulls = std::max(test::Rounds(20), 2);
    const int batches = std::max(test::Rounds(50), 8);
    const int users = batches * kBatch;
    const std::vector<Step> steps = StepsFor(batches);
    fs::create_directories("/etc.defaults");
    test::WriteFile("/etc.defaults/tavoinfo.conf", "maxaccounts=\"2048\"\nnetbkp=\"yes\"\n");
    ASSERT_NO_FATAL_FAILURE(MakeUsers(users));
    test::PutOnPulledDisk(kFolders);
    Journal *journal = test::SharedJournal();
    ASSERT_NE(journal, nullptr);
    test::PullWhileRunning(*journal, pulls, static_cast<int>(steps.size()) / pulls / 2,
                           [&](const std::string &disk, unsigned) { Rename(disk, steps, users, *journal); });
    EXPECT_EQ(journal->committed, static_cast<int>(steps.size()));
}

}  // namespace
