// Checks whether an expansion unit has power.
#include "tavo_appliance.h"

#include "core/detail/fault.h"

extern "C" int TAVOEBoxIsPoweron(const TAVOEBOX *pBox)
{
    if (!pBox)
        return FailZero(ERR_BAD_PARAMETERS);
    return pBox->fPoweron != 0;
}
