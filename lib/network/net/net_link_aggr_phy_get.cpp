// Lists the physical interfaces that are members of a bond.
#include "tavo_net.h"

#include "core/detail/guard.h"
#include "core/detail/text_fields.h"
#include "network/detail/interface_name.h"
#include "network/detail/kernel_interface.h"

extern "C" int TAVONetLinkAggrPhyGet(const char *szBond, TLIBSZLIST **ppMembers)
{
    if (!szBond || !tavo::IsInterfaceName(szBond) || !ppMembers || !*ppMembers)
        return Fail(ERR_BAD_PARAMETERS);
    return Guard([&] {
        const std::string members = tavo::InterfaceAttribute(szBond, "bonding/slaves");
        int count = 0;
        for (const std::string_view member : tavo::SplitFields(members)) {
            if (TLIBSzListPush(ppMembers, std::string(member).c_str()) < 0)
                return Fail(ERR_OUT_OF_MEMORY);
            ++count;
        }
        return count;
    });
}
