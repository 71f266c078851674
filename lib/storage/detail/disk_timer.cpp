// Sets the spin-down timer of all disks whose power is managed.
#include "storage/detail/disk_timer.h"

#include "tavo_disk.h"

#include "storage/detail/disk_path.h"
#include "storage/detail/raw_disk.h"

namespace tavo {

bool SetTimerOfAllDisks(int value)
{
    bool good = true;
    for (int i = 0; i < kPowerDisks; ++i) {
        const std::string disk = PortDevice(i);
        Fd fd;
        if (OpenRawDisk(disk.c_str(), fd) != 0)
            continue;
        fd.Reset();
        good &= TAVOIDiskSetDiskStandbyTimer(disk.c_str(), value) == 0;
    }
    return good;
}

}  // namespace tavo
