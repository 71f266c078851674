// tavoctl disk, partition, raid and lvm on real disks: what is shown is what is there, and nothing in use is destroyed.
#include "run_tavoctl.h"
#include "support/machine.h"
#include "support/test.h"

#include <nlohmann/json.hpp>

namespace {

using nlohmann::json;
using test::IsRefused;
using test::Succeeds;
using test::Tavoctl;
using test::Told;

class MachineTavoctl : public test::MachineTest {
  protected:
    void TearDown() override
    {
        if (test::OnMachine())
            Told("umount /volume* 2>/dev/null; swapoff -a; /usr/lib/tavo-machine/reset");
    }
};

json Facts(test::Words words)
{
    words.insert(words.begin() + 2, "--json");
    const test::Ran ran = Tavoctl(words);
    EXPECT_EQ(ran.status, 0) << testing::PrintToString(words) << ran;
    return test::Facts(ran);
}

TEST_F(MachineTavoctl, ShowsTheDisks)
{
    const json disks = Facts({"disk", "list"});
    ASSERT_EQ(disks.size(), 6u);
    for (std::size_t i = 0; i < 6; ++i) {
        EXPECT_EQ(disks[i].at("bay"), std::to_string(i + 1));
        EXPECT_EQ(disks[i].at("disk"), std::string("sd") + "abcdef"[i]);
        EXPECT_EQ(disks[i].at("model"), "NASLAB-HD-" + std::to_string(i + 1));
        EXPECT_EQ(disks[i].at("size"), 96 << 20);
        EXPECT_EQ(disks[i].at("state"), "spinning");
        EXPECT_EQ(disks[i].at("layout"), "blank");
        EXPECT_EQ(disks[i].at("temperature"), nullptr);
        EXPECT_EQ(disks[i].at("role"), json::array());
    }
    EXPECT_EQ(Tavoctl({"disk", "temperature", "sda"}).status, 1);
    const json smart = Facts({"disk", "smart", "sda"});
    ASSERT_EQ(smart.size(), 7u);
    EXPECT_EQ(smart[6].at("name"), "airflow temperature");
    EXPECT_EQ(smart[6].at("raw"), 31);
    EXPECT_EQ(smart[6].at("threshold"), 50);
    EXPECT_EQ(smart[6].at("state"), "good");

    Succeeds({"disk", "cache", "sda", "off"});
    EXPECT_EQ(Facts({"disk", "info", "sda"}).at("write_cache"), false);
    Succeeds({"disk", "cache", "sda", "on"});
    EXPECT_EQ(Facts({"disk", "info", "sda"}).at("write_cache"), true);
    Succeeds({"disk", "standby", "--yes", "sdf"});
    Succeeds({"disk", "standby", "--yes", "--timer", "20"});
    test::Happen("pull 2");
    EXPECT_EQ(Facts({"disk", "list"}).at(1).at("state"), "empty");
    EXPECT_EQ(Tavoctl({"disk", "info", "sdb"}).status, 3);
}

TEST_F(MachineTavoctl, TestsADriveAndReadsItsErrors)
{
    const std::string tested = "smartctl -l selftest /dev/sda | grep -c '^# *[0-9]' || true";
    const int before = std::stoi(Told(tested));  // a drive remembers tests of earlier cases
    Succeeds({"disk", "test", "--short", "--wait", "sda"});
    Succeeds({"disk", "test", "--long", "sda"});
    EXPECT_EQ(std::stoi(Told(tested)), before + 2);
    EXPECT_EQ(Facts({"disk", "health", "sda"}).at(0).at("self_test"), "passed");
    EXPECT_EQ(Facts({"disk", "health", "sda"}).at(0).at("errors"), 0);
    EXPECT_EQ(Facts({"disk", "errors", "sda"}), json::array());

    // A drive that works on a test, and then cannot read.
    const std::string failing = "LD_PRELOAD=" TEST_FAILING_DRIVE " tavoctl disk ";
    const test::CommandResult result = test::Shell(failing + "test --short --wait sda");
    EXPECT_EQ(result.status, 1);
    EXPECT_THAT(result.output, testing::HasSubstr("the test failed: it cannot read"));
    EXPECT_EQ(Told("cat /tmp/asked"), "test 1\nrunning\nrunning\nfailed\n");
    const json health = json::parse(test::Shell(failing + "health --json sda").output).at("items").at(0);
    EXPECT_EQ(health.at("verdict"), "failing");
    EXPECT_EQ(health.at("errors"), 1);
    const json error = json::parse(test::Shell(failing + "errors --json sda").output).at("items").at(0);
    EXPECT_EQ(error.at("error"), "the sector cannot be read");
    EXPECT_EQ(error.at("sector"), 4711);
    Told("rm -f /tmp/asked");
}

TEST_F(MachineTavoctl, BringsADiskFromBlankToVolumeAndBack)
{
    for (const char *bay : {"1", "2", "3"}) {
        test::Happen(std::string("pull ") + bay);
        test::Happen(std::string("plug ") + bay + " --blank 4736");
    }
    for (const char *disk : {"sda", "sdb", "sdc"}) {
        Succeeds({"partition", "create", "--yes", "--system", disk});
        Succeeds({"partition", "create", "--yes", "--data", disk});
    }
    EXPECT_EQ(Facts({"partition", "layout", "sda"}), (json{{"disk", "/dev/sda"}, {"version", 7}, {"raid", true}}));
    EXPECT_EQ(Tavoctl({"partition", "table", "sda"}).out, "mbr\n");
    const json partitions = Facts({"partition", "list", "sda"});
    ASSERT_EQ(partitions.size(), 3u);
    EXPECT_EQ(partitions[1].at("partition"), "sda2");
    EXPECT_EQ(partitions[1].at("start"), 4980736);
    EXPECT_EQ(partitions[1].at("sectors"), 4194304);
    EXPECT_EQ(partitions[1].at("type"), "0xFD");
    EXPECT_EQ(Tavoctl({"partition", "create", "--yes", "--data", "sda"}).status, 1);

    Succeeds({"raid", "create", "--yes", "--level", "5", "--slots", "3", "--size", "64", "md2", "sda3", "sdb3"});
    EXPECT_EQ(Facts({"raid", "info", "md2"}).at("status"), "degraded");
    EXPECT_EQ(Tavoctl({"raid", "wait", "md2"}).status, 1);
    IsRefused({"raid", "create", "--yes", "--level", "1", "md3", "sda3", "sdc3"}, "/dev/sda3 belongs to /dev/md2");
    IsRefused({"partition", "create", "--yes", "--system", "sdb"}, "/dev/sdb3 belongs to /dev/md2");
    IsRefused({"partition", "clean", "--yes", "--data", "sdb"}, "/dev/sdb3 belongs to /dev/md2");
    IsRefused({"raid", "erase", "--yes", "sdb3"}, "belongs to /dev/md2");
    Succeeds({"raid", "add", "--yes", "md2", "sdc3"});
    Succeeds({"raid", "wait", "--timeout", "120", "md2"});
    const json array = Facts({"raid", "list"}).at(0);
    EXPECT_EQ(array.at("status"), "normal");
    EXPECT_EQ(array.at("size"), 128 << 20);
    EXPECT_EQ(array.at("members"), json({"sda3", "sdb3", "sdc3"}));
    EXPECT_EQ(Facts({"disk", "info", "sda"}).at("role"), json({"md2"}));
    EXPECT_EQ(Facts({"disk", "list"}).at(0).at("layout"), "version 7");
    const std::string uuid = Facts({"raid", "info", "md2"}).at("uuid");
    EXPECT_EQ(Facts({"raid", "superblock", "sdb3"}).at(0).at("uuid"), uuid);

    Succeeds({"lvm", "create", "--yes", "vg1", "md2"});
    IsRefused({"raid", "stop", "--yes", "md2"}, "/dev/md2 belongs to the volume vg1-lv");
    Succeeds({"lvm", "remove", "--yes", "vg1"});
    Succeeds({"volume", "create", "--yes", "1", "md2"});
    EXPECT_EQ(Facts({"lvm", "list"}).at(0).at("use"), "/dev/vg1/lv is mounted on /volume1");
    IsRefused({"lvm", "remove", "--yes", "vg1"}, "/dev/vg1/lv is mounted on /volume1");
    IsRefused({"raid", "remove", "--yes", "md2"}, "belongs to the volume");
    Told("echo x >/volume1/file");
    Succeeds({"volume", "unmount", "1"});
    Succeeds({"lvm", "rename", "vg1", "vg2"});
    Succeeds({"lvm", "expand", "vg2"});
    Succeeds({"lvm", "remove", "--yes", "vg2"});
    EXPECT_EQ(Facts({"lvm", "list"}), json::array());

    Succeeds({"raid", "stop", "--yes", "md2"});
    Succeeds({"raid", "assemble", "md2", uuid});
    IsRefused({"raid", "erase", "--yes", "--uuid", uuid}, "/dev/md2 runs");
    Told("mkswap /dev/sda2 && swapon /dev/sda2");
    IsRefused({"partition", "create", "--yes", "--system", "sda"}, "/dev/sda2 is swap space");
    Told("swapoff /dev/sda2");
    Succeeds({"raid", "remove", "--yes", "md2"});
    EXPECT_EQ(Tavoctl({"raid", "superblock", "sda3", "sdb3", "sdc3"}).status, 3);
    Succeeds({"partition", "clean", "--yes", "--system", "sda"});
    EXPECT_EQ(Facts({"partition", "list", "sda"}), json::array());
}

TEST_F(MachineTavoctl, ShowsHowFarARebuildIs)
{
    Succeeds({"raid", "create", "--yes", "--level", "1", "--slots", "2", "md4", "sda"});
    Told("echo 400 >/sys/block/md4/md/sync_speed_max && echo 200 >/sys/block/md4/md/sync_speed_min");
    Succeeds({"raid", "add", "--yes", "md4", "sdb"});
    EXPECT_EQ(Tavoctl({"raid", "wait", "--timeout", "2", "md4"}).status, 4);
    const json array = Facts({"raid", "info", "md4"});
    EXPECT_EQ(array.at("action"), "recover");
    EXPECT_LT(array.at("percent"), 100);
    EXPECT_EQ(array.at("spare"), json({"/dev/sdb"}));
    const test::Ran seen = test::TavoctlAtTerminal({"raid", "wait", "--timeout", "3", "md4"});
    EXPECT_THAT(seen.out, testing::ContainsRegex("md4: recover [0-9]+ %, [0-9.]+ MiB/s, .* left"));
    Told("echo 200000 >/sys/block/md4/md/sync_speed_max");
    Succeeds({"raid", "wait", "--timeout", "120", "md4"});

    Told("echo faulty >/sys/block/md4/md/dev-sdb/state");
    IsRefused({"raid", "remove", "--yes", "md4", "sda"}, "is in sync");
    Succeeds({"raid", "remove", "--yes", "md4", "sdb"});
    EXPECT_EQ(Facts({"raid", "info", "md4"}).at("active"), json({"/dev/sda"}));
    EXPECT_EQ(Tavoctl({"raid", "remove", "--yes", "md4", "sdf"}).status, 3);
}

}  // namespace
