// tavoctl storage, disk, partition, raid, lvm and volume on real disks: what is shown is what is there, nothing in use is
// destroyed, and disks that sleep are asked for nothing but their power.
#include "support/machine.h"

#include "run_tavoctl.h"
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
        if (!test::OnMachine())
            return;
        Told("umount /volume* 2>/dev/null; swapoff -a; /usr/lib/tavo-machine/reset; rm -rf /dev/vg* /volume*");
        if (::access("/dev/sdb", F_OK) != 0) {  // what replaced it has another name until its own is free
            test::Happen("pull 2");
            test::Happen("plug 2");
        }
    }
};

using MachineVolumes = MachineTavoctl;
using MachineSleep = MachineTavoctl;

json Facts(test::Words words)
{
    words.emplace_back("--json");
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

void PlugLarge(int count)
{
    for (int bay = 1; bay <= count; ++bay) {
        test::Happen("pull " + std::to_string(bay));
        test::Happen("plug " + std::to_string(bay) + " --blank 4800");
    }
}

json Named(const json &rows, const std::string &column, const std::string &value)
{
    for (const json &row : rows)
        if (row.at(column) == value)
            return row;
    return json::object();
}

std::string DiskInBay(const std::string &bay)
{
    return Named(Facts({"disk", "list"}), "bay", bay).value("disk", "");
}

TEST_F(MachineVolumes, ThreeCommandsFromBlankDisksToAVolumeThatOutlivesADisk)
{
    PlugLarge(4);
    Succeeds({"partition", "create", "--yes", "sda", "sdb", "sdc", "sdd"});
    Succeeds({"raid", "create", "--yes", "--level", "5", "--no-sync", "md2", "sda3", "sdb3", "sdc3", "sdd3"});
    Succeeds({"volume", "create", "--yes", "1", "md2"});
    const std::string sum = Told("head -c 8M /dev/urandom >/volume1/data && sync && sha256sum </volume1/data");

    json tree = Facts({"storage"});
    EXPECT_EQ(Named(tree, "name", "sdb").at("serial"), "SN0002");
    EXPECT_EQ(Named(tree, "name", "sdb3").at("state"), "active in md2");
    EXPECT_EQ(Named(tree, "name", "md2").at("parents"), json({"sda3", "sdb3", "sdc3", "sdd3"}));
    EXPECT_EQ(Named(tree, "name", "/dev/vg1/lv").at("mount"), "/volume1");
    EXPECT_EQ(Named(tree, "name", "/dev/vg1/lv").at("filesystem"), "ext4");
    IsRefused({"volume", "create", "--yes", "1", "sde"}, "is mounted there");
    IsRefused({"volume", "create", "--yes", "2", "md2"}, "/dev/md2 belongs to the volume vg1-lv");
    IsRefused({"volume", "check", "1"}, "it is mounted on /volume1");

    // Pulled while it is written to: the bay, the array and its member are named, and the new disk takes the place.
    test::Happen("pull 3");
    Told("head -c 1M /dev/urandom >/volume1/more && sync");
    EXPECT_TRUE(test::Comes([] { return Facts({"raid", "list"}).at(0).at("status") == "degraded"; }));
    EXPECT_EQ(Facts({"raid", "list"}).at(0).at("failed"), json({"/dev/sdc3"}));
    const json bay = Named(Facts({"disk", "list"}), "bay", "3");
    EXPECT_EQ(bay.at("state"), "pulled");
    EXPECT_EQ(bay.at("role"), json({"md2"}));
    IsRefused({"raid", "replace", "--yes", "md2", "sdb3", "sde"}, "/dev/sdb3 is in sync");
    IsRefused({"raid", "replace", "--yes", "md2", "sdb"}, "is a member already");
    IsRefused({"raid", "replace", "--yes", "md2", "sde"}, "take a larger one", 1);
    test::Happen("plug 3 --blank 4800");
    const std::string disk = DiskInBay("3");
    EXPECT_NE(disk, "sdc") << "md2 still has that name";
    Succeeds({"raid", "replace", "--yes", "--wait", "md2", disk});
    EXPECT_EQ(Facts({"raid", "list"}).at(0).at("status"), "normal");
    Succeeds({"raid", "speed", "--most", "500000", "md2"});
    Succeeds({"raid", "scrub", "--wait", "md2"});
    EXPECT_EQ(Facts({"raid", "info", "md2"}).at("mismatches"), 0);
    EXPECT_EQ(Facts({"raid", "info", "md2"}).at("most_speed"), 500000);
    Told("echo 3 >/proc/sys/vm/drop_caches");
    EXPECT_EQ(Told("sha256sum </volume1/data"), sum);

    // Everything stopped, as after a start of the system.
    const int open_file = ::open("/volume1/data", O_RDONLY | O_CLOEXEC);
    IsRefused({"volume", "unmount", "1"}, "programs have files open there");
    ::close(open_file);
    Succeeds({"volume", "unmount", "1"});
    EXPECT_EQ(Facts({"volume", "check", "1"}).at("state"), "clean");
    Succeeds({"raid", "stop", "--yes", "md2"});
    const json stopped = Facts({"raid", "list", "--all"});
    ASSERT_EQ(stopped.size(), 1u);
    EXPECT_EQ(stopped[0].at("array"), "md2");
    EXPECT_EQ(stopped[0].at("status"), "stopped");
    EXPECT_EQ(stopped[0].at("members").size(), 4u);
    Succeeds({"raid", "assemble", "--all"});
    EXPECT_EQ(Facts({"raid", "assemble", "--all"}).at("changed"), false);
    Succeeds({"volume", "mount", "--all"});
    EXPECT_EQ(Facts({"volume", "mount", "1"}).at("changed"), false);
    EXPECT_EQ(Told("sha256sum </volume1/data"), sum);
}

TEST_F(MachineVolumes, ADocumentOfTheStateBringsQuotasAndServicesOnce)
{
    Succeeds({"raid", "create", "--yes", "--level", "1", "--no-sync", "md2", "sda", "sdb"});
    Succeeds({"volume", "create", "--yes", "1", "md2"});
    Succeeds({"user", "add", "--unknown-password", "anna"});
    const test::ScratchDir dir;
    test::WriteFile(dir / "box.json",
                    R"({"format_version": 1, "quotas": [{"volume": 1, "user": "anna", "limit_kib": 2048}],
        "services": [{"name": "media", "enabled": true, "folders": ["/volume1/music"]}]})");
    EXPECT_EQ(Facts({"state", "apply", dir / "box.json"}).at("changed"), true);
    EXPECT_THAT(Facts({"state", "show"}).at("quotas"),
                testing::Contains(json({{"volume", 1}, {"user", "anna"}, {"limit_kib", 2048}})));
    EXPECT_EQ(Told("readlink /var/services/music"), "/volume1/music\n");
    Told("mkdir -m 777 /volume1/open; su -s /bin/sh anna -c 'head -c 3M /dev/zero >/volume1/open/full' 2>/dev/null; "
         "true");
    const long written = std::stol(Told("stat -c %s /volume1/open/full"));
    EXPECT_TRUE(written > 1024 * 1024 && written <= 2048 * 1024) << "the limit is 2 MiB, not " << written;
    EXPECT_EQ(Facts({"state", "apply", dir / "box.json"}).at("changed"), false);
    EXPECT_EQ(Facts({"state", "diff", dir / "box.json"}), json::array());
    Succeeds({"service", "disable", "media"});
    Told("quotaoff /volume1");
    Succeeds({"user", "delete", "--yes", "anna"});
}

