// Fills the record of a service's data folder: its name, its capability, and the target of its link.
#include "tavo_service.h"

#include "core/detail/guard.h"
#include "core/detail/keep_fault.h"
#include "core/detail/log.h"
#include "core/detail/setting_switch.h"
#include "service/detail/service_table.h"
#include "service/detail/volume_list.h"

#include <cstdio>

namespace {

constexpr const char *kNamings[] = {"@", "", "@database/"};

bool IsSpecial(int type)
{
    return type == tavo::kVolumeExternal || type == tavo::kVolumeRemote;
}

}  // namespace

extern "C" int TAVOServiceSettingGet(int idShare, TAVOSERVICESHARE *pShare)
{
    const tavo::ServiceShareRow *row = tavo::FindServiceShare(idShare);
    if (!row || !pShare)
        return Fail(ERR_BAD_PARAMETERS);

    TAVOSERVICESHARE share = row->share;
    std::snprintf(share.szShareName, sizeof share.szShareName, "%s%s", kNamings[share.nNaming], share.szShare);
    for (const char *key : row->capability_keys) {
        if (key && tavo::SettingSaysYes(tavo::kFactorySettings, key))
            share.fSupported = 1;
    }
    const int result = TAVOServiceVolumeGetbyLink(share.szLink, share.szVolume, sizeof share.szVolume,
                                                  share.szVolumePath, sizeof share.szVolumePath);
    share.fOnVolume = result == 1;
    if (share.szVolumePath[0]) {
        TLIBErrSet(ERR_SUCCESS);
        const tavo::KeepFault keep;  // a volume of unknown type is logged, and not a failure
        const int type = Guard([&] { return tavo::VolumeType(share.szVolumePath); });
        if (type < 0) {
            const int code = TLIBErrGet() ? TLIBErrGet() : ERR_NO_VOLUME_ID;
            LogError("%s:%d Failed to check volume type: path=[%s], tavoerr=0x%04X", share.szVolumePath, code);
        }
        share.fSpecialVolume = IsSpecial(type);
    }
    *pShare = share;
    return result;
}
