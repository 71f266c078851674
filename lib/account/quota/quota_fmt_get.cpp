// Reads the quota format of a volume.
#include "tavo_quota.h"

#include "core/detail/fault.h"

#include <cerrno>

#include <sys/quota.h>

extern "C" int TAVOQuotaFmtGet(const char *szDevice)
{
    if (!szDevice || !*szDevice)
        return Fail(ERR_BAD_PARAMETERS);
    uint32_t format = 0;
    if (::quotactl(QCMD(Q_GETFMT, USRQUOTA), szDevice, 0, reinterpret_cast<caddr_t>(&format)) != 0)
        return Fail(errno == ESRCH ? ERR_QUOTA_NOT_ENABLED : ERR_SYS_UNKNOWN);
    return static_cast<int>(format);
}
