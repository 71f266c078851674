// Lists the services that keep data on a volume.
#include "tavo_service.h"

#include "core/detail/fault.h"
#include "service/detail/service_table.h"
#include "service/detail/volume_list.h"

#include <algorithm>

extern "C" int TAVOServiceGetbyVolume(const char *szVolume, TLIBSZLIST **ppNames)
{
    if (!szVolume || !tavo::VolumeNumber(szVolume) || !ppNames || !*ppNames)
        return Fail(ERR_BAD_PARAMETERS);
    int count = 0;
    for (int id = 0; id < tavo::kServices; ++id) {
        const auto shares = tavo::SharesOf(tavo::service_table[id]);
        if (std::none_of(shares.begin(), shares.end(),
                         [&](int32_t share) { return TAVOServiceIsOnVolume(share, szVolume) == 1; }))
            continue;
        if (TLIBSzListPush(ppNames, tavo::service_table[id].szName) < 0)
            return Fail(ERR_OUT_OF_MEMORY);
        ++count;
    }
    return count;
}
