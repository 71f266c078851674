// Returns the path of the disk or partition of an open descriptor.
#include "tavo_disk.h"

#include "core/detail/guard.h"
#include "storage/detail/device_name.h"

#include <algorithm>
#include <cstring>
#include <string>

#include <sys/stat.h>
#include <sys/sysmacros.h>
#include <unistd.h>

extern "C" char *TAVODiskGetDevnameFromFd(int fd)
{
    return Guard([&]() -> char * {
        struct stat facts;
        if (::fstat(fd, &facts) != 0)
            return FailNull(ERR_STAT_FAILED);
        if (!S_ISBLK(facts.st_mode))
            return FailNull(ERR_NOT_A_DISK);
        const std::string link =
            "/sys/dev/block/" + std::to_string(major(facts.st_rdev)) + ":" + std::to_string(minor(facts.st_rdev));
        char target[4096];
        const ssize_t length = ::readlink(link.c_str(), target, sizeof target);
        if (length <= 0)
            return FailNull(ERR_NO_DISK_ID);
        std::string path(tavo::kDev);
        path += tavo::LastPart({target, static_cast<size_t>(length)});
        std::replace(path.begin(), path.end(), '!', '/');  // /sys writes "!" for a slash in the device's name
        char *const copy = ::strdup(path.c_str());
        return copy ? copy : FailNull(ERR_OUT_OF_MEMORY);
    });
}
