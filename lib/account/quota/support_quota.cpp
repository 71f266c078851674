// Checks whether the model has quotas.
#include "tavo_file.h"
#include "tavo_quota.h"

#include "core/detail/keep_fault.h"
#include "core/detail/setting_switch.h"

#include <strings.h>

extern "C" int TAVOSupportQUOTA(void)
{
    const tavo::KeepFault keep;
    char value[5];
    return TLIBFileGetKeyValue(tavo::kFactorySettings, "supportquota", value, sizeof value, 0) > 0 &&
                   ::strcasecmp(value, "yes") == 0
               ? 1
               : 0;
}
