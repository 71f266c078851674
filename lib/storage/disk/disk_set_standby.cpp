// Spins all disks down.
#include "tavo_disk.h"

#include "core/detail/guard.h"
#include "core/detail/log.h"
#include "storage/detail/disk_path.h"
#include "storage/detail/raw_disk.h"

#include <vector>

#include <unistd.h>

namespace {

constexpr unsigned kDrivesWrite = 10;  // seconds until what was flushed is on the platters

}  // namespace

extern "C" int TAVODiskSetStandby(void)
{
    return Guard([&] {
        std::vector<std::string> disks;
        for (int i = 0; i < tavo::kPowerDisks; ++i) {
            tavo::Fd fd;
            if (tavo::OpenRawDisk(tavo::PortDevice(i).c_str(), fd) == 0)
                disks.push_back(tavo::PortDevice(i));
        }
        for (const std::string &disk : disks) {
            if (TAVOIDiskFlushBuffer(disk.c_str()) != 0)
                LogError("%s:%d TAVOIDiskFlushBuffer(%s) fail, but still issue standby", disk);
        }
        ::sync();
        ::sleep(kDrivesWrite);
        int result = 0;
        for (const std::string &disk : disks)
            result |= TAVOIDiskSetDiskStandby(disk.c_str());
        return result;
    });
}
