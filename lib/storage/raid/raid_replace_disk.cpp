// Puts a new disk into the place of a member.
#include "tavo_disk.h"
#include "tavo_partition.h"
#include "tavo_raid.h"

#include "core/detail/guard.h"
#include "core/detail/log.h"
#include "core/detail/model_setting.h"
#include "storage/detail/array_name.h"
#include "storage/detail/device_use.h"
#include "storage/detail/disk_path.h"
#include "storage/detail/disk_size.h"
#include "storage/detail/kernel_reach.h"
#include "storage/detail/kernel_text.h"
#include "storage/detail/member_size.h"
#include "storage/detail/open_disk.h"

#include <cstring>
#include <string>

namespace {

constexpr int kDataPartition = 3;

struct Replacement {
    const RAIDMEMBER *old = nullptr;  // null: a slot is free
    const RAIDMEMBER *neighbour = nullptr;
    std::string member;  // what joins the array
    int partition = 0;   // its number; 0 for the whole disk
    int version = 0;     // of the layout
    bool make_system = false;
    bool make_data = false;
};

bool IsGone(const RAIDMEMBER &member)
{
    return (member.nState & (RAID_MEMBER_FAILED | RAID_MEMBER_FATAL)) != 0 || !tavo::HasNode(member.szPath);
}

// The member that goes; with none given the only one that is failed or pulled.
bool ChooseOld(const RAIDINFO &info, const char *wanted, Replacement &plan)
{
    int members = 0;
    int gone = 0;
    for (const RAIDMEMBER *member = info.pMembers; member; member = member->pNext, ++members) {
        if (wanted ? std::strcmp(member->szPath, wanted) != 0 : !IsGone(*member))
            continue;
        plan.old = member;
        ++gone;
    }
    if (wanted && !plan.old)
        LogError("%s:%d %s is not a member of %s", wanted, info.szPath);
    else if (plan.old && plan.old->nState == RAID_MEMBER_ACTIVE && !IsGone(*plan.old))
        LogError("%s:%d %s is in order in %s: only a failed or pulled member is replaced", plan.old->szPath,
                 info.szPath);
    else if (gone > 1)
        LogError("%s:%d %s has lost more than one member: which one is replaced has to be said", info.szPath);
    else if (!plan.old && members >= info.nSlot)
        LogError("%s:%d %s has no failed or pulled member, and no free slot", info.szPath);
    else
        return true;
    return false;
}

bool ChooseNeighbour(const RAIDINFO &info, Replacement &plan)
{
    for (const RAIDMEMBER *member = info.pMembers; member; member = member->pNext) {
        if (member != plan.old && member->nState == RAID_MEMBER_ACTIVE && !IsGone(*member)) {
            plan.neighbour = member;
            return true;
        }
    }
    LogError("%s:%d %s has no member that is in order", info.szPath);
    return false;
}

// The sectors of the new disk that the array will get; -1, logged.
int64_t PlanPartitions(const char *disk, Replacement &plan)
{
    uint64_t sectors = 0;
    if (DiskSizeGet(disk, &sectors) != 1)
        return -1;
    const std::string path = plan.neighbour->szPath;
    const std::string neighbour(tavo::WithoutNumber(path));
    plan.partition = tavo::StrictNumber<int>(std::string_view(path).substr(neighbour.size())).value_or(0);
    plan.member = disk + (plan.partition ? std::to_string(plan.partition) : "");
    if (plan.partition == 0)
        return static_cast<int64_t>(sectors);
    const int raid = tavo::ModelHas("supportraid") ? 1 : 0;
    if (plan.partition > kDataPartition || BlTAVOCheckPartitionLayout(neighbour.c_str(), raid, &plan.version) != 1) {
        LogError("%s:%d %s has no partitions of the system", neighbour);
        return -1;
    }
    int version = 0;
    plan.make_system = BlTAVOCheckPartitionLayout(disk, raid, &version) != 1 || version != plan.version;
    plan.make_data = RCPartitionConfigs(kDataPartition, neighbour.c_str(), nullptr, nullptr) >= 0 &&
                     (plan.make_system || RCPartitionConfigs(kDataPartition, disk, nullptr, nullptr) < 0);
    const TAVOPARTLAYOUT &layout = grgAllTavoPartLayout[TAVOPartitionLayoutIdxGet(plan.version, raid)];
    if (plan.partition < kDataPartition)
        return static_cast<int64_t>(plan.partition == 1 ? layout.cSector1 : layout.cSector2);
    if (!plan.make_data)
        return RCPartitionConfigs(kDataPartition, disk, nullptr, nullptr);
    constexpr uint64_t large = uint64_t{1} << 32;  // such disks end with a copy of their table
    constexpr uint64_t copy = 33;
    const uint64_t around = static_cast<uint64_t>(layout.place2.nStart + layout.place2.cSector) +
                            uint64_t{layout.cGap} + (sectors > large ? copy : 0);
    return sectors > around ? static_cast<int64_t>(sectors - around) : 0;
}

// Superblock, bitmap and data need room; another member shows the size of the part before the data.
bool IsLargeEnough(const RAIDINFO &info, const Replacement &plan, int64_t sectors)
{
    const std::string name(tavo::WithoutDev(plan.neighbour->szPath));
    const uint64_t offset = tavo::KernelNumber(tavo::ArrayFile(info.nArray, "md/dev-" + name + "/offset")).value_or(0);
    const uint64_t room = static_cast<uint64_t>(sectors);
    return room >= offset && tavo::HoldsMember(info, room - offset);
}

std::string UserOfNew(const char *disk, const Replacement &plan)
{
    if (plan.make_system || plan.partition == 0)
        return tavo::UsedPartition(disk, 1, tavo::kLastPartition);
    return tavo::UsedPartition(disk, plan.partition, plan.partition);
}

// A superblock of an earlier array comes back with the partition that held it.
bool EraseOldSuperblock(const std::string &member)
{
    RAIDSUPERBLOCK superblock;
    return RAIDSBGet(member.c_str(), &superblock) != 1 || !superblock.szUuid[0] || RAIDSBClean(member.c_str()) == 0;
}

bool MakePartitions(const char *disk, const Replacement &plan)
{
    if (plan.make_system && PartitionCreate(disk, PARTITION_SYSTEM, &plan.version) != 0)
        return false;
    if (plan.make_data && PartitionCreate(disk, PARTITION_DATA, &plan.version) != 0)
        return false;
    const int last = plan.make_data ? kDataPartition : kDataPartition - 1;
    for (int number = plan.make_system ? 1 : kDataPartition; number <= last; ++number) {
        if (number != plan.partition && !EraseOldSuperblock(std::string(disk) + std::to_string(number)))
            return false;
    }
    // Of this array, too: mdadm does not add what it takes for a member that went away.
    return EraseOldSuperblock(plan.member);
}

}  // namespace

