// Returns the daemons that serve a kind of data folder.
#include "tavo_service.h"

#include "core/detail/fault.h"

#include <strings.h>

namespace {

struct FolderDaemons {
    const char *name;
    uint32_t mask;
};

constexpr uint32_t kShown = TAVO_DAEMON_MEDIA | TAVO_DAEMON_INDEX;  // shows any kind of media

// clang-format off
constexpr FolderDaemons kFolders[] = {
    {"web",          TAVO_DAEMON_WEB_USER},
    {"NetBackup",    TAVO_DAEMON_NETBKP},
    {"surveillance", TAVO_DAEMON_SURVEILLANCE},
    {"photo",        kShown | TAVO_DAEMON_THUMBNAIL | TAVO_DAEMON_VIDEO},
    {"video",        kShown | TAVO_DAEMON_PLAYER},
    {"music",        kShown | TAVO_DAEMON_PLAYER | TAVO_DAEMON_AUDIO | TAVO_DAEMON_REMOTE},
};
// clang-format on

}  // namespace

extern "C" int TAVOServiceDaemonGet(const char *szName)
{
    if (!szName || !*szName)
        return Fail(ERR_BAD_PARAMETERS);
    for (const FolderDaemons &folder : kFolders) {
        if (::strcasecmp(folder.name, szName) == 0)
            return static_cast<int>(folder.mask);
    }
    return 0;
}