TEST_F(MachineVolumes, AVolumeGrowsWithItsArray)
{
    Succeeds({"raid", "create", "--yes", "--level", "1", "--size", "40", "--no-sync", "md2", "sda", "sdb"});
    Succeeds({"volume", "create", "--yes", "3", "md2"});
    EXPECT_EQ(Facts({"volume", "grow", "3"}).at("changed"), false);
    const uint64_t before = Facts({"volume", "list"}).at(0).at("capacity");
    Told("echo x >/volume3/file");
    Succeeds({"raid", "grow", "--yes", "--wait", "md2"});
    EXPECT_EQ(Facts({"raid", "grow", "md2"}).at("changed"), false);
    Succeeds({"volume", "grow", "3"});
    EXPECT_GT(Facts({"volume", "list"}).at(0).at("capacity"), before * 2);
    EXPECT_EQ(Told("cat /volume3/file"), "x\n");
    EXPECT_EQ(Facts({"volume", "grow", "3"}).at("changed"), false);
}

TEST_F(MachineVolumes, StartsUnsafeArraysOnlyOnRequest)
{
    Succeeds({"raid", "create", "--yes", "--level", "5", "--no-sync", "md2", "sda", "sdb", "sdc"});
    Told("dd if=/dev/urandom of=/dev/md2 bs=64k count=16 oflag=direct");
    // Two of three, one of them outdated: it had failed before the last writes.
    Told("echo faulty >/sys/block/md2/md/dev-sdc/state && dd if=/dev/urandom of=/dev/md2 bs=64k count=16 oflag=direct");
    Succeeds({"raid", "stop", "--yes", "md2"});
    test::Happen("pull 2");
    IsRefused({"raid", "assemble", "--all"},
              "/dev/md2 is not started: only 1 of 3 members are there and up to date, and it takes 2", 1);
    EXPECT_EQ(Facts({"raid", "list"}), json::array());
    IsRefused({"raid", "assemble", "md2"}, "--force says what may be lost", 1);
    const test::Ran asked = Tavoctl({"raid", "assemble", "--force", "md2"});
    EXPECT_EQ(asked.status, 2) << asked;
    EXPECT_THAT(asked.err, testing::ContainsRegex("/dev/sda: slot 0, [0-9]+ events"));
    EXPECT_THAT(asked.err, testing::HasSubstr("may be lost or damaged"));
    EXPECT_EQ(Tavoctl({"raid", "assemble", "--yes", "--force", "md2"}).status, 0);
    EXPECT_EQ(Facts({"raid", "list"}).at(0).at("status"), "degraded");
    EXPECT_EQ(Told("head -c 1M /dev/md2 | wc -c"), "1048576\n");
}

