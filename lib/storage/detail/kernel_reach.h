// How large a device may be for this system's kernel. A 32-bit one counts the pages of a device in 32 bits: beyond 16 TiB it
// would read and write the wrong ones.
#ifndef TAVO_STORAGE_DETAIL_KERNEL_REACH_H
#define TAVO_STORAGE_DETAIL_KERNEL_REACH_H

#include "tavo_list.h"

#include <cstdint>
#include <string>

namespace tavo {

// Each is a sentence about what is too large, and empty where it is not, or no size can be read. On a 64-bit kernel nothing
// is too large, and no device is opened.
std::string BeyondReach(const std::string &what, uint64_t bytes);
std::string DeviceBeyondReach(const std::string &path);
std::string GroupBeyondReach(const std::string &group, const TLIBSZLIST &devices);

struct ArrayPlan {
    int level;
    int slots;
    uint64_t member_limit;      // bytes used of each member; 0: all of it
    const TLIBSZLIST *members;  // null: all of member_limit
};

// Also when one of the members is.
std::string ArrayBeyondReach(const std::string &array, const ArrayPlan &plan);

// A linear array with one member more.
std::string LongerArrayBeyondReach(const std::string &array, const std::string &member);

}  // namespace tavo

#endif
