// Sets the stripe cache of an array.
#include "tavo_raid.h"

#include "core/detail/guard.h"
#include "core/detail/log.h"
#include "storage/detail/array_name.h"
#include "storage/detail/open_disk.h"
#include "storage/detail/partition_command.h"

extern "C" int TAVORAIDMdStripeCacheSizeSet(const char *szPath, int nEntry)
{
    const auto array = szPath ? tavo::ArrayNumber(szPath) : std::nullopt;
    if (!array || nEntry < 1) {
        LogError("%s:%d Bad parameters");
        return Fail(ERR_BAD_PARAMETERS);
    }
    return Guard([&] {
        const std::string file = tavo::ArrayFile(*array, "md/stripe_cache_size");
        if (!tavo::HasNode(file.c_str()))
            return 0;
        const int status = tavo::RunDiskCommand("/bin/echo %d > %s", nEntry, file).status;
        if (status == 0)
            return 0;
        LogError("%s:%d Failed to change stripe cache size of '%s', WEXITSTATUS(err)=%d", szPath, status);
        return -1;
    });
}
