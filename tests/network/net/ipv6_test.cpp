// IPv6 addresses and routes, wake-on-LAN and the DHCP clients: what is run, asked, stored and refused.
#include "tavo_net.h"

#include "cards.h"
#include "network/lock_holder.h"
#include "network/named_process.h"
#include "support/container_text.h"
#include "support/recorded_commands.h"

#include <utility>

#include <linux/ethtool.h>
#include <linux/sockios.h>

using test::Cards;
using test::LastFault;
using test::Quiet;
using test::ReadFile;
using test::WriteFile;
using testing::ElementsAre;
using testing::EndsWith;
using testing::HasSubstr;
using testing::IsEmpty;

namespace {

constexpr const char *kTavoinfo = "/etc/tavoinfo.conf";

// A card that knows wake-on-LAN.
struct Wake {
    uint32_t supported = WAKE_MAGIC | WAKE_PHY;
    uint32_t enabled = 0;
    int sets = 0;
    bool answers = true;
    bool obeys = true;

    int Answer(ifreq *ask)
    {
        ethtool_wolinfo info;
        std::memcpy(&info, ask->ifr_data, sizeof info);
        errno = EOPNOTSUPP;
        if (!answers)
            return -1;
        if (info.cmd == ETHTOOL_GWOL) {
            info.supported = supported;
            info.wolopts = enabled;
            std::memcpy(ask->ifr_data, &info, sizeof info);
            return 0;
        }
        if (!obeys)
            return -1;
        ++sets;
        enabled = info.wolopts;
        return info.cmd == ETHTOOL_SWOL ? 0 : -1;
    }
};

class NetIPv6 : public Cards {
  protected:
    NetIPv6()
    {
        AddCard("eth0", "192.0.2.10");
        WriteFile(kIfcfg, "DEVICE=eth0\nBOOTPROTO=dhcp\n");
        WriteFile(kTavoinfo, "support_wol=\"yes\"\nwol_enabled_options=\"g\"\n");
        calls_.OnIoctl([this](int, unsigned long request, void *argument) {
            return request == SIOCETHTOOL ? wake_.Answer(static_cast<ifreq *>(argument)) : Answer(request, argument);
        });
    }

