// Sets the spin-down timer of all disks, by seconds.
#include "tavo_disk.h"

#include "core/detail/guard.h"
#include "storage/detail/disk_timer.h"

extern "C" int TAVODiskSetStandbySeconds(int nSecond)
{
    constexpr int unit = 5;       // seconds
    constexpr int largest = 240;  // above, ATA counts in half hours
    if (nSecond < 1 || nSecond > unit * largest)
        return Fail(ERR_BAD_PARAMETERS);
    return Guard([&] { return tavo::SetTimerOfAllDisks((nSecond + unit - 1) / unit) ? 0 : -1; });
}
