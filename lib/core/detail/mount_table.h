// /proc/mounts.
#ifndef TAVO_CORE_DETAIL_MOUNT_TABLE_H
#define TAVO_CORE_DETAIL_MOUNT_TABLE_H

#include <string>
#include <string_view>
#include <vector>

namespace tavo {

struct Mount {
    std::string source;
    std::string point;
    std::string type;
    std::string options;  // with commas

    // Whole options only: "quota" is not one of "rw,usrquota". Of "usrquota=FILE" the name is enough.
    bool Has(std::string_view option) const;
};

// Blanks in a path are \040 there.
std::vector<Mount> ParseMounts(std::string_view text);

// All mounts; false when the file cannot be read.
bool ReadMounts(std::vector<Mount> &mounts);

}  // namespace tavo

#endif
