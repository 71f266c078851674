// Sets the address of an interface: from DHCP, or a static one.
#include "tavo_net.h"

#include "core/detail/guard.h"
#include "core/detail/log.h"
#include "core/detail/pid_file.h"
#include "network/detail/checkpoint.h"
#include "network/detail/connected_route.h"
#include "network/detail/dhcp_client.h"
#include "network/detail/further_addresses.h"
#include "network/detail/interface_file.h"
#include "network/detail/interface_name.h"
#include "network/detail/ipv4_text.h"
#include "network/detail/net_command.h"
#include "network/detail/network_change.h"

#include <cerrno>
#include <csignal>
#include <cstring>
#include <span>

#include <unistd.h>

namespace {

// Puts the previous address, routes and client back; the result of the function.
int GiveUp(const TAVONETCARD &card, tavo::Checkpoint &before, bool cleared)
{
    const bool was_dhcp = tavo::ReadSetting(tavo::InterfaceFile(card.szInterface), "BOOTPROTO") == "dhcp";
    if (!before.PutBack(cleared))
        LogError("%s(%d): TAVOIRecoverIPSetting failed.(%X)", ERR_OP_FAILURE);
    tavo::RepairRoutes(card.szInterface, was_dhcp);
    return Fail(ERR_OP_FAILURE);
}

// The interface has its address by now: 0, or -2 when the file cannot be written.
int StoreCard(const TAVONETCARD &card, std::span<const tavo::SettingChange> changes)
{
    const std::string file = tavo::InterfaceFile(card.szInterface);
    const int code = tavo::RewriteSettings(file, changes);
    if (code == 0)
        return 0;
    LogError("%s:%d Set %s error.", file);
    Fail(code);
    return -2;
}

int UseDhcp(const TAVONETCARD &card, tavo::Checkpoint &before)
{
    const char *const interface = card.szInterface;
    if (!tavo::EndDhcpClient(interface))
        return GiveUp(card, before, false);
    if (tavo::RunNetCommand("/sbin/dhcpcd -n %s -t %d > /dev/null 2>&1", interface, tavo::kDhcpSeconds) != 0) {
        LogError("%s(%d) run dhcpcd error %s", std::strerror(errno));
        return GiveUp(card, before, true);
    }
    const tavo::SettingChange changes[] = {
        {"DEVICE", interface},     {"ONBOOT", "yes"},        {"BOOTPROTO", "dhcp"},   {"IPADDR", std::nullopt},
        {"NETMASK", std::nullopt}, {"MASTER", std::nullopt}, {"SLAVE", std::nullopt},
    };
    return StoreCard(card, changes);
}

// Compares addresses, ignoring leading zeros.
template <size_t Size>
bool Holds(const char (&field)[Size], const tavo::Ipv4 &address)
{
    const auto found = tavo::ParseIpv4({field, ::strnlen(field, Size)});
    return found && found->Word() == address.Word();
}

// The daemon that tells a name service our address wants to know of a new one.
void TellDynamicDns()
{
    const tavo::PidSignal told = tavo::SignalByPidFile("/var/run/ddnsd.pid", SIGHUP);
    if (told == tavo::PidSignal::sent)
        return;
    LogError("%s(%d) : HUP ddnsd result: %s%s%s ",
             told == tavo::PidSignal::no_pid ? "no such service or not enabled" : "", "",
             told == tavo::PidSignal::failed ? "failed" : "");
}

int UseStatic(const TAVONETCARD &card, const TAVONETCARD *previous, tavo::Checkpoint &before)
{
    const char *const interface = card.szInterface;
    const tavo::Ipv4 address = *tavo::ParseIpv4(card.szIp);
    const tavo::Ipv4 mask = *tavo::ParseIpv4(card.szMask);
    const auto broadcast = tavo::Ipv4::FromWord(address.Word() | ~mask.Word());

    // A client that still renews its lease would take the address away again.
    const bool clear = tavo::ReadPidFile(tavo::DhcpPidFile(interface).c_str()).value_or(0) > 0;
    if (clear && !tavo::EndDhcpClient(interface))
        return GiveUp(card, before, false);
    if (tavo::RunNetCommand("/sbin/ifconfig %s %s netmask %s broadcast %s > /dev/null 2>&1", interface, address.Text(),
                            mask.Text(), broadcast.Text()) != 0)
        return GiveUp(card, before, clear);
    const tavo::SettingChange changes[] = {
        {"DEVICE", interface},
        {"ONBOOT", "yes"},
        {"BOOTPROTO", "static"},
        {"IPADDR", address.Text()},
        {"NETMASK", mask.Text()},
        {"BROADCAST", broadcast.Text()},
        {"NETWORK", tavo::Ipv4::FromWord(address.Word() & mask.Word()).Text()},
    };
    if (const int result = StoreCard(card, changes))
        return result;
    ::unlink("/etc/ppp/old_gateway.bak");
    ::unlink("/etc/resolv.conf.bak");
    if (!previous || !Holds(previous->szIp, address) || !Holds(previous->szMask, mask))
        TellDynamicDns();
    return 0;
}

int SetCard(const TAVONETCARD &card, const TAVONETCARD *previous)
{
    const bool dhcp = card.nMode == TAVO_NET_DHCP;
    tavo::Checkpoint before;
    before.AddFile(tavo::InterfaceFile(card.szInterface));
    before.AddFile(tavo::kResolverFile);
    before.AddCard(card.szInterface);
    before.Begin();
    const tavo::FurtherAddresses further(card.szInterface);
    const int result = dhcp ? UseDhcp(card, before) : UseStatic(card, previous, before);
    if (result != -1) {
        further.PutBack();
        tavo::RepairRoutes(card.szInterface, dhcp);
    }
    before.End();
    return result;
}

}  // namespace

extern "C" int TAVONetSetCard1(const TAVONETCARD *pCard, const TAVONETCARD *pPrevious)
{
    if (!pCard)
        return Fail(ERR_BAD_PARAMETERS);
    TAVONETCARD card = *pCard;  // the mask is rewritten in its canonical form
    if (::strnlen(card.szInterface, sizeof card.szInterface) == sizeof card.szInterface ||
        !tavo::IsInterfaceName(card.szInterface))
        return Fail(ERR_BAD_PARAMETERS);
    if (card.nMode != TAVO_NET_DHCP) {
        card.szIp[sizeof card.szIp - 1] = 0;
        card.szMask[sizeof card.szMask - 1] = 0;
        if (!BlTLIBIsIpAddr(card.szIp) || !BlTLIBIsIpMask(card.szMask))
            return Fail(ERR_INVALID_NETNAME);
    }
    return Guard([&] { return tavo::ChangeNetwork([&] { return SetCard(card, pPrevious); }); });
}
