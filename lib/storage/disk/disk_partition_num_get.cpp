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
    const size_t base = std::strcspn(szPath, "123456789");
    if (base == 0 || base >= static_cast<size_t>(cbBase))
        return -1;
    int number = 0;
    if (szPath[base] && std::from_chars(szPath + base, szPath + std::strlen(szPath), number).ec != std::errc{})
        return -1;
    std::memcpy(szBase, szPath, base);
    szBase[base] = 0;
    return number;
}
