// Lines of pvs and vgs.
#ifndef TAVO_STORAGE_DETAIL_LVM_LINE_H
#define TAVO_STORAGE_DETAIL_LVM_LINE_H

#include "tavo_lvm.h"

#include "storage/detail/volume_name.h"

#include <optional>
#include <string_view>

namespace tavo {

// "  /dev/md2|vg1|UUID|1". Warnings, which the tools mix in, are no such lines.
std::optional<LVMPV> ParsePvLine(std::string_view line);

// "  UUID" of vgs: the UUID; empty for another line.
std::optional<std::string_view> ParseVgLine(std::string_view line);

// "  /dev/md2:vg1:lv:" of pvs.
struct PvVolume {
    std::string_view device;
    std::string_view group;
    std::string_view volume;
};
std::optional<PvVolume> ParsePvVolumeLine(std::string_view line);

}  // namespace tavo

#endif
