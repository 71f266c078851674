// Reads the stored host name.
#include "tavo_file.h"
#include "tavo_net.h"

#include "core/detail/fault.h"
#include "network/detail/interface_file.h"

extern "C" int TAVOLnxGetHostname(char *szName, int cbName)
{
    if (!szName || cbName <= 0)
        return Fail(ERR_BAD_PARAMETERS);
    return TLIBFileGetKeyValue(tavo::kNetworkFile, "HOSTNAME", szName, cbName, 0) > 0 ? 0 : -1;
}
