// Cases that end in every way that a case can end: what run-tests says of each is compared with what it must say.
#include <gtest/gtest.h>

#include <cerrno>
#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <fstream>

#include <sys/stat.h>
#include <sys/utsname.h>
#include <unistd.h>

namespace {

TEST(Outcome, Passes)
{
    utsname system{};
    ASSERT_EQ(uname(&system), 0);
    EXPECT_STREQ(system.machine, "armv7l");
    EXPECT_EQ(sizeof(off_t), 8u);
    EXPECT_EQ(sizeof(long), 4u);
}

TEST(Outcome, Fails)
{
    puts("this line belongs to the failing case");
    EXPECT_EQ(1, 2);
}

TEST(Outcome, Aborts)
{
    std::abort();
}

TEST(Outcome, IsKilledByABadPointer)
{
    *reinterpret_cast<volatile int *>(8) = 1;
}

TEST(Outcome, Exits)
{
    std::exit(0);
}

TEST(Outcome, Hangs)
{
    for (;;)
        pause();
}

TEST(Outcome, FillsTheMemory)
{
    for (;;)
        memset(malloc(1 << 20), 1, 1 << 20);
}

TEST(Outcome, MeetsAFullFileSystem)
{
    std::ofstream file("/tmp/large");
    const std::string block(1 << 20, 'x');
    while (file << block)
        ;
    EXPECT_EQ(errno, ENOSPC);
    unlink("/tmp/large");
}

TEST(Outcome, IsSkipped)
{
    GTEST_SKIP() << "not here";
}

TEST(Outcome, PrintsNoNewline)
{
    printf("half a line");
    fflush(stdout);
}

TEST(Outcome, LeavesAProcess)
{
    if (fork() == 0) {
        sleep(1000);
        _exit(0);
    }
}

// What one process changes below the root no other sees: the next program finds the files of a fresh appliance.
TEST(Root, TakesChanges)
{
    std::ofstream("/etc/hostname") << "changed";
    std::string text;
    std::ifstream("/etc/hostname") >> text;
    EXPECT_EQ(text, "changed");
}

class Numbered : public testing::TestWithParam<int> {};
TEST_P(Numbered, Passes)
{
    EXPECT_LT(GetParam(), 3);
}
INSTANTIATE_TEST_SUITE_P(Three, Numbered, testing::Range(0, 3));

// Suites of this name have the real tools and the disks of the machine.
TEST(MachineDisks, AreSixInTheOrderOfTheBays)
{
    for (char name : std::string("abcdef")) {
        struct stat info;
        EXPECT_EQ(stat((std::string("/dev/sd") + name).c_str(), &info), 0) << name;
    }
}

TEST(MachineDisks, AreWrittenAndLeft)
{
    EXPECT_EQ(system("mdadm -C /dev/md7 -R -e 1.2 -l 1 -n 2 /dev/sda /dev/sdb"), 0);
    EXPECT_EQ(system("vgcreate -qq vgtest /dev/sdc && lvcreate -qq -y -L 8M -n one vgtest"), 0);
    EXPECT_EQ(system("ip link add bond7 type bond && ip link set eth1 master bond7 && ip addr add 10.1.2.3/8 dev eth0"),
              0);
}

}  // namespace
