// Checks whether the FTP server is enabled and running. The row names a process, but the daemon may run under inetd for
// a single session. So both the key and the process are checked.
#include "tavo_service.h"

#include "core/detail/guard.h"
#include "service/detail/process_named.h"

extern "C" int TAVOServiceFTPStatus(const TAVOSERVICE *pService)
{
    return TAVOServiceSTDStatus(pService) == 1 && Guard([] { return tavo::IsProcessNamed("ftpd"); });
}
