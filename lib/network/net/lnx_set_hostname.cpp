// Gives the appliance another host name: in the kernel, in the stored settings and in /etc/hosts.
#include "tavo_net.h"

#include "tavo_file.h"

#include "core/detail/file_rewrite.h"
#include "core/detail/guard.h"
#include "core/detail/lock_hold.h"
#include "core/detail/log.h"
#include "network/detail/hosts_file.h"
#include "network/detail/interface_file.h"
#include "network/detail/kernel_interface.h"
#include "network/detail/network_lock.h"

#include <cstring>

#include <unistd.h>

namespace {

constexpr const char *kHosts = "/etc/hosts";

// The address that the name stands for is the first one that the appliance has.
std::string FirstAddress()
{
    for (const std::string &interface : tavo::WiredInterfaces()) {
        if (const auto found = tavo::AddressOf(interface))
            return found->address.Text();
    }
    return "";
}

int RewriteHosts(const std::string &old_name, const char *new_name)
{
    tavo::FileRewrite rewrite;
    std::string text;
    if (const int code = rewrite.Open(kHosts); code != 0 && !rewrite.IsMissing())
        return code;
    if (!rewrite.IsMissing() && !rewrite.Read(text))
        return ERR_READ_FAILED;
    return rewrite.Replace(tavo::HostsWithName(text, old_name, new_name, FirstAddress()), 0644);
}

}  // namespace

extern "C" int TAVOLnxSetHostname(const char *szName)
{
    if (!szName)
        return Fail(ERR_BAD_PARAMETERS);
    if (!BlTLIBIsHostname(szName))
        return Fail(ERR_INVALID_NETNAME);
    return Guard([&] {
        const tavo::LockHold lock(tavo::kNetworkExclusive, tavo::kNetworkSeconds);
        if (!lock)
            return Fail(ERR_LOCK_FAILED);
        const std::string old_name = tavo::ReadSetting(tavo::kNetworkFile, "HOSTNAME");
        if (TLIBFileSetKeyValue(tavo::kNetworkFile, "HOSTNAME", szName, nullptr) < 0)
            return Fail(TLIBErrGet());
        if (const int code = RewriteHosts(old_name, szName)) {
            LogError("%s:%d Set %s error.", kHosts);
            return Fail(code);
        }
        if (::sethostname(szName, std::strlen(szName)) != 0)
            return Fail(ERR_SYS_UNKNOWN);
        return 0;
    });
}
