// Stores the default gateway and makes it the kernel's.
#include "tavo_net.h"

#include "tavo_file.h"

#include "core/detail/guard.h"
#include "core/detail/keep_fault.h"
#include "core/detail/log.h"
#include "network/detail/interface_file.h"
#include "network/detail/ipv4_text.h"
#include "network/detail/net_command.h"
#include "network/detail/network_change.h"

namespace {

int AddDefault(const std::string &gateway)
{
    return tavo::RunNetCommand("/sbin/route add default gw %s > /dev/null 2>&1", gateway);
}

// What the kernel and the file had before; without a route the appliance would be cut off from whoever sets it.
void PutBackGateway(const std::string &live, const std::string &stored)
{
    if (!stored.empty())
        TLIBFileSetKeyValue(tavo::kNetworkFile, "GATEWAY", stored.c_str(), nullptr);
    else
        TLIBFileRemoveKey(tavo::kNetworkFile, "GATEWAY");
    if (!live.empty())
        AddDefault(live);
}

std::string LiveGateway()
{
    const tavo::KeepFault keep;  // without one there is nothing to put back
    char gateway[20] = "";
    return TAVONetDefaultGatewayGet(gateway, sizeof gateway) == 0 ? gateway : "";
}

int SetGateway(const std::string &gateway)
{
    const std::string live = LiveGateway();
    const std::string stored = tavo::ReadSetting(tavo::kNetworkFile, "GATEWAY");

    tavo::RunNetCommand("/sbin/route delete default > /dev/null 2>&1");
    if (TLIBFileSetKeyValue(tavo::kNetworkFile, "GATEWAY", gateway.c_str(), nullptr) < 0) {
        const int code = TLIBErrGet();
        LogError("%s(%d): TLIBFileSetKeyValue(%s, GATEWAY, %s) failed.(%X)", tavo::kNetworkFile, gateway, code);
        if (!live.empty())
            AddDefault(live);
        return Fail(code);
    }
    if (AddDefault(gateway) != 0) {
        LogError("%s(%d): failed to set default gateway.");
        PutBackGateway(live, stored);
        return Fail(ERR_OP_FAILURE);
    }
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
