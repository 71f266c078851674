// Tells whether a disk is a member of an array.
#include "tavo_raid.h"

#include "core/detail/log.h"

// Superblocks cannot be read yet, and a wrong answer would have a foreign disk taken for one of the system's.
extern "C" int RAIDDiskIsUsedByRAID(const char *szDisk, int *)
{
    LogError("%s:%d Failed to read the RAID superblocks of %s", szDisk);
    return -1;
}
