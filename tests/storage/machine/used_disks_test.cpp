// Real disks that were used before: they held a volume, were pulled, are large, or belong to another system.
#include "real_storage.h"
#include "support/captured_log.h"

#include <gmock/gmock.h>

namespace {

using test::BecomesNormal;
using test::Make;
using test::MembersOf;
using test::ReadArray;
using test::Shell;
using test::StatusOf;
using test::Told;
using testing::ElementsAre;
using testing::HasSubstr;

using MachineUsedDisks = test::LivedTest;

INSTANTIATE_TEST_SUITE_P(, MachineUsedDisks, testing::ValuesIn(test::Lives()), test::LifeName);

void MakeVolume()
{
    // An array made again of the same members shows the group that it held.
    LVMVG before;
    if (LVMVgSBGet("/dev/vg1", &before) == 1) {
        EXPECT_THAT(Shell("tavoctl volume create --yes 1 md2").output, HasSubstr("tavoctl lvm remove removes it"));
        Told("tavoctl lvm remove --yes vg1");
    }
    Told("tavoctl volume create --yes 1 md2 && dd if=/dev/urandom of=/volume1/data bs=64k count=64 && sync");
}

void DropVolume()
{
    Told("umount /volume1");
    EXPECT_EQ(LVMRemove("/dev/vg1", "lv"), 0);
    EXPECT_EQ(LVMVgRemove("/dev/vg1"), 0);
    EXPECT_EQ(LVMPvRemove("/dev/md2"), 0);
}

TEST_P(MachineUsedDisks, AVolumeIsMadeWhereOneWasBefore)
{
    const std::vector<std::string> members = {"/dev/sda", "/dev/sdb", "/dev/sdc"};
    ASSERT_EQ(Make("/dev/md2", RAID_LEVEL_5, members), 0);
    MakeVolume();
    DropVolume();
    MakeVolume();
    DropVolume();
    // And through an array that was made again.
    ASSERT_EQ(RAIDRemove(ReadArray("/dev/md2").get()), 0);
    ASSERT_EQ(Make("/dev/md2", RAID_LEVEL_5, members), 0);
    MakeVolume();
}

TEST_P(MachineUsedDisks, ADiskInUseIsNotHalfCleaned)
{
    test::PlugSystemDisks(2, 4800);
    ASSERT_EQ(Make("/dev/md0", RAID_LEVEL_1, {"/dev/sda1", "/dev/sdb1"}, {.mib = 64}), 0);
    const auto table = [] {
        return Told("head -c 512 /dev/sda | sha256sum; ls /sys/block/sda | grep sda");
    };
    const std::string before = table();
    EXPECT_EQ(PartitionClean("/dev/sda", PARTITION_SYSTEM), -1);
    EXPECT_EQ(PartitionCreate("/dev/sda", PARTITION_SYSTEM, nullptr), -1);
    EXPECT_EQ(table(), before);
    EXPECT_EQ(StatusOf("/dev/md0"), RAID_STATUS_NORMAL);
    // The system's array does not hinder the data partition; a file system on it does.
    Told("tavoctl volume create --yes 1 sda3");
    EXPECT_EQ(PartitionClean("/dev/sda", PARTITION_DATA), -1);
    EXPECT_EQ(table(), before);
    Told("tavoctl volume unmount 1");
    EXPECT_EQ(PartitionClean("/dev/sda", PARTITION_DATA), 0);
    EXPECT_EQ(PartitionCreate("/dev/sda", PARTITION_DATA, nullptr), 0);
    EXPECT_EQ(StatusOf("/dev/md0"), RAID_STATUS_NORMAL);
}

TEST_P(MachineUsedDisks, NoOldArrayComesBackAfterCleaning)
{
    test::PlugSystemDisks(2, 4800);
    for (const int number : {1, 2, 3}) {
        const std::string tail = std::to_string(number);
        ASSERT_EQ(Make("/dev/md" + std::to_string(number - 1), RAID_LEVEL_1, {"/dev/sda" + tail, "/dev/sdb" + tail},
                       {.mib = 16}),
                  0);
    }
    for (const char *array : {"/dev/md0", "/dev/md1", "/dev/md2"})
        ASSERT_EQ(RAIDStop(array), 0);
    for (const int bay : {1, 2}) {
        EXPECT_EQ(PartitionClean(test::Disk(bay).c_str(), PARTITION_SYSTEM | PARTITION_DATA), 0);
        test::Partition(bay);
    }
    EXPECT_EQ(Told("tavoctl raid assemble --all && tavoctl raid list --all --noheadings"), "");
    EXPECT_THAT(Told("cat /proc/mdstat"), testing::Not(HasSubstr("active")));
    for (const char *member : {"/dev/sda1", "/dev/sda2", "/dev/sda3", "/dev/sdb2"}) {
        RAIDSUPERBLOCK superblock;
        EXPECT_EQ(RAIDSBGet(member, &superblock), 0) << member;
    }
}

TEST_P(MachineUsedDisks, APulledDiskIsReplacedInItsBay)
{
    test::PlugSystemDisks(4, 4800);
    ASSERT_EQ(Make("/dev/md0", RAID_LEVEL_1, {"/dev/sda1", "/dev/sdb1", "/dev/sdc1", "/dev/sdd1"}, {.mib = 32}), 0);
    ASSERT_EQ(Make("/dev/md2", RAID_LEVEL_5, {"/dev/sda3", "/dev/sdb3", "/dev/sdc3", "/dev/sdd3"}, {.mib = 64}), 0);
    MakeVolume();
    const std::string sum = Told("sha256sum /volume1/data");

    test::Happen("pull 4");
    Told("dd if=/dev/urandom of=/volume1/more bs=64k count=16 && sync");
    ASSERT_TRUE(test::Eventually([] { return StatusOf("/dev/md2") == RAID_STATUS_DEGRADED; }));
    EXPECT_THAT(MembersOf("/dev/md2", RAID_MEMBER_FAILED), ElementsAre("/dev/sdd3"));
    uint64_t kib = 0;
    EXPECT_GE(RAIDExpansible(ReadArray("/dev/md2").get(), &kib), 0);

    // The arrays hold the disk's name until it is removed: of md0, which has not noticed, too.
    EXPECT_EQ(RAIDRemoveDisk(ReadArray("/dev/md2").get(), "/dev/sdd3"), 0);
    EXPECT_EQ(RAIDRemoveDisk(ReadArray("/dev/md0").get(), "/dev/sdd1"), 0);
    EXPECT_EQ(ReadArray("/dev/md0")->nWorking, 3);

    // A smaller disk will do: 64 MiB of each are used.
    test::Happen("plug 4 --blank 4700");
    ASSERT_TRUE(test::Eventually([] { return DiskIsExist("/dev/sdd") == 1; })) << "the bay has its name again";
    EXPECT_EQ(RAIDReplaceDisk(ReadArray("/dev/md2").get(), nullptr, "/dev/sdd"), 0);
    EXPECT_EQ(RAIDReplaceDisk(ReadArray("/dev/md0").get(), nullptr, "/dev/sdd"), 0);
    EXPECT_TRUE(BecomesNormal("/dev/md2"));
    EXPECT_TRUE(BecomesNormal("/dev/md0"));
    EXPECT_EQ(MembersOf("/dev/md2", RAID_MEMBER_ACTIVE).size(), 4u);
    Told("echo 3 >/proc/sys/vm/drop_caches");
    EXPECT_EQ(Told("sha256sum /volume1/data"), sum);
}

TEST_P(MachineUsedDisks, AnArrayStartsWithoutAMemberThatIsGone)
{
    const std::vector<std::string> members = {"/dev/sda", "/dev/sdb", "/dev/sdc", "/dev/sdd"};
    ASSERT_EQ(Make("/dev/md2", RAID_LEVEL_5, members), 0);
    const test::Array record = ReadArray("/dev/md2");
    ASSERT_EQ(RAIDStop("/dev/md2"), 0);
    ASSERT_EQ(RAIDAssembleByInfo(record.get()), 0);
    EXPECT_EQ(StatusOf("/dev/md2"), RAID_STATUS_NORMAL);
    ASSERT_EQ(RAIDStop("/dev/md2"), 0);
    test::Happen("pull 3");
    EXPECT_EQ(RAIDAssembleByInfo(record.get()), 0);
    EXPECT_EQ(StatusOf("/dev/md2"), RAID_STATUS_DEGRADED);
    // Its record has three members now, and mdadm asks for a fourth.
    const test::Array degraded = ReadArray("/dev/md2");
    ASSERT_EQ(RAIDStop("/dev/md2"), 0);
    EXPECT_EQ(RAIDAssembleByInfo(degraded.get()), 0);
    EXPECT_EQ(StatusOf("/dev/md2"), RAID_STATUS_DEGRADED);
    ASSERT_EQ(RAIDStop("/dev/md2"), 0);
    test::Happen("pull 4");
    EXPECT_EQ(RAIDAssembleByInfo(record.get()), -1) << "two of four";
    EXPECT_EQ(StatusOf("/dev/md2"), 0);
}

TEST_P(MachineUsedDisks, AllOfALargeDiskIsUsed)
{
    constexpr int tib = 1 << 20;
    test::PlugSystemDisks(2, 3 * tib);
    constexpr int64_t sectors = int64_t{6} << 30;
    int64_t start = 0;
    EXPECT_EQ(RCPartitionConfigs(3, "sda", &start, nullptr), sectors - 33 - 9437184);
    EXPECT_EQ(start, 9437184);
    uint64_t kernel = 0;
    ASSERT_EQ(DiskSizeGet("/dev/sda3", &kernel), 1);
    EXPECT_EQ(kernel, static_cast<uint64_t>(sectors - 33 - 9437184));
    int kind = 0;
    EXPECT_EQ(PartitionTableTypeGet("/dev/sda", &kind), 0);
    EXPECT_EQ(kind, PARTITION_TABLE_GPT);
    ASSERT_EQ(Make("/dev/md2", RAID_LEVEL_1, {"/dev/sda3", "/dev/sdb3"}), 0);
    EXPECT_GT(ReadArray("/dev/md2")->cbArray, uint64_t{2990} << 30);
    EXPECT_EQ(PartitionClean("/dev/sda", PARTITION_SYSTEM), -1) << "in use";
    EXPECT_EQ(RAIDRemove(ReadArray("/dev/md2").get()), 0);
    EXPECT_EQ(PartitionClean("/dev/sda", PARTITION_SYSTEM | PARTITION_DATA), 0);
    EXPECT_EQ(Told("ls /sys/block/sda | grep -c sda || true"), "0\n");
}

// Three disks of 8 TiB: the largest volume that fits, and one that this kernel could not reach.
TEST_P(MachineUsedDisks, AVolumeOfFifteenTebibytes)
{
    constexpr int tib = 1 << 20;
    test::PlugSystemDisks(3, 8 * tib);
    EXPECT_EQ(RCPartitionConfigs(3, "sdc", nullptr, nullptr), (int64_t{16} << 30) - 33 - 9437184);
    const std::vector<std::string> members = {"/dev/sda3", "/dev/sdb3", "/dev/sdc3"};
    for (const int level : {RAID_LEVEL_0, RAID_LEVEL_LINEAR}) {
        const test::CapturedLog log;
        EXPECT_EQ(Make("/dev/md2", level, members), -1);
        EXPECT_THAT(log.Texts(), testing::Contains(HasSubstr("larger than the 16 TiB")));
    }
    for (const std::string &member : members) {
        RAIDSUPERBLOCK superblock;
        EXPECT_EQ(RAIDSBGet(member.c_str(), &superblock), 0) << member;
    }
    ASSERT_EQ(Make("/dev/md2", RAID_LEVEL_5, members, {.mib = uint64_t{15} * tib / 2}), 0);
    EXPECT_EQ(ReadArray("/dev/md2")->cbArray, uint64_t{15} << 40);
    // The last block is there, and is not the first one. A file system would go on writing its tables for hours.
    ASSERT_EQ(LVMCreate(test::MakeList({"/dev/md2"}).get(), "/dev/vg1", "lv", nullptr, 0), 0);
    EXPECT_GT(std::stoull(Told("blockdev --getsize64 /dev/vg1/lv")), (uint64_t{15} << 40) - (uint64_t{8} << 20));
    Told("lv=$(readlink -f /dev/vg1/lv) && last=$(($(blockdev --getsize64 $lv) / 4096 - 1)) && "
         "head -c 4096 /dev/zero >/tmp/zero && head -c 4096 /dev/urandom >/tmp/random && "
         "dd if=/tmp/zero of=$lv bs=4096 oflag=direct && dd if=/tmp/random of=$lv bs=4096 seek=$last oflag=direct && "
         "sum() { md5sum | cut -c1-32; } && "
         "[ $(dd if=$lv bs=4096 skip=$last iflag=direct | sum) = $(sum </tmp/random) ] && "
         "[ $(dd if=$lv bs=4096 count=1 | sum) = $(sum </tmp/zero) ]");
}

TEST_P(MachineUsedDisks, LeavesAForeignStickAlone)
{
    test::Happen("plug usb --blank");
    const std::string stick = Told("for block in /sys/block/sd*; do "
                                   "case $(readlink -f $block) in */usb*) echo -n /dev/${block##*/};; esac; done");
    ASSERT_THAT(stick, testing::StartsWith("/dev/sd"));
    // A group that is not active, over nothing but the stick, and a stray physical volume on a disk.
    Told("tavoctl volume create --yes 9 " + stick + " && tavoctl volume unmount 9 && sync");
    test::PlugBlank(2);  // LVM takes no member of an array and no disk with a table
    ASSERT_EQ(LVMPvCreate("/dev/sdb"), 0);
    const std::string before = Told("blockdev --flushbufs " + stick + "; sha256sum " + stick);
    EXPECT_EQ(LVMCleanIllegal(), 0);
    ASSERT_EQ(Make("/dev/md2", RAID_LEVEL_1, {"/dev/sda", "/dev/sdb"}), 0) << "the stray one is gone";
    EXPECT_EQ(RAIDRemove(ReadArray("/dev/md2").get()), 0);
    EXPECT_EQ(PartitionClean("/dev/sda", PARTITION_SYSTEM | PARTITION_DATA), 0);
    EXPECT_EQ(Told("blockdev --flushbufs " + stick + "; sha256sum " + stick), before);
    EXPECT_EQ(Told("pvs --noheadings -o vg_name " + stick), "  vg9\n");
    test::Happen("pull usb");
}

TEST_P(MachineUsedDisks, AMountedDiskStaysAsItIs)
{
    // What it held may still have a superblock at the beginning, which a file system leaves alone.
    RAIDSUPERBLOCK superblock = {};
    RAIDSBGet("/dev/sde", &superblock);
    Told("mkfs.ext4 -q -F /dev/sde && mkdir -p /mnt/disk && mount -o ro,noload /dev/sde /mnt/disk");
    const std::string sum = "blockdev --flushbufs /dev/sde && sha256sum /dev/sde";
    const std::string before = Told(sum);
    for (const int parts : {+PARTITION_SYSTEM, +PARTITION_DATA, PARTITION_SYSTEM | PARTITION_DATA})
        EXPECT_EQ(PartitionClean("/dev/sde", parts), -1) << parts;
    EXPECT_EQ(PartitionCreate("/dev/sde", PARTITION_SYSTEM, nullptr), -1);
    EXPECT_NE(RAIDSBClean("/dev/sde"), 0);
    if (superblock.szUuid[0])
        RAIDSBCleanByUUID(nullptr, superblock.szUuid);
    LVMCleanIllegal();
    EXPECT_EQ(Told(sum), before);
    Told("umount /mnt/disk && e2fsck -f -n /dev/sde");
}

// Sectors of 4,096 bytes: every geometry of ours counts in 512.
TEST_P(MachineUsedDisks, OtherSectorsAreRefusedBeforeAnythingIsWritten)
{
    Told("truncate -s 64M /tmp/image && losetup -b 4096 /dev/loop0 /tmp/image");
    const std::string before = Told("sha256sum /tmp/image");
    EXPECT_NE(Shell("/sbin/sfdisk -M1 /dev/loop0").status, 0);
    EXPECT_THAT(Shell("/sbin/sfdisk -N1 -uS -q -f -j256 -z100 -tfd -F /dev/loop0").output, HasSubstr("4096"));
    EXPECT_EQ(PartitionAddTable("/dev/loop0"), -1);
    Told("losetup -d /dev/loop0");
    EXPECT_EQ(Told("sha256sum /tmp/image && rm /tmp/image"), before);
}

}  // namespace
