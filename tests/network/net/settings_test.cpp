// What is run, written and logged when an interface, the gateway, the name servers or the host name change.
#include "tavo_net.h"

#include "cards.h"
#include "network/card_record.h"
#include "network/lock_holder.h"
#include "network/named_process.h"
#include "support/container_text.h"
#include "support/hostile_names.h"
#include "support/recorded_commands.h"

#include <csignal>
#include <cstdarg>
#include <sstream>
#include <utility>

#include <dlfcn.h>
#include <sys/syscall.h>
#include <unistd.h>

using test::Card;
using test::Cards;
using test::LastFault;
using test::List;
using test::MakeList;
using test::Quiet;
using test::ReadFile;
using test::WriteFile;
using testing::Each;
using testing::ElementsAre;
using testing::EndsWith;
using testing::HasSubstr;
using testing::IsEmpty;

namespace {

bool unkillable = false;
std::string named_host;
bool refuses_name = false;

constexpr const char *kLease = "/etc/dhcpc/dhcpcd-eth0.info";
constexpr const char *kConnected = "eth0\t000200C0\t00000000\t0001\t0\t0\t0\t00FFFFFF\t0\t0\t0\n";

std::string DefaultRoute(const std::string &gateway)
{
    return "eth0\t00000000\t" + gateway + "\t0003\t0\t0\t0\t00000000\t0\t0\t0\n";
}

class NetSettings : public Cards {
  protected:
    NetSettings()
    {
        AddCard("eth0", "192.0.2.10");
        SetRoutes(kConnected + DefaultRoute("010200C0"));
        std::filesystem::remove(kLease);
        WriteFile(kIfcfg,
                  "# mine\nDEVICE=eth0\nONBOOT=yes\nBOOTPROTO=static\nIPADDR=192.0.2.10\nNETMASK=255.255.255.0\n");
    }

    const std::string kIfcfg = test::kScripts + "ifcfg-eth0";
    test::RecordedCommands commands_;
};

TEST_F(NetSettings, AStaticAddressIsAppliedAndStored)
{
    WriteFile("/etc/resolv.conf.bak", "");
    std::filesystem::create_directories("/etc/ppp");
    WriteFile("/etc/ppp/old_gateway.bak", "");
    SetRoutes("");
    test::ForgetFault();
    const TAVONETCARD card = Card(TAVO_NET_STATIC, "192.0.2.020", "255.255.255.000");
    ASSERT_EQ(TAVONetSetCard1(&card, nullptr), 0);
    EXPECT_EQ(TLIBErrGet(), ERR_SUCCESS);
    EXPECT_THAT(commands_.Take(),
                ElementsAre(Quiet("/sbin/ifconfig eth0 192.0.2.20 netmask 255.255.255.0 broadcast 192.0.2.255"),
                            Quiet("/sbin/route add -net 192.0.2.0 netmask 255.255.255.0 dev eth0"),
                            Quiet("/sbin/route add default gw 192.0.2.1")));
    EXPECT_EQ(ReadFile(kIfcfg), "# mine\nDEVICE=eth0\nONBOOT=yes\nBOOTPROTO=static\nIPADDR=192.0.2.20\n"
                                "NETMASK=255.255.255.0\nBROADCAST=192.0.2.255\nNETWORK=192.0.2.0\n");
    EXPECT_FALSE(std::filesystem::exists("/etc/resolv.conf.bak"));
    EXPECT_FALSE(std::filesystem::exists("/etc/ppp/old_gateway.bak"));
    EXPECT_EQ(log_.Take(), "net_set_card1(#) : HUP ddnsd result: no such service or not enabled ");

    // The same once more: the name service need not know, and the routes are there.
    SetRoutes(kConnected + DefaultRoute("010200C0"));
    ASSERT_EQ(TAVONetSetCard1(&card, &card), 0);
    EXPECT_EQ(commands_.Take().size(), 1u);
    EXPECT_EQ(log_.Take(), "");
}

TEST_F(NetSettings, DhcpTakesTheStaticSettingsOut)
{
    WriteFile(kIfcfg,
              "DEVICE=eth0\nBOOTPROTO=static\nIPADDR=192.0.2.10\nNETMASK=255.255.255.0\nMASTER=bond0\nSLAVE=yes\n"
              "USERCTL=no\n");
    const TAVONETCARD card = Card(TAVO_NET_DHCP);
    ASSERT_EQ(TAVONetSetCard1(&card, nullptr), 0);
    EXPECT_THAT(commands_.Commands(),
                ElementsAre(Quiet("/sbin/ifconfig eth0 0.0.0.0"), Quiet("/sbin/dhcpcd -n eth0 -t 30")));
    EXPECT_EQ(ReadFile(kIfcfg), "DEVICE=eth0\nBOOTPROTO=dhcp\nUSERCTL=no\nONBOOT=yes\n");
    EXPECT_THAT(Sleeps(), ElementsAre("sleep 1"));
}

TEST_F(NetSettings, WithoutALeaseTheOldAddressComesBack)
{
    const std::string before = ReadFile(kIfcfg);
    commands_.Fail("/sbin/dhcpcd");
    const TAVONETCARD card = Card(TAVO_NET_DHCP);
    EXPECT_EQ(TAVONetSetCard1(&card, nullptr), -1);
    EXPECT_EQ(LastFault(), (test::Fault{ERR_OP_FAILURE, "net_set_card1"}));
    EXPECT_THAT(commands_.Take(),
                ElementsAre(HasSubstr("0.0.0.0"), HasSubstr("dhcpcd"),
                            Quiet("/sbin/ifconfig eth0 192.0.2.10 netmask 255.255.255.0 broadcast 192.0.2.255"),
                            Quiet("/sbin/route add default gw 192.0.2.1")));
    EXPECT_EQ(ReadFile(kIfcfg), before);
    EXPECT_THAT(log_.Take(), testing::StartsWith("net_set_card1(#) run dhcpcd error "));

    // Of an interface that had a lease the client's own file knows it.
    WriteFile(kIfcfg, "DEVICE=eth0\nBOOTPROTO=dhcp\n");
    WriteFile(kLease, "IPADDR=192.0.2.77\nNETMASK=255.255.0.0\n");
    commands_.Fail("/sbin/");
    EXPECT_EQ(TAVONetSetCard1(&card, nullptr), -1);
    EXPECT_THAT(commands_.Take(),
                testing::Contains(Quiet("/sbin/ifconfig eth0 192.0.2.77 netmask 255.255.0.0 broadcast 192.0.255.255")));
    EXPECT_EQ(log_.Lines().size(), 3u);
    const std::string log = log_.Take();
    EXPECT_THAT(log, testing::StartsWith("net_set_card1:# Initial setting interface [eth0] error "));
    EXPECT_THAT(log, HasSubstr("net_set_card1(#) run dhcpcd error"));
    EXPECT_THAT(log, EndsWith("net_set_card1(#): TAVOIRecoverIPSetting failed.(2A00)"));
}

// A process under another program's name, where the DHCP client writes its number.
struct Client : test::NamedProcess {
    explicit Client(const char *name) : NamedProcess(name) { WriteFile(kPidFile, std::to_string(Pid()) + "\n"); }
    ~Client() { ::unlink(kPidFile); }

