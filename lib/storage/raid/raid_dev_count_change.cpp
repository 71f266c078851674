// Changes the number of slots of an array.
#include "tavo_raid.h"

#include "core/detail/guard.h"
#include "core/detail/log.h"
#include "storage/detail/array_name.h"
#include "storage/detail/kernel_reach.h"
#include "storage/detail/kernel_text.h"
#include "storage/detail/partition_command.h"

namespace {

// A RAID 6 that was a RAID 5 has its second parity on its last member. mdadm changes it only with that option.
bool HasLayoutOfRaid5(const char *path)
{
    constexpr uint64_t first_such = 16;
    const int number = tavo::ArrayNumber(path).value_or(0);
    return tavo::KernelText(tavo::ArrayFile(number, "md/level")) == "raid6" &&
           tavo::KernelNumber(tavo::ArrayFile(number, "md/layout")).value_or(0) >= first_such;
}

}  // namespace

extern "C" int RAIDDevCountChange(const RAIDINFO *pInfo, int nSlot)
{
    if (!pInfo || !tavo::IsArrayPath(pInfo->szPath) || nSlot < 1) {
        LogError("%s:%d Bad parameters");
        return Fail(ERR_BAD_PARAMETERS);
    }
    return Guard([&] {
        const std::string beyond = tavo::ArrayBeyondReach(
            pInfo->szPath,
            {.level = pInfo->fLevel, .slots = nSlot, .member_limit = pInfo->cbMember, .members = nullptr});
        if (!beyond.empty()) {
            LogError("%s:%d %s", beyond);
            return -1;
        }
        auto result = tavo::RunDiskCommand("/sbin/mdadm --grow %s -n %d >/dev/null 2>&1\n", pInfo->szPath, nSlot);
        if (result.status != 0 && HasLayoutOfRaid5(pInfo->szPath))
            result = tavo::RunDiskCommand("/sbin/mdadm --grow %s -n %d --layout=preserve > /dev/null 2>&1",
                                          pInfo->szPath, nSlot);
        if (result.status == 0)
            return 0;
        LogError("%s:%d Failed to do '%s', err=%d", result.command, result.status);
        return -1;
    });
}
