// Splits the name of a partition into the disk's name and a number.
#include "tavo_disk.h"

#include "core/detail/fault.h"

#include <charconv>
#include <cstring>

extern "C" int TAVODiskPartitionNumGet(const char *szPath, char *szBase, int cbBase)
{
    if (!szPath || !szBase || cbBase < 2)
        return Fail(ERR_BAD_PARAMETERS);
    // A 0 stays in the base: only 1 to 9 begin a number.
    const size_t whole = std::strcspn(szPath, "123456789");
    const size_t kept = whole < static_cast<size_t>(cbBase) ? whole : static_cast<size_t>(cbBase) - 1;
    if (kept == 0)
        return -1;
    std::memcpy(szBase, szPath, kept);
    szBase[kept] = 0;
    int number = 0;
    std::from_chars(szPath + kept, szPath + std::strlen(szPath), number);
    return number;
}
