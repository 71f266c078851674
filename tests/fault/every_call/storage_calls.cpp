// Disks, partitions, arrays and volume groups: two disks with a mirror and a volume group on it, as the kernel shows them.
#include "call.h"
#include "support/captured_log.h"
#include "support/container_text.h"
#include "support/device_tree.h"
#include "support/recorded_calls.h"
#include "support/scratch_dir.h"

#include <cerrno>
#include <cstdlib>
#include <cstring>

#include <fcntl.h>
#include <linux/fs.h>
#include <linux/hdreg.h>
#include <linux/major.h>
#include <linux/raid/md_u.h>
#include <scsi/sg.h>
#include <sys/syscall.h>
#include <unistd.h>

namespace every_call {
namespace {

using test::MakeList;

constexpr const char *kUuid = "495e879a:4e806313:a484c744:9c844bd2";

// What the appliance's driver adds.
constexpr unsigned long kArrayStatus = 0x80040961;
constexpr unsigned long kSyncStatus = 0x80140960;

// The kernel's answers. A real request is made for show, so that it can be failed like every other system call.
int Answer(int, unsigned long request, void *argument)
{
    if (WasFailed(::syscall(SYS_ioctl, -1, request, argument)))
        return -1;
    if (request == BLKGETSIZE64) {
        const uint64_t bytes = uint64_t{1} << 30;
        std::memcpy(argument, &bytes, sizeof bytes);
    } else if (request == GET_ARRAY_INFO) {
        mdu_array_info_t info = {};
        info.level = 1;
        info.raid_disks = info.nr_disks = info.working_disks = 2;
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
    TLIBSZLIST *paths = MakeList({"/dev/sda3", "/dev/sdb3"}).release();

    Mirror()
    {
        std::strcpy(members[0].szPath, "/dev/sda3");
        std::strcpy(members[1].szPath, "/dev/sdb3");
        members[0].nState = members[1].nState = RAID_MEMBER_ACTIVE;
        members[0].pNext = &members[1];
        info.nArray = 2;
        std::strcpy(info.szPath, "/dev/md2");
        info.fLevel = RAID_LEVEL_1;
        info.nStatus = RAID_STATUS_NORMAL;
        info.cbArray = info.cbMember = uint64_t{96} << 20;
        info.nSlot = info.nWorking = 2;
        info.pMembers = members;
    }
    ~Mirror() { TLIBSzListFree(paths); }
    Mirror(const Mirror &) = delete;
    Mirror &operator=(const Mirror &) = delete;
};

struct OpenDevice {
    explicit OpenDevice(const char *path) : fd(::open(path, O_RDONLY | O_CLOEXEC)) {}
    ~OpenDevice() { ::close(fd); }
    OpenDevice(const OpenDevice &) = delete;
    OpenDevice &operator=(const OpenDevice &) = delete;
    int fd;
};

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
            CALL(DiskContainerGet, 0,
                 {
                     int kind = 0;
                     run(f, "/dev/sda", &kind);
                     run.Show(kind);
                 }),
            CALL(DiskDDStatusGet, kAnswers,
                 {
                     uint64_t done = 0;
                     uint64_t total = 0;
                     run(f, "/dev/sda", &done, &total);
                 }),
            CALL(DiskInfoEnum, kAnswers,
                 {
                     DISKLIST *list = nullptr;
                     run(f, static_cast<const int *>(nullptr), &list);
                     DiskInfoEnumFree(list);
                 }),
            CALL(DiskInfoEnumFree, 0,
                 {
                     DISKLIST *list = nullptr;
                     DiskInfoEnum(nullptr, &list);
                     run(f, list);
                 }),
            CALL(DiskInfoFree, 0,
                 {
                     DISKINFO *info = nullptr;
                     DiskInfoGet("/dev/sda", &info);
                     run(f, info);
                 }),
            CALL(DiskInfoGet, kAnswers,
                 {
                     DISKINFO *info = nullptr;
                     run(f, "/dev/sda", &info);
                     DiskInfoFree(info);
                 }),
            CALL(DiskIsExist, kAnswers, { run(f, "/dev/sda"); }),
            CALL(DiskListPush, 0,
                 {
                     DISKINFO info = {};
                     DISKLIST *list = nullptr;
                     run(f, &list, &info);
                     std::free(list);
                 }),
            CALL(DiskPartitionsLayoutGet, kLeavesCode,
                 {
                     auto *layout = static_cast<TavoPartitionLayout *>(std::calloc(1, sizeof(TavoPartitionLayout)));
                     run(f, "sda", layout);
                     run.Show(layout->nEntry);
                     std::free(layout);
                 }),
            CALL(DiskPartitionsLayoutInit, 0,
                 {
                     auto *layout = static_cast<TavoPartitionLayout *>(std::calloc(1, sizeof(TavoPartitionLayout)));
                     run(f, layout);
                     std::free(layout);
                 }),
            CALL(DiskPathParse, 0,
                 {
                     DISKPATH path = {};
                     run(f, "/dev/sda3", &path);
                     run.Show(path.nPartition);
                 }),
            CALL(DiskSizeGet, 0,
                 {
                     uint64_t sectors = 0;
                     run(f, "/dev/sda", &sectors);
                     run.Show(static_cast<long long>(sectors));
                 }),
            CALL(SmartDataRead, 0,
                 {
                     unsigned char page[512] = {};
                     run(f, "/dev/sda", page, 0);
                 }),
            CALL(TAVODiskEnum, kAnswers,
                 {
                     int32_t *numbers = nullptr;
                     run(f, int{DISK_ENUM_INTERNAL}, &numbers);
                     std::free(numbers);
                 }),
            CALL(TAVODiskGetDevnameFromFd, kAnswers,
                 {
                     const OpenDevice device("/dev/sda");
                     std::free(run(f, device.fd));
                 }),
            CALL(TAVODiskGetFileSBTimerSetting, kAnswers, { run(f); }),
            CALL(TAVODiskGetInfo, 0,
                 {
                     TAVODISKINFO *info = nullptr;
                     run(f, 1, 2048, &info);
                     std::free(info);
                 }),
            CALL(TAVODiskGetStandbyTimer, kAnswers,
                 {
                     int minutes = 0;
                     run(f, &minutes);
                 }),
            CALL(TAVODiskIsMvSocDriver, kAnswers, { run(f, "/dev/sda"); }),
            CALL(TAVODiskIsSSD, kAnswers, { run(f, "/dev/sda"); }),
            CALL(TAVODiskPartitionNumGet, 0,
                 {
                     char base[32] = "";
                     run(f, "/dev/sda3", base, 32);
                     run.Show(base);
                 }),
            CALL(TAVODiskSetFileSBTimerSetting, kLeavesCode, { run(f, 20); }),
            CALL(TAVODiskSetStandby, kAnswers, { run(f); }),
            CALL(TAVODiskSetStandbySeconds, kAnswers, { run(f, 600); }),
            CALL(TAVODiskSetStandbyTimer, kAnswers, { run(f, 20); }),
            CALL(TAVODiskTemperatureC, kAnswers, { run(f, "/dev/sda"); }),
            CALL(TAVODiskTemperatureGet, 0, { run(f, "/dev/sda"); }),
            CALL(TAVODiskUSBGetInfo, kAnswers,
                 {
                     uint64_t size = 0;
                     run(f, "sda", &size);
                 }),
            CALL(TAVODiskWriteCacheGet, kAnswers, { run(f, "/dev/sda"); }),
            CALL(TAVODiskWriteCacheSet, 0, { run(f, "/dev/sda", 1); }),
            CALL(TAVOIDiskCheckPower, 0,
                 {
                     unsigned char state = 0;
                     run(f, "/dev/sda", &state);
                     run.Show(state);
                 }),
            CALL(TAVOIDiskEnterSleep, 0, { run(f, "/dev/sda"); }),
            CALL(TAVOIDiskFlushBuffer, kNoCode, { run(f, "/dev/sda"); }),
            CALL(TAVOIDiskRawOpen, 0,
                 {
                     const int fd = run(f, "/dev/sda");
                     if (fd >= 0)
                         ::close(fd);
                 }),
            CALL(TAVOIDiskReset, 0, { run(f, "/dev/sda"); }),
            CALL(TAVOIDiskSetDiskStandby, 0, { run(f, "/dev/sda"); }),
            CALL(TAVOIDiskSetDiskStandbyTimer, 0, { run(f, "/dev/sda", 120); }),
            CALL(TAVOIsUSBDiskFATNoPartition, kAnswers, { run(f, "/dev/sdb"); }),
            CALL(TAVOLnxDiskGetModel, 0,
                 {
                     char model[64] = "";
                     run(f, "/dev/sda", model, 64);
                     run.Show(model);
                 }),
            CALL(ata_command_interface, 0,
                 {
                     const OpenDevice device("/dev/sda");
                     unsigned char data[512] = {};
                     run(f, device.fd, int{DISK_COMMAND_CHECK_POWER}, data);
                 }),
            CALL(marvell_command_interface, kAnswers,
                 {
                     const OpenDevice device("/dev/sda");
                     unsigned char data[512] = {};
                     run(f, device.fd, int{DISK_COMMAND_CHECK_POWER}, data);
                 }),

            // Partitions.
            CALL(BlTAVOCheckPartitionLayout, kAnswers,
                 {
                     int version = 0;
                     run(f, "/dev/sda", 1, &version);
                 }),
            CALL(PartType, 0, { run.Show(f[1].nType); }),
            CALL(PartitionAddTable, 0, { run(f, "/dev/sdb"); }),
            CALL(PartitionClean, kAnswers, { run(f, "/dev/sda", int{PARTITION_DATA}); }),
            CALL(PartitionCleanRAID, 0, { run(f, "/dev/sda", 3); }),
            CALL(PartitionCreate, kAnswers,
                 {
                     const int version = 7;
                     run(f, "/dev/sda", int{PARTITION_DATA}, &version);
                 }),
            CALL(PartitionIsExtended, kAnswers, { run(f, "/dev/sda1"); }),
            CALL(PartitionLayoutGet, kAnswers,
                 {
                     int version = 0;
                     run(f, &version);
                 }),
            CALL(PartitionPathEnum, 0,
                 {
                     TLIBSZLIST *list = MakeList({}).release();
                     const PARTITIONFILTER filter = {"sda", 0};
                     run(f, &filter, &list);
                     run.Show(list);
                     TLIBSzListFree(list);
                 }),
            CALL(PartitionTableTypeGet, 0,
                 {
                     int kind = 0;
                     run(f, "/dev/sda", &kind);
                     run.Show(kind);
                 }),
            CALL(RCPartitionConfigs, kAnswers,
                 {
                     int64_t start = 0;
                     uint32_t type = 0;
                     run(f, 1, "sda", &start, &type);
                 }),
            CALL(TAVOCheckSpecialDevice, kAnswers, { run(f, "/dev/sda"); }),
            CALL(TAVOPartitionLayoutIdxGet, 0, { run(f, 7, 1); }),
            CALL(grgAllTavoPartLayout, 0, { run.Show(f[0].nVersion); }),

            // Arrays.
            CALL(RAIDAdd, 0,
                 {
                     const Mirror mirror;
                     run(f, &mirror.info, "/dev/sdb3");
                 }),
            CALL(RAIDAddRobustCheck, kAnswers,
                 {
                     const Mirror mirror;
                     run(f, &mirror.info, "/dev/sdb3");
                 }),
            CALL(RAIDAssemble, 0, { run(f, "/dev/md2", kUuid); }),
            CALL(RAIDAssembleByInfo, 0,
                 {
                     const Mirror mirror;
                     run(f, &mirror.info);
                 }),
            CALL(RAIDBadSectorRemap, kAnswers, { run(f, "/dev/md2", 1); }),
            CALL(RAIDCreate, kLeavesCode,
                 {
                     const Mirror mirror;
                     RAIDREQUEST request = {};
                     request.szPath = "/dev/md2";
                     request.fLevel = RAID_LEVEL_1;
                     request.nSlot = 2;
                     request.pslMembers = mirror.paths;
                     run(f, &request);
                 }),
            CALL(RAIDDevCountChange, 0,
                 {
                     const Mirror mirror;
                     run(f, &mirror.info, 3);
                 }),
            CALL(RAIDDiskCount, 0,
                 {
                     const Mirror mirror;
                     run(f, mirror.members, int{RAID_MEMBER_ACTIVE});
                 }),
            CALL(RAIDDiskIsUsedByRAID, kAnswers,
                 {
                     int array = 0;
                     run(f, "/dev/sda", &array);
                 }),
            CALL(RAIDExpansible, kAnswers,
                 {
                     const Mirror mirror;
                     uint64_t size = 0;
                     run(f, &mirror.info, &size);
                 }),
            CALL(RAIDInfoDup, 0,
                 {
                     const Mirror mirror;
                     RAIDInfoFree(run(f, &mirror.info));
                 }),
            CALL(RAIDInfoEnum, kAnswers,
                 {
                     RAIDLIST *list = nullptr;
                     run(f, &list);
                     RAIDListFree(list);
                 }),
            CALL(RAIDInfoFree, 0,
                 {
                     const Mirror mirror;
                     run(f, RAIDInfoDup(&mirror.info));
                 }),
            CALL(RAIDInfoGet, kAnswers,
                 {
                     RAIDINFO *info = nullptr;
                     run(f, "/dev/md2", &info);
                     RAIDInfoFree(info);
                 }),
            CALL(RAIDIoctlStatus, 0,
                 {
                     const OpenDevice device("/dev/md2");
                     int status = 0;
                     run(f, device.fd, &status);
                     run.Show(status);
                 }),
            CALL(RAIDListCount, 0,
                 {
                     RAIDLIST node = {nullptr, nullptr};
                     run(f, &node);
                 }),
            CALL(RAIDListFree, 0,
                 {
                     const Mirror mirror;
                     RAIDLIST *list = nullptr;
                     RAIDListPush(&list, RAIDInfoDup(&mirror.info));
                     run(f, list);
                 }),
            CALL(RAIDListPush, 0,
                 {
                     const Mirror mirror;
                     RAIDLIST *list = nullptr;
                     RAIDINFO *copy = RAIDInfoDup(&mirror.info);
                     if (run(f, &list, copy) < 0)
                         RAIDInfoFree(copy);
                     RAIDListFree(list);
                 }),
            CALL(RAIDListSearch, 0,
                 {
                     Mirror mirror;
                     RAIDLIST node = {&mirror.info, nullptr};
                     RAIDINFO *found = nullptr;
                     run(f, &node, "/dev/md2", &found);
                 }),
            CALL(RAIDMdStripeSizeGet, kAnswers, { run(f, "/dev/md2"); }),
            CALL(RAIDMigrate2RAID6, kAnswers,
                 {
                     Mirror mirror;
                     mirror.info.fLevel = RAID_LEVEL_5;
                     run(f, &mirror.info, mirror.paths);
                 }),
            CALL(RAIDParityDiskCount, 0, { run(f, int{RAID_LEVEL_5}, 4); }),
            CALL(RAIDPathEnum, kAnswers,
                 {
                     TLIBSZLIST *list = MakeList({}).release();
                     run(f, &list);
                     run.Show(list);
                     TLIBSzListFree(list);
                 }),
            CALL(RAIDRebuildStatusGet, 0,
                 {
                     const OpenDevice device("/dev/md2");
                     RAIDPROGRESS progress = {};
                     run(f, device.fd, &progress);
                     run.Show(progress.nState);
                 }),
            CALL(RAIDRebuildingMultiWait, kAnswers,
                 {
                     TLIBSZLIST *list = MakeList({"/dev/md2"}).release();
                     run(f, list);
                     TLIBSzListFree(list);
                 }),
            CALL(RAIDRebuildingWait, kAnswers, { run(f, "/dev/md2"); }),
            CALL(RAIDRemove, kLeavesCode,
                 {
                     const Mirror mirror;
                     run(f, &mirror.info);
                 }),
            CALL(RAIDRemoveDisk, 0,
                 {
                     const Mirror mirror;
                     run(f, &mirror.info, "/dev/sdb3");
                 }),
            CALL(RAIDRemoveMultiple, kAnswers,
                 {
                     TLIBSZLIST *list = MakeList({"/dev/md2"}).release();
                     run(f, list);
                     TLIBSzListFree(list);
                 }),
            CALL(RAIDReplaceDisk, kAnswers,
                 {
                     const Mirror mirror;
                     run(f, &mirror.info, "/dev/sdb3", "/dev/sdc3");
                 }),
            CALL(RAIDSBClean, 0, { run(f, "/dev/sda3"); }),
            CALL(RAIDSBCleanByUUID, kAnswers,
                 {
                     const Mirror mirror;
                     run(f, &mirror.info, kUuid);
                 }),
            CALL(RAIDSBEnum, kAnswers,
                 {
                     const Mirror mirror;
                     RAIDSBENTRY *entries = nullptr;
                     run(f, mirror.paths, &entries);
                     std::free(entries);
                 }),
            CALL(RAIDSBGet, kAnswers,
                 {
                     RAIDSUPERBLOCK superblock = {};
                     run(f, "/dev/sda3", &superblock);
                 }),
            CALL(RAIDSizeUnallocGet, kLeavesCode,
                 {
                     const Mirror mirror;
                     uint64_t size = 0;
                     run(f, &mirror.info, &size);
                 }),
            CALL(RAIDStatusDecide, 0,
                 {
                     const Mirror mirror;
                     mdu_array_info_t info = {};
                     info.level = 1;
                     info.raid_disks = info.nr_disks = info.working_disks = 2;
                     int status = 0;
                     run(f, &info, mirror.members, &status);
                     run.Show(status);
                 }),
            CALL(RAIDStop, 0, { run(f, "/dev/md2"); }),
            CALL(RAIDUUIDGet, kAnswers,
                 {
                     char uuid[64] = "";
                     run(f, "/dev/md2", uuid, 64);
                 }),
            CALL(TAVORAIDMdStripeCacheSizeSet, 0, { run(f, "/dev/md2", 512); }),
            CALL(TAVORAIDMdTuningPerformance, kAnswers, { run(f, "/dev/md2"); }),

            // Volume groups.
            CALL(LVMCleanIllegal, kAnswers, { run(f); }),
            CALL(LVMCreate, kAnswers,
                 {
                     TLIBSZLIST *list = MakeList({"/dev/md2"}).release();
                     char uuid[64] = "";
                     run(f, list, "/dev/vg1", "lv", uuid, 64);
                     TLIBSzListFree(list);
                 }),
            CALL(LVMGetLVPath, kAnswers,
                 {
                     char path[128] = "";
                     run(f, "/dev/md2", path, 128);
                 }),
            CALL(LVMIsSupport, kAnswers, { run(f); }),
            CALL(LVMLvCreate, 0, { run(f, "/dev/vg1", "lv"); }),
            CALL(LVMPvCreate, 0, { run(f, "/dev/md2"); }),
            CALL(LVMPvExpand, kAnswers,
                 {
                     LVMVGINFO *info = LVMVgInfoAlloc();
                     TLIBSzListPush(&info->pslPvs, "/dev/md2");
                     run(f, info);
                     LVMVgInfoFree(info);
                 }),
            CALL(LVMPvParseLine, 0,
                 {
                     LVMPV pv = {};
                     run(f, "  /dev/md2|vg1|lSQfeY-dso4-NzXN-Hbdv-wh1J-WThm-cNRXi7|1", &pv);
                     run.Show(pv.szPv);
                 }),
            CALL(LVMPvRemove, 0, { run(f, "/dev/md2"); }),
            CALL(LVMPvSBEnum, kAnswers,
                 {
                     LVMPVLIST *list = nullptr;
                     run(f, &list);
                     LVMPvSBListFree(list);
                 }),
            CALL(LVMPvSBGet, kAnswers,
                 {
                     LVMPV pv = {};
                     run(f, "/dev/md2", &pv);
                 }),
            CALL(LVMPvSBListFree, 0,
                 {
                     const LVMPV pv = {};
                     LVMPVLIST *list = nullptr;
                     LVMPvSBListPush(&list, &pv);
                     run(f, list);
                 }),
            CALL(LVMPvSBListPush, 0,
                 {
                     const LVMPV pv = {};
                     LVMPVLIST *list = nullptr;
                     run(f, &list, &pv);
                     LVMPvSBListFree(list);
                 }),
            CALL(LVMPvScan, 0, { run(f); }),
            CALL(LVMRemove, kAnswers, { run(f, "/dev/vg1", "vg"); }),
            CALL(LVMRemoveLV, kAnswers, { run(f, "/dev/md2"); }),
            CALL(LVMVgCreate, 0,
                 {
                     TLIBSZLIST *list = MakeList({"/dev/md2"}).release();
                     run(f, "/dev/vg1", list);
                     TLIBSzListFree(list);
                 }),
            CALL(LVMVgInfoAlloc, 0, { LVMVgInfoFree(run(f)); }),
            CALL(LVMVgInfoFree, 0, { run(f, LVMVgInfoAlloc()); }),
            CALL(LVMVgRemove, 0, { run(f, "/dev/vg1"); }),
            CALL(LVMVgRename, 0, { run(f, "/dev/vg1", "vg1", "vg2"); }),
            CALL(LVMVgSB2Info, kAnswers,
                 {
                     const LVMVG group = Group();
                     LVMVGINFO *info = LVMVgInfoAlloc();
                     run(f, &group, info);
                     LVMVgInfoFree(info);
                 }),
            CALL(LVMVgSBGet, kAnswers,
                 {
                     LVMVG group = {};
                     run(f, "/dev/vg1", &group);
                 }),
            CALL(LVMVgSBListSearch, 0,
                 {
                     LVMVGINFO *info = LVMVgInfoAlloc();
                     std::strcpy(info->szVg, "/dev/vg1");
                     const LVMVGLIST node = {info, nullptr};
                     const LVMVGKEY key = {"/dev/vg1", nullptr};
                     LVMVGINFO *found = nullptr;
                     run(f, &node, &key, &found);
                     LVMVgInfoFree(info);
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
