// Reads switches of settings files.
#include "core/detail/setting_switch.h"

#include "tavo_file.h"

#include "core/detail/keep_fault.h"

#include <strings.h>

namespace tavo {

bool SettingEquals(const char *path, const char *key, const char *value) noexcept
{
    const KeepFault keep;
    return BlTAVOFileCheckKeyValue(path, key, value) != 0;
}

bool SettingIsYes(const char *path, const char *key) noexcept
{
    return SettingEquals(path, key, "yes");
}

bool SettingSaysYes(const char *path, const char *key) noexcept
{
    char value[8];  // a longer value is not a "yes"
    const KeepFault keep;
    return TLIBFileGetKeyValue(path, key, value, sizeof value, 0) > 0 && ::strcasecmp(value, "yes") == 0;
}

}  // namespace tavo
