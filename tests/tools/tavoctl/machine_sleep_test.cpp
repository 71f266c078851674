// Disks that sleep: what lists show comes from elsewhere, and nothing but the question whether they sleep reaches them.
#include "run_tavoctl.h"
#include "support/machine.h"
#include "support/test.h"

namespace {

using test::Told;

class MachineSleep : public test::MachineTest {
  protected:
    void TearDown() override
    {
        if (test::OnMachine())
            Told("umount /volume* 2>/dev/null; /usr/lib/tavo-machine/reset; rm -rf /dev/vg* /volume*");
    }
};

// The commands that drives were sent, each once.
std::set<std::string> Asked()
{
    std::ifstream file("/tmp/asked");
    std::set<std::string> lines;
    for (std::string line; std::getline(file, line);)
        lines.insert(line);
    return lines;
}

// What the kernel has read from and written to each disk, through whichever program.
std::string Traffic()
{
    return Told("for disk in a b c d e f; do awk '{ print $1, $3, $5, $7 }' /sys/block/sd$disk/stat; done");
}

TEST_F(MachineSleep, ListsAskSleepingDisksForNothingButTheirPower)
{
    test::Succeeds({"raid", "create", "--yes", "--level", "5", "--no-sync", "md2", "sda", "sdb", "sdc"});
    test::Succeeds({"volume", "create", "--yes", "1", "md2"});
    Told("sync; sleep 8; sync");  // what the file system still had to write
    const std::set<std::string> power = {"E5"};
    for (const char *words : {"disk list", "disk list --json", "disk info sda", "disk health", "raid list",
                              "raid info md2", "raid list --all", "storage", "partition list", "partition layout sda",
                              "volume list", "lvm list", "disk smart sda", "disk temperature sda"}) {
        std::remove("/tmp/asked");
        test::CommandResult result = {};
        // A young file system and its array write on their own now and then; what a list reads, it reads every time.
        bool is_quiet = false;
        for (int attempt = 0; attempt < 5 && !is_quiet; ++attempt) {
            Told("echo 3 >/proc/sys/vm/drop_caches");
            const std::string before = Traffic();
            result = test::Shell(std::string("LD_PRELOAD=" TEST_SLEEPY_DRIVES " timeout 60 tavoctl ") + words);
            is_quiet = Traffic() == before;
        }
        EXPECT_NE(result.status, 124) << words;
        EXPECT_THAT(Asked(), testing::AnyOf(testing::Eq(power), testing::IsEmpty())) << words << "\n" << result.output;
        EXPECT_TRUE(is_quiet) << words << "\n" << result.output;
    }
    // And it is not that nothing is ever written down.
    std::remove("/tmp/asked");
    Told("LD_PRELOAD=" TEST_SLEEPY_DRIVES " tavoctl disk smart --wake sda");
    EXPECT_THAT(Asked(), testing::Contains("B0"));
}

}  // namespace
