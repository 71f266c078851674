// Arrays that do not run.
#include "storage/stopped_arrays.h"

#include "storage/arrays.h"
#include "storage/device.h"

#include <algorithm>
#include <cstdio>
#include <set>

namespace tavoctl {
namespace {

// The kernel accepts a member whose count is one lower: the power failed while the members were being updated.
constexpr int tolerated = 1;

std::string DiskOf(const std::string &member)
{
    return member.substr(0, member.find_last_not_of("0123456789") + 1);
}

void FreeRecord(RAIDINFO *info)
{
    while (info->pMembers) {
        const std::unique_ptr<RAIDMEMBER> first(info->pMembers);
        info->pMembers = first->pNext;
    }
    delete info;
}

void TakeIn(std::vector<StoppedArray> &arrays, const std::string &path, const RAIDSUPERBLOCK &superblock)
{
    auto array = std::find_if(arrays.begin(), arrays.end(),
                              [&](const StoppedArray &known) { return known.uuid == superblock.szUuid; });
    if (array == arrays.end())
        array = arrays.insert(arrays.end(),
                              {superblock.szArray, superblock.szUuid, superblock.fLevel, superblock.nMember, {}});
    array->members.push_back({path, superblock.iRole, superblock.nEvent});
}

}  // namespace

int StoppedArray::UpToDate() const
{
    int newest = 0;
    for (const StoppedMember &member : members)
        newest = std::max(newest, member.events);
    std::set<int> held;
    for (const StoppedMember &member : members)
        if (member.slot >= 0 && member.events + tolerated >= newest)
            held.insert(member.slot);
    return static_cast<int>(held.size());
}

int StoppedArray::Needed() const
{
    return slots - std::max(RAIDParityDiskCount(level, slots), 0);
}

bool StoppedArray::OnUsb() const
{
    return std::any_of(members.begin(), members.end(),
                       [](const StoppedMember &member) { return BayOf(DiskOf(member.path)) == "usb"; });
}

std::vector<std::string> StoppedArray::Describe() const
{
    std::vector<std::string> lines;
    for (const StoppedMember &member : members)
        lines.push_back(member.path + ": " +
                        (member.slot < 0 ? std::string("spare") : "slot " + std::to_string(member.slot)) + ", " +
                        std::to_string(member.events) + " events");
    return lines;
}

std::shared_ptr<const RAIDINFO> StoppedArray::Record() const
{
    const std::shared_ptr<RAIDINFO> info(new RAIDINFO(), FreeRecord);
    std::snprintf(info->szPath, sizeof info->szPath, "%s", path.c_str());
    info->fLevel = level;
    info->nSlot = slots;
    info->nWorking = static_cast<int32_t>(members.size());
    RAIDMEMBER **end = &info->pMembers;
    for (const StoppedMember &member : members) {
        *end = new RAIDMEMBER();
        std::snprintf((*end)->szPath, sizeof(*end)->szPath, "%s", member.path.c_str());
        (*end)->nState = member.slot < 0 ? RAID_MEMBER_SPARE : RAID_MEMBER_ACTIVE;
        end = &(*end)->pNext;
    }
    return info;
}

std::vector<StoppedArray> StoppedArrays(bool wake)
{
    RefuseToWakeAny(wake, "read the superblocks");
    std::set<std::string> taken;  // members and UUIDs of the arrays that run
    for (const Array &array : ReadArrays()) {
        for (const std::string &member : Members(*array, ~0))
            taken.insert(member);
        char uuid[64];
        if (RAIDUUIDGet(array->szPath, uuid, sizeof uuid) == 1)
            taken.insert(uuid);
    }
    std::vector<StoppedArray> arrays;
    for (const std::string &name : DeviceNames()) {
        const std::string path = DevicePath(name);
        RAIDSUPERBLOCK superblock;
        RefuseUnreadable(path, "read the superblock of " + path);
        if (name.starts_with("sd") && !taken.contains(path) && RAIDSBGet(path.c_str(), &superblock) == 1 &&
            superblock.szUuid[0] && !taken.contains(superblock.szUuid))
            TakeIn(arrays, path, superblock);
    }
    std::sort(arrays.begin(), arrays.end(), [](const StoppedArray &left, const StoppedArray &right) {
        return left.path.size() != right.path.size() ? left.path.size() < right.path.size() : left.path < right.path;
    });
    return arrays;
}

}  // namespace tavoctl
