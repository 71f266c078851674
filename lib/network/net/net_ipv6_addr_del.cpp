// Takes an IPv6 address from an interface.
#include "tavo_net.h"

#include "network/detail/ipv6_change.h"

extern "C" int TAVONetIPv6AddrDel(const char *szInterface, const char *szAddr, int nPrefix)
{
    return tavo::ChangeIpv6Address(tavo::Ipv6AddressChange::remove, szInterface, szAddr, nPrefix);
}