    static constexpr const char *kPidFile = "/etc/dhcpc/dhcpcd-eth0.pid";
};

TEST_F(NetSettings, ARunningClientIsKilledFirst)
{
    // But not another process that got its old number.
    for (const std::string name : {"dhcpcd", "smbd"}) {
        Client client(name.c_str());
        const TAVONETCARD card = Card(TAVO_NET_DHCP);
        EXPECT_EQ(TAVONetSetCard1(&card, nullptr), 0);
        EXPECT_EQ(client.End(), name == "dhcpcd" ? SIGKILL : 0);
        EXPECT_TRUE(name == "smbd" || (!std::filesystem::exists(Client::kPidFile) && log_.Lines().empty()));
    }
}

TEST_F(NetSettings, AClientThatEndedForNothingIsStartedAgain)
{
    WriteFile(kIfcfg, "DEVICE=eth0\nBOOTPROTO=dhcp\n");
    WriteFile(kLease, "IPADDR=192.0.2.77\nNETMASK=255.255.255.0\nGATEWAY=192.0.2.3\n");
    SetRoutes(kConnected);
    Client client("dhcpcd");
    commands_.Fail("/sbin/ifconfig eth0 192.0.2.20");
    const TAVONETCARD card = Card(TAVO_NET_STATIC, "192.0.2.20", "255.255.255.0");
    EXPECT_EQ(TAVONetSetCard1(&card, nullptr), -1);
    EXPECT_THAT(commands_.Commands(),
                ElementsAre(Quiet("/sbin/ifconfig eth0 0.0.0.0"), HasSubstr("192.0.2.20"),
                            Quiet("/sbin/ifconfig eth0 192.0.2.77 netmask 255.255.255.0 broadcast 192.0.2.255"),
                            Quiet("/sbin/dhcpcd -n eth0 -t 30") + " &", Quiet("/sbin/route add default gw 192.0.2.3")));
    EXPECT_EQ(client.End(), SIGKILL);
}

// The gateway that is stored belongs to a static address.
TEST_F(NetSettings, WithDhcpTheClientNamesTheGateway)
{
    const struct {
        const char *live, *leased, *added;
    } rows[] = {
        {"FE0200C0", "", ""},                // the client has set one
        {"", "", "192.0.2.1"},               // it has none to set
        {"", "192.0.2.254", "192.0.2.254"},  // it has noted one
        {"FE0200C0", "192.0.2.254", ""},
    };
    for (const auto &row : rows) {
        SetRoutes(kConnected + (*row.live ? DefaultRoute(row.live) : ""));
        WriteFile(kLease, std::string("IPADDR=192.0.2.77\n") + (*row.leased ? "GATEWAY=" : "") + row.leased + "\n");
        const TAVONETCARD card = Card(TAVO_NET_DHCP);
        EXPECT_EQ(TAVONetSetCard1(&card, nullptr), 0);
        const std::vector<std::string> commands = commands_.Take();
        EXPECT_EQ(commands.size(), *row.added ? 3u : 2u) << row.live << row.leased;
        if (*row.added) {
            EXPECT_EQ(commands.back(), Quiet(std::string("/sbin/route add default gw ") + row.added));
        }
        EXPECT_THAT(ReadFile("/etc/sysconfig/network"), HasSubstr("GATEWAY=192.0.2.1\n")) << "for the way back";
    }
}

TEST_F(NetSettings, AClientThatCannotBeKilledEndsTheChange)
{
    Client client("dhcpcd");
    const std::string before = ReadFile(kIfcfg);
    unkillable = true;
    const TAVONETCARD card = Card(TAVO_NET_DHCP);
    EXPECT_EQ(TAVONetSetCard1(&card, nullptr), -1);
    unkillable = false;
    EXPECT_EQ(LastFault(), (test::Fault{ERR_OP_FAILURE, "net_set_card1"}));
    EXPECT_EQ(Sleeps(), std::vector<std::string>(30, "sleep 1"));
    EXPECT_EQ(log_.Lines().size(), 30u);
    EXPECT_THAT(log_.Texts(),
                Each(EndsWith(" dhcpcd pid[" + std::to_string(client.Pid()) + "] still exists, wait 1 second.")));
    EXPECT_THAT(commands_.Commands(), ElementsAre(HasSubstr("/sbin/ifconfig eth0 192.0.2.10 ")));
    EXPECT_EQ(ReadFile(kIfcfg), before);
}

TEST_F(NetSettings, TheCardIsReadFromItsFileAndTheKernel)
{
    TAVONETCARD card = {};
    test::ForgetFault();
    ASSERT_EQ(TAVONetGetCard1(&card), 0);
    EXPECT_EQ(TLIBErrGet(), ERR_SUCCESS);
    std::ostringstream text;
    text << card.nMode << " " << card.szInterface << " " << card.szIp << "/" << card.szMask << " " << card.szBroadcast
         << " " << card.szNetwork << " " << card.szGateway << " " << card.szMac << " " << card.nMtu << " "
         << card.fLink;
    EXPECT_EQ(text.str(), std::to_string(TAVO_NET_STATIC) + " eth0 192.0.2.10/255.255.255.0 192.0.2.255 192.0.2.0 "
                                                            "192.0.2.1 02:00:00:00:00:0a 9000 1");
    WriteFile(kIfcfg, "DEVICE=eth0\nBOOTPROTO=dhcp\n");
    ASSERT_EQ(TAVONetGetCard1(&card), 0);
    EXPECT_EQ(card.nMode, TAVO_NET_DHCP);

    tree_.Remove("/sys/class/net");
    EXPECT_EQ(TAVONetGetCard1(&card), -1);
    EXPECT_EQ(TLIBErrGet(), ERR_FILE_NOT_FOUND);
}

TEST_F(NetSettings, TheGatewayIsStoredBetweenTheTwoCommands)
{
    ASSERT_EQ(TAVONetDefaultGatewaySet("192.0.2.254"), 0);
    EXPECT_THAT(commands_.Commands(),
                ElementsAre(Quiet("/sbin/route delete default"), Quiet("/sbin/route add default gw 192.0.2.254")));
    EXPECT_EQ(ReadFile("/etc/sysconfig/network"), "GATEWAY=192.0.2.254\nHOSTNAME=tavo\n");
    char text[16];
    EXPECT_EQ(TAVONetDefaultGatewayGetConf(text, sizeof text), 0);
    EXPECT_STREQ(text, "192.0.2.254");
    EXPECT_EQ(TAVONetDefaultGatewayGet(text, sizeof text), 0);
    EXPECT_STREQ(text, "192.0.2.1");
    EXPECT_EQ(TAVONetDefaultGatewayGet(text, 9), -1);
    EXPECT_EQ(TLIBErrGet(), ERR_NOT_ENOUGH_MEMORY);
}

TEST_F(NetSettings, AGatewayThatCannotBeReachedIsPutBack)
{
    commands_.Fail("/sbin/route add default gw 198.51.100.1");
    EXPECT_EQ(TAVONetDefaultGatewaySet("198.51.100.1"), -1);
    EXPECT_EQ(LastFault(), (test::Fault{ERR_OP_FAILURE, "net_default_gateway_set"}));
    EXPECT_THAT(commands_.Take(), ElementsAre(HasSubstr("delete default"), HasSubstr("198.51.100.1"),
                                              Quiet("/sbin/route add default gw 192.0.2.1")));
    EXPECT_EQ(ReadFile("/etc/sysconfig/network"), "GATEWAY=192.0.2.1\nHOSTNAME=tavo\n");
    EXPECT_EQ(log_.Take(), "net_default_gateway_set(#): failed to set default gateway.");
    for (const char *bad : {"", "127.0.0.1", "10.0.0.255", "192.0.2.1;reboot", "-host"}) {
        EXPECT_EQ(TAVONetDefaultGatewaySet(bad), -1) << bad;
        EXPECT_EQ(TLIBErrGet(), ERR_INVALID_NETNAME) << bad;
    }
    EXPECT_THAT(commands_.Commands(), IsEmpty()) << "looked at before the old route goes";
}

TEST_F(NetSettings, ReportsAnUnknownRouteTable)
{
    tree_.Put("/proc/net/route", "Destination Gateway\n");
    char text[16];
    EXPECT_EQ(TAVONetDefaultGatewayGet(text, sizeof text), -1);
    EXPECT_EQ(TLIBErrGet(), ERR_FORMAT_ERROR);
    EXPECT_THAT(log_.Take(),
                testing::StartsWith("net_default_gateway_get (#) Unknow kernel routing table format, errno=["));
}

TEST_F(NetSettings, NameServersGoThroughALink)
{
    std::filesystem::create_directories("/var/ns");
    std::filesystem::remove("/etc/resolv.conf");
    std::filesystem::create_symlink("/var/ns/resolv", "/etc/resolv.conf");
    WriteFile("/var/ns/resolv", "nameserver 198.51.100.9\n");
    const List two = MakeList({"192.0.2.053", "2001:db8::1"});
    test::ForgetFault();
    ASSERT_EQ(TAVONetDNSSet(two.get()), 0);
    EXPECT_EQ(TLIBErrGet(), ERR_SUCCESS);
    EXPECT_EQ(ReadFile("/var/ns/resolv"), "nameserver\t192.0.2.53\nnameserver\t2001:db8::1\n");
    EXPECT_TRUE(std::filesystem::is_symlink("/etc/resolv.conf"));

    List found = MakeList({});
    EXPECT_EQ(test::Moving(found, TAVONetDNSGet), 2);
    EXPECT_THAT(test::Items(found.get()), ElementsAre("192.0.2.53", "2001:db8::1"));

    for (const char *bad : {"127.0.0.1", "ns.example.com", "1.2.3.4\nsearch x", "fe80::1%eth0", ""}) {
        const List list = MakeList({"192.0.2.1", bad});
        EXPECT_EQ(TAVONetDNSSet(list.get()), -1) << bad;
        EXPECT_EQ(LastFault(), (test::Fault{ERR_INVALID_NETNAME, "net_dns_set"}));
        EXPECT_THAT(log_.Take(), testing::StartsWith("net_dns_set (#) Bad DNS "));
    }
    EXPECT_EQ(ReadFile("/var/ns/resolv"), "nameserver\t192.0.2.53\nnameserver\t2001:db8::1\n");
    std::filesystem::remove("/etc/resolv.conf");
}

// The line of the appliance's own name, in every state of its addresses.
TEST_F(NetSettings, HostsHasTheNameAtTheFirstAddress)
{
    const auto hosts = [] {
        return ReadFile("/etc/hosts");
    };
    const std::string rest = "# printers\n192.0.2.50\tlp lp.local\n";
    test::ForgetFault();
    WriteFile("/etc/hosts", "127.0.0.1 localhost\n10.0.0.5 tavo\n" + rest);
    EXPECT_EQ(TAVONetHostsRefresh(), 0);
    EXPECT_EQ(hosts(), "127.0.0.1\tlocalhost\n192.0.2.10\ttavo\n" + rest);

    addresses_.clear();
    EXPECT_EQ(TAVOLnxSetHostname("attic"), 0);
    EXPECT_EQ(TLIBErrGet(), ERR_SUCCESS);
    EXPECT_EQ(ReadFile("/etc/sysconfig/network"), "GATEWAY=192.0.2.1\nHOSTNAME=attic\n");
    EXPECT_EQ(named_host, "attic");
    char name[16];
    EXPECT_EQ(TAVOLnxGetHostname(name, sizeof name), 0);
    EXPECT_STREQ(name, "attic");
    EXPECT_EQ(hosts(), "127.0.0.1\tlocalhost\n127.0.1.1\tattic\n" + rest) << "no card has an address";

    // Any change of the network finds what has changed meanwhile, and so does who only held up the client's hook.
    addresses_["eth0"] = {"192.0.2.60", "255.255.255.0"};
    EXPECT_EQ(TAVONetRouteAdd("10.20.0.0", "255.255.0.0", "eth0"), 0);
    EXPECT_EQ(hosts(), "127.0.0.1\tlocalhost\n192.0.2.60\tattic\n" + rest);
    addresses_["eth0"].first = "192.0.2.61";
    BlTAVOLnxIsDHCP("eth0");
    EXPECT_EQ(hosts(), "127.0.0.1\tlocalhost\n192.0.2.61\tattic\n" + rest);

    // Without a stored name the kernel's counts.
    WriteFile("/etc/sysconfig/network", "GATEWAY=192.0.2.1\n");
    char own[256] = "";
    ::gethostname(own, sizeof own - 1);
    EXPECT_EQ(TAVONetHostsRefresh(), 0);
    EXPECT_THAT(hosts(), HasSubstr("192.0.2.61\t" + std::string(own) + "\n"));
    const auto written = std::filesystem::last_write_time("/etc/hosts");
    EXPECT_EQ(TAVONetHostsRefresh(), 0);
    EXPECT_EQ(std::filesystem::last_write_time("/etc/hosts"), written) << "a file that is true stays";
}

TEST_F(NetSettings, TheClientsHookNeverWaits)
{
    WriteFile("/etc/hosts", "127.0.0.1\tlocalhost\n10.0.0.5\ttavo\n");
    {
        const test::LockHolder other(0x106);
        EXPECT_EQ(TAVONetHostsRefresh(), 1);
        EXPECT_EQ(ReadFile("/etc/hosts"), "127.0.0.1\tlocalhost\n10.0.0.5\ttavo\n");
    }
    EXPECT_EQ(TAVONetHostsRefresh(), 0);
    EXPECT_EQ(ReadFile("/etc/hosts"), "127.0.0.1\tlocalhost\n192.0.2.10\ttavo\n");
}

TEST_F(NetSettings, AHostsFileThatCannotBeWrittenFailsTheNameAlone)
{
    std::filesystem::remove("/etc/hosts");
    std::filesystem::create_directory("/etc/hosts");
    EXPECT_EQ(TAVONetDefaultGatewaySet("192.0.2.254"), 0);
    EXPECT_EQ(log_.Take(), "net_default_gateway_set:# Set /etc/hosts error.");
    named_host.clear();
    EXPECT_EQ(TAVOLnxSetHostname("attic"), -1);
    EXPECT_EQ(ReadFile("/etc/sysconfig/network"), "GATEWAY=192.0.2.254\nHOSTNAME=tavo\n");
    EXPECT_EQ(named_host, "");
    std::filesystem::remove("/etc/hosts");
}

TEST_F(NetSettings, ANameThatTheKernelRefusesIsNotStored)
{
    WriteFile("/etc/hosts", "");
    refuses_name = true;
    EXPECT_EQ(TAVOLnxSetHostname("attic"), -1);
    refuses_name = false;
    EXPECT_EQ(LastFault(), (test::Fault{ERR_SYS_UNKNOWN, "lnx_set_hostname"}));
    EXPECT_EQ(ReadFile("/etc/sysconfig/network"), "GATEWAY=192.0.2.1\nHOSTNAME=tavo\n");
    EXPECT_EQ(ReadFile("/etc/hosts"), "127.0.0.1\tlocalhost\n192.0.2.10\ttavo\n");
}

TEST_F(NetSettings, TheMtuHasAKeyForEachInterface)
{
    WriteFile("/etc/tavoinfo.conf", "eth1_mtu=\"4000\"\nrunsamba=\"yes\"\n");
    char text[16];
    test::ForgetFault();
    EXPECT_EQ(TAVOConfGetMTUValue("eth0", text, sizeof text), 0);
    EXPECT_STREQ(text, "1500");
    EXPECT_EQ(TLIBErrGet(), ERR_SUCCESS);
    EXPECT_EQ(TAVOGetMTUSetting("eth1"), 4000);
    EXPECT_EQ(TAVONetSetMTUValue("eth0", 9000), 0);
    EXPECT_EQ(TAVOGetMTUSetting("eth0"), 9000);
    EXPECT_THAT(commands_.Commands(), ElementsAre(Quiet("/sbin/ifconfig eth0 mtu 9000")));
    EXPECT_THAT(ReadFile("/etc/tavoinfo.conf"), HasSubstr("eth1_mtu=\"4000\"\nrunsamba=\"yes\"\n"));

    commands_.Fail("/sbin/ifconfig");
    EXPECT_EQ(TAVONetSetMTUEth("eth0", 1400), -1);
    EXPECT_EQ(log_.Take(), "net_set_mtu_eth:# Failed to ifconfig MTU Value(0x2A00)");
    EXPECT_EQ(TAVONetSetMTUValue("eth0", 1400), -1);
    EXPECT_EQ(LastFault(), (test::Fault{ERR_OP_FAILURE, "net_set_mtu_eth"}));
    EXPECT_EQ(TAVOGetMTUSetting("eth0"), 9000) << "what the card refuses is not stored";
    {
        const test::LockHolder other(0x106);
        EXPECT_EQ(TAVONetSetMTUEth("eth0", 1400), -1);
        EXPECT_EQ(TLIBErrGet(), ERR_LOCK_FAILED);
    }
    for (const int bad : {-1, 0, 67, 65536})
        EXPECT_EQ(TAVONetSetMTUValue("eth0", bad), -1) << bad;
    EXPECT_EQ(TAVOGetMTUSetting("eth0"), 9000);
    log_.Clear();
    EXPECT_EQ(TAVOConfGetMTUValue("abcdefghijklmnop", text, sizeof text), -1);
    EXPECT_EQ(log_.Take(), "conf_get_mtu_value:# interface name is too long");
    WriteFile("/etc/tavoinfo.conf", "eth1_mtu=\"4k\"\n");
    EXPECT_EQ(TAVOGetMTUSetting("eth1"), -1);
    EXPECT_EQ(TLIBErrGet(), ERR_FORMAT_ERROR);
}

TEST_F(NetSettings, AConflictIsWhatAnswersAPing)
{
    EXPECT_EQ(TAVOIIpConflict("eth0", "192.0.2.10"), 0);
    EXPECT_THAT(commands_.Commands(), IsEmpty()) << "our own address";
    EXPECT_EQ(TAVOIIpConflict("eth0", "192.0.2.11"), 1);
    EXPECT_THAT(commands_.Commands(), ElementsAre(Quiet("/bin/ping -c 1 -w 2 192.0.2.11")));
    const std::pair<int, int> rows[] = {{1, 0}, {2, 0}, {127, -1}};
    for (const auto &[status, answer] : rows) {
        EXPECT_EQ(log_.Take(), "");
        test::ForgetFault();
        commands_.Exit(status);
        EXPECT_EQ(TAVOIIpConflict("eth0", "192.0.2.11"), answer) << status;
        EXPECT_EQ(TLIBErrGet(), answer < 0 ? ERR_OP_FAILURE : ERR_SUCCESS);
    }
    EXPECT_THAT(log_.Take(),
                testing::StartsWith("net_ip_conflict(#): system(/bin/ping -c 1 -w 2 192.0.2.11 > /dev/null "
                                    "2>&1) failed.(strerror="));
}

TEST_F(NetSettings, IsDhcpRepairsAFileThatDoesNotSay)
{
    for (const std::string mode : {"dhcp", "DHCP", "dhcpx", "static"}) {
        WriteFile(kIfcfg, "BOOTPROTO=" + mode + "\n");
        EXPECT_EQ(BlTAVOLnxIsDHCP("eth0"), mode == "dhcp") << mode;
        EXPECT_EQ(ReadFile(kIfcfg), "BOOTPROTO=" + mode + "\n");
    }
    EXPECT_EQ(log_.Take(), "");
    WriteFile(kIfcfg, "DEVICE=eth0\n");
    EXPECT_EQ(BlTAVOLnxIsDHCP("eth0"), 0);
    EXPECT_EQ(ReadFile(kIfcfg), "DEVICE=eth0\nBOOTPROTO=static\n");
    EXPECT_EQ(log_.Take(), "lnx_is_dhcp(#) Get BOOTPROTO failed.(2000)");
    EXPECT_EQ(BlTAVOLnxIsDHCP(""), 0);
    EXPECT_EQ(TLIBErrGet(), ERR_BAD_PARAMETERS);
}

TEST_F(NetSettings, RoutesAreAddedAndRemoved)
{
    EXPECT_EQ(TAVONetRouteAdd("010.20.0.0", "255.255.0.0", "ppp0"), 0);
    EXPECT_EQ(TAVONetRouteDel("10.20.0.0", "255.255.0.0", "eth0"), 0);
    EXPECT_THAT(commands_.Commands(),
                ElementsAre(Quiet("/sbin/route add -net 10.20.0.0 netmask 255.255.0.0 dev ppp0"),
                            Quiet("/sbin/route del -net 10.20.0.0 netmask 255.255.0.0 dev eth0")));
    commands_.Fail("/sbin/route");
    EXPECT_EQ(TAVONetRouteAdd("10.20.0.0", "255.255.0.0", "eth0"), -1);
    EXPECT_EQ(LastFault(), (test::Fault{ERR_OP_FAILURE, "net_route_add"}));
    commands_.Clear();
    const char *const rows[][3] = {{"10.20.0.1", "255.255.0.0", "eth0"},
                                   {"10.20.0.0", "255.0.255.0", "eth0"},
                                   {"default", "255.255.0.0", "eth0"},
                                   {"10.20.0.0", "255.255.0.0", "eth0;reboot"}};
    for (const auto &row : rows) {
        EXPECT_EQ(TAVONetRouteAdd(row[0], row[1], row[2]), -1) << row[0];
        EXPECT_EQ(TAVONetRouteDel(row[0], row[1], row[2]), -1) << row[0];
    }
    EXPECT_THAT(commands_.Commands(), IsEmpty());
}

TEST_F(NetSettings, IPv6IsSwitchedForOneInterface)
{
    WriteFile(kIfcfg, "DEVICE=eth0\n");
    EXPECT_EQ(TAVONetIPv6Set("eth0", 0), 0);
    EXPECT_EQ(ReadFile(kIfcfg), "DEVICE=eth0\nIPV6INIT=no\n");
    EXPECT_EQ(TAVONetIPv6Set("eth0", 1), 0);
    EXPECT_EQ(ReadFile(kIfcfg), "DEVICE=eth0\nIPV6INIT=yes\n");
    EXPECT_THAT(commands_.Commands(), ElementsAre("/bin/echo 1 > /proc/sys/net/ipv6/conf/eth0/disable_ipv6",
                                                  "/bin/echo 0 > /proc/sys/net/ipv6/conf/eth0/disable_ipv6"));
    commands_.Fail("/bin/echo", 2);
    EXPECT_EQ(TAVONetIPv6Set("eth0", 0), -1);
    EXPECT_EQ(LastFault(), (test::Fault{ERR_OP_FAILURE, "net_ipv6_set"}));
    EXPECT_EQ(ReadFile(kIfcfg), "DEVICE=eth0\nIPV6INIT=yes\n");
    EXPECT_EQ(TAVONetIPv6Set("../all", 1), -1);
    EXPECT_EQ(TLIBErrGet(), ERR_BAD_PARAMETERS);
}

TEST_F(NetSettings, APortIsInUseWhenASocketHasIt)
{
    const std::string header = "  sl  local_address rem_address   st\n";
    tree_.Put("/proc/net/tcp", header + "   0: 0100007F:1F90 00000000:0000 0A\n");
    tree_.Put("/proc/net/udp", header + "  12: 00000000:270F 00000000:0000 07\n");
    EXPECT_EQ(BlTLIBIsPortInUse(8080), 1);
    EXPECT_EQ(BlTLIBIsPortInUse(9999), 1);
    test::ForgetFault();
    EXPECT_EQ(BlTLIBIsPortInUse(10), 0) << "a state is no port";
    EXPECT_EQ(TLIBErrGet(), ERR_SUCCESS);
    tree_.Put("/proc/net/tcp6",
              header + "   0: " + std::string(32, '0') + ":1F91 " + std::string(32, '0') + ":0000 0A\n");
    EXPECT_EQ(BlTLIBIsPortInUse(8081), 1);
    EXPECT_EQ(BlTLIBIsPortInUse(0), 0);
    EXPECT_EQ(TLIBErrGet(), ERR_BAD_PARAMETERS);
    tree_.Remove("/proc/net/udp");
    EXPECT_EQ(BlTLIBIsPortInUse(10), 0);
    EXPECT_EQ(LastFault(), (test::Fault{ERR_OPEN_FAILED, "net_is_port_in_use"}));
    EXPECT_EQ(log_.Take(), "net_is_port_in_use:# Fail to open [/proc/net/udp], errno=[2/No such file or directory]");
}

// Whatever is passed for an interface, an address or a name: nothing runs and no file changes.
TEST_F(NetSettings, HostileNamesAreRefused)
{
    const std::string file = ReadFile(kIfcfg);
    const std::string network = ReadFile("/etc/sysconfig/network");
    WriteFile("/etc/tavoinfo.conf", "support_wol=\"yes\"\nwol_enabled_options=\"g\"\n");
    TLIBSZLIST *list = PslTLIBSzListAlloc(512);
    ::unlink(test::kCanary);
    for (std::string name : test::HostileNames()) {
        if (const size_t at = name.find("sda"); at != name.npos)
            name.replace(at, 3, "eth0");
        const char *const text = name.c_str();
        char buffer[64];
        // As a careless caller fills a record: whole, or cut without an end.
        TAVONETCARD card = {};
        name.copy(card.szInterface, sizeof card.szInterface);
        TAVONETCARD address = Card(TAVO_NET_STATIC, "", "255.255.255.0");
        name.copy(address.szIp, sizeof address.szIp);
        TAVONETLINKAGGR bond = {};
        name.copy(bond.szBond, sizeof bond.szBond);
        TAVONETLINKAGGR member = {"bond0", TAVO_NET_AGGR_BACKUP, 0, 1, {}, {}};
        name.copy(member.rgszMember[0], sizeof member.rgszMember[0]);
        const List servers = MakeList({name});
        const auto refused = [text](auto... results) {
            EXPECT_THAT((std::vector<int>{results...}), Each(-1)) << text;
        };
        refused(TAVONetSetCard1(&card, nullptr), TAVONetSetCard1(&address, nullptr), TAVONetDefaultGatewaySet(text),
                TAVOLnxSetHostname(text), TAVONetDNSSet(servers.get()), TAVONetSetMTUValue(text, 1500),
                TAVONetSetMTUEth(text, 1500), TAVOConfGetMTUValue(text, buffer, sizeof buffer),
                TAVOIIpConflict(text, "192.0.2.11"), TAVOIIpConflict("eth0", text), TAVONetLinkAggrSet(&bond),
                TAVONetLinkAggrSet(&member), TAVONetLinkAggrGet(text, &bond), TAVONetIPv6Set(text, 1),
                TAVONetIPv6AddrAdd(text, "2001:db8::1", 64), TAVONetIPv6AddrAdd("eth0", text, 64),
                TAVONetIPv6AddrDel("eth0", text, 64), TAVONetIPv6AddrEnum(text, &list),
                TAVONetIPv6RouteAdd("eth0", text, 64, nullptr), TAVONetIPv6RouteDel("eth0", "2001:db8::", 64, text),
                TAVONetDhcpTest(text, 1), TAVONetDhcp6Wait(text, 1), TAVONetWolGet(text), TAVONetWolSet(text, 1));
        EXPECT_EQ(BlTAVOLnxIsDHCP(text), 0) << name;
        EXPECT_EQ(BlTLIBIsConnected(text), 0) << name;
    }
    TLIBSzListFree(list);
    EXPECT_THAT(commands_.Commands(), IsEmpty());
    EXPECT_FALSE(std::filesystem::exists(test::kCanary));
    EXPECT_EQ(ReadFile(kIfcfg), file);
    EXPECT_EQ(ReadFile("/etc/sysconfig/network"), network);
    EXPECT_EQ(std::distance(std::filesystem::directory_iterator(test::kScripts), {}), 1);
}

}  // namespace

extern "C" {

int sethostname(const char *name, size_t length) noexcept
{
    if (refuses_name) {
        errno = EPERM;
        return -1;
    }
    named_host.assign(name, length);
    return 0;
}

int kill(pid_t pid, int signal) noexcept
{
    if (unkillable) {
        errno = EPERM;
        return -1;
    }
    return static_cast<int>(::syscall(SYS_kill, pid, signal));
}

long syscall(long number, ...) noexcept
{
    va_list list;
    va_start(list, number);
    long args[6];
    for (long &arg : args)
        arg = va_arg(list, long);
    va_end(list);
    if (unkillable && number == SYS_pidfd_send_signal) {
        errno = EPERM;
        return -1;
    }
    using Syscall = long(long, ...);
    static Syscall *const real = reinterpret_cast<Syscall *>(::dlsym(RTLD_NEXT, "syscall"));
    return real(number, args[0], args[1], args[2], args[3], args[4], args[5]);
}
}
