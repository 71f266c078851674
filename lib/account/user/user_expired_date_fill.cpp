// Sets the expiry day of a record from a date.
#include "tavo_user.h"

#include "account/detail/shadow_line.h"
#include "core/detail/fault.h"
#include "core/detail/log.h"

#include <ctime>

extern "C" int TAVOUserExpiredDateFill(TAVOUSER *pUser, const char *szDate)
{
    if (!pUser || !szDate)
        return Fail(ERR_BAD_PARAMETERS);
    struct tm date = {};
    const char *end = ::strptime(szDate, "%Y/%m/%d", &date);
    const struct tm wanted = date;
    // Midnight of that date in UTC: the day number does not depend on the time zone and its summer time.
    const int64_t seconds = end && !*end ? int64_t{::timegm(&date)} : 0;
    if (!end || *end || date.tm_mday != wanted.tm_mday || date.tm_mon != wanted.tm_mon) {
        LogError("%s:%d Invalid date:%s or format:\"yyyy/mm/dd\"", szDate);
        return Fail(ERR_BAD_PARAMETERS);
    }
    const int64_t day = seconds / tavo::kSecondsOfDay;
    pUser->nExpired = seconds < 0 || day > INT32_MAX ? int32_t{TAVO_USER_EXPIRE_LAST} : static_cast<int32_t>(day);
    return 0;
}
