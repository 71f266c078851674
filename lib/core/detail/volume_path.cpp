// The paths of the appliance's volumes: /volume1, /volume2, ...
#include "core/detail/volume_path.h"

#include "core/detail/strict_number.h"

namespace tavo {

int VolumeNumber(std::string_view path) noexcept
{
    constexpr std::string_view stem = "/volume";
    if (!path.starts_with(stem) || path.substr(stem.size()).starts_with('0'))
        return 0;
    const std::optional<int> number = StrictNumber<int>(path.substr(stem.size()));
    return number && *number > 0 ? *number : 0;
}

std::string_view VolumeOf(std::string_view path) noexcept
{
    const std::string_view volume = path.substr(0, path.find('/', 1));
    return VolumeNumber(volume) ? volume : std::string_view();
}

}  // namespace tavo
