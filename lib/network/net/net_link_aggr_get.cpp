// Reads how a bond is set up.
#include "tavo_net.h"

#include "core/detail/guard.h"
#include "core/detail/log.h"
#include "core/detail/text_fields.h"
#include "network/detail/bonding.h"
#include "network/detail/interface_name.h"
#include "network/detail/kernel_interface.h"
#include "network/detail/net_buffer.h"

#include <cstring>

extern "C" int TAVONetLinkAggrGet(const char *szBond, TAVONETLINKAGGR *pAggr)
{
    if (!szBond || !tavo::IsInterfaceName(szBond) || !pAggr)
        return Fail(ERR_BAD_PARAMETERS);
    return Guard([&] {
        TAVONETLINKAGGR aggr;
        std::memset(&aggr, 0, sizeof aggr);
        tavo::ToBuffer(szBond, aggr.szBond, sizeof aggr.szBond);

        const std::string mode = tavo::InterfaceAttribute(szBond, "bonding/mode");
        if (mode.empty()) {  // no such bond: nothing is aggregated
            *pAggr = aggr;
            return 0;
        }
        const auto known = tavo::ParseBondMode(mode);
        if (!known) {
            LogError("%s:%d Non-supported bonding mode [%s]", mode);
            return Fail(ERR_LINK_AGGR_OPTION);
        }
        aggr.nMode = static_cast<int32_t>(*known);
        const std::string members = tavo::InterfaceAttribute(szBond, "bonding/slaves");
        for (const std::string_view member : tavo::SplitFields(members)) {
            if (aggr.nMember == TAVO_NET_MEMBERS)
                break;
            tavo::ToBuffer(member, aggr.rgszMember[aggr.nMember++], sizeof aggr.rgszMember[0]);
        }
        if (*known == tavo::BondMode::lacp) {
            const auto state = tavo::ReadKernelFile(("/proc/net/bonding/" + std::string(szBond)).c_str());
            tavo::ToBuffer(tavo::ParsePartnerMac(state.value_or("")), aggr.szPartner, sizeof aggr.szPartner);
        }
        *pAggr = aggr;
        return 0;
    });
}
