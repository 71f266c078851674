// Where the settings of services are read.
#ifndef TAVO_SERVICE_DETAIL_SETTINGS_FILES_H
#define TAVO_SERVICE_DETAIL_SETTINGS_FILES_H

#include "tavo_file.h"
#include "tavo_service.h"

#include "core/detail/keep_fault.h"

#include <strings.h>

namespace tavo {

inline constexpr const char *kSettings = "/etc/tavoinfo.conf";                  // the switches
inline constexpr const char *kFactorySettings = "/etc.defaults/tavoinfo.conf";  // the model's capabilities

// True when the key's value is `word`, in any case of letters. Values are "yes" and "no", so eight bytes hold them.
inline bool SettingIs(const char *file, const char *key, const char *word) noexcept
{
    char value[8];
    const KeepFault keep;  // a missing key is an answer
    return TLIBFileGetKeyValue(file, key, value, sizeof value, 0) > 0 && ::strcasecmp(value, word) == 0;
}

// Whether the service's key switches it on. A service without a key is driven by others.
inline bool IsSwitchedOn(const TAVOSERVICE &service) noexcept
{
    return service.szKey && SettingIs(kSettings, service.szKey, "yes");
}

}  // namespace tavo

#endif
