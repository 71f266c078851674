// Reads an array from the md driver and the kernel.
#include "tavo_raid.h"

#include "core/detail/guard.h"
#include "core/detail/log.h"
#include "core/detail/open_file.h"
#include "core/detail/owner.h"
#include "storage/detail/array_level.h"
#include "storage/detail/array_members.h"
#include "storage/detail/array_name.h"
#include "storage/detail/bounded_text.h"
#include "storage/detail/disk_size.h"
#include "storage/detail/kernel_text.h"

#include <cstring>
#include <memory>

namespace {

bool IsAbsent(int error)
{
    return error == ENOENT || error == ENXIO || error == ENODEV;
}

// Newer superblocks take sizes beyond the 32 bits of the driver's answer, so the kernel's files come first.
void FillSizes(RAIDINFO &info, const mdu_array_info_t &array, const tavo::Fd &device)
{
    constexpr uint64_t kib = 1024;
    const std::optional<uint64_t> sectors = tavo::KernelNumber(tavo::ArrayFile(info.nArray, "size"));
    if (sectors)
        info.cbArray = *sectors * tavo::kSectorSize;
    else if (!tavo::AskSize(device, info.cbArray))
        info.cbArray = 0;
    const std::optional<uint64_t> member = tavo::KernelNumber(tavo::ArrayFile(info.nArray, "md/component_size"));
    info.cbMember = member.value_or(array.size > 0 ? static_cast<uint64_t>(array.size) : 0) * kib;
}

// The appliance's driver knows; elsewhere the kernel's file does.
bool IsRebuilding(int number, const tavo::Fd &device)
{
    RAIDPROGRESS progress = {};
    if (::ioctl(device.Get(), tavo::kSyncStatusRequest, &progress) == 0)
        return progress.nState != 0;
    const std::optional<std::string> action = tavo::KernelText(tavo::ArrayFile(number, "md/sync_action"));
    return action && tavo::IsRebuildAction(action->c_str());
}

int Report(int code, const char *what, const char *path)
{
    const int error = errno;
    LogError("%s:%d Failed to %s %s, errno=%s", what, path, std::strerror(error));
    return Fail(code);
}

}  // namespace

extern "C" int RAIDInfoGet(const char *szPath, RAIDINFO **ppInfo)
{
    if (!ppInfo || !tavo::IsArrayPath(szPath))
        return Fail(ERR_BAD_PARAMETERS);
    return Guard([&] {
        const tavo::Fd device = tavo::OpenFd(szPath, O_RDONLY);
        if (!device)
            return IsAbsent(errno) ? 0 : Report(ERR_OPEN_FAILED, "open", szPath);
        mdu_array_info_t array = {};
        if (::ioctl(device.Get(), GET_ARRAY_INFO, &array) != 0)
            return IsAbsent(errno) ? 0 : Report(ERR_SIZE_UNKNOWN, "get array information of", szPath);
        const std::optional<int> level = tavo::LevelOfKernel(array.level);
        if (!level) {
            LogError("%s:%d unknown raid level: %d", array.level);
            return Fail(ERR_UNKNOWN);
        }
        std::unique_ptr<RAIDINFO, tavo::FreedBy<RAIDInfoFree>> owner(
            static_cast<RAIDINFO *>(std::calloc(1, sizeof(RAIDINFO))));
        if (!owner)
            return Fail(ERR_OUT_OF_MEMORY);
        RAIDINFO &info = *owner;
        info.nArray = *tavo::ArrayNumber(szPath);
        tavo::CopyBounded(info.szPath, szPath);
        info.fLevel = *level;
        info.nSlot = array.raid_disks;
        info.nWorking = array.working_disks;
        info.nFailed = array.failed_disks;
        if (!tavo::ReadMembers(device.Get(), info.nArray, array, &info.pMembers))
            return Fail(ERR_OUT_OF_MEMORY);
        if (RAIDStatusDecide(&array, info.pMembers, &info.nStatus) != 0)
            return -1;
        // An array without redundancy that lost a disk keeps its members' states.
        if (tavo::KernelText(tavo::ArrayFile(info.nArray, "md/array_state")) == "broken")
            info.nStatus = RAID_STATUS_CRASHED;
        FillSizes(info, array, device);
        info.fRebuilding = IsRebuilding(info.nArray, device) ? 1 : 0;
        *ppInfo = owner.release();
        return 1;
    });
}
