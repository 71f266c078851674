// Writes one account into the open stores.
#include "tavo_user.h"

#include "account/detail/account_name.h"
#include "account/detail/user_accounts.h"
#include "account/detail/user_change.h"
#include "core/detail/guard.h"

extern "C" int TAVOUserDBSet(TAVOUSERDB *pDb, const char *szOldName, const TAVOUSER *pUser)
{
    if (!pDb || !pDb->pName || !pDb->pMisc || !pDb->pShadow || !pDb->pSmb || !pDb->pUid || !pUser || !pUser->szName)
        return Fail(ERR_BAD_PARAMETERS);
    return Guard([&] {
        if (tavo::IsDomainName(pUser->szName))
            return 0;
        tavo::UserChange change;
        int code = tavo::PrepareUser(*pDb, szOldName, *pUser, {::time(nullptr), tavo::ConfiguredHashMethod()}, change);
        if (code == 0)
            code = tavo::StoreUser(*pDb, change);
        return code == 0 ? 0 : Fail(code);
    });
}
