// A line of the appliance's sfdisk: "/dev/sda1 256 4980735 4980480 fd Linux raid autodetect".
#ifndef TAVO_STORAGE_DETAIL_SFDISK_LINE_H
#define TAVO_STORAGE_DETAIL_SFDISK_LINE_H

#include <cstdint>
#include <optional>
#include <string_view>

namespace tavo {

struct PartitionGeometry {
    int64_t start;  // sectors of 512 bytes
    int64_t count;
    uint32_t type;
};

std::optional<PartitionGeometry> ParseSfdiskLine(std::string_view line);

}  // namespace tavo

#endif
