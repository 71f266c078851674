// Disks, partitions, arrays and volume groups: two disks with a mirror and a volume group on it, as the kernel shows them.
#include "arguments.h"
#include "support/device_tree.h"
#include "support/recorded_calls.h"
#include "support/test.h"

#include <linux/fs.h>
#include <linux/hdreg.h>
#include <linux/major.h>
#include <linux/raid/md_u.h>
#include <scsi/sg.h>
#include <sys/syscall.h>

namespace every_call {
namespace {

constexpr const char *kUuid = "495e879a:4e806313:a484c744:9c844bd2";

// What the appliance's driver adds.
constexpr unsigned long kArrayStatus = 0x80040961;
constexpr unsigned long kSyncStatus = 0x80140960;

mdu_array_info_t ArrayOfTwo()
{
    mdu_array_info_t info = {};
    info.level = 1;
    info.raid_disks = info.nr_disks = info.working_disks = 2;
    return info;
}

// The kernel's answers. A real request is made for show, so that it can be failed like every other system call.
int Answer(int, unsigned long request, void *argument)
{
    if (WasFailed(::syscall(SYS_ioctl, -1, request, argument)))
        return -1;
    if (request == BLKGETSIZE64) {
        const uint64_t bytes = uint64_t{1} << 30;
        std::memcpy(argument, &bytes, sizeof bytes);
    } else if (request == GET_ARRAY_INFO) {
        const mdu_array_info_t info = ArrayOfTwo();
        std::memcpy(argument, &info, sizeof info);
    } else if (request == GET_DISK_INFO) {
        auto *disk = static_cast<mdu_disk_info_t *>(argument);
        if (disk->number < 2) {
            disk->major = 8;
            disk->minor = 3 + 16 * disk->number;
            disk->state = 6;  // active and in sync
        }
    } else if (request == HDIO_DRIVE_CMD && argument) {
        auto *data = static_cast<unsigned char *>(argument);
        if (data[0] == 0xB0 && data[2] == 0xD0) {
            data[4 + 2] = 194;
            data[4 + 2 + 5] = 38;
        } else if (data[0] == 0xE5) {
            data[2] = 0xFF;
        }
    } else if (request == kArrayStatus || request == kSyncStatus) {
        std::memset(argument, 0, request == kArrayStatus ? sizeof(int) : sizeof(RAIDPROGRESS));
    } else if (request == HDIO_GET_IDENTITY || request == HDIO_SET_DMA || request == HDIO_DRIVE_RESET ||
               request == BLKFLSBUF || request == HDIO_DRIVE_CMD) {
        return 0;
    } else {
        errno = ENOTTY;
        return -1;
    }
    return 0;
}

struct Storage {
    test::DeviceTree tree;
    test::RecordedCalls calls{Answer};

    Storage()
    {
        const test::CapturedLog quiet;
        tree.Put("/etc.defaults/tavoinfo.conf", "maxdisks=2\nsupportraid=yes\n");
        tree.Put("/proc/partitions", "major minor  #blocks  name\n\n   8        0    1048576 sda\n"
                                     "   8        1     98304 sda1\n   8        3     98304 sda3\n"
                                     "   8       16    1048576 sdb\n   8       19     98304 sdb3\n");
        tree.Put("/proc/mounts", "/dev/vg1/lv /volume1 ext4 rw 0 0\n");
        for (const char *disk : {"sda", "sdb"}) {
            const std::string name = disk;
            tree.AddDisk("/dev/" + name, 8, name == "sda" ? 0 : 16, std::string(512, '\0'));
            tree.AddDisk("/dev/" + name + "3", 8, name == "sda" ? 3 : 19, std::string(512, '\0'));
            tree.Put("/sys/block/" + name + "/device/model", "model\n");
            tree.Put("/sys/block/" + name + "/size", "2097152\n");
            tree.Put("/sys/block/" + name + "/queue/rotational", "1\n");
            tree.Put("/sys/block/" + name + "/queue/read_ahead_kb", "128\n");
            tree.Put("/sys/block/" + name + "/" + name + "3/size", "196608\n");
            tree.Put("/sys/block/" + name + "/" + name + "3/start", "2048\n");
        }
        tree.Link("/sys/dev/block/8:3", "../../block/sda/sda3");
        tree.Link("/sys/dev/block/8:19", "../../block/sdb/sdb3");
        tree.AddDisk("/dev/md2", 9, 2);
        tree.Put("/sys/block/md2/md/array_state", "clean\n");
        tree.Put("/sys/block/md2/md/sync_completed", "none\n");
        tree.Put("/sys/block/md2/md/sync_action", "idle\n");
        tree.Put("/sys/block/md2/md/stripe_cache_size", "256\n");
        tree.Put("/sys/block/md2/size", "196608\n");
        tree.Put("/sys/block/md2/queue/read_ahead_kb", "128\n");
        test::WriteFile("/tmp/tavodd.sda", "10 20\n");
    }
};

// A mirror as a caller describes it.
struct Mirror {
    RAIDMEMBER members[2] = {};
    RAIDINFO info = {};
    RAIDLIST node = {&info, nullptr};
    Owned<TLIBSZLIST> paths = ListOf({"/dev/sda3", "/dev/sdb3"});

