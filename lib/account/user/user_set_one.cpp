// Adds, changes or renames one user.
#include "tavo_user.h"

#include "core/detail/fault.h"

extern "C" int TAVOUserSetOne(const char *szOldName, const TAVOUSER *pUser)
{
    if (!pUser)
        return Fail(ERR_BAD_PARAMETERS);
    return TAVOUserSet(&szOldName, &pUser, 1);
}
