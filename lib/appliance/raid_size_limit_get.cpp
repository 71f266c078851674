// Tells how much of an array member the model uses at most.
#include "tavo_appliance.h"

#include "core/detail/guard.h"
#include "core/detail/model_setting.h"

extern "C" unsigned long RAIDSizeLimitGet(void)
{
    unsigned long limit = 0;
    Guard([&] { limit = tavo::ModelNumber("raidsizelimit").value_or(0); });
    return limit;
}
