// Checks whether a day has passed in the appliance's time zone.
#include "tavo_user.h"

#include "account/detail/shadow_line.h"
#include "core/detail/log.h"
#include "core/detail/open_file.h"

#include <ctime>

namespace {

constexpr int64_t kSummerTime = 3600;
constexpr size_t kLongestZone = 128;

// The zone of /etc/TZ becomes the zone of the process: programs that run for months follow a change that way.
void SetZone()
{
    char zone[kLongestZone + 1];
    const tavo::File file = tavo::OpenToRead("/etc/TZ");
    if (!file || !std::fgets(zone, static_cast<int>(kLongestZone), file.Get()))
        return;
    const size_t length = std::string_view(zone).size();
    if (length == 0 || zone[length - 1] != '\n')
        return;
    zone[length - 1] = 0;
    if (::setenv("TZ", zone, 1) != 0)
        LogError("%s:%d Failed to set environment variable: TZ");
    ::tzset();
}

}  // namespace

extern "C" int TAVOUserIsExpired(int day)
{
    if (day < 0)
        return 0;
    SetZone();
    const time_t now = ::time(nullptr);
    struct tm local = {};
    ::localtime_r(&now, &local);
    const int64_t summer = ::daylight != 0 && local.tm_isdst > 0 ? kSummerTime : 0;
    return day * tavo::kSecondsOfDay + tavo::kSecondsOfDay + ::timezone - summer <= now ? 1 : 0;
}
