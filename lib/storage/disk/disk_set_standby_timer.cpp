// Sets the spin-down timer of all disks, by minutes.
#include "tavo_disk.h"

#include "core/detail/guard.h"
#include "storage/detail/disk_timer.h"

namespace {

constexpr int kNever = 0;
constexpr int kFixed = 0xFB;  // five and a half hours

// The times that ATA can encode: 5 seconds to 20 minutes, 21 minutes, half hours up to 5.5 hours, 8 hours.
constexpr bool HasEncoding(int minutes)
{
    return (minutes >= 0 && minutes <= 21) || (minutes > 0 && minutes <= 330 && minutes % 30 == 0) || minutes == 480;
}

}  // namespace

extern "C" int TAVODiskSetStandbyTimer(int nMinute)
{
    if (!HasEncoding(nMinute))
        return Fail(ERR_BAD_PARAMETERS);
    return Guard([&] {
        // The system watches the disks and spins them down itself after the minutes; the drive's own timer is only
        // there in case that fails, so it is the same for every choice.
        if (!tavo::SetTimerOfAllDisks(nMinute == 0 ? kNever : kFixed))
            return -1;
        if (TAVODiskGetFileSBTimerSetting() == nMinute)
            return 0;
        return TAVODiskSetFileSBTimerSetting(nMinute);
    });
}
