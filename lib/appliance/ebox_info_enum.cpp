// Finds the expansion units.
#include "tavo_appliance.h"

#include "appliance/detail/expansion_port.h"
#include "core/detail/guard.h"
#include "core/detail/model_setting.h"
#include "core/detail/owner.h"

#include <algorithm>
#include <vector>

extern "C" int TAVOEBoxInfoEnum(TAVOEBOX **ppBox)
{
    if (!ppBox)
        return Fail(ERR_BAD_PARAMETERS);
    *ppBox = nullptr;
    return Guard([&] {
        if (!tavo::ModelHas("supportebox"))
            return 0;
        if (!tavo::CanSeePorts())
            return Fail(ERR_OPEN_FAILED);
        std::vector<TAVOEBOX> boxes;
        for (int port = 0; port < tavo::kPorts; ++port) {
            if (!tavo::HasPortMultiplier(port))
                continue;
            TAVOEBOX box = {};
            box.iUnit = static_cast<int32_t>(boxes.size()) + 1;
            box.iPort = port;
            box.fPoweron = tavo::HasLink(port) ? 1 : 0;
            tavo::ListUnitDisks(box);
            boxes.push_back(box);
        }
        if (boxes.empty())
            return 0;
        *ppBox = static_cast<TAVOEBOX *>(std::malloc(boxes.size() * sizeof(TAVOEBOX)));
        if (!*ppBox)
            return Fail(ERR_OUT_OF_MEMORY);
        std::copy(boxes.begin(), boxes.end(), *ppBox);
        return static_cast<int>(boxes.size());
    });
}