    const std::string kIfcfg = test::kScripts + "ifcfg-eth0";
    test::RecordedCommands commands_;
    Wake wake_;
};

TEST_F(NetIPv6, AddressesAreGivenStoredAndTakenBack)
{
    test::ForgetFault();
    EXPECT_EQ(TAVONetIPv6AddrAdd("eth0", "2001:DB8:0:0::1", 64), 0);
    EXPECT_EQ(TLIBErrGet(), ERR_SUCCESS);
    EXPECT_EQ(ReadFile(kIfcfg), "DEVICE=eth0\nBOOTPROTO=dhcp\nIPV6INIT=yes\nIPV6ADDR=2001:db8::1\nIPV6PREFIXLENG=64\n");
    EXPECT_EQ(TAVONetIPv6AddrDel("eth0", "2001:db8::2", 64), 0);
    EXPECT_THAT(ReadFile(kIfcfg), HasSubstr("IPV6ADDR=2001:db8::1")) << "another one than the stored one";
    EXPECT_EQ(TAVONetIPv6AddrDel("eth0", "2001:db8:0::1", 64), 0);
    EXPECT_EQ(ReadFile(kIfcfg), "DEVICE=eth0\nBOOTPROTO=dhcp\nIPV6INIT=yes\n");
    EXPECT_THAT(commands_.Take(), ElementsAre(Quiet("/sbin/ip -6 addr add 2001:db8::1/64 dev eth0"),
                                              Quiet("/sbin/ip -6 addr del 2001:db8::2/64 dev eth0"),
                                              Quiet("/sbin/ip -6 addr del 2001:db8::1/64 dev eth0")));

    commands_.Fail("/sbin/ip");
    EXPECT_EQ(TAVONetIPv6AddrAdd("eth0", "2001:db8::7", 64), -1);
    EXPECT_EQ(LastFault(), (test::Fault{ERR_OP_FAILURE, "net_ipv6_addr_add"}));
    EXPECT_EQ(ReadFile(kIfcfg), "DEVICE=eth0\nBOOTPROTO=dhcp\nIPV6INIT=yes\n");
}

TEST_F(NetIPv6, RoutesGoToNetworks)
{
    EXPECT_EQ(TAVONetIPv6RouteAdd("eth0", "2001:db8:1::", 48, "fe80::1"), 0);
    EXPECT_EQ(TAVONetIPv6RouteAdd("eth0", "::", 0, "2001:db8::ffff"), 0);
    EXPECT_EQ(TAVONetIPv6RouteDel("eth0", "2001:db8:2::", 47, nullptr), 0);
    EXPECT_THAT(commands_.Commands(), ElementsAre(Quiet("/sbin/ip -6 route add 2001:db8:1::/48 via fe80::1 dev eth0"),
                                                  Quiet("/sbin/ip -6 route add ::/0 via 2001:db8::ffff dev eth0"),
                                                  Quiet("/sbin/ip -6 route del 2001:db8:2::/47 dev eth0")));
    commands_.Fail("/sbin/ip", 2);
    EXPECT_EQ(TAVONetIPv6RouteDel("eth0", "::", 0, nullptr), -1);
    EXPECT_EQ(LastFault(), (test::Fault{ERR_OP_FAILURE, "net_ipv6_route_del"}));
}

TEST_F(NetIPv6, RefusesInvalidAddresses)
{
    const struct {
        const char *interface, *text;
        int length;
        int address, route;  // the code when it is taken for an address, for a network; 0: fine
    } rows[] = {
        {"eth0", "2001:db8::1", -1, ERR_INVALID_NETNAME, ERR_INVALID_NETNAME},
        {"eth0", "2001:db8::1", 129, ERR_INVALID_NETNAME, ERR_INVALID_NETNAME},
        {"eth0", "2001:db8::1", 128, 0, 0},
        {"eth0", "2001:db8::1", 127, 0, ERR_INVALID_NETNAME},
        {"eth0", "fe80::1%eth0", 64, ERR_INVALID_NETNAME, ERR_INVALID_NETNAME},
        {"eth0", "192.0.2.1", 24, ERR_INVALID_NETNAME, ERR_INVALID_NETNAME},
        {"eth0", "::1;reboot", 128, ERR_INVALID_NETNAME, ERR_INVALID_NETNAME},
        {"eth0", "ff02::1", 128, ERR_INVALID_NETNAME, 0},
        {"eth0", "", 64, ERR_INVALID_NETNAME, ERR_INVALID_NETNAME},
        {"eth0", nullptr, 64, ERR_BAD_PARAMETERS, ERR_BAD_PARAMETERS},
        {"eth0;x", "2001:db8::", 64, ERR_BAD_PARAMETERS, ERR_BAD_PARAMETERS},
        {nullptr, "2001:db8::", 64, ERR_BAD_PARAMETERS, ERR_BAD_PARAMETERS},
    };
    for (const auto &row : rows) {
        SCOPED_TRACE(std::string(row.text ? row.text : "NULL") + "/" + std::to_string(row.length));
        commands_.Clear();
        const auto check = [&](int result, int code) {
            EXPECT_EQ(result, code ? -1 : 0);
            EXPECT_EQ(TLIBErrGet(), code);
            test::ForgetFault();
        };
        test::ForgetFault();
        check(TAVONetIPv6AddrAdd(row.interface, row.text, row.length), row.address);
        check(TAVONetIPv6RouteAdd(row.interface, row.text, row.length, nullptr), row.route);
        check(TAVONetIPv6RouteDel(row.interface, row.text, row.length, nullptr), row.route);
        EXPECT_EQ(commands_.Commands().size(), (row.address == 0) + 2u * (row.route == 0));
    }
    EXPECT_EQ(TAVONetIPv6RouteAdd("eth0", "2001:db8::", 64, "::"), -1);
    EXPECT_EQ(TLIBErrGet(), ERR_INVALID_NETNAME);
    log_.Take();
    TAVONetIPv6AddrAdd("eth0", "::1", 129);
    EXPECT_EQ(log_.Take(), "net_ipv6_addr_add:# Paramter Prefix length 129 out of range [0, 128]");
}

TEST_F(NetIPv6, AddressesComeFromTheKernelsTable)
{
    tree_.Put("/proc/net/if_inet6", "00000000000000000000000000000001 01 80 10 80       lo\n"
                                    "20010db8000000000000000000000001 02 40 00 80     eth0\n"
                                    "fe800000000000000000000000000a01 02 40 20 80     eth0\n"
                                    "fe800000000000000000000000000b01 03 40 20 80    eth01\n"
                                    "zz800000000000000000000000000b01 03 40 20 80     eth0\n"
                                    "fe80 03 40 20 80     eth0\n"
                                    "fe800000000000000000000000000b01 03 ff 20 80     eth0\n");
    test::List list = test::MakeList({});
    const auto enumerate = [&](const char *interface) {
        return test::Moving(list, [=](auto **addr) { return TAVONetIPv6AddrEnum(interface, addr); });
    };
    EXPECT_EQ(enumerate("eth0"), 2);
    EXPECT_THAT(test::Items(list.get()), ElementsAre("2001:db8::1/64", "fe80::a01/64"));
    tree_.Remove("/proc/net/if_inet6");
    EXPECT_EQ(enumerate("eth0"), 0);
    EXPECT_EQ(enumerate("../eth0"), -1);
    EXPECT_EQ(TLIBErrGet(), ERR_BAD_PARAMETERS);
}

TEST_F(NetIPv6, SetsTheWakeUpPacketsOfACard)
{
    test::ForgetFault();
    EXPECT_EQ(TAVONetWolGet("eth0"), 0);
    EXPECT_EQ(TAVONetWolSet("eth0", 1), 0);
    EXPECT_EQ(wake_.enabled, uint32_t{WAKE_MAGIC});
    EXPECT_EQ(TAVONetWolGet("eth0"), 1);
    EXPECT_THAT(ReadFile(kTavoinfo), EndsWith("eth0_wol_options=g\n"));
    EXPECT_EQ(TAVONetWolSet("eth0", 1), 0);
    EXPECT_EQ(wake_.sets, 1) << "it knows already";
    EXPECT_EQ(TAVONetWolSet("eth0", 0), 0);
    EXPECT_EQ(wake_.enabled, 0u);
    EXPECT_THAT(ReadFile(kTavoinfo), EndsWith("eth0_wol_options=d\n"));
    EXPECT_EQ(TLIBErrGet(), ERR_SUCCESS);
    EXPECT_THAT(log_.Texts(), IsEmpty());
}

// Stored and set, or neither; also as a part of a larger change.
TEST_F(NetIPv6, WakeOnLanIsPutBack)
{
    const std::string before = ReadFile(kTavoinfo);
    wake_.obeys = false;
    EXPECT_EQ(TAVONetWolSet("eth0", 1), -1);
    EXPECT_EQ(LastFault(), (test::Fault{ERR_OP_FAILURE, "net_wol_set"}));
    EXPECT_EQ(ReadFile(kTavoinfo), before);
    wake_.obeys = true;
    {
        const test::LockHolder other(TAVO_LOCK_TAVOINFO | TAVO_LOCK_EXCLUSIVE | TAVO_LOCK_NONBLOCKING);
        EXPECT_EQ(TAVONetWolSet("eth0", 1), -1);
        EXPECT_EQ(TLIBErrGet(), ERR_LOCK_FAILED);
        EXPECT_EQ(wake_.enabled, 0u);
    }
    EXPECT_EQ(TAVONetCheckpointTake(), 0);
    EXPECT_EQ(TAVONetWolSet("eth0", 1), 0);
    EXPECT_EQ(wake_.enabled, uint32_t{WAKE_MAGIC});
    EXPECT_EQ(TAVONetCheckpointPutBack(), 0);
    EXPECT_EQ(wake_.enabled, 0u);
    EXPECT_EQ(ReadFile(kTavoinfo), before);
}

TEST_F(NetIPv6, ReportsWhyACardCannotWake)
{
    const std::string yes = "support_wol=\"yes\"\n";
    const std::string packet = "wol_enabled_options=\"g\"\n";
    const struct {
        std::string settings;
        bool answers;
        int code;
        const char *log;
    } rows[] = {
        {packet, true, ERR_OP_UNREGISTERED, "Wake-on-lan isn't supported."},
        {"support_wol=\"no\"\n" + packet, true, ERR_OP_UNREGISTERED, "Wake-on-lan isn't supported."},
        {yes, true, ERR_KEY_NOT_FOUND, "Miss wake-on-lan enable options."},
        {yes + "wol_enabled_options=\"gx\"\n", true, ERR_FORMAT_ERROR, "Miss wake-on-lan enable options."},
        {yes + packet, false, ERR_OP_FAILURE, "Cannot get current wake-on-lan settings"},
        {yes + "wol_enabled_options=\"s\"\n", true, ERR_OP_FAILURE, "Cannot set new wake-on-lan settings"},
    };
    for (const auto &row : rows) {
        SCOPED_TRACE(row.settings);
        WriteFile(kTavoinfo, row.settings);
        wake_.answers = row.answers;
        EXPECT_EQ(TAVONetWolSet("eth0", 1), -1);
        EXPECT_EQ(LastFault(), (test::Fault{row.code, "net_wol_set"}));
        EXPECT_EQ(log_.Take(), std::string("net_wol_set:# ") + row.log);
        EXPECT_EQ(wake_.sets, 0);
        EXPECT_EQ(ReadFile(kTavoinfo), row.settings);
    }
}

TEST_F(NetIPv6, UsesThePanelOnlyOnModelsThatHaveOne)
{
    tree_.Put("/dev/ttyS1", "");
    EXPECT_EQ(TAVONetWolSet("eth0", 1), 0);
    EXPECT_EQ(ReadFile(tree_.Place("/dev/ttyS1")), "") << "here a console or a modem may hang";

    tree_.Put("/etc.defaults/tavoinfo.conf", "wol_by_panel=\"yes\"\n");
    WriteFile(kTavoinfo, "support_wol=\"yes\"\nwol_enabled_options=\"g\"\n");
    wake_.sets = 0;
    EXPECT_EQ(TAVONetWolGet("eth0"), 0);
    EXPECT_EQ(TAVONetWolSet("eth0", 1), 0);
    EXPECT_EQ(ReadFile(tree_.Place("/dev/ttyS1")), "l\n");
    EXPECT_EQ(wake_.sets, 0);
    EXPECT_EQ(TAVONetWolGet("eth0"), 1);
    EXPECT_EQ(TAVONetWolSet("eth0", 0), -1);
    EXPECT_EQ(LastFault(), (test::Fault{ERR_OP_UNREGISTERED, "net_wol_set"}));
    {
        const test::LockHolder other(TAVO_LOCK_TTYS1 | TAVO_LOCK_EXCLUSIVE | TAVO_LOCK_NONBLOCKING);
        EXPECT_EQ(TAVONetWolSet("eth0", 1), -1) << "somebody else is writing to the panel";
        EXPECT_EQ(TLIBErrGet(), ERR_LOCK_FAILED);
    }
    tree_.Remove("/dev/ttyS1");
    EXPECT_EQ(TAVONetWolSet("eth0", 1), -1);
    EXPECT_EQ(TLIBErrGet(), ERR_OP_FAILURE);
}

TEST_F(NetIPv6, TheDhcpTestTellsThreeThings)
{
    const std::pair<int, int> rows[] = {{0, 0}, {1, 1}, {2, 1}, {126, -1}, {127, -1}};
    for (const auto &[status, answer] : rows) {
        SCOPED_TRACE(status);
        test::ForgetFault();
        commands_.Exit(status);
        EXPECT_EQ(TAVONetDhcpTest("eth0", 12), answer);
        EXPECT_EQ(TLIBErrGet(), answer < 0 ? ERR_OP_FAILURE : ERR_SUCCESS);
        EXPECT_EQ(log_.Take().empty(), answer >= 0);
    }
    EXPECT_EQ(commands_.Commands().front(), Quiet("/sbin/dhcpcd -T eth0 -t 12"));
    for (const char *bad : {"", "eth0;x", "-T"})
        EXPECT_EQ(TAVONetDhcpTest(bad, 12), -1) << bad;
    EXPECT_EQ(TAVONetDhcpTest("eth0", 0), -1);
    EXPECT_EQ(TLIBErrGet(), ERR_BAD_PARAMETERS);
}

// Programs that bear the DHCPv6 client's name, for one interface each.
TEST_F(NetIPv6, ADhcp6ClientIsWaitedForOnItsOwnInterface)
{
    test::NamedProcess client("/usr/sbin/dhcp6c", "eth0");
    EXPECT_EQ(TAVONetDhcp6Wait("eth0", 3), -1);
    EXPECT_EQ(LastFault(), (test::Fault{ERR_TIMER_EXPIRED, "net_dhcp6_wait"}));
    EXPECT_THAT(Sleeps(), ElementsAre("sleep 1", "sleep 1", "sleep 1"));
    calls_.Clear();
    EXPECT_EQ(TAVONetDhcp6Wait("eth", 3), 0);
    client.End();
    EXPECT_EQ(TAVONetDhcp6Wait("eth0", 3), 0);
    EXPECT_THAT(Sleeps(), IsEmpty());
    EXPECT_EQ(TAVONetDhcp6Wait("eth0", -1), -1);
    EXPECT_EQ(TLIBErrGet(), ERR_BAD_PARAMETERS);
}

}  // namespace
