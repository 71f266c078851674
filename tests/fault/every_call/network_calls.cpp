// Interfaces, routes, bonds and discovery: one card with an address, as the kernel shows it.
#include "arguments.h"
#include "network/card_record.h"
#include "support/device_tree.h"
#include "support/recorded_calls.h"
#include "support/test.h"

#include <arpa/inet.h>
#include <net/if.h>
#include <sys/ioctl.h>
#include <sys/syscall.h>

namespace every_call {
namespace {

using test::Bond;

int Answer(int, unsigned long request, void *argument)
{
    if (WasFailed(::syscall(SYS_ioctl, -1, request, argument)))
        return -1;
    if (request != SIOCGIFADDR && request != SIOCGIFNETMASK) {
        errno = ENOTTY;
        return -1;
    }
    ifreq ask;
    std::memcpy(&ask, argument, sizeof ask);
    sockaddr_in answer = {};
    answer.sin_family = AF_INET;
    answer.sin_addr.s_addr = htonl(request == SIOCGIFADDR ? 0xC000020A : 0xFFFFFF00);
    std::memcpy(&ask.ifr_addr, &answer, sizeof answer);
    std::memcpy(argument, &ask, sizeof ask);
    return 0;
}

struct Network {
    test::DeviceTree tree;
    test::RecordedCalls calls{Answer};

