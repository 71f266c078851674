// Data folders of services: real folders, never links. A user who may write to a volume must not choose where root puts
// the data of services.
#ifndef TAVO_SERVICE_DETAIL_DATA_FOLDER_H
#define TAVO_SERVICE_DETAIL_DATA_FOLDER_H

#include "tavo_service.h"

#include "core/detail/keep_fault.h"
#include "service/detail/service_table.h"

#include <sys/stat.h>

namespace tavo {

// Reads the record of a data folder for callers that need only its name, so an unreadable link is ignored. False for a
// bad id, which has been recorded.
inline bool FindDataFolder(int idShare, TAVOSERVICESHARE &share)
{
    if (!FindServiceShare(idShare))
        return TAVOServiceSettingGet(idShare, &share) >= 0;
    const KeepFault keep;
    TAVOServiceSettingGet(idShare, &share);
    return true;
}

inline bool IsRealFolder(const char *path) noexcept
{
    struct stat st;
    return ::lstat(path, &st) == 0 && S_ISDIR(st.st_mode);
}

}  // namespace tavo

#endif
