// Checks whether the service that owns a data folder is enabled.
#include "tavo_file.h"
#include "tavo_service.h"

#include "core/detail/fault.h"
#include "core/detail/keep_fault.h"
#include "core/detail/log.h"
#include "core/detail/setting_switch.h"
#include "service/detail/service_table.h"

#include <strings.h>

namespace {

constexpr int kDownload = 4;

// The download scheduler has a settings file of its own; the enabled flag there counts.
constexpr const char *kDownloadSettings = "/usr/tavo/etc/download.conf";

// A missing key has the value "" and is not a failure.
struct DownloadSetting {
    explicit DownloadSetting(const char *key) noexcept
    {
        const tavo::KeepFault keep;
        if (TLIBFileGetKeyValue(kDownloadSettings, key, value, sizeof value, 0) < 0)
            code = TLIBErrGet();
    }

    char value[8] = "";
    int code = ERR_SUCCESS;
};

}  // namespace

extern "C" int TAVOServiceEnableGet(int idShare)
{
    const tavo::ServiceShareRow *row = tavo::FindServiceShare(idShare);
    if (!row)
        return FailZero(ERR_BAD_PARAMETERS);
    if (idShare != kDownload)
        return row->share.szEnableKey[0] && tavo::SettingSaysYes(tavo::kSettings, row->share.szEnableKey);

    const DownloadSetting setting(row->share.szEnableKey);
    if (setting.code != ERR_SUCCESS) {
        LogError("%s(%d)[%X] Failed to get info of download deck", setting.code);
        return FailZero(setting.code);
    }
    return ::strcasecmp(setting.value, "yes") == 0;
}
