// Tells whether the service behind a data folder is enabled.
#include "tavo_service.h"

#include "core/detail/fault.h"
#include "core/detail/log.h"
#include "service/detail/service_table.h"
#include "service/detail/settings_files.h"

namespace {

constexpr int kDownload = 4;

// The download scheduler keeps settings of its own; its enabled flag there is what counts.
constexpr const char *kDownloadSettings = "/usr/tavo/etc/download.conf";

}  // namespace

extern "C" int TAVOServiceEnableGet(int idShare)
{
    const tavo::ServiceShareRow *row = tavo::FindServiceShare(idShare);
    if (!row)
        return FailZero(ERR_BAD_PARAMETERS);
    if (idShare != kDownload)
        return row->share.szEnableKey[0] && tavo::SettingIs(tavo::kSettings, row->share.szEnableKey, "yes");

    char value[8];
    if (TLIBFileGetKeyValue(kDownloadSettings, row->share.szEnableKey, value, sizeof value, 0) < 0) {
        LogError("%s(%d)[%X] Failed to get info of download deck", TLIBErrGet());
        return 0;
    }
    return ::strcasecmp(value, "yes") == 0;
}
