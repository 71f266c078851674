// Stores the default gateway and makes it the kernel's.
#include "tavo_file.h"
#include "tavo_net.h"

#include "core/detail/guard.h"
#include "core/detail/log.h"
#include "network/detail/checkpoint.h"
#include "network/detail/connected_route.h"
#include "network/detail/interface_file.h"
#include "network/detail/ipv4_text.h"
#include "network/detail/net_command.h"
#include "network/detail/network_change.h"

#include <algorithm>

namespace {

// To any router when `gateway` is NULL.
bool HasDefault(const tavo::Ipv4 *gateway = nullptr)
{
    const auto routes = tavo::LiveRoutes();
    return std::any_of(routes.begin(), routes.end(), [&](const tavo::Route &route) {
        return route.IsDefault() && (!gateway || route.gateway == *gateway);
    });
}

int SetGateway(const std::string &gateway)
{
    tavo::Checkpoint before;
    before.AddSetting(tavo::kNetworkFile, "GATEWAY");
    before.AddGateway();
    before.Begin();
    // There may be none to delete. But one that is still there would stay beside the new one.
    const int deleted = tavo::RunNetCommand("/sbin/route delete default > /dev/null 2>&1");
    if (deleted == -1 || (deleted != 0 && HasDefault())) {
        before.PutBackAll();
        return Fail(ERR_OP_FAILURE);
    }
    if (TLIBFileSetKeyValue(tavo::kNetworkFile, "GATEWAY", gateway.c_str(), nullptr) < 0) {
        const int code = TLIBErrGet();
        LogError("%s(%d): TLIBFileSetKeyValue(%s, GATEWAY, %s) failed.(%X)", tavo::kNetworkFile, gateway, code);
        before.PutBack();
        return Fail(code);
    }
    if (const int status = tavo::RunNetCommand("/sbin/route add default gw %s > /dev/null 2>&1", gateway)) {
        LogError("%s(%d): failed to set default gateway.");
        // Without a route the appliance would be cut off from its administrator.
        const auto added = tavo::ParseIpv4(gateway);
        if (status == -1 || HasDefault(&*added))
            before.PutBackAll();
        else
            before.PutBack();
        return Fail(ERR_OP_FAILURE);
    }
    before.End();
    return 0;
}

}  // namespace

extern "C" int TAVONetDefaultGatewaySet(const char *szGateway)
{
    if (!szGateway)
        return Fail(ERR_BAD_PARAMETERS);
    if (!BlTLIBIsIpAddr(szGateway))
        return Fail(ERR_INVALID_NETNAME);
    return Guard([&] {
        const std::string gateway = tavo::ParseIpv4(szGateway)->Text();  // to the tool "010" is 8
        return tavo::ChangeNetwork([&] { return SetGateway(gateway); });
    });
}
