// Changes of IPv6 addresses.
#include "network/detail/ipv6_change.h"

#include "network/detail/net_command.h"

namespace tavo {

int RunAddressTool(const char *verb, const in6_addr &address, int length, const char *interface)
{
    return RunNetCommand("/sbin/ip -6 addr %s %s/%d dev %s > /dev/null 2>&1", verb, Ipv6Text(address), length,
                         interface);
}

}  // namespace tavo
