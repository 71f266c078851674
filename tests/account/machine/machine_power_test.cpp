// The disk with the account files loses its power while users are added.
#include "machine_power.h"

#include "tavo_user.h"

#include <algorithm>
#include <cstdio>

namespace {

using test::Journal;
using test::NamesIn;

constexpr int kUsers = 500;
constexpr int kPulls = 6;
constexpr int kLargestBatch = 12;
constexpr const char *kFiles[] = {"/etc/passwd", "/etc/shadow", "/etc/tavouser.conf",
                                  "/usr/tavo/etc/private/smbpasswd"};

const test::FoldersOnDisk kFolders = {{"/etc", "/volume1/etc"}, {"/usr/tavo/etc/private", "/volume1/private"}};

std::string NameOf(int number)
{
    return "user" + std::to_string(number);
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

// One run of the machine: look at what is there, go on adding until all are there or the disk is gone.
[[noreturn]] void RunMachine(const std::string &disk, Journal &journal, unsigned seed)
{
    if (!test::StartFromDisk(disk, kFolders)) {
        std::perror("start");
        ::_exit(test::kNotStarted);
    }
    if (!AllAreThere(journal))
        ::_exit(test::kNotWhole);
    std::mt19937 random(seed);
    while (journal.committed < kUsers) {
        const int count = std::min(1 + static_cast<int>(random() % kLargestBatch), kUsers - journal.committed);
        journal.begun = journal.committed + count;
        if (!AddBatch(journal.committed, count))
            ::_exit(test::kCutShort);
        journal.committed = journal.begun.load();
    }
    ::_exit(test::kDone);
}

using MachinePower = test::MachineTest;

TEST_F(MachinePower, ThePlugIsPulledWhileUsersAreAdded)
{
    test::PutOnPulledDisk(kFolders);
    Journal *journal = test::SharedJournal();
    ASSERT_NE(journal, nullptr);
    test::PullWhileRunning(*journal, kPulls, kUsers / kPulls / 2,
                           [&](const std::string &disk, unsigned seed) { RunMachine(disk, *journal, seed); });
    EXPECT_EQ(journal->committed, kUsers);
}

}  // namespace
