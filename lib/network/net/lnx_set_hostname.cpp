// Gives the appliance another host name: in the kernel, in the stored settings and in /etc/hosts.
#include "tavo_net.h"

#include "tavo_file.h"

#include "core/detail/guard.h"
#include "core/detail/keep_fault.h"
#include "core/detail/log.h"
#include "network/detail/interface_file.h"
#include "network/detail/network_change.h"

#include <cstring>

#include <unistd.h>

namespace {

void PutBackName(const std::string &stored, const char *refused)
{
    const tavo::KeepFault keep;
    if (stored.empty())
        TLIBFileRemoveKey(tavo::kNetworkFile, "HOSTNAME");
    else
        TLIBFileSetKeyValue(tavo::kNetworkFile, "HOSTNAME", stored.c_str(), nullptr);
    tavo::UpdateHosts(refused);
}

int SetName(const char *name)
{
    const std::string stored = tavo::ReadSetting(tavo::kNetworkFile, "HOSTNAME");
    const std::string old_name = tavo::OwnHostName();
    if (TLIBFileSetKeyValue(tavo::kNetworkFile, "HOSTNAME", name, nullptr) < 0)
        return Fail(TLIBErrGet());
    if (const int code = tavo::UpdateHosts(old_name)) {
        LogError("%s:%d Set %s error.", tavo::kHostsFile);
        PutBackName(stored, name);
        return Fail(code);
    }
    if (::sethostname(name, std::strlen(name)) != 0) {
        PutBackName(stored, name);
        return Fail(ERR_SYS_UNKNOWN);
    }
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
