// The network's functions against a kernel: what they set is read back from it, in namespaces with cards of their own.
#include "tavo_net.h"

#include "network/card_record.h"
#include "network/network_state.h"
#include "support/container_text.h"
#include "support/fault_state.h"
#include "support/network_scene.h"

#include <gmock/gmock.h>

#include <cstring>
#include <filesystem>
#include <optional>

#include <netinet/in.h>
#include <sys/socket.h>
#include <sys/utsname.h>
#include <unistd.h>

using test::Card;
using test::kIfcfg;
using test::Node;
using test::OwnAddress;
using test::ReadFile;
using testing::AllOf;
using testing::Contains;
using testing::HasSubstr;
using testing::Not;

namespace {

class Kernel : public test::NetworkScene {
  protected:
    void SetUp() override
    {
        NetworkScene::SetUp();
        if (IsSkipped())
            return;
        there_.emplace("there");
        cable_->Plug(*there_, "eth0");
        ASSERT_EQ(there_->Shell("ifconfig eth0 192.0.2.99 netmask 255.255.255.0 up"), 0);
    }

    std::optional<Node> there_;
};

std::string LiveGateway()
{
    char text[20] = "";
    return TAVONetDefaultGatewayGet(text, sizeof text) == 0 ? text : "none";
}

TEST_F(Kernel, KnowsItsOwnNameAtAnyTime)
{
    EXPECT_TRUE(here_->Run([] {
        EXPECT_EQ(TAVOLnxSetHostname("attic"), 0);
        EXPECT_EQ(OwnAddress(), "127.0.1.1") << "no card has an address yet";
        for (const char *address : {"192.0.2.5", "192.0.2.60"}) {
            const TAVONETCARD card = Card(TAVO_NET_STATIC, address, "255.255.255.0");
            EXPECT_EQ(TAVONetSetCard1(&card, nullptr), 0);
            EXPECT_EQ(OwnAddress(), address);
        }
        EXPECT_EQ(TAVOLnxSetHostname("cellar"), 0);
        EXPECT_EQ(OwnAddress(), "192.0.2.60");
        EXPECT_EQ(test::ShellStatus("ifconfig eth0 0.0.0.0"), 0);
        EXPECT_EQ(TAVONetHostsRefresh(), 0) << "as the hook of a client that has lost its lease does";
        EXPECT_EQ(OwnAddress(), "127.0.1.1");
        return true;
    }));
}

TEST_F(Kernel, StoresNoMtuThatTheCardRefuses)
{
    EXPECT_TRUE(here_->Run([] {
        EXPECT_EQ(TAVONetSetMTUValue("eth0", 1400), 0);
        EXPECT_EQ(TAVONetSetMTUValue("eth0", 65535 + 1), -1);
        EXPECT_EQ(TAVONetSetMTUValue("eth8", 9000), -1) << "no such card";
        EXPECT_EQ(TLIBErrGet(), ERR_OP_FAILURE);
        EXPECT_EQ(TAVOGetMTUSetting("eth8"), 1500);
        EXPECT_EQ(TAVOGetMTUSetting("eth0"), 1400);
        return true;
    }));
}

TEST_F(Kernel, HasTheAddressAndTheRoutesThatWereSet)
{
    EXPECT_TRUE(here_->Run([] {
        const TAVONETCARD wanted = Card(TAVO_NET_STATIC, "192.0.2.20", "255.255.255.128");
        EXPECT_EQ(TAVONetSetCard1(&wanted, nullptr), 0);
        TAVONETCARD card;
        EXPECT_EQ(TAVONetGetCard1(&card), 0);
        EXPECT_STREQ(card.szIp, "192.0.2.20");
        EXPECT_STREQ(card.szMask, "255.255.255.128");
        EXPECT_STREQ(card.szBroadcast, "192.0.2.127");
        EXPECT_STREQ(card.szNetwork, "192.0.2.0");
        EXPECT_STREQ(card.szGateway, "192.0.2.99");
        EXPECT_EQ(card.nMtu, 1500);
        EXPECT_EQ(card.fLink, 1);
        EXPECT_EQ(BlTLIBIsConnected("eth0"), 1);
        EXPECT_EQ(LiveGateway(), "192.0.2.99") << "the stored one";
        return true;
    }));
    EXPECT_THAT(here_->Output("ip -4 addr show dev eth0"), HasSubstr("inet 192.0.2.20/25 brd 192.0.2.127"));
    EXPECT_THAT(here_->Output("ip route"),
                AllOf(HasSubstr("default via 192.0.2.99"), HasSubstr("192.0.2.0/25 dev eth0")));
    EXPECT_EQ(here_->Shell("ping -c 1 -w 5 192.0.2.99 >/dev/null"), 0);
}

// ifconfig sets a mask where the kernel has the first address just then, which may be another one.
TEST_F(Kernel, KeepsFurtherAddressesBesideANewFirstOne)
{
    EXPECT_TRUE(here_->Run([] {
        const TAVONETCARD old = Card(TAVO_NET_STATIC, "192.0.2.20", "255.255.255.0");
        EXPECT_EQ(TAVONetSetCard1(&old, nullptr), 0);
        EXPECT_EQ(test::ShellStatus("ip addr add 203.0.113.1/29 dev eth0 && ip addr add 192.0.2.21/24 dev eth0 && "
                                    "ip route add 233.252.0.0/24 via 203.0.113.2"),
                  0);
        const auto has = [](const char *address) {
            for (const std::string rest : {"203.0.113.1/29", "192.0.2.21/24"})
                EXPECT_EQ(test::ShellStatus("ip addr show dev eth0 | grep -q ' " + rest + " '"), 0) << rest;
            EXPECT_EQ(test::ShellStatus("[ $(ip addr show dev eth0 | grep -c 'inet ') = 3 ]"), 0);
            EXPECT_EQ(test::ShellStatus("ip route | grep -q '^233.252.0.0/24 via 203.0.113.2 dev eth0'"), 0);
            TAVONETCARD card;
            EXPECT_EQ(TAVONetGetCard1(&card), 0);
            EXPECT_EQ(std::string(card.szIp) + "/" + card.szMask, address);
        };
        const TAVONETCARD wanted = Card(TAVO_NET_STATIC, "192.0.2.130", "255.255.255.192");
        EXPECT_EQ(TAVONetSetCard1(&wanted, nullptr), 0);
        has("192.0.2.130/255.255.255.192");
        // The client fails: there is none here.
        const TAVONETCARD lease = Card(TAVO_NET_DHCP);
        EXPECT_EQ(TAVONetSetCard1(&lease, nullptr), -1);
        has("192.0.2.130/255.255.255.192");
        return true;
    }));
}

TEST_F(Kernel, HasTheGatewayOrTheOldOne)
{
    EXPECT_TRUE(here_->Run([] {
        const TAVONETCARD card = Card(TAVO_NET_STATIC, "192.0.2.20", "255.255.255.0");
        EXPECT_EQ(TAVONetSetCard1(&card, nullptr), 0);
        EXPECT_EQ(TAVONetDefaultGatewaySet("192.0.2.30"), 0);
        EXPECT_EQ(LiveGateway(), "192.0.2.30");
        EXPECT_EQ(TAVONetDefaultGatewaySet("198.51.100.1"), -1) << "on no network of ours";
        EXPECT_EQ(TLIBErrGet(), ERR_OP_FAILURE);
        EXPECT_EQ(LiveGateway(), "192.0.2.30");
        EXPECT_EQ(ReadFile("/etc/sysconfig/network"), "GATEWAY=192.0.2.30\nHOSTNAME=here\n");
        EXPECT_EQ(TAVONetRouteAdd("198.51.100.0", "255.255.255.0", "eth0"), 0);
        EXPECT_EQ(TAVONetDefaultGatewaySet("198.51.100.1"), 0) << "now it is";
        EXPECT_EQ(TAVONetRouteAdd("198.51.100.0", "255.255.255.0", "eth0"), -1) << "there already";
        EXPECT_EQ(TAVONetRouteDel("198.51.100.0", "255.255.255.0", "eth0"), 0);
        EXPECT_EQ(TAVONetRouteDel("198.51.100.0", "255.255.255.0", "eth0"), -1);
        return true;
    }));
}

TEST_F(Kernel, HasTheNameTheMtuAndTheServers)
{
    EXPECT_TRUE(here_->Run([] {
        EXPECT_EQ(TAVOLnxSetHostname("attic"), 0);
        utsname name;
        ::uname(&name);
        EXPECT_STREQ(name.nodename, "attic");
        EXPECT_EQ(TAVONetSetMTUValue("eth0", 1400), 0);
        TAVONETCARD card;
        EXPECT_EQ(TAVONetGetCard1(&card), 0);
        EXPECT_EQ(card.nMtu, 1400);
        EXPECT_EQ(TAVONetSetMTUEth("eth7", 1400), -1);
        EXPECT_EQ(TLIBErrGet(), ERR_OP_FAILURE);
        EXPECT_EQ(TAVONetDNSSet(test::MakeList({"192.0.2.53"}).get()), 0);
        return true;
    }));
    EXPECT_EQ(here_->Output("cat /etc/resolv.conf"), "nameserver\t192.0.2.53\n");
}

TEST_F(Kernel, TakesIPv6Settings)
{
    EXPECT_TRUE(here_->Run([] {
        if (!std::filesystem::exists("/proc/net/if_inet6"))
            return true;
        EXPECT_EQ(test::ShellStatus("ifconfig eth0 up"), 0);
        EXPECT_EQ(TAVONetIPv6Set("eth0", 1), 0);
        EXPECT_EQ(BlTAVONetIPv6IsEnabled("eth0"), 1);
        EXPECT_EQ(TAVONetIPv6AddrAdd("eth0", "2001:db8::20", 64), 0);
        EXPECT_EQ(TAVONetIPv6AddrAdd("eth0", "2001:db8::20", 64), -1) << "it has it";
        const auto addresses = [] {
            test::List list = test::MakeList({});
            EXPECT_GE(test::Moving(list, [](auto **addr) { return TAVONetIPv6AddrEnum("eth0", addr); }), 0);
            return test::Items(list.get());
        };
        EXPECT_THAT(addresses(), Contains("2001:db8::20/64"));
        EXPECT_EQ(TAVONetIPv6RouteAdd("eth0", "2001:db8:1::", 48, "2001:db8::1"), 0);
        EXPECT_EQ(TAVONetIPv6RouteAdd("eth0", "::", 0, "2001:db8::1"), 0);
        EXPECT_EQ(test::ShellStatus("ip -6 route | grep -q '^2001:db8:1::/48 via 2001:db8::1 dev eth0'"), 0);
        EXPECT_EQ(test::ShellStatus("ip -6 route | grep -q '^default via 2001:db8::1 dev eth0'"), 0);
        EXPECT_EQ(TAVONetIPv6RouteDel("eth0", "::", 0, nullptr), 0);
        EXPECT_EQ(test::ShellStatus("ip -6 route | grep -q ^default"), 1);
        EXPECT_EQ(TAVONetIPv6AddrDel("eth0", "2001:db8::20", 64), 0);
        EXPECT_THAT(addresses(), Not(Contains("2001:db8::20/64")));
        EXPECT_EQ(TAVONetIPv6Set("eth0", 0), 0);
        EXPECT_EQ(BlTAVONetIPv6IsEnabled("eth0"), 0);
        EXPECT_EQ(addresses(), std::vector<std::string>());
        testing::internal::CaptureStderr();
        EXPECT_EQ(TAVONetIPv6Set("eth7", 0), -1);
        EXPECT_EQ(testing::internal::GetCapturedStderr(), "");
        EXPECT_EQ(BlTAVONetIPv6IsEnabled("eth7"), 0);
        EXPECT_EQ(TLIBErrGet(), ERR_OPEN_FAILED);
        return true;
    }));
}

TEST_F(Kernel, ShowsWhoElseHasAnAddress)
{
    EXPECT_TRUE(here_->Run([] {
        const TAVONETCARD card = Card(TAVO_NET_STATIC, "192.0.2.20", "255.255.255.0");
        EXPECT_EQ(TAVONetSetCard1(&card, nullptr), 0);
        EXPECT_EQ(TAVOIIpConflict("eth0", "192.0.2.99"), 1);
        EXPECT_EQ(TAVOIIpConflict("eth0", "192.0.2.98"), 0);
        EXPECT_EQ(TAVOIIpConflict("eth0", "192.0.2.20"), 0) << "our own";
        return true;
    }));
}

TEST_F(Kernel, ShowsWhichPortsAreTaken)
{
    EXPECT_TRUE(here_->Run([] {
        for (const int type : {SOCK_STREAM, SOCK_DGRAM}) {
            const int port = 5120 + type;
            EXPECT_EQ(BlTLIBIsPortInUse(port), 0);
            const int fd = ::socket(AF_INET, type | SOCK_CLOEXEC, 0);
            sockaddr_in here{};
            here.sin_family = AF_INET;
            here.sin_port = htons(static_cast<uint16_t>(port));
            EXPECT_EQ(::bind(fd, reinterpret_cast<const sockaddr *>(&here), sizeof here), 0);
            EXPECT_EQ(type == SOCK_STREAM ? ::listen(fd, 1) : 0, 0);
            EXPECT_EQ(BlTLIBIsPortInUse(port), 1);
            ::close(fd);
            EXPECT_EQ(BlTLIBIsPortInUse(port), 0);
        }
        return true;
    }));
}

// The appliance's client is another one than the desk's: the options of its calls are put into those of busybox's.
constexpr const char *kClient = R"(#!/bin/sh
cat >/tmp/lease <<'END'
#!/bin/sh
[ "$1" = bound ] || exit 0
busybox ifconfig $interface $ip netmask $subnet
[ ! "$router" ] || busybox route add default gw $router
printf 'IPADDR=%s\nNETMASK=%s\n' $ip $subnet >/etc/dhcpc/dhcpcd-$interface.info
END
chmod 755 /tmp/lease
script=/tmp/lease
[ "$1" = -n ] || script=/bin/true
exec busybox udhcpc -f -n -q -i "$2" -t 3 -T 1 -s $script
)";

