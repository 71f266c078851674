// Gives the first interface its address: from DHCP, or a static one.
#include "tavo_net.h"

#include "core/detail/guard.h"
#include "core/detail/log.h"
#include "core/detail/pid_file.h"
#include "network/detail/connected_route.h"
#include "network/detail/dhcp_client.h"
#include "network/detail/interface_file.h"
#include "network/detail/interface_name.h"
#include "network/detail/ipv4_text.h"
#include "network/detail/net_command.h"
#include "network/detail/network_change.h"

#include <cerrno>
#include <csignal>
#include <cstring>

#include <unistd.h>

namespace {

constexpr int kKillRounds = 30;  // a client that outlives so many kills hangs in the kernel

int Configure(const char *interface, const tavo::Ipv4 &address, const tavo::Ipv4 &mask)
{
    const auto broadcast = tavo::Ipv4::FromWord(address.Word() | ~mask.Word());
    return tavo::RunNetCommand("/sbin/ifconfig %s %s netmask %s broadcast %s > /dev/null 2>&1", interface,
                               address.Text(), mask.Text(), broadcast.Text());
}

// What the interface has before it is changed.
struct Before {
    explicit Before(const char *interface)
        : routes(tavo::LiveRoutes()), dhcp(tavo::ReadSetting(tavo::InterfaceFile(interface), "BOOTPROTO") == "dhcp"),
          client(tavo::HasDhcpClient(interface))
    {
    }

    std::vector<tavo::Route> routes;
    bool dhcp;
    bool client;
    bool cleared = false;  // the old address has been taken away, and with it every route
};

// Restores the previous address, from the interface file, which is still unchanged, or from the DHCP lease, and the
// routes and the client that went with it.
void Recover(const char *interface, const Before &before)
{
    const std::string file = before.dhcp ? tavo::DhcpLeaseFile(interface) : tavo::InterfaceFile(interface);
    const auto address = tavo::ParseIpv4(tavo::ReadSetting(file, "IPADDR"));
    const auto mask = tavo::ParseIpv4(tavo::ReadSetting(file, "NETMASK"));
    if (address && mask && Configure(interface, *address, *mask) != 0)
        LogError("%s(%d): TAVOIRecoverIPSetting failed.(%X)", ERR_OP_FAILURE);
    tavo::PutBackRoutes(before.routes, before.cleared ? std::vector<tavo::Route>() : tavo::LiveRoutes(), interface);
    tavo::RepairRoutes(interface, before.dhcp);
    if (before.client && !tavo::HasDhcpClient(interface))
        tavo::StartDhcpClient(interface);
}

// Ends the client that runs, so that two never fight over one interface.
bool EndClient(const char *interface, Before &before)
{
    for (int round = 0; tavo::KillDhcpClient(interface) == tavo::ClientEnd::alive; ++round) {
        if (round == kKillRounds)
            return false;
        const auto pid = tavo::ReadPidFile(tavo::DhcpPidFile(interface).c_str());
        LogError("%s(%d) dhcpcd pid[%d] still exists, wait 1 second.", pid.value_or(0));
        ::sleep(1);
    }
    before.cleared = true;
    if (tavo::RunNetCommand("/sbin/ifconfig %s 0.0.0.0 > /dev/null 2>&1", interface) != 0)
        LogError("%s:%d Initial setting interface [%s] error %s", interface, std::strerror(errno));
    ::sleep(1);
    ::unlink(tavo::DhcpPidFile(interface).c_str());
    return true;
}

int UseDhcp(const char *interface, Before &before)
{
    if (!EndClient(interface, before)) {
        Recover(interface, before);
        return Fail(ERR_OP_FAILURE);
    }
    if (tavo::RunNetCommand("/sbin/dhcpcd -n %s -t %d > /dev/null 2>&1", interface, tavo::kDhcpSeconds) != 0) {
        LogError("%s(%d) run dhcpcd error %s", std::strerror(errno));
        Recover(interface, before);
        return Fail(ERR_OP_FAILURE);
    }
    const tavo::SettingChange changes[] = {
        {"DEVICE", interface},     {"ONBOOT", "yes"},        {"BOOTPROTO", "dhcp"},   {"IPADDR", std::nullopt},
        {"NETMASK", std::nullopt}, {"MASTER", std::nullopt}, {"SLAVE", std::nullopt},
    };
    if (const int code = tavo::RewriteSettings(tavo::InterfaceFile(interface), changes)) {
        LogError("%s:%d Set %s error.", tavo::InterfaceFile(interface));
        Fail(code);
        return -2;
    }
    return 0;
}

// Whatever leading zeros the caller wrote.
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

int UseStatic(const TAVONETCARD &card, const TAVONETCARD *previous, Before &before)
{
    const char *const interface = card.szInterface;
    const tavo::Ipv4 address = *tavo::ParseIpv4(card.szIp);
    const tavo::Ipv4 mask = *tavo::ParseIpv4(card.szMask);

    // A client that still renews its lease would take the address away again.
    if (tavo::ReadPidFile(tavo::DhcpPidFile(interface).c_str()).value_or(0) > 0 && !EndClient(interface, before)) {
        Recover(interface, before);
        return Fail(ERR_OP_FAILURE);
    }
    if (Configure(interface, address, mask) != 0) {
        Recover(interface, before);
        return Fail(ERR_OP_FAILURE);
    }
    const tavo::SettingChange changes[] = {
        {"DEVICE", interface},
        {"ONBOOT", "yes"},
        {"BOOTPROTO", "static"},
        {"IPADDR", address.Text()},
        {"NETMASK", mask.Text()},
        {"BROADCAST", tavo::Ipv4::FromWord(address.Word() | ~mask.Word()).Text()},
        {"NETWORK", tavo::Ipv4::FromWord(address.Word() & mask.Word()).Text()},
    };
    if (const int code = tavo::RewriteSettings(tavo::InterfaceFile(interface), changes)) {
        LogError("%s:%d Set %s error.", tavo::InterfaceFile(interface));
        Fail(code);
        return -2;
    }
    ::unlink("/etc/ppp/old_gateway.bak");
    ::unlink("/etc/resolv.conf.bak");
    if (!previous || !Holds(previous->szIp, address) || !Holds(previous->szMask, mask))
        TellDynamicDns();
    return 0;
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
    return Guard([&] {
        return tavo::ChangeNetwork([&] {
            const bool dhcp = card.nMode == TAVO_NET_DHCP;
            Before before(card.szInterface);
            const int result = dhcp ? UseDhcp(card.szInterface, before) : UseStatic(card, pPrevious, before);
            if (result != -1)
                tavo::RepairRoutes(card.szInterface, dhcp);
            return result;
        });
    });
}
