// Checks whether a text is a contiguous IPv4 mask and writes it in its canonical form.
#include "tavo_net.h"

#include "core/detail/fault.h"
#include "network/detail/ipv4_text.h"

#include <cstdio>

extern "C" int BlTLIBIsIpMask(char *szMask)
{
    if (!szMask)
        return FailZero(ERR_BAD_PARAMETERS);
    const auto mask = tavo::ParseIpv4(szMask);
    if (!mask || !tavo::PrefixLength(*mask))
        return FailZero(ERR_INVALID_NETNAME);
    // In place is safe: without leading zeros the text can only get shorter.
    const auto &octet = mask->octet;
    std::sprintf(szMask, "%d.%d.%d.%d", octet[0], octet[1], octet[2], octet[3]);
    return 1;
}
