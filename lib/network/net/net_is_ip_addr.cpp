// Checks whether a text is an IPv4 address that a host can have.
#include "tavo_net.h"

#include "core/detail/fault.h"
#include "network/detail/ipv4_text.h"

extern "C" int BlTLIBIsIpAddr(const char *szAddr)
{
    if (!szAddr)
        return FailZero(ERR_BAD_PARAMETERS);
    const auto address = tavo::ParseIpv4(szAddr);
    return address && tavo::IsHostAddress(*address) ? 1 : FailZero(ERR_INVALID_NETNAME);
}
