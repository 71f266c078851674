// Data folders of services: real folders, never links to one. Who may write to a volume must not choose where root puts
// the data of services.
#ifndef TAVO_SERVICE_DETAIL_DATA_FOLDER_H
#define TAVO_SERVICE_DETAIL_DATA_FOLDER_H

#include <sys/stat.h>

namespace tavo {

inline bool IsRealFolder(const char *path) noexcept
{
    struct stat st;
    return ::lstat(path, &st) == 0 && S_ISDIR(st.st_mode);
}

}  // namespace tavo

#endif
