// Reads the stored default gateway.
#include "tavo_file.h"
#include "tavo_net.h"

#include "core/detail/fault.h"
#include "network/detail/interface_file.h"

extern "C" int TAVONetDefaultGatewayGetConf(char *szGateway, int cbGateway)
{
    if (!szGateway || cbGateway <= 0)
        return Fail(ERR_BAD_PARAMETERS);
    return TLIBFileGetKeyValue(tavo::kNetworkFile, "GATEWAY", szGateway, cbGateway, 0) > 0 ? 0 : -1;
}
