// Every change of the network that has steps: how it is made, and how it is taken back from wherever it stopped.
#ifndef TESTS_NETWORK_NETWORK_CHANGE_H
#define TESTS_NETWORK_NETWORK_CHANGE_H

#include "tavo_net.h"

#include "network/card_record.h"
#include "support/container_text.h"
#include "support/network_scene.h"

#include <gtest/gtest.h>

#include <cstring>
#include <ostream>

namespace test {

// Gets a lease at once and goes to the background.
inline constexpr const char *kQuickClient = R"(#!/bin/sh
busybox ifconfig "$2" 192.0.2.40 netmask 255.255.255.0
busybox route add default gw 192.0.2.98
printf 'IPADDR=192.0.2.40\nNETMASK=255.255.255.0\nGATEWAY=192.0.2.98\n' >/etc/dhcpc/dhcpcd-"$2".info
)";

inline int SetAddress(const char *address)
{
    const TAVONETCARD card = Card(TAVO_NET_STATIC, address, "255.255.255.0");
    return TAVONetSetCard1(&card, &card);
}

inline int SetDhcp()
{
    const TAVONETCARD card = Card(TAVO_NET_DHCP);
    return TAVONetSetCard1(&card, &card);
}

inline void BackToStatic()
{
    ShellStatus("busybox ifconfig eth0 0.0.0.0");
    WriteFile(kIfcfg, "DEVICE=eth0\nONBOOT=yes\nBOOTPROTO=static\nIPADDR=192.0.2.20\nNETMASK=255.255.255.0\n"
                      "BROADCAST=192.0.2.255\nNETWORK=192.0.2.0\n");
    EXPECT_EQ(SetAddress("192.0.2.20"), 0);
}

inline int SetServer(const char *server)
{
    return TAVONetDNSSet(MakeList({server}).get());
}

inline bool HasIPv6Address()
{
    return ShellStatus("grep -q ^20010db8 /proc/net/if_inet6") == 0;
}

inline bool HasIPv6Route()
{
    return ShellStatus("grep -q ^20010db800010000 /proc/net/ipv6_route") == 0;
}

inline int AddIPv6Address()
{
    return TAVONetIPv6AddrAdd("eth0", "2001:db8::20", 64);
}

inline int RemoveIPv6Address()
{
    return TAVONetIPv6AddrDel("eth0", "2001:db8::20", 64);
}

inline int AddIPv6Route()
{
    return TAVONetIPv6RouteAdd("eth0", "2001:db8:1::", 48, "2001:db8::1");
}

inline int RemoveIPv6Route()
{
    return TAVONetIPv6RouteDel("eth0", "2001:db8:1::", 48, "2001:db8::1");
}

inline void EnsureIPv6()
{
    EXPECT_EQ(TAVONetIPv6Set("eth0", 1), 0);
    if (!HasIPv6Address()) {
        EXPECT_EQ(AddIPv6Address(), 0);
    }
    if (!HasIPv6Route()) {
        EXPECT_EQ(AddIPv6Route(), 0);
    }
}

inline int MakeBond()
{
    const TAVONETLINKAGGR bond = Bond();
    return TAVONetLinkAggrSet(&bond);
}

inline void NoBond()
{
    EXPECT_EQ(ShellStatus("/etc/rc.network stop && cd /etc/sysconfig/network-scripts && rm -f * && "
                          "printf 'DEVICE=eth0\nBOOTPROTO=static\nIPADDR=192.0.2.20\nNETMASK=255.255.255.0\n' "
                          ">ifcfg-eth0 && printf '# second\nDEVICE=eth1\nBOOTPROTO=none\n' >ifcfg-eth1 && "
                          "/etc/rc.network start"),
              0);
}

struct NetworkChange {
    const char *name;
    int (*make)();
    void (*back)();  // from before the change or from after it
    int stride = 1;  // of a short run
    enum { nothing, ipv6, client } needs = nothing;
    int first_command = 1;  // of those whose failure counts
};

inline void PrintTo(const NetworkChange &change, std::ostream *out)
{
    *out << change.name;
}

inline const NetworkChange kNetworkChanges[] = {
    {"Address", [] { return SetAddress("192.0.2.60"); },
     [] {
         EXPECT_EQ(SetAddress("192.0.2.20"), 0);
     }},
    {"ToDhcp", SetDhcp, BackToStatic, 3, NetworkChange::client},
    {"FromDhcp", [] { return SetAddress("192.0.2.20"); }, [] { EXPECT_EQ(SetDhcp(), 0); }, 3, NetworkChange::client},
    {"Gateway", [] { return TAVONetDefaultGatewaySet("192.0.2.30"); },
     [] {
         EXPECT_EQ(TAVONetDefaultGatewaySet("192.0.2.99"), 0);
     }},
    {"Name", [] { return TAVOLnxSetHostname("attic"); },
     [] {
         EXPECT_EQ(TAVOLnxSetHostname("here"), 0);
     }},
    {"Mtu", [] { return TAVONetSetMTUValue("eth0", 1400); },
     [] {
         EXPECT_EQ(TAVONetSetMTUValue("eth0", 1500), 0);
     }},
    {"Servers", [] { return SetServer("192.0.2.54"); },
     [] {
         EXPECT_EQ(SetServer("192.0.2.53"), 0);
     }},
    {"Route", [] { return TAVONetRouteAdd("198.51.100.0", "255.255.255.0", "eth0"); },
     [] {
         ShellStatus("busybox route del -net 198.51.100.0 netmask 255.255.255.0 dev eth0 2>/dev/null");
     }},
    {"Bond", MakeBond, NoBond, 12, NetworkChange::nothing, 2},
    {"IPv6Address", AddIPv6Address,
     [] {
         EXPECT_TRUE(HasIPv6Address() || AddIPv6Address() == 0);
         EXPECT_EQ(RemoveIPv6Address(), 0);
     },
     2, NetworkChange::ipv6},
    {"IPv6AddressGone", RemoveIPv6Address, EnsureIPv6, 2, NetworkChange::ipv6},
    {"IPv6Route", AddIPv6Route,
     [] {
         EnsureIPv6();
         EXPECT_EQ(RemoveIPv6Route(), 0);
     },
     2, NetworkChange::ipv6},
    {"IPv6RouteGone", RemoveIPv6Route, EnsureIPv6, 2, NetworkChange::ipv6},
    {"IPv6Off", [] { return TAVONetIPv6Set("eth0", 0); }, EnsureIPv6, 2, NetworkChange::ipv6},
    {"IPv6On", [] { return TAVONetIPv6Set("eth0", 1); }, [] { EXPECT_EQ(TAVONetIPv6Set("eth0", 0), 0); }, 2,
     NetworkChange::ipv6},
};

}  // namespace test

#endif
