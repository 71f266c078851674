// RAID levels: the kernel's numbers and our bits.
#ifndef TAVO_STORAGE_DETAIL_ARRAY_LEVEL_H
#define TAVO_STORAGE_DETAIL_ARRAY_LEVEL_H

#include "tavo_raid.h"

#include <array>
#include <optional>
#include <string_view>

namespace tavo {

struct ArrayLevel {
    int kernel;             // md's number
    int bit;                // RAID_LEVEL_
    std::string_view name;  // as "mdadm -E" prints it
};

inline constexpr std::array<ArrayLevel, 6> kArrayLevels = {{
    {-1, RAID_LEVEL_LINEAR, "linear"},
    {0, RAID_LEVEL_0, "raid0"},
    {1, RAID_LEVEL_1, "raid1"},
    {5, RAID_LEVEL_5, "raid5"},
    {6, RAID_LEVEL_6, "raid6"},
    {10, RAID_LEVEL_10, "raid10"},
}};

constexpr std::optional<int> LevelOfKernel(int kernel)
{
    for (const ArrayLevel &level : kArrayLevels) {
        if (level.kernel == kernel)
            return level.bit;
    }
    return std::nullopt;
}

constexpr std::optional<int> KernelOfLevel(int bit)
{
    for (const ArrayLevel &level : kArrayLevels) {
        if (level.bit == bit)
            return level.kernel;
    }
    return std::nullopt;
}

// RAID 5 for an unknown name, because most arrays of the appliance have that level.
constexpr int LevelOfName(std::string_view name)
{
    for (const ArrayLevel &level : kArrayLevels) {
        if (level.name == name)
            return level.bit;
    }
    return RAID_LEVEL_5;
}

// Returns whether no member can fail without the array.
constexpr bool HasNoRedundancy(int bit)
{
    return bit == RAID_LEVEL_0 || bit == RAID_LEVEL_LINEAR;
}

}  // namespace tavo

#endif
