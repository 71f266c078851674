// Tells whether a text is an IPv4 address that a host can have.
#include "tavo_net.h"

#include "core/detail/fault.h"
#include "network/detail/ipv4_text.h"

extern "C" int BlTLIBIsIpAddr(const char *szAddr)
{
    if (!szAddr)
        return FailZero(ERR_BAD_PARAMETERS);
    const auto address = tavo::ParseIpv4(szAddr);
    if (!address)
        return FailZero(ERR_INVALID_NETNAME);
    const int first = address->octet[0];
    // A last octet of 255 is taken for a broadcast whatever the mask says: the web pages know no mask at this point.
    if (first == 0 || first == 127 || first > 223 || address->octet[3] > 254)
        return FailZero(ERR_INVALID_NETNAME);
    return 1;
}
