// A program that changes groups dies at random moments. What the next one
// finds is the state before or after the change, whole: never one file of each.
#include "account/group/group_fixture.h"
#include "support/rounds.h"

#include <gtest/gtest.h>

#include <functional>
#include <map>
#include <random>
#include <sstream>

#include <signal.h>
#include <stdio.h>
#include <sys/mman.h>
#include <sys/stat.h>
#include <sys/wait.h>
#include <unistd.h>

namespace {

using Described = std::map<std::string, std::string>;  // group and members, to its description

// Every group of people in the two files. Their lines are whole.
Described GroupsInFiles()
{
    Described found;
    std::istringstream lines(test::GroupFile());
    std::string line;
    std::getline(lines, line);
    EXPECT_TRUE(line.starts_with("#$_@GID__INDEX@_$")) << line;
    std::map<std::string, std::string> descriptions;
    std::istringstream texts(test::DescFile());
    for (std::string text; std::getline(texts, text);)
        descriptions[text.substr(0, text.find(':'))] = text.substr(text.find(':') + 1);
    while (std::getline(lines, line)) {
        EXPECT_EQ(std::count(line.begin(), line.end(), ':'), 3) << line;
        const std::string name = line.substr(0, line.find(':'));
        if (name.starts_with("g_"))
            found[name + " " + line.substr(line.rfind(':') + 1)] = descriptions[name];
    }
    return found;
}

// Step s of a program that works with groups: one is added, described, renamed with other members, and deleted two
// rounds later. The expected groups are computed with each step.
struct Worker {
    void Step(int s, bool really)
    {
        const std::string name = "g_" + std::to_string(s / 4);
        switch (s % 4) {
        case 0:
            has[name + " admin"] = "";
            return Do(really, [&] { test::AddGroup(name, -1, {"admin"}); });
        case 1:
            has[name + " admin"] = "first";
            return Do(really, [&] { TAVOGroupDescSet(name.c_str(), "first"); });
        case 2:
            has.erase(name + " admin");
            has[name + "b guest"] = "first";
            return Do(really, [&] { test::SetGroup(name.c_str(), name + "b", -1, {"guest"}); });
        default:
            const std::string old = "g_" + std::to_string(s / 4 - 2) + "b";
            has.erase(old + " guest");
            return Do(really, [&] { test::DeleteGroups({old.c_str()}); });
        }
    }
    static void Do(bool really, const std::function<void()> &change)
    {
        if (really)
            change();
    }
    Described has;
};

Described GroupsAfter(int steps)
{
    Worker worker;
    for (int s = 0; s < steps; ++s)
        worker.Step(s, false);
    return worker.has;
}

TEST(GroupDeath, AtRandomMoments)
{
    struct Journal {
        volatile int done;
        volatile bool busy;
    };
    auto *journal = static_cast<Journal *>(
        ::mmap(nullptr, sizeof(Journal), PROT_READ | PROT_WRITE, MAP_SHARED | MAP_ANONYMOUS, -1, 0));
    ASSERT_NE(journal, MAP_FAILED);
    std::mt19937 random(11);
    int done = 0;
    unsigned span = 4000;  // microseconds in which death comes: some steps, however quick the machine is
    for (int round = 0; round < test::Rounds(2000); ++round) {
        const int before = done;
        journal->done = done;
        journal->busy = false;
        const pid_t child = ::fork();
        if (child == 0) {
            Worker worker;
            for (int step = done;; ++step) {
                journal->busy = true;
                worker.Step(step, true);
                journal->done = step + 1;
                journal->busy = false;
            }
        }
        ::usleep(useconds_t(random() % span));
        ::kill(child, SIGKILL);
        int status = 0;
        ::waitpid(child, &status, 0);
        done = journal->done;
        ASSERT_TRUE(test::GetGroup("root"));  // opens, and so repairs
        const Described found = GroupsInFiles();
        if (found != GroupsAfter(done)) {
            ASSERT_TRUE(journal->busy);
            ASSERT_EQ(found, GroupsAfter(done + 1)) << "round " << round << " step " << done;
            ++done;
        }
        for (const auto &[group, description] : found) {
            char text[16] = "?";
            ASSERT_GT(TAVOGroupDescGet(group.substr(0, group.find(' ')).c_str(), text, sizeof text), 0);
            ASSERT_EQ(text, description) << group;
        }
        if (done == before && span < 1'000'000)
            span *= 2;
        else if (done > before + 8)
            span /= 2;
    }
    ::munmap(journal, sizeof *journal);
    EXPECT_GT(done, test::Rounds(2000) / 10);
}

TEST(GroupStores, RebuiltWhateverBecomesOfThem)
{
    const std::string groups = "#$_@GID__INDEX@_$65540$\nroot:x:0:\nstaff:x:65540:bob\n";
    test::WriteFile("/etc/group", groups);
    test::WriteFile("/etc/group_desc", "staff:old hands\nghost:nobody's\n");
    const char *const stores[] = {TAVO_GROUP_DB_NAME, TAVO_GROUP_DB_ID, TAVO_GROUP_DB_DESC};
    void (*const damages[])(const char *) = {
        [](const char *path) { ::unlink(path); },
        [](const char *path) { ASSERT_EQ(::truncate(path, 100), 0); },
        [](const char *path) { test::WriteFile(path, std::string(9000, 'x')); },
        [](const char *path) {
            ::unlink(path);
            ASSERT_EQ(::symlink("/etc/hosts", path), 0);
        },
        [](const char *path) {
            ::unlink(path);
            ASSERT_EQ(::mkdir(path, 0700), 0);
        },
    };
    const std::string hosts = test::FileText("/etc/hosts");
    for (const char *store : stores) {
        for (const auto damage : damages) {
            ASSERT_TRUE(test::GetGroup("staff"));
            damage(store);
            char text[16];
            ASSERT_EQ(TAVOGroupDescGet("staff", text, sizeof text), 10) << store;
            EXPECT_STREQ(text, "old hands");
            ASSERT_EQ(test::SetGroup("staff", "staff", -1, {"bob"}), 0) << store;
            EXPECT_EQ(test::GroupFile(), groups);
        }
    }
    EXPECT_EQ(test::DescFile(), "staff:old hands\n");
    EXPECT_EQ(test::FileText("/etc/hosts"), hosts);
}

}  // namespace
