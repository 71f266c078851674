// Where the settings of services are read.
#ifndef TAVO_SERVICE_DETAIL_SETTINGS_FILES_H
#define TAVO_SERVICE_DETAIL_SETTINGS_FILES_H

#include "tavo_file.h"
#include "tavo_service.h"

#include "core/detail/keep_fault.h"

#include <strings.h>

namespace tavo {

inline constexpr const char *kSettings = "/etc/tavoinfo.conf";                  // what is switched on
inline constexpr const char *kFactorySettings = "/etc.defaults/tavoinfo.conf";  // what the model has

// True when the key's value is `word`, in any case of letters; values are "yes" and "no", so eight bytes hold them.
inline bool SettingIs(const char *file, const char *key, const char *word) noexcept
{
    char value[8];
    const KeepFault keep;  // a key that is not there is an answer
    return TLIBFileGetKeyValue(file, key, value, sizeof value, 0) > 0 && ::strcasecmp(value, word) == 0;
}

// Switched on by its key; a service without one is driven by others.
inline bool IsSwitchedOn(const TAVOSERVICE &service) noexcept
{
    return service.szKey && SettingIs(kSettings, service.szKey, "yes");
}

}  // namespace tavo

#endif
