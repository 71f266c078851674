// Reads the space limit and the use of a user.
#include "tavo_quota.h"

#include "account/detail/quota_user.h"
#include "core/detail/guard.h"

#include <cerrno>
#include <cstddef>

#include <sys/quota.h>

static_assert(sizeof(TAVOQUOTA) == 16 && offsetof(TAVOQUOTA, cbUsed) == 8, "programs of the appliance read these");

extern "C" int TAVOQuotaGet(const char *szUser, const char *szDevice, TAVOQUOTA *pQuota)
{
    if (!szUser || !*szUser || !szDevice || !*szDevice || !pQuota)
        return Fail(ERR_BAD_PARAMETERS);
    return Guard([&] {
        int32_t uid = -1;
        if (const tavo::Code code = tavo::FindQuotaUser(szUser, uid))
            return Fail(code);
        dqblk block = {};
        if (::quotactl(QCMD(Q_GETQUOTA, USRQUOTA), szDevice, uid, reinterpret_cast<caddr_t>(&block)) != 0)
            return Fail(errno == ESRCH ? ERR_QUOTA_NOT_ENABLED : ERR_SYS_UNKNOWN);
        *pQuota = {TAVOUnitTrans(TAVO_UNIT_KB_TO_MB, static_cast<float>(block.dqb_bhardlimit)), block.dqb_curspace};
        return 0;
    });
}