TEST_F(Kernel, GetsALeaseFromAServer)
{
    const test::ScriptedClient client(kClient);
    EXPECT_TRUE(here_->Run([] {
        const TAVONETCARD fixed = Card(TAVO_NET_STATIC, "192.0.2.20", "255.255.255.0");
        EXPECT_EQ(TAVONetSetCard1(&fixed, nullptr), 0);
        EXPECT_EQ(TAVONetDhcpTest("eth0", 3), 1) << "no server yet";
        // Without a lease all is as it was.
        const TAVONETCARD lease = Card(TAVO_NET_DHCP);
        const std::string before = ReadFile(kIfcfg);
        EXPECT_EQ(TAVONetSetCard1(&lease, nullptr), -1);
        EXPECT_EQ(TLIBErrGet(), ERR_OP_FAILURE);
        TAVONETCARD card;
        EXPECT_EQ(TAVONetGetCard1(&card), 0);
        EXPECT_STREQ(card.szIp, "192.0.2.20");
        EXPECT_EQ(ReadFile(kIfcfg), before);
        EXPECT_EQ(LiveGateway(), "192.0.2.99") << "a manager beyond the router is not locked out";
        EXPECT_EQ(OwnAddress(), "192.0.2.20");
        return true;
    }));
    ASSERT_EQ(there_->Shell("mkdir -p /var/lib/misc; touch /tmp/leases; printf 'start 192.0.2.40\\nend 192.0.2.40\\n"
                            "interface eth0\\nlease_file /tmp/leases\\npidfile /tmp/udhcpd.pid\\n"
                            "opt subnet 255.255.255.0\\n' >/tmp/udhcpd.conf; cp /tmp/udhcpd.conf /tmp/router.conf; "
                            "echo 'opt router 192.0.2.98' >>/tmp/router.conf; busybox udhcpd /tmp/udhcpd.conf"),
              0);
    EXPECT_TRUE(here_->Run([] {
        EXPECT_EQ(TAVONetDhcpTest("eth0", 3), 0);
        TAVONETCARD card;
        EXPECT_EQ(TAVONetGetCard1(&card), 0);
        EXPECT_STREQ(card.szIp, "192.0.2.20") << "asking takes no lease";
        const TAVONETCARD lease = Card(TAVO_NET_DHCP);
        EXPECT_EQ(TAVONetSetCard1(&lease, &card), 0);
        EXPECT_EQ(TAVONetGetCard1(&card), 0);
        EXPECT_EQ(card.nMode, TAVO_NET_DHCP);
        EXPECT_STREQ(card.szIp, "192.0.2.40");
        EXPECT_EQ(BlTAVOLnxIsDHCP("eth0"), 1);
        EXPECT_EQ(LiveGateway(), "192.0.2.99") << "the lease has none, so the stored one is back";
        EXPECT_EQ(OwnAddress(), "192.0.2.40");
        return true;
    }));
    ASSERT_EQ(there_->Shell("kill $(cat /tmp/udhcpd.pid); sleep 0.3; busybox udhcpd /tmp/router.conf"), 0);
    EXPECT_TRUE(here_->Run([] {
        const TAVONETCARD lease = Card(TAVO_NET_DHCP);
        const TAVONETCARD fixed = Card(TAVO_NET_STATIC, "192.0.2.20", "255.255.255.0");
        EXPECT_EQ(TAVONetSetCard1(&fixed, nullptr), 0);
        EXPECT_EQ(TAVONetSetCard1(&lease, nullptr), 0);
        EXPECT_EQ(LiveGateway(), "192.0.2.98") << "the lease's own";
        EXPECT_EQ(test::ShellStatus("[ $(grep -c '^eth0.00000000' /proc/net/route) = 1 ]"), 0);
        EXPECT_EQ(TAVONetSetCard1(&fixed, nullptr), 0);
        EXPECT_EQ(LiveGateway(), "192.0.2.99") << "and the way back";
        EXPECT_EQ(OwnAddress(), "192.0.2.20");
        return true;
    }));
}

}  // namespace
