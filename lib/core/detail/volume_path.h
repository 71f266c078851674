// The paths of the appliance's volumes: /volume1, /volume2, ...
#ifndef TAVO_CORE_DETAIL_VOLUME_PATH_H
#define TAVO_CORE_DETAIL_VOLUME_PATH_H

#include <string_view>

namespace tavo {

// Returns the number of "/volumeN"; 0 for anything else.
int VolumeNumber(std::string_view path) noexcept;

// Returns the "/volumeN" that holds the path; empty when no volume does.
std::string_view VolumeOf(std::string_view path) noexcept;

}  // namespace tavo

#endif
