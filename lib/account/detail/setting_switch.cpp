// Reads switches of the settings files.
#include "account/detail/setting_switch.h"

#include "core/detail/keep_fault.h"
#include "tavo_file.h"

namespace tavo {

bool SettingIsYes(const char *path, const char *key)
{
    const KeepFault keep;
    return BlTAVOFileCheckKeyValue(path, key, "yes") != 0;
}

}  // namespace tavo
