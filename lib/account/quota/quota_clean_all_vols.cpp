// Clears the limits of users on every volume.
#include "tavo_quota.h"

#include "core/detail/log.h"

extern "C" int TAVOQuotaCleanAllVols(const TLIBSZLIST *)
{
    LogError("%s:%d Quotas are not available yet");
    return Fail(ERR_OP_UNREGISTERED);
}
