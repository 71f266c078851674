// Switches quotas on for a volume.
#include "tavo_quota.h"

#include "account/detail/quota_command.h"
#include "core/detail/guard.h"
#include "core/detail/log.h"

namespace {

// The quota files of groups are made too: the mount options promise them, and quotacheck would miss them later.
constexpr tavo::QuotaCommand kSteps[] = {
    {"mount -o remount,usrquota,grpquota %s%d > /dev/null 2>&1", ERR_QUOTA_REMOUNT},
    {"quotacheck -c -g -u -F vfsv0 %s%d  > /dev/null 2>&1 ", ERR_QUOTA_CHECK},
    {"quotaon -F vfsv0 %s%d > /dev/null 2>&1 ", ERR_QUOTA_ON},
};

}  // namespace

extern "C" int TAVOQuotaInit(int nVolume)
{
    return Guard([&] {
        if (!tavo::IsVolumeMounted(nVolume))
            return Fail(ERR_BAD_PARAMETERS);
        for (const tavo::QuotaCommand &step : kSteps) {
            if (const tavo::Code code = tavo::RunQuotaCommand(step, nVolume)) {
                LogError("%s:%d Failed to switch quotas on for %s%d, tavoerr=0x%04X", tavo::kVolume, nVolume, code);
                return Fail(code);
            }
        }
        return 0;
    });
}
