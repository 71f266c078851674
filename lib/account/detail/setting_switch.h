// Switches and numbers of the settings files, where a missing one is an ordinary answer.
#ifndef TAVO_ACCOUNT_DETAIL_SETTING_SWITCH_H
#define TAVO_ACCOUNT_DETAIL_SETTING_SWITCH_H

namespace tavo {

inline constexpr char kSettings[] = "/etc/tavoinfo.conf";                  // what the administrator set
inline constexpr char kFactorySettings[] = "/etc.defaults/tavoinfo.conf";  // what the model can do

// Whether the key says "yes". Leaves the error state alone.
bool SettingIsYes(const char *path, const char *key);

// Whether it has exactly that value.
bool SettingEquals(const char *path, const char *key, const char *value);

}  // namespace tavo

#endif
