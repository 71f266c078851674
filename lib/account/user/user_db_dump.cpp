// Writes the four account files from the open stores.
#include "tavo_user.h"

#include "account/detail/user_dump.h"
#include "core/detail/guard.h"
#include "core/detail/log.h"

extern "C" int TAVOUserDBDump(TAVOUSERDB *pDb)
{
    if (!pDb || !pDb->pName || !pDb->pMisc || !pDb->pShadow || !pDb->pSmb || !pDb->pUid)
        return Fail(ERR_BAD_PARAMETERS);
    return Guard([&] {
        tavo::DumpReport report;
        const int code = tavo::DumpUsers(*pDb, report);
        // Accounts of the system have no Samba password and no privileges: nothing that needs looking after.
        for (const tavo::DumpReport::Missing &missing : report.missing)
            LogDebug("%s:%d No record of [%s] for %s", missing.name, missing.file);
        if (code == 0)
            return 0;
        if (report.not_opened)
            LogError("%s:%d fail to open file[%s]", report.not_opened);
        else if (!report.lost.empty())
            LogError("%s:%d Account [%s] would be lost, the files are left alone", report.lost);
        else
            LogError("%s:%d Failed to write the account files, tavoerr=0x%04X, errno=%d", code, errno);
        return Fail(code);
    });
}
