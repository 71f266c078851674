// /proc/mounts.
#ifndef TAVO_STORAGE_DETAIL_MOUNT_TABLE_H
#define TAVO_STORAGE_DETAIL_MOUNT_TABLE_H

#include <string>
#include <string_view>
#include <vector>

namespace tavo {

struct Mount {
    std::string source;
    std::string point;
    std::string type;
};

// Blanks in a path stand as \040 there.
std::vector<Mount> ParseMounts(std::string_view text);

// All mounts; false when the file cannot be read.
bool ReadMounts(std::vector<Mount> &mounts);

}  // namespace tavo

#endif
