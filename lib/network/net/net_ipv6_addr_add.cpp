// Gives an interface an IPv6 address.
#include "tavo_net.h"

#include "core/detail/guard.h"
#include "core/detail/log.h"
#include "network/detail/interface_file.h"
#include "network/detail/interface_name.h"
#include "network/detail/ipv6_change.h"
#include "network/detail/network_change.h"

extern "C" int TAVONetIPv6AddrAdd(const char *szInterface, const char *szAddr, int nPrefix)
{
    if (!szInterface || !tavo::IsInterfaceName(szInterface) || !szAddr)
        return Fail(ERR_BAD_PARAMETERS);
    if (!tavo::IsPrefixLength(nPrefix)) {
        LogError("%s:%d Paramter Prefix length %d out of range [0, 128]", nPrefix);
        return Fail(ERR_INVALID_NETNAME);
    }
    const auto address = tavo::ParseIpv6(szAddr);
    if (!address || !tavo::IsHostAddress(*address))
        return Fail(ERR_INVALID_NETNAME);
    return Guard([&] {
        return tavo::ChangeNetwork([&] {
            if (tavo::RunAddressTool("add", *address, nPrefix, szInterface) != 0)
                return Fail(ERR_OP_FAILURE);
            const tavo::SettingChange changes[] = {{"DEVICE", szInterface},
                                                   {"IPV6INIT", "yes"},
                                                   {"IPV6ADDR", tavo::Ipv6Text(*address)},
                                                   {"IPV6PREFIXLENG", std::to_string(nPrefix)}};
            if (const int code = tavo::RewriteSettings(tavo::InterfaceFile(szInterface), changes)) {
                LogError("%s:%d Set %s error.", tavo::InterfaceFile(szInterface));
                Fail(code);
                return -2;
            }
            return 0;
        });
    });
}
