// Removes the limits of users on every volume that has quotas.
#include "tavo_quota.h"

#include "account/detail/quota_volumes.h"
#include "core/detail/guard.h"
#include "core/detail/log.h"

extern "C" int TAVOQuotaCleanAllVols(const TLIBSZLIST *pslUsers)
{
    if (!pslUsers)
        return Fail(ERR_BAD_PARAMETERS);
    return Guard([&] {
        std::vector<tavo::MountedVolume> volumes;
        if (!tavo::ReadMountedVolumes(volumes))
            return Fail(ERR_READ_FAILED);
        int code = 0;
        for (const tavo::MountedVolume &volume : volumes) {
            if (!volume.has_user_quotas || TAVOQuotaClean(pslUsers, volume.device.c_str()) == 0)
                continue;
            code = tavoerrno;
            LogError("%s:%d Failed to clean quota on %s, errno=0x%X", volume.path, code);
        }
        return code == 0 ? 0 : Fail(code);
    });
}
