// Checks whether an internal port leads to an expansion unit.
#include "tavo_appliance.h"

#include "appliance/detail/expansion_port.h"
#include "core/detail/guard.h"
#include "core/detail/model_setting.h"

extern "C" int TAVOEBoxDevIs(int iPort)
{
    return Guard([&] { return iPort >= 0 && tavo::ModelHas("supportebox") && tavo::HasPortMultiplier(iPort) ? 1 : 0; });
}
