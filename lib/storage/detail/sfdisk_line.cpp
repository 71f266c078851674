// A line of the appliance's sfdisk.
#include "storage/detail/sfdisk_line.h"

#include "core/detail/strict_number.h"
#include "core/detail/text_fields.h"

namespace tavo {
namespace {

constexpr size_t kReadable = 63;  // only so much of a line has ever been read; the name at its end is not needed

}  // namespace

std::optional<PartitionGeometry> ParseSfdiskLine(std::string_view line)
{
    const auto fields = SplitFields(line.substr(0, kReadable));
    PartitionGeometry geometry = {};
    if (fields.size() < 5 || !ReadNumber(fields[1], geometry.start) || !ReadNumber(fields[3], geometry.count) ||
        !ReadNumber(fields[4], geometry.type, 16))
        return std::nullopt;
    return geometry.start >= 0 && geometry.count >= 0 ? std::optional(geometry) : std::nullopt;
}

}  // namespace tavo
