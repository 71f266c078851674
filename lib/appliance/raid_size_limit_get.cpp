// Returns how much of an array member the model uses at most.
#include "tavo_appliance.h"

#include "core/detail/guard.h"
#include "core/detail/model_setting.h"

#include <algorithm>
#include <climits>

extern "C" unsigned long RAIDSizeLimitGet(void)
{
    unsigned long limit = 0;
    Guard([&] {
        const uint64_t kib = tavo::ModelNumber("raidsizelimit").value_or(0);
        limit = static_cast<unsigned long>(std::min<uint64_t>(kib, ULONG_MAX));
    });
    return limit;
}
