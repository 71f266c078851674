// Takes an IPv6 address from an interface.
#include "tavo_net.h"

#include "core/detail/guard.h"
#include "core/detail/log.h"
#include "network/detail/interface_file.h"
#include "network/detail/interface_name.h"
#include "network/detail/ipv6_change.h"
#include "network/detail/network_change.h"

namespace {

// 0, also when another address is stored or none; or the code of what failed.
int Forget(const std::string &file, const std::string &address)
{
    const auto stored = tavo::ParseIpv6(tavo::ReadSetting(file, "IPV6ADDR").c_str());
    if (!stored || tavo::Ipv6Text(*stored) != address)
        return 0;
    const tavo::SettingChange changes[] = {{"IPV6ADDR", std::nullopt}, {"IPV6PREFIXLENG", std::nullopt}};
    return tavo::RewriteSettings(file, changes);
}

}  // namespace

extern "C" int TAVONetIPv6AddrDel(const char *szInterface, const char *szAddr, int nPrefix)
{
    if (!szInterface || !tavo::IsInterfaceName(szInterface) || !szAddr)
        return Fail(ERR_BAD_PARAMETERS);
    if (!tavo::IsPrefixLength(nPrefix)) {
        LogError("%s:%d Paramter Prefix length %d out of range [0, 128]", nPrefix);
        return Fail(ERR_INVALID_NETNAME);
    }
    const auto address = tavo::ParseIpv6(szAddr);
    if (!address)
        return Fail(ERR_INVALID_NETNAME);
    return Guard([&] {
        return tavo::ChangeNetwork([&] {
            if (tavo::RunAddressTool("del", *address, nPrefix, szInterface) != 0)
                return Fail(ERR_OP_FAILURE);
            if (const int code = Forget(tavo::InterfaceFile(szInterface), tavo::Ipv6Text(*address))) {
                LogError("%s:%d Set %s error.", tavo::InterfaceFile(szInterface));
                Fail(code);
                return -2;
            }
            return 0;
        });
    });
}
