// Writes one group into the open stores.
#include "tavo_group.h"

#include "account/detail/account_name.h"
#include "account/detail/group_accounts.h"
#include "core/detail/guard.h"
#include "core/detail/log.h"

extern "C" int TAVOGroupDBSet(TAVOGROUPDB *pDb, const char *szOldName, const TAVOGROUP *pGroup)
{
    if (!pDb || !pDb->pName || !pDb->pGid || !pDb->pDesc || !pGroup || !pGroup->szName)
        return Fail(ERR_BAD_PARAMETERS);
    return Guard([&] {
        if (tavo::IsDomainName(pGroup->szName)) {
            LogError("%s:%d Cannot set not-local group. group name=[%s]", pGroup->szName);
            return Fail(ERR_INVALID_GROUPNAME);
        }
        tavo::GroupChange change;
        int code = tavo::PrepareGroup(*pDb, szOldName, *pGroup, pGroup->nGid, change);
        if (code == 0)
            code = tavo::StoreGroup(*pDb, change);
        return code == 0 ? 0 : Fail(code);
    });
}
