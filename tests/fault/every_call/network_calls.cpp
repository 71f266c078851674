// Interfaces, routes, bonds and discovery: one card with an address, as the kernel shows it.
#include "call.h"
#include "network/card_record.h"
#include "support/captured_log.h"
#include "support/container_text.h"
#include "support/device_tree.h"
#include "support/recorded_calls.h"
#include "support/scratch_dir.h"

#include <cerrno>
#include <cstring>
#include <filesystem>

#include <arpa/inet.h>
#include <net/if.h>
#include <sys/ioctl.h>
#include <sys/syscall.h>
#include <unistd.h>

namespace every_call {
namespace {

using test::Bond;
using test::MakeList;

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

struct Found {
    TLIBSZLIST *list = MakeList({}).release();

    ~Found() { TLIBSzListFree(list); }
};

}  // namespace

Family NetworkFamily()
{
    return {
        "Network",
        {
            CALL(BlTAVOLnxIsDHCP, kAnswers, { run(f, "eth0"); }),
            CALL(BlTAVONetIPv6IsEnabled, kAnswers, { run(f, "eth0"); }),
            CALL(BlTLIBIsAtom, kZeroFails | kNoCode, { run(f, "atom"); }),
            CALL(BlTLIBIsConnected, kAnswers, { run(f, "eth0"); }),
            CALL(BlTLIBIsDomain, kZeroFails | kNoCode, { run(f, "example.com"); }),
            CALL(BlTLIBIsHostname, kZeroFails | kNoCode, { run(f, "tavo"); }),
            CALL(BlTLIBIsIpAddr, kZeroFails | kNoCode, { run(f, "192.0.2.1"); }),
            CALL(BlTLIBIsIpMask, kZeroFails | kNoCode,
                 {
                     char mask[] = "255.255.255.0";
                     run(f, mask);
                 }),
            CALL(BlTLIBIsMailbox, kZeroFails | kNoCode, { run(f, "a@example.com"); }),
            CALL(BlTLIBIsPortInUse, kAnswers, { run(f, 8080); }),
            CALL(BlTLIBIsSubNet, kZeroFails | kNoCode, { run(f, "192.0.2.0/255.255.255.0"); }),
            CALL(BlTLIBIsWorkGroupName, kZeroFails | kNoCode, { run(f, "WORKGROUP"); }),
            CALL(BlTLIBIsv6IpAddrValid, kZeroFails | kNoCode, { run(f, "fe80::1"); }),
            CALL(ErrTLIBIpMaskToSubnet, 0,
                 {
                     char in[64] = "192.0.2.1/255.255.255.0";
                     char out[64] = "";
                     run(f, in, out);
                     run.Show(out);
                 }),
            CALL(ErrTLIBSubnetToIpMask, 0,
                 {
                     char in[64] = "192.0.2.0/24";
                     char out[64] = "";
                     run(f, in, out);
                     run.Show(out);
                 }),
            CALL(TAVOConfGetMTUValue, kAnswers,
                 {
                     char mtu[16] = "";
                     run(f, "eth0", mtu, 16);
                 }),
            CALL(TAVOConfSetMTUValue, 0, { run(f, "eth0", 1400); }),
            CALL(TAVOGetMTUSetting, kAnswers, { run(f, "eth0"); }),
            CALL(TAVOIIpConflict, kAnswers, { run(f, "eth0", "192.0.2.55"); }),
            CALL(TAVOLnxGetHostname, 0,
                 {
                     char name[64] = "";
                     run(f, name, 64);
                     run.Show(name);
                 }),
            CALL(TAVOLnxSetHostname, kInChild, { run(f, "tavo"); }),
            CALL(TAVONetAddressProbe, kAnswers | kNoFaults, { run(f, "eth0", "192.0.2.2", 1); }),
            CALL(TAVONetCheckpointEnd, kAnswers, { run(f); }),
            CALL(TAVONetCheckpointPutBack, kAnswers, { run(f); }),
            CALL(TAVONetCheckpointTake, kAnswers | kSteps, { run(f); }),
            CALL(TAVONetDNSGet, 0,
                 {
                     Found found;
                     run(f, &found.list);
                     run.Show(found.list);
                 }),
            CALL(TAVONetDNSSet, 0,
                 {
                     TLIBSZLIST *servers = MakeList({"192.0.2.2"}).release();
                     run(f, servers);
                     TLIBSzListFree(servers);
                 }),
            CALL(TAVONetDefaultGatewayGet, 0,
                 {
                     char gateway[32] = "";
                     run(f, gateway, 32);
                     run.Show(gateway);
                 }),
            CALL(TAVONetDefaultGatewayGetConf, 0,
                 {
                     char gateway[32] = "";
                     run(f, gateway, 32);
                     run.Show(gateway);
                 }),
            CALL(TAVONetDefaultGatewaySet, 0, { run(f, "192.0.2.2"); }),
            CALL(TAVONetDhcp6Wait, kAnswers | kNoFaults, { run(f, "eth0", 0); }),
            CALL(TAVONetDhcpTest, 0, { run(f, "eth0", 1); }),
            CALL(TAVONetHostsRefresh, kAnswers, { run(f); }),
            CALL(TAVONetGetCard, kAnswers,
                 {
                     TAVONETCARD card = {};
                     run(f, "eth0", &card);
                 }),
            CALL(TAVONetGetCard1, kAnswers,
                 {
                     TAVONETCARD card = {};
                     run(f, &card);
                 }),
            CALL(TAVONetIPv6AddrAdd, 0, { run(f, "eth0", "2001:db8::1", 64); }),
            CALL(TAVONetIPv6AddrDel, 0, { run(f, "eth0", "2001:db8::1", 64); }),
            CALL(TAVONetIPv6AddrEnum, 0,
                 {
                     Found found;
                     run(f, "eth0", &found.list);
                     run.Show(found.list);
                 }),
            CALL(TAVONetIPv6RouteAdd, 0, { run(f, "eth0", "2001:db8:1::", 64, "fe80::1"); }),
            CALL(TAVONetIPv6RouteDel, 0, { run(f, "eth0", "2001:db8:1::", 64, "fe80::1"); }),
            CALL(TAVONetIPv6Set, kAnswers, { run(f, "eth0", 1); }),
            CALL(TAVONetLinkAggrEnum, kAnswers,
                 {
                     Found found;
                     run(f, &found.list);
                 }),
            CALL(TAVONetLinkAggrGet, kAnswers,
                 {
                     TAVONETLINKAGGR bond = {};
                     run(f, "bond0", &bond);
                 }),
            CALL(TAVONetLinkAggrOptSlsaveAdd, 0,
                 {
                     TAVONETLINKAGGR bond = Bond();
                     run(f, &bond, "eth1");
                 }),
            CALL(TAVONetLinkAggrPhyGet, kAnswers,
                 {
                     Found found;
                     run(f, "bond0", &found.list);
                 }),
            CALL(TAVONetLinkAggrSet, kAnswers,
                 {
                     const TAVONETLINKAGGR bond = Bond();
                     run(f, &bond);
                 }),
            CALL(TAVONetRouteAdd, 0, { run(f, "198.51.100.0", "255.255.255.0", "eth0"); }),
            CALL(TAVONetRouteDel, 0, { run(f, "198.51.100.0", "255.255.255.0", "eth0"); }),
            CALL(TAVONetSetCard1, kAnswers,
                 {
                     const TAVONETCARD card = Static();
                     run(f, &card, static_cast<const TAVONETCARD *>(nullptr));
                 }),
            CALL(TAVONetSetMTUEth, 0, { run(f, "eth0", 1400); }),
            CALL(TAVONetSetMTUValue, 0, { run(f, "eth0", 1400); }),
            CALL(TAVONetWolGet, kAnswers, { run(f, "eth0"); }),
            CALL(TAVONetWolSet, kAnswers, { run(f, "eth0", 1); }),

            // Discovery.
            CALL(ErrFHOSTSendBroadcastUdp, kAnswers, { run(f, static_cast<const void *>(stFHOSTHeader), 8); }),
            CALL(ErrFHOSTSendQueryPkt, kAnswers, { run(f); }),
            CALL(FHOSTBroadCastSize, 0, { run.Show(f); }),
            CALL(FHOSTBroadCastSizeV11, 0, { run.Show(f); }),
            CALL(FHOSTBroadCastSizeVDS20, 0, { run.Show(f); }),
            CALL(FHOSTHeaderSize, 0, { run.Show(f); }),
            CALL(TAVOFHOSTDumpHost, kAnswers, { run(f); }),
            // It watches for whole seconds.
            CALL(TAVOFHOSTEnum, kAnswers | kNoFaults,
                 {
                     const TAVOFHOSTCALLBACK count = [](const TAVOFHOST *, void *) {
                         return 0;
                     };
                     run(f, count, static_cast<void *>(nullptr), 1);
                 }),
            CALL(TAVOFHOSTGet2Hash, kAnswers,
                 {
                     TLIBSZHASH *hosts = PshTLIBSzHashAlloc(64);
                     run(f, &hosts);
                     TLIBSzHashFree(hosts);
                 }),
            CALL(stFHOSTBroadCast, 0, { run.Show(f[0]); }),
            CALL(stFHOSTBroadCastV11, 0, { run.Show(f[0]); }),
            CALL(stFHOSTBroadCastVDS20, 0, { run.Show(f[0]); }),
            CALL(stFHOSTHeader, 0, { run.Show(f[0]); }),
        },
        [] { return std::make_shared<Network>(); },
        {"/etc", "/usr/tavo/etc"},
    };
}

}  // namespace every_call
