// Changes of the IPv6 addresses of an interface.
#include "network/detail/ipv6_change.h"

#include "core/detail/guard.h"
#include "core/detail/log.h"
#include "network/detail/checkpoint.h"
#include "network/detail/interface_file.h"
#include "network/detail/interface_name.h"
#include "network/detail/net_command.h"
#include "network/detail/network_change.h"

namespace tavo {
namespace {

// 0 or the code of what failed. One address is stored: the one that was added last.
int StoreAddress(Ipv6AddressChange change, const std::string &interface, const std::string &address, int length)
{
    const std::string file = InterfaceFile(interface);
    if (change == Ipv6AddressChange::add) {
        const SettingChange changes[] = {{"DEVICE", interface},
                                         {"IPV6INIT", "yes"},
                                         {"IPV6ADDR", address},
                                         {"IPV6PREFIXLENG", std::to_string(length)}};
        return RewriteSettings(file, changes);
    }
    const auto setting = TryReadSetting(file, "IPV6ADDR");
    if (!setting)
        return ERR_READ_FAILED;
    const auto stored = ParseIpv6(setting->c_str());
    if (!stored || Ipv6Text(*stored) != address)
        return 0;
    const SettingChange changes[] = {{"IPV6ADDR", std::nullopt}, {"IPV6PREFIXLENG", std::nullopt}};
    return RewriteSettings(file, changes);
}

int Change(Ipv6AddressChange change, const std::string &interface, const std::string &address, int length, Where where)
{
    const char *const verb = change == Ipv6AddressChange::add ? "add" : "del";
    Checkpoint before;
    before.AddFile(InterfaceFile(interface));
    before.AddIpv6Address(interface, address, length);
    before.Begin(where);
    if (RunNetCommand("/sbin/ip -6 addr %s %s/%d dev %s > /dev/null 2>&1", verb, address, length, interface) != 0) {
        before.PutBackAll();  // it may have been killed when its work was done
        return Fail(ERR_OP_FAILURE, where);
    }
    const int code = StoreAddress(change, interface, address, length);
    before.End();
    if (code == 0)
        return 0;
    LogErrorAt(where, "%s:%d Set %s error.", InterfaceFile(interface));
    Fail(code, where);
    return -2;
}

}  // namespace

int ChangeIpv6Address(Ipv6AddressChange change, const char *interface, const char *text, int length,
                      Where where) noexcept
{
    if (!interface || !IsInterfaceName(interface) || !text)
        return Fail(ERR_BAD_PARAMETERS, where);
    if (!IsPrefixLength(length)) {
        LogErrorAt(where, "%s:%d Paramter Prefix length %d out of range [0, 128]", length);
        return Fail(ERR_INVALID_NETNAME, where);
    }
    const auto address = ParseIpv6(text);
    if (!address || (change == Ipv6AddressChange::add && !IsHostAddress(*address)))
        return Fail(ERR_INVALID_NETNAME, where);
    return Guard(
        [&] {
            return ChangeNetwork([&] { return Change(change, interface, Ipv6Text(*address), length, where); }, 0,
                                 where);
        },
        ERR_OUT_OF_MEMORY, where);
}

}  // namespace tavo