    Network()
    {
        const test::CapturedLog quiet;
        const std::string scripts = "/etc/sysconfig/network-scripts/";
        std::filesystem::create_directories(scripts);
        std::filesystem::create_directories("/etc/dhcpc");
        test::WriteFile("/etc/sysconfig/network", "GATEWAY=192.0.2.1\nHOSTNAME=tavo\n");
        test::WriteFile(scripts + "ifcfg-eth0",
                        "DEVICE=eth0\nBOOTPROTO=static\nONBOOT=yes\nIPADDR=192.0.2.10\nNETMASK=255.255.255.0\n");
        test::WriteFile("/etc/resolv.conf", "nameserver 192.0.2.1\n");
        test::WriteFile("/tmp/tavods.list", "");
        for (const char *name : {"eth0", "eth1"}) {
            const std::string folder = std::string("/sys/class/net/") + name;
            tree.Put(folder + "/type", "1\n");
            tree.Put(folder + "/address", "02:00:00:00:00:0a\n");
            tree.Put(folder + "/mtu", "1500\n");
            tree.Put(folder + "/carrier", "1\n");
        }
        tree.Put("/proc/net/route",
                 "Iface\tDestination\tGateway \tFlags\tRefCnt\tUse\tMetric\tMask\t\tMTU\tWindow\tIRTT\n"
                 "eth0\t00000000\t010200C0\t0003\t0\t0\t0\t00000000\t0\t0\t0\n"
                 "eth0\t000200C0\t00000000\t0001\t0\t0\t0\t00FFFFFF\t0\t0\t0\n");
        tree.Put("/proc/net/if_inet6", "fe80000000000000000000fffe00000a 02 40 20 80     eth0\n");
        tree.Put("/proc/net/tcp", "  sl  local_address rem_address   st\n   0: 0100007F:1F90 00000000:0000 0A\n");
        tree.Put("/proc/net/udp", "  sl  local_address rem_address   st\n");
        tree.Put("/etc.defaults/tavoinfo.conf", "maxdisks=2\n");
    }
};

TAVONETCARD Static()
{
    TAVONETCARD card = {};
    card.nMode = TAVO_NET_STATIC;
    std::strcpy(card.szInterface, "eth0");
    std::strcpy(card.szIp, "192.0.2.11");
    std::strcpy(card.szMask, "255.255.255.0");
    return card;
}

}  // namespace

Family NetworkFamily()
{
    return {
        "Network",
        {
            CALL(BlTAVOLnxIsDHCP, kAnswers, "eth0"),
            CALL(BlTAVONetIPv6IsEnabled, kAnswers, "eth0"),
            CALL(BlTLIBIsAtom, kZeroFails | kNoCode, "atom"),
            CALL(BlTLIBIsConnected, kAnswers, "eth0"),
            CALL(BlTLIBIsDomain, kZeroFails | kNoCode, "example.com"),
            CALL(BlTLIBIsHostname, kZeroFails | kNoCode, "tavo"),
            CALL(BlTLIBIsIpAddr, kZeroFails | kNoCode, "192.0.2.1"),
            CALL(BlTLIBIsIpMask, kZeroFails | kNoCode, Text<16>{"255.255.255.0"}),
            CALL(BlTLIBIsMailbox, kZeroFails | kNoCode, "a@example.com"),
            CALL(BlTLIBIsPortInUse, kAnswers, 8080),
            CALL(BlTLIBIsSubNet, kZeroFails | kNoCode, "192.0.2.0/255.255.255.0"),
            CALL(BlTLIBIsWorkGroupName, kZeroFails | kNoCode, "WORKGROUP"),
            CALL(BlTLIBIsv6IpAddrValid, kZeroFails | kNoCode, "fe80::1"),
            CALL(ErrTLIBIpMaskToSubnet, 0, Text<64>{"192.0.2.1/255.255.255.0"}, Text<64>()),
            CALL(ErrTLIBSubnetToIpMask, 0, Text<64>{"192.0.2.0/24"}, Text<64>()),
            CALL(TAVOConfGetMTUValue, kAnswers, "eth0", Text<16>(), 16),
            CALL(TAVOConfSetMTUValue, 0, "eth0", 1400),
            CALL(TAVOGetMTUSetting, kAnswers, "eth0"),
            CALL(TAVOIIpConflict, kAnswers, "eth0", "192.0.2.55"),
            CALL(TAVOLnxGetHostname, 0, Text<64>(), 64),
            CALL(TAVOLnxSetHostname, kInChild, "tavo"),
            CALL(TAVONetAddressProbe, kAnswers | kNoFaults, "eth0", "192.0.2.2", 1),
            CALL(TAVONetCheckpointEnd, kAnswers),
            CALL(TAVONetCheckpointPutBack, kAnswers),
            CALL(TAVONetCheckpointTake, kAnswers | kSteps),
            CALL(TAVONetDNSGet, 0, ListOf({})),
            CALL(TAVONetDNSSet, 0, ListOf({"192.0.2.2"})),
            CALL(TAVONetDefaultGatewayGet, 0, Text<32>(), 32),
            CALL(TAVONetDefaultGatewayGetConf, 0, Text<32>(), 32),
            CALL(TAVONetDefaultGatewaySet, 0, "192.0.2.2"),
            CALL(TAVONetDhcp6Wait, kAnswers | kNoFaults, "eth0", 0),
            CALL(TAVONetDhcpTest, 0, "eth0", 1),
            CALL(TAVONetHostsRefresh, kAnswers),
            CALL(TAVONetGetCard, kAnswers, "eth0", Var<TAVONETCARD>()),
            CALL(TAVONetGetCard1, kAnswers, Var<TAVONETCARD>()),
            CALL(TAVONetIPv6AddrAdd, 0, "eth0", "2001:db8::1", 64),
            CALL(TAVONetIPv6AddrDel, 0, "eth0", "2001:db8::1", 64),
            CALL(TAVONetIPv6AddrEnum, 0, "eth0", ListOf({})),
            CALL(TAVONetIPv6RouteAdd, 0, "eth0", "2001:db8:1::", 64, "fe80::1"),
            CALL(TAVONetIPv6RouteDel, 0, "eth0", "2001:db8:1::", 64, "fe80::1"),
            CALL(TAVONetIPv6Set, kAnswers, "eth0", 1),
            CALL(TAVONetLinkAggrEnum, kAnswers, ListOf({})),
            CALL(TAVONetLinkAggrGet, kAnswers, "bond0", Var<TAVONETLINKAGGR>()),
            CALL(TAVONetLinkAggrOptSlsaveAdd, 0, Var<TAVONETLINKAGGR>{Bond()}, "eth1"),
            CALL(TAVONetLinkAggrPhyGet, kAnswers, "bond0", ListOf({})),
            CALL(TAVONetLinkAggrSet, kAnswers, Var<TAVONETLINKAGGR>{Bond()}),
            CALL(TAVONetRouteAdd, 0, "198.51.100.0", "255.255.255.0", "eth0"),
            CALL(TAVONetRouteDel, 0, "198.51.100.0", "255.255.255.0", "eth0"),
            CALL(TAVONetSetCard1, kAnswers, Var<TAVONETCARD>{Static()}, nullptr),
            CALL(TAVONetSetMTUEth, 0, "eth0", 1400),
            CALL(TAVONetSetMTUValue, 0, "eth0", 1400),
            CALL(TAVONetWolGet, kAnswers, "eth0"),
            CALL(TAVONetWolSet, kAnswers, "eth0", 1),

            // Discovery.
            CALL(ErrFHOSTSendBroadcastUdp, kAnswers, static_cast<const void *>(stFHOSTHeader), 8),
            CALL(ErrFHOSTSendQueryPkt, kAnswers),
            BODY(FHOSTBroadCastSize, 0, { run.Show(f); }),
            BODY(FHOSTBroadCastSizeV11, 0, { run.Show(f); }),
            BODY(FHOSTBroadCastSizeVDS20, 0, { run.Show(f); }),
            BODY(FHOSTHeaderSize, 0, { run.Show(f); }),
            CALL(TAVOFHOSTDumpHost, kAnswers),
            // It watches for whole seconds.
            CALL(
                TAVOFHOSTEnum, kAnswers | kNoFaults, [](const TAVOFHOST *, void *) { return 0; }, nullptr, 1),
            CALL(TAVOFHOSTGet2Hash, kAnswers, HashOf({})),
            BODY(stFHOSTBroadCast, 0, { run.Show(f[0]); }),
            BODY(stFHOSTBroadCastV11, 0, { run.Show(f[0]); }),
            BODY(stFHOSTBroadCastVDS20, 0, { run.Show(f[0]); }),
            BODY(stFHOSTHeader, 0, { run.Show(f[0]); }),
        },
        [] { return std::make_shared<Network>(); },
        {"/etc", "/usr/tavo/etc"},
    };
}

}  // namespace every_call
