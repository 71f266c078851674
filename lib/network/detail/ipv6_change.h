// Changes of the IPv6 addresses of an interface.
#ifndef TAVO_NETWORK_DETAIL_IPV6_CHANGE_H
#define TAVO_NETWORK_DETAIL_IPV6_CHANGE_H

#include "core/detail/where.h"
#include "network/detail/ipv6_text.h"

namespace tavo {

constexpr bool IsPrefixLength(int length) noexcept
{
    return length >= 0 && length <= kIpv6Bits;
}

enum class Ipv6AddressChange { add, remove };

// The body of TAVONetIPv6AddrAdd and TAVONetIPv6AddrDel: the refusals, the change in the kernel, and the interface
// file.
int ChangeIpv6Address(Ipv6AddressChange change, const char *interface, const char *text, int length,
                      Where where = Where()) noexcept;

}  // namespace tavo

#endif
