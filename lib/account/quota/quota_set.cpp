// Sets the space limit of a user.
#include "tavo_quota.h"

#include "account/detail/quota_user.h"
#include "core/detail/guard.h"

#include <cerrno>
#include <cmath>

#include <sys/quota.h>

namespace {

constexpr double kLargestKb = 18014398509481984.0;  // 2^54: as bytes it still fits into 64 bits

static_assert(sizeof(dqblk::dqb_bhardlimit) == 8, "a 32-bit count would end at 4 TiB");

tavo::Code QuotaCode()
{
    switch (errno) {
    case ESRCH:
        return ERR_QUOTA_NOT_ENABLED;
    case ENOENT:
        return ERR_FILE_NOT_FOUND;
    case EINVAL:
        return ERR_QUOTA_BAD_ARGUMENT;
    default:
        return ERR_SYS_UNKNOWN;
    }
}

}  // namespace

extern "C" int TAVOQuotaSet(const char *szUser, const char *szDevice, const float *prLimit)
{
    if (!szUser || !*szUser || !szDevice || !*szDevice || !prLimit || !std::isfinite(*prLimit) || *prLimit < 0)
        return Fail(ERR_BAD_PARAMETERS);
    const double kb = double{*prLimit} * 1024;
    if (kb >= kLargestKb)
        return Fail(ERR_BAD_PARAMETERS);
    return Guard([&] {
        int32_t uid = -1;
        if (const tavo::Code code = tavo::FindQuotaUser(szUser, uid))
            return Fail(code);
        dqblk block = {};
        block.dqb_bhardlimit = block.dqb_bsoftlimit = static_cast<uint64_t>(kb);
        block.dqb_valid = QIF_LIMITS | QIF_TIMES;
        if (::quotactl(QCMD(Q_SETQUOTA, USRQUOTA), szDevice, uid, reinterpret_cast<caddr_t>(&block)) != 0 ||
            ::quotactl(QCMD(Q_SYNC, USRQUOTA), szDevice, 0, nullptr) != 0)
            return Fail(QuotaCode());
        return 0;
    });
}
