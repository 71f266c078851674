// What the kernel's files say of the network, and what becomes of /etc/hosts.
#include "network/detail/bonding.h"
#include "network/detail/connected_route.h"
#include "network/detail/hosts_file.h"
#include "network/detail/interface_name.h"
#include "network/detail/ipv6_route_table.h"
#include "network/detail/route_table.h"
#include "network/detail/undo_step.h"
#include "support/test.h"

namespace {

constexpr const char *kRoutes = "Iface\tDestination\tGateway \tFlags\tRefCnt\tUse\tMetric\tMask\t\tMTU\tWindow\tIRTT\n"
                                "eth0\t00000000\t0101A8C0\t0003\t0\t0\t0\t00000000\t0\t0\t0\n"
                                "short row\n"
                                "eth1\t000AA8C0\t00000000\t0001\t0\t0\t100\t00FFFFFF\t0\t0\t0\n"
                                "eth2\tzz000000\t00000000\t0001\t0\t0\t0\t00000000\t0\t0\t0\n"
                                "eth3\t00000000\t0201A8C0\t0002\t0\t0\t0\t00000000\t0\t0\t0\n";

TEST(RouteTable, ReadsTheKernelsRows)
{
    const auto routes = tavo::ParseRouteTable(kRoutes);
    ASSERT_TRUE(routes);
    std::string text;
    for (const tavo::Route &route : *routes)
        text += tavo::RouteText(route) + (route.IsDefault() ? " default\n" : "\n");
    EXPECT_EQ(text, "eth0 0.0.0.0 0.0.0.0 192.168.1.1 0 default\neth1 192.168.10.0 255.255.255.0 0.0.0.0 100\n"
                    "eth3 0.0.0.0 0.0.0.0 192.168.1.2 0\n")
        << "a route that is down leads nowhere";

    EXPECT_FALSE(tavo::ParseRouteTable(""));
    EXPECT_FALSE(tavo::ParseRouteTable("Iface\tDestination\tGateway\n"));
}

// What is put back with an address or by the link itself is not listed, nor are rows of other interfaces and broken ones.
TEST(Ipv6RouteTable, HasTheRoutesThatWereSet)
{
    const std::string none(32, '0');
    const std::string db8 = "20010db8000000000000000000000000";
    const std::string router = "20010db8000000000000000000000001";
    const auto row = [&](const std::string &net, const std::string &rest) {
        return net + " " + rest + "\n";
    };
    const std::string table =
        row(none, "00 " + none + " 00 " + router + " 00000400 00000001 00000000 00000003     eth0") +
        row(db8, "30 " + none + " 00 " + none + " 00000400 00000001 00000000 00000001     eth0") +
        row(db8, "40 " + none + " 00 " + none + " 00000100 00000001 00000000 00000001     eth0") +
        row(db8, "40 " + none + " 00 " + router + " 00000100 00000001 00000000 00000003     eth0") +
        row(router, "80 " + none + " 00 " + none + " 00000000 00000002 00000000 80200001     eth0") +
        row(db8, "80 " + none + " 00 " + none + " 00000000 00000002 00000000 00100001     eth0") +
        row("fe80" + none.substr(4), "40 " + none + " 00 " + none + " 00000400 00000001 00000000 00000001 eth0") +
        row("ff00" + none.substr(4), "08 " + none + " 00 " + none + " 00000400 00000001 00000000 00000001 eth0") +
        row(none, "00 " + none + " 00 " + router + " 00000400 00000001 00000000 00000003     eth1") +
        row(db8, "81 " + none + " 00 " + none + " 00000400 00000001 00000000 00000001     eth0") +
        row(db8.substr(1), "30 " + none + " 00 " + none + " 00000400 00000001 00000000 00000001     eth0") +
        row(db8, "30 " + none + " 00 " + none + " 00000400 00000001 00000000 0000000x     eth0");
    std::string found;
    for (const tavo::LiveIpv6Route &route : tavo::ParseIpv6RouteTable(table, "eth0"))
        found += route.destination + " via " + route.gateway + "\n";
    EXPECT_EQ(found, "::/0 via 2001:db8::1\n2001:db8::/48 via \n2001:db8::/64 via 2001:db8::1\n");
}

TEST(Bonding, Partner)
{
    const std::string before = "802.3ad info\nActive Aggregator Info:\n\tAggregator ID: 1\n";
    EXPECT_EQ(tavo::ParsePartnerMac(before + "\tPartner Mac Address: 52:54:00:aa:bb:cc\n"), "52:54:00:aa:bb:cc");
    EXPECT_EQ(tavo::ParsePartnerMac(before + "\tPartner Mac Address: 00:00:00:00:00:00\n"), "");
    EXPECT_EQ(tavo::ParsePartnerMac(before), "");
}

TEST(HostsFile, KeepsTheAdministratorsLines)
{
    EXPECT_EQ(tavo::HostsWithName("", "", "nas", "10.0.0.5"), "127.0.0.1\tlocalhost\n10.0.0.5\tnas\n");
    EXPECT_EQ(
        tavo::HostsWithName("127.0.0.1  localhost\n10.0.0.4\told\n# printers\n10.0.0.9 lp lp.local\n::1 localhost6",
                            "old", "nas", "10.0.0.5"),
        "127.0.0.1\tlocalhost\n10.0.0.5\tnas\n# printers\n10.0.0.9 lp lp.local\n::1 localhost6\n");
    EXPECT_EQ(tavo::HostsWithName("10.0.0.4\tnas\n10.0.0.4\tnas alias\n", "", "nas", ""),
              "127.0.0.1\tlocalhost\n10.0.0.4\tnas alias\n");
}

// A record that a death cut off, or another program wrote, undoes nothing.
TEST(UndoRecord, HasAllOfItsStepsOrNone)
{
    const auto steps = tavo::ParseUndo(tavo::UndoText(
        {{tavo::UndoStep::file, "a b", "text\n", "644", true}, {tavo::UndoStep::command, "true", "", "", false}}));
    ASSERT_TRUE(steps);
    ASSERT_EQ(steps->size(), 2u);
    EXPECT_EQ((*steps)[0].kind, tavo::UndoStep::file);
    EXPECT_EQ((*steps)[0].target + "|" + (*steps)[0].value + "|" + (*steps)[0].more, "a b|text\n|644");
    EXPECT_TRUE((*steps)[0].after_death);
    EXPECT_FALSE((*steps)[1].after_death);
    for (const char *text :
         {"", "f 0 1 1 1\nabc\n", "fF 0 1 1 1\nabc\nend\n", "x 0 1 1 1\nabc\nend\n", " 0 1 1 1\nabc\nend\n",
          "f 0 1 1\nabc\nend\n", "f 0 1 1 1 1\nabc\nend\n", "f 0 1 1 x\nabc\nend\n", "f 0 1x 1 1\nabc\nend\n",
          "f 0 1 99 1\nabc\nend\n", "f 0 99 1 1\nabc\nend\n", "f 0 1 1 99\nabc\nend\n", "f 0 1 1 1\nabcd\nend\n",
          "f 0 1 1 1\nabc"})
        EXPECT_FALSE(tavo::ParseUndo(text)) << text;
}

TEST(InterfaceName, TakesOnlyWhatCanBeOne)
{
    for (const char *name : {"eth0", "bond0", "ppp0", "eth0:1", "eth0.100", "br-lan", "wlan_1", "abcdefghijklmno"})
        EXPECT_TRUE(tavo::IsInterfaceName(name)) << name;
    for (const char *name : {"", ".", "..", "-eth0", "../../shadow", "eth0;reboot", "eth 0", "eth0\n", "$(x)", "`x`",
                             "a/b", "abcdefghijklmnop", "eth\xC3\xA4"})
        EXPECT_FALSE(tavo::IsInterfaceName(name)) << name;
}

}  // namespace
