// Real volumes on real arrays.
#include "real_storage.h"

#include <gmock/gmock.h>

namespace {

using test::Make;
using test::ReadArray;
using test::Shell;
using test::Told;
using testing::ElementsAre;
using testing::HasSubstr;
using testing::Not;

using MachineVolumes = test::LivedTest;

INSTANTIATE_TEST_SUITE_P(, MachineVolumes, testing::ValuesIn(test::Lives()), test::LifeName);

std::vector<std::string> AllPhysicalVolumes()
{
    LVMPVLIST *list = nullptr;
    EXPECT_GE(LVMPvSBEnum(&list), 0);
    std::vector<std::string> names;
    for (const LVMPVLIST *node = list; node; node = node->pNext)
        names.push_back(std::string(node->pv.szPv) + " " + node->pv.szVg);
    LVMPvSBListFree(list);
    return names;
}

// Those on arrays; what the disks held before may be foreign ones.
std::vector<std::string> PhysicalVolumes()
{
    std::vector<std::string> names = AllPhysicalVolumes();
    std::erase_if(names, [](const std::string &name) { return !name.starts_with("/dev/md"); });
    return names;
}

TEST_P(MachineVolumes, AreMadeRenamedExpandedAndRemoved)
{
    ASSERT_EQ(Make("/dev/md2", RAID_LEVEL_1, {"/dev/sda", "/dev/sdb"}, {.mib = 32}), 0);
    ASSERT_EQ(Make("/dev/md3", RAID_LEVEL_LINEAR, {"/dev/sdc", "/dev/sdd"}, {.sync = true}), 0);
    EXPECT_EQ(LVMPvSBGet("/dev/md2", nullptr), -1);
    LVMPV pv;
    EXPECT_EQ(LVMPvSBGet("/dev/md2", &pv), 0);
    LVMVG group;
    EXPECT_EQ(LVMVgSBGet("/dev/vg1", &group), 0);

    char uuid[256] = "";
    ASSERT_EQ(LVMCreate(test::MakeList({"/dev/md2", "/dev/md3"}).get(), "/dev/vg1", "lv", uuid, sizeof uuid), 0);
    EXPECT_THAT(PhysicalVolumes(), ElementsAre("/dev/md2 /dev/vg1", "/dev/md3 /dev/vg1"));
    ASSERT_EQ(LVMVgSBGet("/dev/vg1", &group), 1);
    EXPECT_STREQ(group.szUuid, uuid);
    EXPECT_EQ(Told("vgs --noheading -o vg_uuid vg1 | tr -d ' '"), std::string(uuid) + "\n");
    ASSERT_EQ(LVMPvSBGet("/dev/md3", &pv), 1);
    EXPECT_EQ(pv.nPv, 2);
    char volume[64] = "";
    EXPECT_EQ(LVMGetLVPath("/dev/md2", volume, sizeof volume), 1);
    EXPECT_STREQ(volume, "/dev/vg1/lv");
    // All of it is used, and it can be written.
    EXPECT_EQ(Told("vgs --noheading -o vg_free_count vg1 | tr -d ' '"), "0\n");
    Told("dd if=/dev/urandom of=/dev/vg1/lv bs=1M count=16 conv=fsync");
    const std::string sum = Told("head -c 16M /dev/vg1/lv | md5sum");

    ASSERT_EQ(LVMVgRename("/dev/vg1", nullptr, "vg2"), 0);
    EXPECT_EQ(LVMVgSBGet("/dev/vg1", &group), 0);
    ASSERT_EQ(LVMVgSBGet("/dev/vg2", &group), 1);
    EXPECT_STREQ(group.szUuid, uuid);
    ASSERT_EQ(LVMVgRename(nullptr, "vg2", "vg1"), 0);
    EXPECT_EQ(Told("head -c 16M /dev/vg1/lv | md5sum"), sum);

    // The array under it grows.
    const auto size = [] {
        return std::stoi(Told("pvs --noheading --units m --nosuffix -o pv_size /dev/md3 2>/dev/null"));
    };
    const int before = size();
    ASSERT_EQ(RAIDAdd(ReadArray("/dev/md3").get(), "/dev/sde"), 0);
    EXPECT_EQ(size(), before);
    ASSERT_EQ(LVMVgSBGet("/dev/vg1", &group), 1);
    LVMVGINFO *info = LVMVgInfoAlloc();
    ASSERT_EQ(LVMVgSB2Info(&group, info), 0);
    EXPECT_EQ(info->nPv, 2);
    // For another system's group that lacks disks pvresize fails after its work.
    EXPECT_EQ(LVMPvExpand(info), test::current_life == "lvm" ? -1 : 0);
    LVMVgInfoFree(info);
    EXPECT_GT(size(), before + 40);

    EXPECT_EQ(LVMRemove("/dev/vg1", "lv"), 0);
    EXPECT_EQ(LVMGetLVPath("/dev/md2", volume, sizeof volume), 0);
    EXPECT_EQ(LVMVgRemove("/dev/vg1"), 0);
    EXPECT_EQ(LVMVgSBGet("/dev/vg1", &group), 0);
    EXPECT_THAT(PhysicalVolumes(), ElementsAre("/dev/md2 ", "/dev/md3 "));
    EXPECT_EQ(LVMPvRemove("/dev/md2"), 0);
    EXPECT_EQ(LVMPvRemove("/dev/md3"), 0);
    EXPECT_THAT(PhysicalVolumes(), ElementsAre());
}

TEST_P(MachineVolumes, ADevicesVolumeGoesWithItsMountedSnapshots)
{
    ASSERT_EQ(Make("/dev/md2", RAID_LEVEL_1, {"/dev/sda", "/dev/sdb"}), 0);
    ASSERT_EQ(Make("/dev/md22", RAID_LEVEL_1, {"/dev/sdc", "/dev/sdd"}), 0);
    // The library makes neither snapshots nor volumes that leave room for them.
    for (const auto &[array, group] : {std::pair("/dev/md2", "/dev/vg1"), std::pair("/dev/md22", "/dev/vg2")}) {
        ASSERT_EQ(LVMPvCreate(array), 0);
        ASSERT_EQ(LVMVgCreate(group, test::MakeList({array}).get()), 0);
    }
    Told("lvcreate -q -W n -L 40M -n lv vg1 && mkfs.ext4 -q /dev/vg1/lv && lvcreate -q -s -L 8M -n lvs1 vg1/lv && "
         "mkdir -p /mnt/shot && mount -o ro,noload /dev/vg1/lvs1 /mnt/shot");
    // A device whose name begins with this one's, and a volume whose name does.
    Told("lvcreate -q -W n -L 40M -n lvsecond vg2 && mkfs.ext4 -q /dev/vg2/lvsecond && mkdir -p /mnt/other && mount "
         "/dev/vg2/lvsecond /mnt/other");
    EXPECT_EQ(LVMRemoveLV("/dev/md2"), 0);
    EXPECT_THAT(PhysicalVolumes(), ElementsAre("/dev/md22 /dev/vg2"));
    EXPECT_THAT(Told("cat /proc/mounts"), Not(HasSubstr("/mnt/shot")));
    EXPECT_THAT(Told("cat /proc/mounts"), HasSubstr("/mnt/other"));
    EXPECT_NE(Shell("ls -d /mnt/shot").status, 0);
    Told("echo x >/mnt/other/file && umount /mnt/other");
}

TEST_P(MachineVolumes, StrayPhysicalVolumesAreCleanedAndArraysAreNot)
{
    for (const int bay : {3, 4, 5})  // LVM takes no member of an array and no disk with a table
        test::PlugBlank(bay);
    ASSERT_EQ(Make("/dev/md2", RAID_LEVEL_1, {"/dev/sda", "/dev/sdb"}), 0);
    ASSERT_EQ(LVMCreate(test::MakeList({"/dev/md2"}).get(), "/dev/vg1", "lv", nullptr, 0), 0);
    ASSERT_EQ(LVMPvCreate("/dev/sdc"), 0);
    ASSERT_EQ(LVMCreate(test::MakeList({"/dev/sdd"}).get(), "/dev/vg7", "lv", nullptr, 0), 0);
    // While one is mounted nothing is removed.
    Told("tavoctl volume create --yes 8 sde");
    const std::vector<std::string> before = AllPhysicalVolumes();
    EXPECT_EQ(LVMCleanIllegal(), -1);
    EXPECT_EQ(AllPhysicalVolumes(), before);
    Told("umount /volume8");
    EXPECT_EQ(LVMCleanIllegal(), 0);
    EXPECT_THAT(AllPhysicalVolumes(), ElementsAre("/dev/md2 /dev/vg1"));
}

}  // namespace
