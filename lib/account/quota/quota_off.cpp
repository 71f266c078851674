// Switches quotas off for a volume.
#include "tavo_quota.h"

#include "account/detail/quota_command.h"
#include "core/detail/guard.h"

namespace {

constexpr tavo::QuotaCommand kOff{"quotaoff %s%d > /dev/null 2>&1 ", ERR_QUOTA_OFF};

}  // namespace

extern "C" int TAVOQuotaOff(int nVolume)
{
    return Guard([&] {
        if (!tavo::IsVolumeMounted(nVolume))
            return Fail(ERR_BAD_PARAMETERS);
        const int code = tavo::RunQuotaCommand(kOff, nVolume);
        return code == 0 ? 0 : Fail(code);
    });
}