    explicit Mirror(int level = RAID_LEVEL_1)
    {
        std::strcpy(members[0].szPath, "/dev/sda3");
        std::strcpy(members[1].szPath, "/dev/sdb3");
        members[0].nState = members[1].nState = RAID_MEMBER_ACTIVE;
        members[0].pNext = &members[1];
        info.nArray = 2;
        std::strcpy(info.szPath, "/dev/md2");
        info.fLevel = level;
        info.nStatus = RAID_STATUS_NORMAL;
        info.cbArray = info.cbMember = uint64_t{96} << 20;
        info.nSlot = info.nWorking = 2;
        info.pMembers = members;
    }

    operator RAIDINFO *() { return &info; }
    operator RAIDMEMBER *() { return members; }
    operator RAIDLIST *() { return &node; }
    operator TLIBSZLIST *() { return paths; }
};

Made<::close> OpenDevice(const char *path)
{
    return Made<::close>{::open(path, O_RDONLY | O_CLOEXEC)};
}

Made<LVMVgInfoFree> VgInfo(const char *pv = nullptr)
{
    LVMVGINFO *info = LVMVgInfoAlloc();
    if (pv)
        TLIBSzListPush(&info->pslPvs, pv);
    return Made<LVMVgInfoFree>{info};
}

// What a function makes: its last argument receives it.
template <class T, class Function, class... Args>
T *From(Function &function, Args... args)
{
    T *made = nullptr;
    function(args..., &made);
    return made;
}

LVMVG Group()
{
    LVMVG group = {};
    std::strcpy(group.szVg, "/dev/vg1");
    std::strcpy(group.szUuid, "lSQfeY-dso4-NzXN-Hbdv-wh1J-WThm-cNRXi7");
    return group;
}

}  // namespace

Family StorageFamily()
{
    Family family = {
        "Storage",
        {
            // Disks.
            CALL(DiskContainerGet, 0, "/dev/sda", Var<int>()),
            CALL(DiskDDStatusGet, kAnswers, "/dev/sda", Var<uint64_t>(), Var<uint64_t>()),
            CALL(DiskInfoEnum, kAnswers, nullptr, Made<DiskInfoEnumFree>()),
            CALL(DiskInfoEnumFree, 0, From<DISKLIST>(DiskInfoEnum, nullptr)),
            CALL(DiskInfoFree, 0, From<DISKINFO>(DiskInfoGet, "/dev/sda")),
            CALL(DiskInfoGet, kAnswers, "/dev/sda", Made<DiskInfoFree>()),
            CALL(DiskIsExist, kAnswers, "/dev/sda"),
            CALL(DiskListPush, 0, Made<std::free, DISKLIST *>(), Var<DISKINFO>()),
            CALL(DiskPartitionsLayoutGet, kLeavesCode, "sda", Record<&TavoPartitionLayout::nEntry>()),
            CALL(DiskPartitionsLayoutInit, 0, Record<&TavoPartitionLayout::nEntry>()),
            CALL(DiskPathParse, 0, "/dev/sda3", Record<&DISKPATH::nPartition>()),
            CALL(DiskSizeGet, 0, "/dev/sda", Var<uint64_t>()),
            CALL(SmartDataRead, 0, "/dev/sda", Array<unsigned char, 512>(), 0),
            CALL(TAVODiskEnum, kAnswers, int{DISK_ENUM_INTERNAL}, Made<std::free, int32_t *>()),
            BODY(TAVODiskGetDevnameFromFd, kAnswers, { std::free(run(f, OpenDevice("/dev/sda"))); }),
            CALL(TAVODiskGetFileSBTimerSetting, kAnswers),
            CALL(TAVODiskGetInfo, 0, 1, 2048, Made<std::free, TAVODISKINFO *>()),
            CALL(TAVODiskGetStandbyTimer, kAnswers, Var<int>()),
            CALL(TAVODiskIsMvSocDriver, kAnswers, "/dev/sda"),
            CALL(TAVODiskIsSSD, kAnswers, "/dev/sda"),
            CALL(TAVODiskPartitionNumGet, 0, "/dev/sda3", Text<32>(), 32),
            CALL(TAVODiskSetFileSBTimerSetting, kLeavesCode, 20),
            CALL(TAVODiskSetStandby, kAnswers),
            CALL(TAVODiskSetStandbySeconds, kAnswers, 600),
            CALL(TAVODiskSetStandbyTimer, kAnswers, 20),
            CALL(TAVODiskTemperatureC, kAnswers, "/dev/sda"),
            CALL(TAVODiskTemperatureGet, 0, "/dev/sda"),
            CALL(TAVODiskUSBGetInfo, kAnswers, "sda", Var<uint64_t>()),
            CALL(TAVODiskWriteCacheGet, kAnswers, "/dev/sda"),
            CALL(TAVODiskWriteCacheSet, 0, "/dev/sda", 1),
            CALL(TAVOIDiskCheckPower, 0, "/dev/sda", Var<unsigned char>()),
            CALL(TAVOIDiskEnterSleep, 0, "/dev/sda"),
            CALL(TAVOIDiskFlushBuffer, kNoCode, "/dev/sda"),
            BODY(TAVOIDiskRawOpen, 0, { ::close(run(f, "/dev/sda")); }),
            CALL(TAVOIDiskReset, 0, "/dev/sda"),
            CALL(TAVOIDiskSetDiskStandby, 0, "/dev/sda"),
            CALL(TAVOIDiskSetDiskStandbyTimer, 0, "/dev/sda", 120),
            CALL(TAVOIsUSBDiskFATNoPartition, kAnswers, "/dev/sdb"),
            CALL(TAVOLnxDiskGetModel, 0, "/dev/sda", Text<64>(), 64),
            CALL(ata_command_interface, 0, OpenDevice("/dev/sda"), int{DISK_COMMAND_CHECK_POWER},
                 Array<unsigned char, 512>()),
            CALL(marvell_command_interface, kAnswers, OpenDevice("/dev/sda"), int{DISK_COMMAND_CHECK_POWER},
                 Array<unsigned char, 512>()),

            // Partitions.
            CALL(BlTAVOCheckPartitionLayout, kAnswers, "/dev/sda", 1, Var<int>()),
            BODY(PartType, 0, { run.Show(f[1].nType); }),
            CALL(PartitionAddTable, 0, "/dev/sdb"),
            CALL(PartitionClean, kAnswers, "/dev/sda", int{PARTITION_DATA}),
            CALL(PartitionCleanRAID, 0, "/dev/sda", 3),
            CALL(PartitionCreate, kAnswers, "/dev/sda", int{PARTITION_DATA}, Var<int>{7}),
            CALL(PartitionIsExtended, kAnswers, "/dev/sda1"),
            CALL(PartitionLayoutGet, kAnswers, Var<int>()),
            CALL(PartitionPathEnum, 0, Var<PARTITIONFILTER>{{"sda", 0}}, ListOf({})),
            CALL(PartitionTableTypeGet, 0, "/dev/sda", Var<int>()),
            CALL(RCPartitionConfigs, kAnswers, 1, "sda", Var<int64_t>(), Var<uint32_t>()),
            CALL(TAVOCheckSpecialDevice, kAnswers, "/dev/sda"),
            CALL(TAVOPartitionLayoutIdxGet, 0, 7, 1),
            BODY(grgAllTavoPartLayout, 0, { run.Show(f[0].nVersion); }),

            // Arrays.
            CALL(RAIDAdd, 0, Mirror(), "/dev/sdb3"),
            CALL(RAIDAddRobustCheck, kAnswers, Mirror(), "/dev/sdb3"),
            CALL(RAIDAssemble, 0, "/dev/md2", kUuid),
            CALL(RAIDAssembleByInfo, 0, Mirror()),
            CALL(RAIDBadSectorRemap, kAnswers, "/dev/md2", 1),
            BODY(RAIDCreate, kLeavesCode,
                 {
                     Mirror mirror;
                     RAIDREQUEST request = {};
                     request.szPath = "/dev/md2";
                     request.fLevel = RAID_LEVEL_1;
                     request.nSlot = 2;
                     request.pslMembers = mirror;
                     run(f, &request);
                 }),
            CALL(RAIDDevCountChange, 0, Mirror(), 3),
            CALL(RAIDDiskCount, 0, Mirror(), int{RAID_MEMBER_ACTIVE}),
            CALL(RAIDDiskIsUsedByRAID, kAnswers, "/dev/sda", Var<int>()),
            CALL(RAIDExpansible, kAnswers, Mirror(), Var<uint64_t>()),
            BODY(RAIDInfoDup, 0, { RAIDInfoFree(run(f, Mirror())); }),
            CALL(RAIDInfoEnum, kAnswers, Made<RAIDListFree>()),
            CALL(RAIDInfoFree, 0, RAIDInfoDup(Mirror())),
            CALL(RAIDInfoGet, kAnswers, "/dev/md2", Made<RAIDInfoFree>()),
            CALL(RAIDIoctlStatus, 0, OpenDevice("/dev/md2"), Var<int>()),
            CALL(RAIDListCount, 0, Mirror()),
            BODY(RAIDListFree, 0,
                 {
                     RAIDLIST *list = nullptr;
                     RAIDListPush(&list, RAIDInfoDup(Mirror()));
                     run(f, list);
                 }),
            BODY(RAIDListPush, 0,
                 {
                     RAIDINFO *copy = RAIDInfoDup(Mirror());
                     if (run(f, Made<RAIDListFree>(), copy) < 0)
                         RAIDInfoFree(copy);
                 }),
            CALL(RAIDListSearch, 0, Mirror(), "/dev/md2", Var<RAIDINFO *>()),
            CALL(RAIDMdStripeSizeGet, kAnswers, "/dev/md2"),
            CALL(RAIDMigrate2RAID6, kAnswers, Mirror(RAID_LEVEL_5), Mirror()),
            CALL(RAIDParityDiskCount, 0, int{RAID_LEVEL_5}, 4),
            CALL(RAIDPathEnum, kAnswers, ListOf({})),
            CALL(RAIDRebuildStatusGet, 0, OpenDevice("/dev/md2"), Record<&RAIDPROGRESS::nState>()),
            CALL(RAIDRebuildingMultiWait, kAnswers, ListOf({"/dev/md2"})),
            CALL(RAIDRebuildingWait, kAnswers, "/dev/md2"),
            CALL(RAIDRemove, kLeavesCode, Mirror()),
            CALL(RAIDRemoveDisk, 0, Mirror(), "/dev/sdb3"),
            CALL(RAIDRemoveMultiple, kAnswers, ListOf({"/dev/md2"})),
            CALL(RAIDReplaceDisk, kAnswers, Mirror(), "/dev/sdb3", "/dev/sdc3"),
            CALL(RAIDSBClean, 0, "/dev/sda3"),
            CALL(RAIDSBCleanByUUID, kAnswers, Mirror(), kUuid),
            CALL(RAIDSBEnum, kAnswers, Mirror(), Made<std::free, RAIDSBENTRY *>()),
            CALL(RAIDSBGet, kAnswers, "/dev/sda3", Var<RAIDSUPERBLOCK>()),
            CALL(RAIDSizeUnallocGet, kLeavesCode, Mirror(), Var<uint64_t>()),
            CALL(RAIDStatusDecide, 0, Var<mdu_array_info_t>{ArrayOfTwo()}, Mirror(), Var<int>()),
            CALL(RAIDStop, 0, "/dev/md2"),
            CALL(RAIDUUIDGet, kAnswers, "/dev/md2", Text<64>(), 64),
            CALL(TAVORAIDMdStripeCacheSizeSet, 0, "/dev/md2", 512),
            CALL(TAVORAIDMdTuningPerformance, kAnswers, "/dev/md2"),

            // Volume groups.
            CALL(LVMCleanIllegal, kAnswers),
            CALL(LVMCreate, kAnswers, ListOf({"/dev/md2"}), "/dev/vg1", "lv", Text<64>(), 64),
            CALL(LVMGetLVPath, kAnswers, "/dev/md2", Text<128>(), 128),
            CALL(LVMIsSupport, kAnswers),
            CALL(LVMLvCreate, 0, "/dev/vg1", "lv"),
            CALL(LVMPvCreate, 0, "/dev/md2"),
            CALL(LVMPvExpand, kAnswers, VgInfo("/dev/md2")),
            CALL(LVMPvParseLine, 0, "  /dev/md2|vg1|lSQfeY-dso4-NzXN-Hbdv-wh1J-WThm-cNRXi7|1", Record<&LVMPV::szPv>()),
            CALL(LVMPvRemove, 0, "/dev/md2"),
            CALL(LVMPvSBEnum, kAnswers, Made<LVMPvSBListFree>()),
            CALL(LVMPvSBGet, kAnswers, "/dev/md2", Var<LVMPV>()),
            BODY(LVMPvSBListFree, 0,
                 {
                     const LVMPV pv = {};
                     LVMPVLIST *list = nullptr;
                     LVMPvSBListPush(&list, &pv);
                     run(f, list);
                 }),
            CALL(LVMPvSBListPush, 0, Made<LVMPvSBListFree>(), Var<LVMPV>()),
            CALL(LVMPvScan, 0),
            CALL(LVMRemove, kAnswers, "/dev/vg1", "vg"),
            CALL(LVMRemoveLV, kAnswers, "/dev/md2"),
            CALL(LVMVgCreate, 0, "/dev/vg1", ListOf({"/dev/md2"})),
            BODY(LVMVgInfoAlloc, 0, { LVMVgInfoFree(run(f)); }),
            CALL(LVMVgInfoFree, 0, LVMVgInfoAlloc()),
            CALL(LVMVgRemove, 0, "/dev/vg1"),
            CALL(LVMVgRename, 0, "/dev/vg1", "vg1", "vg2"),
            CALL(LVMVgSB2Info, kAnswers, Var<LVMVG>{Group()}, VgInfo()),
            CALL(LVMVgSBGet, kAnswers, "/dev/vg1", Var<LVMVG>()),
            BODY(LVMVgSBListSearch, 0,
                 {
                     const Made<LVMVgInfoFree> info = VgInfo();
                     std::strcpy(info.made->szVg, "/dev/vg1");
                     const LVMVGLIST node = {info, nullptr};
                     run(f, &node, Var<LVMVGKEY>{{"/dev/vg1", nullptr}}, Var<LVMVGINFO *>());
                 }),
        },
        [] { return std::make_shared<Storage>(); },
        {"/etc", "/usr/tavo/etc"},
    };
    // Most of these functions log the failure and set no code.
    for (Call &call : family.calls)
        call.flags |= kNoCode;
    return family;
}

}  // namespace every_call