extern "C" int RAIDReplaceDisk(const RAIDINFO *pInfo, const char *szOld, const char *szNew)
{
    constexpr int redundant = RAID_LEVEL_1 | RAID_LEVEL_5 | RAID_LEVEL_6 | RAID_LEVEL_10;
    if (!pInfo || !tavo::IsArrayPath(pInfo->szPath) || (pInfo->fLevel & redundant) == 0 ||
        (szOld && !tavo::IsMemberPath(szOld)) || !tavo::IsMemberPath(szNew) || tavo::WithoutNumber(szNew) != szNew) {
        LogError("%s:%d Bad parameters");
        return Fail(ERR_BAD_PARAMETERS);
    }
    return Guard([&] {
        Replacement plan;
        if (!ChooseOld(*pInfo, szOld, plan) || !ChooseNeighbour(*pInfo, plan))
            return -1;
        const int64_t sectors = PlanPartitions(szNew, plan);
        if (sectors < 0)
            return -1;
        std::string hindrance = UserOfNew(szNew, plan);
        if (hindrance.empty())
            hindrance = tavo::DeviceBeyondReach(szNew);
        if (!hindrance.empty()) {
            LogError("%s:%d %s", hindrance);
            return -1;
        }
        if (!IsLargeEnough(*pInfo, plan, sectors)) {
            LogError("%s:%d '%s' is too small for '%s'", plan.member, pInfo->szPath);
            return Fail(ERR_NOT_ENOUGH_SPACE);
        }
        if (plan.old) {
            if (RAIDRemoveDisk(pInfo, plan.old->szPath) != 0)
                return -1;
            LogError("%s:%d [Info] %s removed from %s", plan.old->szPath, pInfo->szPath);
        }
        if (!MakePartitions(szNew, plan))
            return -1;
        if (plan.make_system || plan.make_data)
            LogError("%s:%d [Info] %s partitioned as %s", szNew, plan.neighbour->szPath);
        if (RAIDAddRobustCheck(pInfo, plan.member.c_str()) != 0)
            return -1;
        LogError("%s:%d [Info] %s added to %s", plan.member, pInfo->szPath);
        return 0;
    });
}
