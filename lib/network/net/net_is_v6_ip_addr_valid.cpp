// Checks whether a text is an IPv6 address.
#include "tavo_net.h"

#include "core/detail/fault.h"

#include <arpa/inet.h>

extern "C" int BlTLIBIsv6IpAddrValid(const char *szAddr)
{
    in6_addr address;
    if (!szAddr)
        return FailZero(ERR_BAD_PARAMETERS);
    if (::inet_pton(AF_INET6, szAddr, &address) != 1)
        return FailZero(ERR_INVALID_NETNAME);
    return 1;
}
