// Collects the appliances on the network and hands their list over for reading.
#include "tavo_fhost.h"

#include "core/detail/guard.h"
#include "core/detail/log.h"
#include "network/detail/discovery_daemon.h"
#include "network/detail/host_list.h"

#include <cerrno>
#include <cstdio>
#include <cstring>

#include <unistd.h>

extern "C" int TAVOFHOSTDumpHost(void)
{
    return Guard([] {
        if (!tavo::IsDiscoveryAlive()) {
            LogError("%s(%d): findhostd daemon is not running ....");
            if (!tavo::StartDiscovery())
                return Fail(ERR_OP_FAILURE);
        }
        if (!tavo::MakeHostList()) {
            LogError("%s:%d Fail to create [%s], errno=[%d/%s]", tavo::kHostList, errno, std::strerror(errno));
            return Fail(ERR_CREATE_FAILED);
        }
        if (ErrFHOSTSendQueryPkt() != 0) {
            LogError("%s(%d): ErrFHOSTSendQueryPkt() failed!");
            return Fail(ERR_OP_FAILURE);
        }
        ::sleep(tavo::kAnswerSeconds);
        if (std::rename(tavo::kHostList, tavo::kHostListTaken) == 0)
            return 0;
        LogError("%s:%d Fail to rename [%s], errno=[%d/%s]", tavo::kHostList, errno, std::strerror(errno));
        return Fail(ERR_RENAME_FAILED);
    });
}
