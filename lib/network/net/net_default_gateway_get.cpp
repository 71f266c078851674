// Reads the default gateway that the kernel uses.
#include "tavo_net.h"

#include "core/detail/guard.h"
#include "core/detail/log.h"
#include "network/detail/kernel_interface.h"
#include "network/detail/net_buffer.h"
#include "network/detail/route_table.h"

#include <cerrno>
#include <cstring>

extern "C" int TAVONetDefaultGatewayGet(char *szGateway, int cbGateway)
{
    if (!szGateway || cbGateway <= 0)
        return Fail(ERR_BAD_PARAMETERS);
    return Guard([&] {
        const auto text = tavo::ReadKernelFile("/proc/net/route");
        if (!text)
            return Fail(ERR_OPEN_FAILED);
        const auto routes = tavo::ParseRouteTable(*text);
        if (!routes) {
            LogError("%s (%d) Unknow kernel routing table format, errno=[%s/%d]", std::strerror(errno), errno);
            return Fail(ERR_FORMAT_ERROR);
        }
        for (const tavo::Route &route : *routes) {
            if (route.IsDefault())
                return tavo::ToBuffer(route.gateway.Text(), szGateway, cbGateway) ? 0 : Fail(ERR_NOT_ENOUGH_MEMORY);
        }
        return Fail(ERR_KEY_NOT_FOUND);
    });
}
