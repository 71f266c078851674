// Switches of settings files. A missing key is an ordinary answer, so the error state is not touched.
#ifndef TAVO_CORE_DETAIL_SETTING_SWITCH_H
#define TAVO_CORE_DETAIL_SETTING_SWITCH_H

#include "core/detail/appliance_paths.h"

#include <optional>

namespace tavo {

// Returns whether the key has exactly this value.
bool SettingEquals(const char *path, const char *key, const char *value) noexcept;

// Returns whether the value is exactly "yes".
bool SettingIsYes(const char *path, const char *key) noexcept;

// Returns whether the value is "yes" in any case of letters: services and capabilities of the model.
bool SettingSaysYes(const char *path, const char *key) noexcept;

// Returns whether the key has exactly that value; nullopt when the file is there and cannot be read. A file that is closed
// to a program without root has no keys for it. Leaves the error state alone. Throws bad_alloc.
std::optional<bool> ReadSetting(const char *path, const char *key, const char *value);

}  // namespace tavo

#endif
