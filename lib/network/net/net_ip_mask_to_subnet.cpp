// Turns "address/dotted mask" into "network/prefix length".
#include "tavo_net.h"

#include "core/detail/fault.h"
#include "network/detail/ipv4_text.h"

#include <algorithm>
#include <cstdio>

namespace {

constexpr size_t kBuffer = 64;  // buffer size that every caller passes

}  // namespace

extern "C" int ErrTLIBIpMaskToSubnet(char *szIn, char *szOut)
{
    const auto parts = szIn ? tavo::SplitAtSlash(szIn) : std::nullopt;
    if (!parts)
        return Fail(ERR_BAD_PARAMETERS);
    const auto address = tavo::ParseIpv4(parts->before);
    if (!address || std::ranges::find(address->octet, 255) != address->octet.end())
        return Fail(ERR_INVALID_NETNAME);
    const auto mask = tavo::ParseIpv4(parts->after);
    const auto length = mask ? tavo::PrefixLength(*mask) : std::nullopt;
    if (!length)
        return Fail(ERR_INVALID_NETNAME);

    const auto network = tavo::Ipv4::FromWord(address->Word() & mask->Word()).octet;
    std::snprintf(szOut ? szOut : szIn, kBuffer, "%d.%d.%d.%d/%d", network[0], network[1], network[2], network[3],
                  *length);
    return 0;
}
