// Checks whether a disk is a member of an array.
#include "tavo_raid.h"

#include "core/detail/guard.h"
#include "storage/detail/array_name.h"

#include <string>

namespace {

constexpr int kLastArrayOfPartitions = 100;

// The array that a member names; 0 none, -1 when its superblock cannot be read.
int ArrayOf(const std::string &member, int &array)
{
    RAIDSUPERBLOCK superblock;
    const int result = RAIDSBGet(member.c_str(), &superblock);
    if (result <= 0)
        return result;
    const auto number = tavo::ArrayNumber(superblock.szArray);
    array = number.value_or(array);
    return number ? 1 : 0;
}

}  // namespace

extern "C" int RAIDDiskIsUsedByRAID(const char *szDisk, int *pnArray)
{
    if (!tavo::IsMemberPath(szDisk))
        return Fail(ERR_BAD_PARAMETERS);
    return Guard([&] {
        const std::string disk = szDisk;
        for (const char *partition : {"3", "5", ""}) {
            int array = 0;
            const int used = ArrayOf(disk + partition, array);
            if (used < 0)
                return -1;
            if (used == 0)
                continue;
            // Whole disks are members of no array of the system's own.
            if (*partition == 0 && array <= kLastArrayOfPartitions)
                return 0;
            if (pnArray)
                *pnArray = array;
            return 1;
        }
        return 0;
    });
}
