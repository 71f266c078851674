// Reads all physical volumes.
#include "tavo_lvm.h"

#include "core/detail/command_output.h"
#include "core/detail/guard.h"
#include "core/detail/log.h"
#include "core/detail/owner.h"

#include <memory>

namespace {

bool Add(const LVMPV &pv, std::unique_ptr<LVMPVLIST, tavo::FreedBy<LVMPvSBListFree>> &owner)
{
    LVMPVLIST *list = owner.release();
    const bool pushed = LVMPvSBListPush(&list, &pv) == 0;
    owner.reset(list);
    return pushed;
}

}  // namespace

extern "C" int LVMPvSBEnum(LVMPVLIST **ppList)
{
    if (!ppList) {
        LogError("%s:%d Bad parameters");
        return -1;
    }
    *ppList = nullptr;
    if (LVMIsSupport() != 1)
        return 0;
    return Guard([&] {
        const std::string command =
            "/sbin/pvs --noheading -o pv_name,vg_name,vg_uuid,pv_count --separator \"|\" 2>/dev/null";
        tavo::CommandOutput output(command);
        std::unique_ptr<LVMPVLIST, tavo::FreedBy<LVMPvSBListFree>> list;
        int count = 0;
        LVMPV pv;
        for (std::string line; output.Next(line);) {
            if (LVMPvParseLine(line.c_str(), &pv) != 0)
                continue;
            if (!Add(pv, list))
                return -1;
            ++count;
        }
        if (output.Status() < 0) {
            LogError("%s:%d Failed to do '%s'", command);
            return -1;
        }
        *ppList = list.release();
        return count;
    });
}
