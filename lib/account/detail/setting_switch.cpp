// Reads switches of the settings files.
#include "account/detail/setting_switch.h"

#include "core/detail/keep_fault.h"
#include "tavo_file.h"

namespace tavo {

bool SettingIsYes(const char *path, const char *key)
{
    return SettingEquals(path, key, "yes");
}

bool SettingEquals(const char *path, const char *key, const char *value)
{
    const KeepFault keep;
    return BlTAVOFileCheckKeyValue(path, key, value) != 0;
}

}  // namespace tavo
