// Changes of IPv6 addresses: what all of them refuse, and the tool that makes them.
#ifndef TAVO_NETWORK_DETAIL_IPV6_CHANGE_H
#define TAVO_NETWORK_DETAIL_IPV6_CHANGE_H

#include "network/detail/ipv6_text.h"

namespace tavo {

constexpr bool IsPrefixLength(int length) noexcept
{
    return length >= 0 && length <= kIpv6Bits;
}

// "/sbin/ip -6 addr VERB ADDRESS/LENGTH dev INTERFACE"; its exit status, -1 when it was not run.
int RunAddressTool(const char *verb, const in6_addr &address, int length, const char *interface);

}  // namespace tavo

#endif
