// Writes the expiry day of a record as a date.
#include "tavo_user.h"

#include "account/detail/shadow_line.h"
#include "core/detail/fault.h"

#include <cstdio>
#include <cstring>
#include <ctime>

extern "C" int TAVOUserExpiredDateGet(const TAVOUSER *pUser, char *szBuf, int cbBuf)
{
    if (!pUser || !szBuf || cbBuf < 1)
        return Fail(ERR_BAD_PARAMETERS);
    char text[64] = "";
    if (pUser->nExpired >= 2) {  // 0 and 1 are what old firmware wrote for "never"
        const time_t seconds = static_cast<time_t>(pUser->nExpired * tavo::kSecondsOfDay);
        struct tm date = {};
        ::gmtime_r(&seconds, &date);
        std::snprintf(text, sizeof text, "%d/%d/%d", date.tm_year + 1900, date.tm_mon + 1, date.tm_mday);
    }
    if (std::strlen(text) >= static_cast<size_t>(cbBuf))
        return Fail(ERR_NOT_ENOUGH_MEMORY);
    std::strcpy(szBuf, text);
    return 0;
}
