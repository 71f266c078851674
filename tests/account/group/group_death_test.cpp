// A program dies while it moves the group files into place. What the next one finds is the state before or after the
// change, whole: never one file of each.
#include "account/group/group_fixture.h"

#include <gtest/gtest.h>

#include <atomic>

#include <dlfcn.h>
#include <stdio.h>
#include <sys/stat.h>
#include <sys/wait.h>
#include <unistd.h>

namespace {

std::atomic<int> renames_to_live{-1};  // of files below /etc; -1: for ever

}  // namespace

// Takes the place of rename: the process dies before the one that it is not to live to see, or right behind it.
extern "C" int rename(const char *from, const char *to) noexcept
{
    static const auto real = reinterpret_cast<int (*)(const char *, const char *)>(::dlsym(RTLD_NEXT, "rename"));
    if (std::string_view(to).starts_with("/etc/group") && renames_to_live >= 0 && renames_to_live-- == 0)
        ::_exit(42);
    return real(from, to);
}

namespace {

bool DiesAt(int renames, int (*change)())
{
    const pid_t child = ::fork();
    if (child == 0) {
        renames_to_live = renames;
        change();
        ::_exit(0);
    }
    int status = 0;
    ::waitpid(child, &status, 0);
    return WIFEXITED(status) && WEXITSTATUS(status) == 42;
}

TEST(GroupDeath, BetweenTheRenames)
{
    const auto change = [] {
        return test::SetGroup("staff", "crew", 70000, {"alice"});
    };
    for (const int renames : {0, 1}) {
        test::WriteFile("/etc/group", "#$_@GID__INDEX@_$65540$\nroot:x:0:\nstaff:x:65540:bob\n");
        test::WriteFile("/etc/group_desc", "staff:old hands\n");
        ASSERT_TRUE(test::GetGroup("staff"));
        ASSERT_TRUE(DiesAt(renames, change)) << "there are two renames";
        // The marker had been written, so the change has happened; opening completes it.
        const test::Group crew = test::GetGroup("crew");
        ASSERT_TRUE(crew) << renames;
        EXPECT_EQ(crew->nGid, 70000);
        EXPECT_FALSE(test::GetGroup("staff"));
        EXPECT_EQ(test::GroupFile(), "#$_@GID__INDEX@_$65540$\nroot:x:0:\ncrew:x:70000:alice\n");
        EXPECT_EQ(test::DescFile(), "crew:old hands\n");
        EXPECT_NE(::access("/etc/.tavogroup.commit", F_OK), 0);
        EXPECT_NE(::access("/etc/group_desc.tmp", F_OK), 0);
    }
    EXPECT_FALSE(DiesAt(2, change));
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
