// The network's functions against a kernel: what they set is read back from it, in namespaces with cards of their own.
#include "tavo_net.h"

#include "network/card_record.h"
#include "support/container_text.h"
#include "support/network_scene.h"
#include "support/own_child.h"
#include "support/test.h"

using test::Card;
using test::Node;
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

int SetStatic(const char *address, const char *mask = "255.255.255.0")
{
    const TAVONETCARD card = Card(TAVO_NET_STATIC, address, mask);
    return TAVONetSetCard1(&card, nullptr);
}

std::string Address()
{
    TAVONETCARD card;
    EXPECT_EQ(TAVONetGetCard1(&card), 0);
    return std::string(card.szIp) + "/" + card.szMask;
}

TEST_F(Kernel, HasTheAddressAndTheRoutesThatWereSet)
{
    EXPECT_TRUE(here_->Run([] {
        EXPECT_EQ(SetStatic("192.0.2.20", "255.255.255.128"), 0);
        EXPECT_EQ(Address(), "192.0.2.20/255.255.255.128");
        EXPECT_EQ(BlTLIBIsConnected("eth0"), 1);
        EXPECT_EQ(TAVOIIpConflict("eth0", "192.0.2.99"), 1);
        EXPECT_EQ(TAVOIIpConflict("eth0", "192.0.2.98"), 0);
        char gateway[20] = "";
        EXPECT_EQ(TAVONetDefaultGatewaySet("198.51.100.1"), -1) << "on no network of ours";
        EXPECT_EQ(TAVONetDefaultGatewayGet(gateway, sizeof gateway), 0);
        EXPECT_STREQ(gateway, "192.0.2.99") << "the stored one";
        EXPECT_EQ(TAVONetRouteAdd("198.51.100.0", "255.255.255.0", "eth0"), 0);
        EXPECT_EQ(TAVONetRouteAdd("198.51.100.0", "255.255.255.0", "eth0"), -1) << "there already";
        EXPECT_EQ(TAVONetRouteDel("198.51.100.0", "255.255.255.0", "eth0"), 0);
        EXPECT_EQ(TAVONetRouteDel("198.51.100.0", "255.255.255.0", "eth0"), -1);
        return true;
    }));
    EXPECT_THAT(here_->Output("ip -4 addr show dev eth0"), HasSubstr("inet 192.0.2.20/25 brd 192.0.2.127"));
    EXPECT_THAT(here_->Output("ip route"),
                AllOf(HasSubstr("default via 192.0.2.99"), HasSubstr("192.0.2.0/25 dev eth0")));
    EXPECT_EQ(here_->Shell("ping -c 1 -w 5 192.0.2.99 >/dev/null"), 0);
}

// ifconfig sets a mask where the kernel has the first address just then, which may be another one.
TEST_F(Kernel, AsksWhoHasAnAddressBeforeItIsTaken)
{
    ASSERT_EQ(there_->Shell("echo 1 >/proc/sys/net/ipv4/icmp_echo_ignore_all"), 0);
    here_->Do([] {
        EXPECT_EQ(SetStatic("192.0.2.10"), 0);
        EXPECT_EQ(TAVONetAddressProbe("eth0", "192.0.2.99", 20), 1);
        EXPECT_EQ(TAVONetAddressProbe("eth0", "192.0.2.98", 20), 0);
        EXPECT_EQ(TAVONetAddressProbe("eth0", "192.0.2.10", 20), 0) << "our own";
        EXPECT_EQ(TAVONetAddressProbe("eth7", "192.0.2.98", 20), -1);
        EXPECT_EQ(TLIBErrGet(), ERR_FILE_NOT_FOUND);
    });
    // Of two that want it at the same time not both get it.
    const auto finds_it_free = [](const Node &node) {
        return node.Run([] { return TAVONetAddressProbe("eth0", "192.0.2.50", 300) == 0; });
    };
    test::OwnChild other([&] { ::_exit(finds_it_free(*there_) ? 1 : 0); });
    const bool free = finds_it_free(*here_);
    EXPECT_FALSE(free && other.Status() != 0);
}

TEST_F(Kernel, KeepsFurtherAddressesBesideANewFirstOne)
{
    EXPECT_TRUE(here_->Run([] {
        EXPECT_EQ(SetStatic("192.0.2.20"), 0);
        EXPECT_EQ(test::ShellStatus("ip addr add 203.0.113.1/29 dev eth0 && ip addr add 192.0.2.21/24 dev eth0 && "
                                    "ip route add 233.252.0.0/24 via 203.0.113.2"),
                  0);
        const auto has = [](const char *address) {
            for (const std::string rest : {"203.0.113.1/29", "192.0.2.21/24"})
                EXPECT_EQ(test::ShellStatus("ip addr show dev eth0 | grep -q ' " + rest + " '"), 0) << rest;
            EXPECT_EQ(test::ShellStatus("[ $(ip addr show dev eth0 | grep -c 'inet ') = 3 ]"), 0);
            EXPECT_EQ(test::ShellStatus("ip route | grep -q '^233.252.0.0/24 via 203.0.113.2 dev eth0'"), 0);
            EXPECT_EQ(Address(), address);
        };
        EXPECT_EQ(SetStatic("192.0.2.130", "255.255.255.192"), 0);
        has("192.0.2.130/255.255.255.192");
        // The client fails: there is none here.
        const TAVONETCARD lease = Card(TAVO_NET_DHCP);
        EXPECT_EQ(TAVONetSetCard1(&lease, nullptr), -1);
        has("192.0.2.130/255.255.255.192");
        return true;
    }));
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

}  // namespace
