// tavoctl storage, volume and the verbs that mend arrays, on real disks: from blank disks to a volume, through a disk
// that is pulled, and back after everything was stopped.
#include "run_tavoctl.h"
#include "support/machine.h"
#include "support/test.h"

#include <nlohmann/json.hpp>

namespace {

using nlohmann::json;
using test::IsRefused;
using test::Succeeds;
using test::Told;

class MachineVolumes : public test::MachineTest {
  protected:
    void TearDown() override
    {
        if (test::OnMachine())
            Told("umount /volume* 2>/dev/null; /usr/lib/tavo-machine/reset; rm -rf /dev/vg* /volume*");
    }
};

json Facts(const test::Words &words)
{
    const test::Ran ran = test::Tavoctl(words);
    EXPECT_EQ(ran.status, 0) << testing::PrintToString(words) << ran;
    return test::Facts(ran);
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
    return Named(Facts({"disk", "list", "--json"}), "bay", bay).value("disk", "");
}

TEST_F(MachineVolumes, ThreeCommandsFromBlankDisksToAVolumeThatOutlivesADisk)
{
    PlugLarge(4);
    Succeeds({"partition", "create", "--yes", "sda", "sdb", "sdc", "sdd"});
    Succeeds({"raid", "create", "--yes", "--level", "5", "--no-sync", "md2", "sda3", "sdb3", "sdc3", "sdd3"});
    Succeeds({"volume", "create", "--yes", "1", "md2"});
    const std::string sum = Told("head -c 8M /dev/urandom >/volume1/data && sync && sha256sum </volume1/data");

    json tree = Facts({"storage", "--json"});
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
    EXPECT_TRUE(test::Comes([] { return Facts({"raid", "list", "--json"}).at(0).at("status") == "degraded"; }));
    EXPECT_EQ(Facts({"raid", "list", "--json"}).at(0).at("failed"), json({"/dev/sdc3"}));
    const json bay = Named(Facts({"disk", "list", "--json"}), "bay", "3");
    EXPECT_EQ(bay.at("state"), "pulled");
    EXPECT_EQ(bay.at("role"), json({"md2"}));
    IsRefused({"raid", "replace", "--yes", "md2", "sdb3", "sde"}, "/dev/sdb3 is in sync");
    IsRefused({"raid", "replace", "--yes", "md2", "sdb"}, "is a member already");
    IsRefused({"raid", "replace", "--yes", "md2", "sde"}, "take a larger one", 1);
    test::Happen("plug 3 --blank 4800");
    const std::string disk = DiskInBay("3");
    EXPECT_NE(disk, "sdc") << "md2 still has that name";
    Succeeds({"raid", "replace", "--yes", "--wait", "md2", disk});
    EXPECT_EQ(Facts({"raid", "list", "--json"}).at(0).at("status"), "normal");
    Succeeds({"raid", "speed", "--most", "500000", "md2"});
    Succeeds({"raid", "scrub", "--wait", "md2"});
    EXPECT_EQ(Facts({"raid", "info", "--json", "md2"}).at("mismatches"), 0);
    EXPECT_EQ(Facts({"raid", "info", "--json", "md2"}).at("most_speed"), 500000);
    Told("echo 3 >/proc/sys/vm/drop_caches");
    EXPECT_EQ(Told("sha256sum </volume1/data"), sum);

    // Everything stopped, as after a start of the system.
    const int open_file = ::open("/volume1/data", O_RDONLY | O_CLOEXEC);
    IsRefused({"volume", "unmount", "1"}, "programs have files open there");
    ::close(open_file);
    Succeeds({"volume", "unmount", "1"});
    EXPECT_EQ(Facts({"volume", "check", "--json", "1"}).at("state"), "clean");
    Succeeds({"raid", "stop", "--yes", "md2"});
    const json stopped = Facts({"raid", "list", "--all", "--json"});
    ASSERT_EQ(stopped.size(), 1u);
    EXPECT_EQ(stopped[0].at("array"), "md2");
    EXPECT_EQ(stopped[0].at("status"), "stopped");
    EXPECT_EQ(stopped[0].at("members").size(), 4u);
    Succeeds({"raid", "assemble", "--all"});
    EXPECT_EQ(Facts({"raid", "assemble", "--all", "--json"}).at("changed"), false);
    Succeeds({"volume", "mount", "--all"});
    EXPECT_EQ(Facts({"volume", "mount", "--json", "1"}).at("changed"), false);
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
    EXPECT_EQ(Facts({"state", "apply", "--json", dir / "box.json"}).at("changed"), true);
    EXPECT_THAT(Facts({"state", "show", "--json"}).at("quotas"),
                testing::Contains(json({{"volume", 1}, {"user", "anna"}, {"limit_kib", 2048}})));
    EXPECT_EQ(Told("readlink /var/services/music"), "/volume1/music\n");
    Told("mkdir -m 777 /volume1/open; su -s /bin/sh anna -c 'head -c 3M /dev/zero >/volume1/open/full' 2>/dev/null; "
         "true");
    const long written = std::stol(Told("stat -c %s /volume1/open/full"));
    EXPECT_TRUE(written > 1024 * 1024 && written <= 2048 * 1024) << "the limit is 2 MiB, not " << written;
    EXPECT_EQ(Facts({"state", "apply", "--json", dir / "box.json"}).at("changed"), false);
    EXPECT_EQ(Facts({"state", "diff", "--json", dir / "box.json"}), json::array());
    Succeeds({"service", "disable", "media"});
    Told("quotaoff /volume1");
    Succeeds({"user", "delete", "--yes", "anna"});
}

TEST_F(MachineVolumes, AVolumeGrowsWithItsArray)
{
    Succeeds({"raid", "create", "--yes", "--level", "1", "--size", "40", "--no-sync", "md2", "sda", "sdb"});
    Succeeds({"volume", "create", "--yes", "3", "md2"});
    EXPECT_EQ(Facts({"volume", "grow", "--json", "3"}).at("changed"), false);
    const uint64_t before = Facts({"volume", "list", "--json"}).at(0).at("capacity");
    Told("echo x >/volume3/file");
    Succeeds({"raid", "grow", "--yes", "--wait", "md2"});
    EXPECT_EQ(Facts({"raid", "grow", "--json", "md2"}).at("changed"), false);
    Succeeds({"volume", "grow", "3"});
    EXPECT_GT(Facts({"volume", "list", "--json"}).at(0).at("capacity"), before * 2);
    EXPECT_EQ(Told("cat /volume3/file"), "x\n");
    EXPECT_EQ(Facts({"volume", "grow", "--json", "3"}).at("changed"), false);
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
    EXPECT_EQ(Facts({"raid", "list", "--json"}), json::array());
    IsRefused({"raid", "assemble", "md2"}, "--force says what may be lost", 1);
    const test::Ran asked = test::Tavoctl({"raid", "assemble", "--force", "md2"});
    EXPECT_EQ(asked.status, 2) << asked;
    EXPECT_THAT(asked.err, testing::ContainsRegex("/dev/sda: slot 0, [0-9]+ events"));
    EXPECT_THAT(asked.err, testing::HasSubstr("may be lost or damaged"));
    EXPECT_EQ(test::Tavoctl({"raid", "assemble", "--yes", "--force", "md2"}).status, 0);
    EXPECT_EQ(Facts({"raid", "list", "--json"}).at(0).at("status"), "degraded");
    EXPECT_EQ(Told("head -c 1M /dev/md2 | wc -c"), "1048576\n");
}

TEST_F(MachineVolumes, WatchTellsOfDisksAndArrays)
{
    const std::string pid = Told("tavoctl watch --json >/tmp/watched 2>&1 & echo $! && sleep 3");
    Succeeds({"raid", "create", "--yes", "--level", "1", "--no-sync", "md4", "sda", "sdb"});
    test::Happen("pull 2");
    Told("dd if=/dev/urandom of=/dev/md4 bs=64k count=1 oflag=direct");
    EXPECT_TRUE(test::Comes([] { return Facts({"raid", "list", "--json"}).at(0).at("status") == "degraded"; }));
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

}  // namespace
