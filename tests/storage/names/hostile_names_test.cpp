// Whatever is passed for a disk, an array, a group or a volume: nothing runs, and nothing outside its folder is opened.
#include "support/hostile_names.h"

#include "tavo_disk.h"
#include "tavo_lvm.h"
#include "tavo_partition.h"
#include "tavo_raid.h"

#include "storage/storage_scene.h"
#include "support/test.h"

#include <cstdint>

using test::MakeList;

namespace {

using HostileNames = test::StorageScene;

TEST_F(HostileNames, RunNothing)
{
    Model("supportraid=\"yes\"\n");
    tree_.Put("/proc/partitions", "   8  0  98304 sda\n");
    tree_.Put("/proc/mounts", "");
    ::unlink(test::kCanary);
    const int version = 7;
    const RAIDINFO raid = {5, "/dev/md5", RAID_LEVEL_5, 1, 0, 1 << 30, 1 << 20, 4, 4, 0, nullptr};
    const test::List good = MakeList({"/dev/md2"});
    const auto layout = std::make_unique<TavoPartitionLayout>();
    std::vector<std::string> names = test::HostileNames();
    ASSERT_GE(names.size(), 200u);
    for (const char *group :
         {"/dev/vg1 /etc", "/dev/vg/../../etc", "/dev/vg1;x", "/dev/vg1/lv", "/dev/vg..", "/dev/vg1\n"})
        names.push_back(group);
    for (const std::string &text : names) {
        const char *const name = text.c_str();
        const test::List list = MakeList({text.empty() ? std::string("x") : text});
        RAIDINFO bad = raid;
        bad.szPath[text.copy(bad.szPath, sizeof bad.szPath - 1)] = 0;
        const RAIDREQUEST by_path = {name, nullptr, 2, 0, 1, 0, list.get(), 1};
        const RAIDREQUEST by_member = {"/dev/md2", nullptr, 2, 0, 1, 0, list.get(), 1};
        RAIDSUPERBLOCK superblock;
        RAIDINFO *read = nullptr;
        LVMPV pv;
        LVMVG vg;
        char room[64];
        const auto refused = [name](auto... results) {
            EXPECT_THAT((std::vector<int64_t>{results...}), testing::Each(-1)) << name;
        };
        refused(
            PartitionCreate(name, PARTITION_SYSTEM, &version), PartitionClean(name, PARTITION_SYSTEM | PARTITION_DATA),
            PartitionCleanRAID(name, 1), PartitionAddTable(name), RCPartitionConfigs(1, name, nullptr, nullptr),
            TAVOCheckSpecialDevice(name), RAIDInfoGet(name, &read), RAIDSBGet(name, &superblock), RAIDSBClean(name),
            RAIDSBCleanByUUID(nullptr, name), RAIDUUIDGet(name, room, sizeof room), RAIDDiskIsUsedByRAID(name, nullptr),
            RAIDStop(name), RAIDAssemble("/dev/md2", name), RAIDAssemble(name, "b7e9ed0e:bf1ea758:5bf5fba6:7c359649"),
            RAIDCreate(&by_path), RAIDCreate(&by_member), RAIDAdd(&raid, name), RAIDAdd(&bad, "/dev/sda3"),
            RAIDAddRobustCheck(&raid, name), RAIDRemove(&bad), RAIDRemoveDisk(&raid, name), RAIDDevCountChange(&bad, 2),
            RAIDMigrate2RAID6(&raid, list.get()), RAIDBadSectorRemap(name, 1), TAVORAIDMdStripeCacheSizeSet(name, 1),
            TAVORAIDMdTuningPerformance(name), LVMPvCreate(name), LVMPvRemove(name), LVMPvSBGet(name, &pv),
            LVMVgCreate(name, good.get()), LVMVgCreate("/dev/vg1", list.get()), LVMVgRemove(name),
            LVMVgRename(name, nullptr, "vg2"), LVMVgRename("/dev/vg1", nullptr, name), LVMVgSBGet(name, &vg),
            LVMLvCreate(name, "lv"), LVMLvCreate("/dev/vg1", name), LVMCreate(list.get(), "/dev/vg1", "lv", nullptr, 0),
            LVMRemove(name, "lv"), LVMRemoveLV(name), LVMGetLVPath(name, room, sizeof room));
        EXPECT_EQ(BlTAVOCheckPartitionLayout(name, 1, nullptr), 0) << name;
        EXPECT_EQ(PartitionIsExtended(name), 0) << name;
        uint64_t number = 7;
        DISKINFO *info = nullptr;
        EXPECT_NE(TAVODiskUSBGetInfo(name, &number), 0) << name;
        EXPECT_NE(TAVOLnxDiskGetModel(name, room, sizeof room), 0) << name;
        EXPECT_NE(TAVODiskIsMvSocDriver(name), 1) << name;
        EXPECT_NE(DiskInfoGet(name, &info), 1) << name;
        DiskPartitionsLayoutGet(name, layout.get());
        EXPECT_EQ(layout->nEntry, 0) << name;
        DiskDDStatusGet(name, &number, &number);
        EXPECT_EQ(number, 7u) << name;
    }
    EXPECT_THAT(commands_.Commands(), testing::IsEmpty());
    for (const std::string &path : tree_.Opened())
        EXPECT_EQ(path.find(".."), path.npos) << path;
    EXPECT_NE(::access(test::kCanary, F_OK), 0);
}

}  // namespace
