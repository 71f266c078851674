// Runs after outcomes_test: finds the machine as that one found it.
#include <gtest/gtest.h>

#include <fstream>
#include <iterator>
#include <string>

#include <unistd.h>

namespace {

std::string Text(const char *path)
{
    std::ifstream file(path);
    return {std::istreambuf_iterator<char>(file), {}};
}

TEST(Second, FindsAFreshRoot)
{
    EXPECT_EQ(Text("/etc/hostname").find("changed"), std::string::npos);
    EXPECT_NE(access("/tmp/large", F_OK), 0);
}

TEST(MachineSecond, FindsTheMachineAsAfterTheStart)
{
    EXPECT_EQ(Text("/proc/mdstat").find("md7"), std::string::npos);
    EXPECT_NE(access("/dev/mapper/vgtest-one", F_OK), 0);
    EXPECT_NE(access("/sys/class/net/bond7", F_OK), 0);
    EXPECT_NE(system("ip -br addr show eth0 | grep -q 10.1.2.3"), 0);
    std::ifstream disk("/dev/sda", std::ios::binary);
    std::string head(1 << 20, 'x');
    ASSERT_TRUE(disk.read(head.data(), static_cast<std::streamsize>(head.size())));
    EXPECT_EQ(head.find_first_not_of('\0'), std::string::npos);
}

TEST(MachineSecond, LosesItsKernel)
{
    std::ofstream("/proc/sysrq-trigger") << 'c' << std::flush;
    sleep(60);
}

TEST(MachineSecond, RunsAfterThat)
{
}

}  // namespace
