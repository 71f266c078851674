// Releases a user record.
#include "tavo_user.h"

#include <cstdlib>

#include <string.h>

extern "C" void TAVOUserFree(TAVOUSER *pUser)
{
    if (!pUser)
        return;
    // It may hold a password in clear text.
    if (pUser->szPasswd)
        ::explicit_bzero(pUser->szPasswd, ::strlen(pUser->szPasswd));
    std::free(pUser);
}
