// Lists the IPv6 addresses of an interface.
#include "tavo_net.h"

#include "core/detail/guard.h"
#include "network/detail/interface_name.h"
#include "network/detail/ipv6_text.h"
#include "network/detail/kernel_interface.h"

#include <cerrno>

extern "C" int TAVONetIPv6AddrEnum(const char *szInterface, TLIBSZLIST **ppAddrs)
{
    if (!szInterface || !tavo::IsInterfaceName(szInterface) || !ppAddrs || !*ppAddrs)
        return Fail(ERR_BAD_PARAMETERS);
    return Guard([&] {
        // Without the file the kernel has no IPv6, and so no interface has an address.
        const auto table = tavo::ReadKernelFile("/proc/net/if_inet6");
        if (!table && errno != ENOENT)
            return Fail(ERR_OPEN_FAILED);
        int count = 0;
        for (const std::string &address : tavo::ParseIpv6Table(table.value_or(""), szInterface)) {
            if (TLIBSzListPush(ppAddrs, address.c_str()) < 0)
                return Fail(ERR_OUT_OF_MEMORY);
            ++count;
        }
        return count;
    });
}
