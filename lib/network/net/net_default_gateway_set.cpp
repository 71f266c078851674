// Stores the default gateway and makes it the kernel's.
#include "tavo_net.h"

#include "tavo_file.h"

#include "core/detail/guard.h"
#include "core/detail/log.h"
#include "network/detail/interface_file.h"
#include "network/detail/net_command.h"

namespace {

int AddDefault(const char *gateway)
{
    return tavo::RunNetCommand("/sbin/route add default gw %s > /dev/null 2>&1", gateway);
}

// What the kernel and the file had before; without a route the appliance would be cut off from whoever sets it.
void PutBack(const char *live, const std::string &stored)
{
    if (!stored.empty())
        TLIBFileSetKeyValue(tavo::kNetworkFile, "GATEWAY", stored.c_str(), nullptr);
    else
        TLIBFileRemoveKey(tavo::kNetworkFile, "GATEWAY");
    if (live[0])
        AddDefault(live);
}

}  // namespace

extern "C" int TAVONetDefaultGatewaySet(const char *szGateway)
{
    if (!szGateway)
        return Fail(ERR_BAD_PARAMETERS);
    if (!BlTLIBIsIpAddr(szGateway))
        return Fail(ERR_INVALID_NETNAME);
    return Guard([&] {
        char live[20] = "";
        if (TAVONetDefaultGatewayGet(live, sizeof live) != 0)
            live[0] = 0;
        const std::string stored = tavo::ReadSetting(tavo::kNetworkFile, "GATEWAY");

        tavo::RunNetCommand("/sbin/route delete default > /dev/null 2>&1");
        if (TLIBFileSetKeyValue(tavo::kNetworkFile, "GATEWAY", szGateway, nullptr) < 0) {
            const int code = TLIBErrGet();
            LogError("%s(%d): TLIBFileSetKeyValue(%s, GATEWAY, %s) failed.(%X)", tavo::kNetworkFile, szGateway, code);
            if (live[0])
                AddDefault(live);
            return Fail(code);
        }
        if (AddDefault(szGateway) != 0) {
            LogError("%s(%d): failed to set default gateway.");
            PutBack(live, stored);
            return Fail(ERR_OP_FAILURE);
        }
        return 0;
    });
}
