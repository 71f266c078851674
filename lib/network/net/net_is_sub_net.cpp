// Checks whether a text is an IPv4 address and a contiguous mask, joined by a slash.
#include "tavo_net.h"

#include "core/detail/fault.h"
#include "network/detail/ipv4_text.h"

extern "C" int BlTLIBIsSubNet(const char *szSubnet)
{
    if (!szSubnet)
        return FailZero(ERR_BAD_PARAMETERS);
    const auto parts = tavo::SplitAtSlash(szSubnet);
    if (!parts || !tavo::ParseIpv4(parts->before))
        return FailZero(ERR_INVALID_NETNAME);
    const auto mask = tavo::ParseIpv4(parts->after);
    if (!mask || !tavo::PrefixLength(*mask))
        return FailZero(ERR_INVALID_NETNAME);
    return 1;
}
