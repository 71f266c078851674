// Adds an IPv6 address to an interface.
#include "tavo_net.h"

#include "network/detail/ipv6_change.h"

extern "C" int TAVONetIPv6AddrAdd(const char *szInterface, const char *szAddr, int nPrefix)
{
    return tavo::ChangeIpv6Address(tavo::Ipv6AddressChange::add, szInterface, szAddr, nPrefix);
}
