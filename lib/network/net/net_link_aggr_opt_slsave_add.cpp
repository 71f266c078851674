// Adds a member interface to a link-aggregation record.
#include "tavo_net.h"

#include "core/detail/guard.h"
#include "network/detail/interface_name.h"
#include "network/detail/kernel_interface.h"
#include "network/detail/net_buffer.h"

#include <cstring>

extern "C" int TAVONetLinkAggrOptSlsaveAdd(TAVONETLINKAGGR *pAggr, const char *szInterface)
{
    if (!pAggr || pAggr->nMember < 0 || pAggr->nMember > TAVO_NET_MEMBERS || !szInterface ||
        !tavo::IsInterfaceName(szInterface))
        return Fail(ERR_BAD_PARAMETERS);
    return Guard([&] {
        // A bond cannot be a member of a bond, and neither can an interface that is not Ethernet.
        if (tavo::InterfaceAttribute(szInterface, "type") != "1" ||
            !tavo::InterfaceAttribute(szInterface, "bonding/mode").empty())
            return Fail(ERR_LINK_AGGR_TYPE);
        for (int i = 0; i < pAggr->nMember; ++i) {
            if (std::strncmp(pAggr->rgszMember[i], szInterface, sizeof pAggr->rgszMember[i]) == 0)
                return 0;
        }
        if (pAggr->nMember == TAVO_NET_MEMBERS)
            return Fail(ERR_LINK_AGGR_OPTION);
        tavo::ToBuffer(szInterface, pAggr->rgszMember[pAggr->nMember++], sizeof pAggr->rgszMember[0]);
        return 0;
    });
}
