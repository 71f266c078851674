// Erases the superblocks of all members of an array.
#include "tavo_raid.h"

#include "core/detail/command_output.h"
#include "core/detail/guard.h"
#include "core/detail/log.h"
#include "storage/detail/array_name.h"
#include "storage/detail/mdadm_examine.h"
#include "storage/detail/proc_partitions.h"

#include <string>
#include <vector>

namespace {

// All names first: no disk is touched while the list is being read.
std::vector<std::string> Disks()
{
    std::vector<std::string> paths;
    tavo::CommandOutput output("/bin/grep sd /proc/partitions");
    for (std::string line; output.Next(line);) {
        const auto row = tavo::ParsePartitionsRow(line);
        if (row && row->name.starts_with("sd") && tavo::IsDeviceName(row->name))
            paths.push_back(std::string(tavo::kDev).append(row->name));
    }
    return paths;
}

}  // namespace

extern "C" int RAIDSBCleanByUUID(const RAIDINFO *, const char *szUuid)
{
    // An empty text would be equal to the UUID of every disk that is in no array.
    if (!szUuid || !tavo::IsArrayUuid(szUuid)) {
        LogError("%s:%d Bad parameters");
        return Fail(ERR_BAD_PARAMETERS);
    }
    return Guard([&] {
        for (const std::string &path : Disks()) {
            RAIDSUPERBLOCK superblock;
            if (RAIDSBGet(path.c_str(), &superblock) != 1 || !tavo::IsSameArrayUuid(superblock.szUuid, szUuid))
                continue;
            LogError("%s:%d [Info] Clean RAID superblock on '%s'", path);
            if (RAIDSBClean(path.c_str()) != 0) {
                LogError("%s:%d Failed to clean suerblock of '%s'", path);
                return -1;
            }
        }
        return 0;
    });
}