TEST_F(MachineVolumes, WatchTellsOfDisksAndArrays)
{
    const std::string pid = Told("tavoctl watch --json >/tmp/watched 2>&1 & echo $! && sleep 3");
    Succeeds({"raid", "create", "--yes", "--level", "1", "--no-sync", "md4", "sda", "sdb"});
    test::Happen("pull 2");
    Told("dd if=/dev/urandom of=/dev/md4 bs=64k count=1 oflag=direct");
    EXPECT_TRUE(test::Comes([] { return Facts({"raid", "list"}).at(0).at("status") == "degraded"; }));
    test::Happen("plug 2 --blank");
    Succeeds({"raid", "replace", "--yes", "--wait", "md4", DiskInBay("2")});
    const char *const expected[] = {
        R"("event":"array-started","object":"md4")",
        R"("event":"disk-out","object":"sdb","detail":"bay 2")",
        R"("event":"member-failed","object":"md4","detail":"/dev/sdb")",
        R"("event":"array-degraded","object":"md4")",
        R"("event":"disk-in","object":"sdg","detail":"bay 2")",
        R"("event":"member-added","object":"md4","detail":"/dev/sdg")",
        R"("event":"rebuild-begun","object":"md4","detail":"recover")",
        R"("event":"array-normal","object":"md4")",
    };
    for (const char *text : expected)
        EXPECT_TRUE(test::Comes([&] { return test::ReadFile("/tmp/watched").find(text) != std::string::npos; }))
            << text << test::ReadFile("/tmp/watched");
    Told("kill " + pid);
}

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
    Succeeds({"raid", "create", "--yes", "--level", "5", "--no-sync", "md2", "sda", "sdb", "sdc"});
    Succeeds({"volume", "create", "--yes", "1", "md2"});
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
