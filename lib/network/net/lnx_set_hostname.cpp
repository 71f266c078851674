// Sets the host name: in the kernel, in the stored settings and in /etc/hosts.
#include "tavo_file.h"
#include "tavo_net.h"

#include "core/detail/guard.h"
#include "core/detail/log.h"
#include "network/detail/checkpoint.h"
#include "network/detail/interface_file.h"
#include "network/detail/network_change.h"

#include <cstring>

#include <unistd.h>

namespace {

int SetName(const char *name)
{
    const auto old_name = tavo::OwnHostName();
    if (!old_name)
        return Fail(ERR_READ_FAILED);
    tavo::Checkpoint before;
    before.AddSetting(tavo::kNetworkFile, "HOSTNAME");
    before.AddFile(tavo::kHostsFile);
    before.AddHostName();
    before.Begin();
    int code = TLIBFileSetKeyValue(tavo::kNetworkFile, "HOSTNAME", name, nullptr) < 0 ? TLIBErrGet() : 0;
    if (code == 0) {
        code = tavo::UpdateHosts(*old_name);
        if (code != 0)
            LogError("%s:%d Set %s error.", tavo::kHostsFile);
    }
    if (code == 0 && ::sethostname(name, std::strlen(name)) != 0)
        code = ERR_SYS_UNKNOWN;
    if (code != 0) {
        before.PutBack();
        return Fail(code);
    }
    before.End();
    return 0;
}

}  // namespace

extern "C" int TAVOLnxSetHostname(const char *szName)
{
    if (!szName)
        return Fail(ERR_BAD_PARAMETERS);
    if (!BlTLIBIsHostname(szName))
        return Fail(ERR_INVALID_NETNAME);
    return Guard([&] { return tavo::ChangeNetwork([&] { return SetName(szName); }); });
}
