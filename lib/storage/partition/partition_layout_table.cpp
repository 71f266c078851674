// Every partition layout ever shipped. Disks made under any of them must be recognised: no value ever changes.
#include "tavo_partition.h"

#include <cstddef>

static_assert(sizeof(TAVOPARTPLACE) == 20);
static_assert(sizeof(TAVOPARTLAYOUT) == 92 && alignof(TAVOPARTLAYOUT) == 1);
static_assert(offsetof(TAVOPARTLAYOUT, place1) == 32 && offsetof(TAVOPARTLAYOUT, place2) == 52 &&
              offsetof(TAVOPARTLAYOUT, place3) == 72);

namespace {

struct Types {
    uint32_t system;
    uint32_t swap;
    uint32_t data;
};

constexpr Types kPlain = {0x83, 0x82, 0x83};
constexpr Types kRaid = {0xFD, 0xFD, 0xFD};

// Partition 2 starts where partition 1 ends; partition 3 takes what the gap leaves.
constexpr TAVOPARTLAYOUT Layout(int32_t version, uint32_t raid, int64_t start, int64_t system, int64_t swap,
                                uint64_t gap)
{
    const Types types = raid ? kRaid : kPlain;
    return {version,
            raid,
            static_cast<uint64_t>(system),
            static_cast<uint64_t>(swap),
            gap,
            {start, system, types.system},
            {start + system, swap, types.swap},
            {-1, -1, types.data}};
}

}  // namespace

// clang-format off
extern "C" constexpr TAVOPARTLAYOUT grgAllTavoPartLayout[10] = {
    //  version RAID start   system     swap     gap
    Layout(1,   0,    63,   273042,   787185,  273042),
    Layout(2,   0,    63,  4980087,  1044225,  257040),
    Layout(3,   0,    63,   530082,   787185,   16002),
    Layout(5,   0,    63,   722862,   594405,   16002),
    Layout(6,   0,    63,  4980087,  4192965,  257040),
    Layout(7,   0,   256,  4980480,  4194304,  262144),
    Layout(1,   1,    63,  1574307,   787185,  273105),
    Layout(2,   1,    63,  4980087,  1044225,  257040),
    Layout(6,   1,    63,  4980087,  4192965,  257040),
    Layout(7,   1,   256,  4980480,  4194304,  262144),
};
// clang-format on
static_assert(sizeof grgAllTavoPartLayout == 920);
