// Removes the limits of users on one volume.
#include "tavo_quota.h"

#include "core/detail/fault.h"

extern "C" int TAVOQuotaClean(const TLIBSZLIST *pslUsers, const char *szDevice)
{
    if (!pslUsers || !szDevice || !*szDevice)
        return Fail(ERR_BAD_PARAMETERS);
    constexpr float no_limit = 0;
    int code = 0;
    for (int i = 0; i < pslUsers->nItem; ++i) {
        const char *user = SzTLIBSzListGet(pslUsers, i);
        if (user && *user && TAVOQuotaSet(user, szDevice, &no_limit) != 0)
            code = tavoerrno;
    }
    return code == 0 ? 0 : Fail(code);
}
