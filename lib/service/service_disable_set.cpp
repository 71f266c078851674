// Sets the enable key of a service to "no" without stopping it.
#include "tavo_file.h"
#include "tavo_service.h"

#include "core/detail/fault.h"
#include "core/detail/log.h"
#include "service/detail/service_table.h"

extern "C" int TAVOServiceDisableSet(int idShare)
{
    const tavo::ServiceShareRow *row = tavo::FindServiceShare(idShare);
    if (!row || !row->share.szEnableKey[0])
        return Fail(ERR_BAD_PARAMETERS);
    if (TAVOINFOSetKeyValue(row->share.szEnableKey, "no") < 0) {
        LogError("%s:%d TAVOINFOSetKeyValue failed with key=%s", row->share.szEnableKey);
        return -1;
    }
    return 0;
}
