// Releases every data folder.
#include "tavo_service.h"

#include "core/detail/fault.h"
#include "service/detail/service_table.h"

extern "C" int TAVOServiceRemoveAll(int fDelete)
{
    bool done = true;
    for (int share = 1; share < tavo::kServiceShares; ++share)
        done = TAVOServiceRemove(share, fDelete) == 0 && done;
    if (!done)
        return Fail(ERR_SERVICE_REMOVE);
    return 0;
}
