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

#include <dlfcn.h>
#include <fcntl.h>
#include <sys/syscall.h>
#include <sys/wait.h>
#include <unistd.h>

using test::Card;
using test::Cards;
using test::CommandReply;
using test::LastFault;
using test::List;
using test::MakeList;
using test::Quiet;
using test::ReadFile;
using test::WriteFile;
using testing::AllOf;
using testing::Contains;
using testing::Each;
using testing::ElementsAre;
using testing::EndsWith;
using testing::HasSubstr;
using testing::IsEmpty;
using testing::MatchesRegex;

namespace {

bool unkillable = false;
std::string named_host;
bool refuses_name = false;

class NetSettings : public Cards {
  protected:
    NetSettings()
    {
        AddCard("eth0", "192.0.2.10");
        SetRoutes("eth0\t000200C0\t00000000\t0001\t0\t0\t0\t00FFFFFF\t0\t0\t0\n"
                  "eth0\t00000000\t010200C0\t0003\t0\t0\t0\t00000000\t0\t0\t0\n");
        WriteFile(kIfcfg,
                  "# mine\nDEVICE=eth0\nONBOOT=yes\nBOOTPROTO=static\nIPADDR=192.0.2.10\nNETMASK=255.255.255.0\n");
    }

    // The command whose text begins so ends with that status; all others succeed.
    void Fails(const std::string &beginning, int status = 1)
    {
        commands_.OnCommand(
            [=](const std::string &command) { return CommandReply{command.starts_with(beginning) ? status : 0}; });
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
    EXPECT_THAT(commands_.Commands(),
                ElementsAre(Quiet("/sbin/ifconfig eth0 192.0.2.20 netmask 255.255.255.0 broadcast 192.0.2.255"),
                            Quiet("/sbin/route add -net 192.0.2.0 netmask 255.255.255.0 dev eth0"),
                            Quiet("/sbin/route add default gw 192.0.2.1")));
    EXPECT_EQ(ReadFile(kIfcfg), "# mine\nDEVICE=eth0\nONBOOT=yes\nBOOTPROTO=static\nIPADDR=192.0.2.20\n"
                                "NETMASK=255.255.255.0\nBROADCAST=192.0.2.255\nNETWORK=192.0.2.0\n");
    EXPECT_FALSE(std::filesystem::exists("/etc/resolv.conf.bak"));
    EXPECT_FALSE(std::filesystem::exists("/etc/ppp/old_gateway.bak"));
    EXPECT_THAT(log_.Texts(), ElementsAre(MatchesRegex(
                                  "net_set_card1\\([0-9]+\\) : HUP ddnsd result: no such service or not enabled ")));

    // The same once more: the name service need not know, and the routes are there.
    SetRoutes("eth0\t000200C0\t00000000\t0001\t0\t0\t0\t00FFFFFF\t0\t0\t0\n"
              "eth0\t00000000\t010200C0\t0003\t0\t0\t0\t00000000\t0\t0\t0\n");
    log_.Clear();
    commands_.Clear();
    ASSERT_EQ(TAVONetSetCard1(&card, &card), 0);
    EXPECT_EQ(commands_.Commands().size(), 1u);
    EXPECT_THAT(log_.Texts(), IsEmpty());
}

TEST_F(NetSettings, AnAddressThatIsNotTakenLeavesTheOldOne)
{
    const std::string before = ReadFile(kIfcfg);
    Fails("/sbin/ifconfig eth0 192.0.2.20");
    const TAVONETCARD card = Card(TAVO_NET_STATIC, "192.0.2.20", "255.255.255.0");
    EXPECT_EQ(TAVONetSetCard1(&card, nullptr), -1);
    EXPECT_EQ(LastFault(), (test::Fault{ERR_OP_FAILURE, "net_set_card1"}));
    EXPECT_THAT(commands_.Commands(),
                ElementsAre(HasSubstr("192.0.2.20"),
                            Quiet("/sbin/ifconfig eth0 192.0.2.10 netmask 255.255.255.0 broadcast 192.0.2.255")));
    EXPECT_EQ(ReadFile(kIfcfg), before);
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
    Fails("/sbin/dhcpcd");
    const TAVONETCARD card = Card(TAVO_NET_DHCP);
    EXPECT_EQ(TAVONetSetCard1(&card, nullptr), -1);
    EXPECT_EQ(LastFault(), (test::Fault{ERR_OP_FAILURE, "net_set_card1"}));
    EXPECT_THAT(commands_.Commands(),
                ElementsAre(HasSubstr("0.0.0.0"), HasSubstr("dhcpcd"),
                            Quiet("/sbin/ifconfig eth0 192.0.2.10 netmask 255.255.255.0 broadcast 192.0.2.255"),
                            Quiet("/sbin/route add default gw 192.0.2.1")));
    EXPECT_EQ(ReadFile(kIfcfg), before);
    EXPECT_THAT(log_.Texts(), ElementsAre(MatchesRegex("net_set_card1\\([0-9]+\\) run dhcpcd error .*")));

    // Of an interface that had a lease the client's own file knows it.
    WriteFile(kIfcfg, "DEVICE=eth0\nBOOTPROTO=dhcp\n");
    WriteFile("/etc/dhcpc/dhcpcd-eth0.info", "IPADDR=192.0.2.77\nNETMASK=255.255.0.0\n");
    Fails("/sbin/");
    log_.Clear();
    commands_.Clear();
    EXPECT_EQ(TAVONetSetCard1(&card, nullptr), -1);
    EXPECT_THAT(commands_.Commands(),
                Contains(Quiet("/sbin/ifconfig eth0 192.0.2.77 netmask 255.255.0.0 broadcast 192.0.255.255")));
    EXPECT_THAT(log_.Texts(),
                ElementsAre(MatchesRegex("net_set_card1:[0-9]+ Initial setting interface \\[eth0\\] error .*"),
                            HasSubstr("run dhcpcd error"),
                            MatchesRegex("net_set_card1\\([0-9]+\\): TAVOIRecoverIPSetting failed.\\(2A00\\)")));
    std::filesystem::remove("/etc/dhcpc/dhcpcd-eth0.info");
}

// A process under another program's name, where the DHCP client writes its number.
struct Client : test::NamedProcess {
    explicit Client(const char *name) : NamedProcess(name) { WriteFile(kPidFile, std::to_string(Pid()) + "\n"); }
    ~Client() { ::unlink(kPidFile); }

    static constexpr const char *kPidFile = "/etc/dhcpc/dhcpcd-eth0.pid";
};

TEST_F(NetSettings, ARunningClientIsKilledFirst)
{
    Client client("dhcpcd");
    const TAVONETCARD card = Card(TAVO_NET_DHCP);
    EXPECT_EQ(TAVONetSetCard1(&card, nullptr), 0);
    EXPECT_EQ(client.End(), SIGKILL);
    EXPECT_FALSE(std::filesystem::exists(Client::kPidFile));
    EXPECT_THAT(log_.Texts(), IsEmpty());
}

TEST_F(NetSettings, AClientThatEndedForNothingIsStartedAgain)
{
    WriteFile(kIfcfg, "DEVICE=eth0\nBOOTPROTO=dhcp\n");
    WriteFile("/etc/dhcpc/dhcpcd-eth0.info", "IPADDR=192.0.2.77\nNETMASK=255.255.255.0\nGATEWAY=192.0.2.3\n");
    SetRoutes("eth0\t000200C0\t00000000\t0001\t0\t0\t0\t00FFFFFF\t0\t0\t0\n");
    Client client("dhcpcd");
    Fails("/sbin/ifconfig eth0 192.0.2.20");
    const TAVONETCARD card = Card(TAVO_NET_STATIC, "192.0.2.20", "255.255.255.0");
    EXPECT_EQ(TAVONetSetCard1(&card, nullptr), -1);
    EXPECT_THAT(commands_.Commands(),
                ElementsAre(Quiet("/sbin/ifconfig eth0 0.0.0.0"), HasSubstr("192.0.2.20"),
                            Quiet("/sbin/ifconfig eth0 192.0.2.77 netmask 255.255.255.0 broadcast 192.0.2.255"),
                            Quiet("/sbin/dhcpcd -n eth0 -t 30") + " &", Quiet("/sbin/route add default gw 192.0.2.3")));
    EXPECT_EQ(client.End(), SIGKILL);
    std::filesystem::remove("/etc/dhcpc/dhcpcd-eth0.info");
}

// The gateway that is stored belongs to a static address.
TEST_F(NetSettings, WithDhcpTheClientNamesTheGateway)
{
    const std::string connected = "eth0\t000200C0\t00000000\t0001\t0\t0\t0\t00FFFFFF\t0\t0\t0\n";
    const struct {
        const char *live, *leased, *added;
    } rows[] = {
        {"FE0200C0", "", ""},                // the client has set one
        {"", "", "192.0.2.1"},               // it has none to set
        {"", "192.0.2.254", "192.0.2.254"},  // it has noted one
        {"FE0200C0", "192.0.2.254", ""},
    };
    for (const auto &row : rows) {
        SetRoutes(connected + (*row.live
                                   ? "eth0\t00000000\t" + std::string(row.live) + "\t0003\t0\t0\t0\t00000000\t0\t0\t0\n"
                                   : ""));
        WriteFile("/etc/dhcpc/dhcpcd-eth0.info", std::string("IPADDR=192.0.2.77\n") +
                                                     (*row.leased ? "GATEWAY=" + std::string(row.leased) + "\n" : ""));
        commands_.Clear();
        const TAVONETCARD card = Card(TAVO_NET_DHCP);
        EXPECT_EQ(TAVONetSetCard1(&card, nullptr), 0);
        EXPECT_EQ(commands_.Commands().size(), *row.added ? 3u : 2u) << row.live << row.leased;
        if (*row.added) {
            EXPECT_EQ(commands_.Commands().back(), Quiet(std::string("/sbin/route add default gw ") + row.added));
        }
        EXPECT_THAT(ReadFile("/etc/sysconfig/network"), HasSubstr("GATEWAY=192.0.2.1\n")) << "for the way back";
    }
    std::filesystem::remove("/etc/dhcpc/dhcpcd-eth0.info");
}

TEST_F(NetSettings, AProcessThatGotTheClientsOldNumberLives)
{
    Client client("smbd");
    const TAVONETCARD card = Card(TAVO_NET_DHCP);
    EXPECT_EQ(TAVONetSetCard1(&card, nullptr), 0);
    EXPECT_EQ(client.End(), 0);
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
    EXPECT_EQ(card.nMode, TAVO_NET_STATIC);
    EXPECT_STREQ(card.szInterface, "eth0");
    EXPECT_STREQ(card.szIp, "192.0.2.10");
    EXPECT_STREQ(card.szMask, "255.255.255.0");
    EXPECT_STREQ(card.szBroadcast, "192.0.2.255");
    EXPECT_STREQ(card.szNetwork, "192.0.2.0");
    EXPECT_STREQ(card.szGateway, "192.0.2.1");
    EXPECT_STREQ(card.szMac, "02:00:00:00:00:0a");
    EXPECT_EQ(card.nMtu, 9000);
    EXPECT_EQ(card.fLink, 1);

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
    Fails("/sbin/route add default gw 198.51.100.1");
    EXPECT_EQ(TAVONetDefaultGatewaySet("198.51.100.1"), -1);
    EXPECT_EQ(LastFault(), (test::Fault{ERR_OP_FAILURE, "net_default_gateway_set"}));
    EXPECT_THAT(commands_.Commands(), ElementsAre(HasSubstr("delete default"), HasSubstr("198.51.100.1"),
                                                  Quiet("/sbin/route add default gw 192.0.2.1")));
    EXPECT_EQ(ReadFile("/etc/sysconfig/network"), "GATEWAY=192.0.2.1\nHOSTNAME=tavo\n");
    EXPECT_THAT(log_.Texts(), ElementsAre(EndsWith("): failed to set default gateway.")));

    commands_.Clear();
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
    EXPECT_THAT(
        log_.Texts(),
        ElementsAre(MatchesRegex("net_default_gateway_get \\([0-9]+\\) Unknow kernel routing table format, errno=.*")));
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
        log_.Clear();
        const List list = MakeList({"192.0.2.1", bad});
        EXPECT_EQ(TAVONetDNSSet(list.get()), -1) << bad;
        EXPECT_EQ(LastFault(), (test::Fault{ERR_INVALID_NETNAME, "net_dns_set"}));
        EXPECT_THAT(log_.Texts(), ElementsAre(HasSubstr(") Bad DNS ")));
    }
    EXPECT_EQ(ReadFile("/var/ns/resolv"), "nameserver\t192.0.2.53\nnameserver\t2001:db8::1\n");
    std::filesystem::remove("/etc/resolv.conf");
}

TEST_F(NetSettings, TheHostNameKeepsTheAdministratorsLines)
{
    WriteFile("/etc/hosts", "127.0.0.1 localhost\n192.0.2.10 tavo\n# printers\n192.0.2.50\tlp lp.local\n");
    test::ForgetFault();
    ASSERT_EQ(TAVOLnxSetHostname("attic"), 0);
    EXPECT_EQ(TLIBErrGet(), ERR_SUCCESS);
    EXPECT_EQ(ReadFile("/etc/hosts"), "127.0.0.1\tlocalhost\n192.0.2.10\tattic\n# printers\n192.0.2.50\tlp lp.local\n");
    EXPECT_EQ(ReadFile("/etc/sysconfig/network"), "GATEWAY=192.0.2.1\nHOSTNAME=attic\n");
    EXPECT_EQ(named_host, "attic");
    char name[16];
    EXPECT_EQ(TAVOLnxGetHostname(name, sizeof name), 0);
    EXPECT_STREQ(name, "attic");
}

// The line of the appliance's own name, in every state of its addresses.
TEST_F(NetSettings, HostsHasTheNameAtTheFirstAddress)
{
    const auto hosts = [] {
        return ReadFile("/etc/hosts");
    };
    const std::string rest = "# printers\n192.0.2.50\tlp lp.local\n";
    WriteFile("/etc/hosts", "127.0.0.1 localhost\n10.0.0.5 tavo\n" + rest);
    EXPECT_EQ(TAVONetHostsRefresh(), 0);
    EXPECT_EQ(hosts(), "127.0.0.1\tlocalhost\n192.0.2.10\ttavo\n" + rest);

    addresses_.clear();
    EXPECT_EQ(TAVOLnxSetHostname("attic"), 0);
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
    EXPECT_THAT(log_.Texts(), ElementsAre(MatchesRegex("net_default_gateway_set:[0-9]+ Set /etc/hosts error.")));
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
    EXPECT_THAT(ReadFile("/etc/tavoinfo.conf"),
                AllOf(HasSubstr("eth1_mtu=\"4000\"\nrunsamba=\"yes\"\n"), HasSubstr("eth0_mtu=")));

    Fails("/sbin/ifconfig");
    EXPECT_EQ(TAVONetSetMTUEth("eth0", 1400), -1);
    EXPECT_THAT(log_.Texts(), ElementsAre(EndsWith("Failed to ifconfig MTU Value(0x2A00)")));
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
    EXPECT_THAT(log_.Texts(), ElementsAre(EndsWith(" interface name is too long")));
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
    const struct {
        int status, answer;
    } rows[] = {{1, 0}, {2, 0}, {127, -1}};
    for (const auto &row : rows) {
        log_.Clear();
        test::ForgetFault();
        Fails("/bin/ping", row.status);
        EXPECT_EQ(TAVOIIpConflict("eth0", "192.0.2.11"), row.answer) << row.status;
        EXPECT_EQ(TLIBErrGet(), row.answer < 0 ? ERR_OP_FAILURE : ERR_SUCCESS);
        EXPECT_EQ(log_.Lines().empty(), row.answer == 0);
    }
    EXPECT_THAT(log_.Texts(), ElementsAre(MatchesRegex("net_ip_conflict\\([0-9]+\\): system\\(/bin/ping -c 1 -w 2 "
                                                       "192.0.2.11 > /dev/null 2>&1\\) failed.\\(strerror=.*\\)")));
}

TEST_F(NetSettings, IsDhcpRepairsAFileThatDoesNotSay)
{
    const struct {
        const char *file;
        int answer;
    } rows[] = {{"BOOTPROTO=dhcp\n", 1}, {"BOOTPROTO=DHCP\n", 0}, {"BOOTPROTO=dhcpx\n", 0}, {"BOOTPROTO=static\n", 0}};
    for (const auto &row : rows) {
        WriteFile(kIfcfg, row.file);
        EXPECT_EQ(BlTAVOLnxIsDHCP("eth0"), row.answer) << row.file;
        EXPECT_EQ(ReadFile(kIfcfg), row.file);
    }
    EXPECT_THAT(log_.Texts(), IsEmpty());
    WriteFile(kIfcfg, "DEVICE=eth0\n");
    EXPECT_EQ(BlTAVOLnxIsDHCP("eth0"), 0);
    EXPECT_EQ(ReadFile(kIfcfg), "DEVICE=eth0\nBOOTPROTO=static\n");
    EXPECT_THAT(log_.Texts(), ElementsAre(EndsWith(") Get BOOTPROTO failed.(2000)")));
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
    Fails("/sbin/route");
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
    Fails("/bin/echo", 2);
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
    EXPECT_THAT(log_.Texts(), ElementsAre(MatchesRegex("net_is_port_in_use:[0-9]+ Fail to open \\[/proc/net/udp\\], "
                                                       "errno=\\[2/.*\\]")));
}

// As a careless caller fills a record: whole, or cut without an end.
template <size_t Size>
void Fill(char (&field)[Size], const std::string &text)
{
    std::memset(field, 0, Size);
    text.copy(field, Size);
}

// Whatever is passed for an interface, an address or a name: nothing runs and no file changes.
TEST_F(NetSettings, HostileNamesAreRefused)
{
    const std::string file = ReadFile(kIfcfg);
    const std::string network = ReadFile("/etc/sysconfig/network");
    ::unlink(test::kCanary);
    for (std::string name : test::HostileNames()) {
        if (const size_t at = name.find("sda"); at != name.npos)
            name.replace(at, 3, "eth0");
        const char *const text = name.c_str();
        char buffer[64];
        TAVONETCARD card = Card(TAVO_NET_DHCP);
        Fill(card.szInterface, name);
        TAVONETCARD address = Card(TAVO_NET_STATIC, "", "255.255.255.0");
        Fill(address.szIp, name);
        TAVONETLINKAGGR bond = {};
        Fill(bond.szBond, name);
        TAVONETLINKAGGR member = {"bond0", TAVO_NET_AGGR_BACKUP, 0, 1, {}, {}};
        Fill(member.rgszMember[0], name);
        const List servers = MakeList({name});
        const int results[] = {
            TAVONetSetCard1(&card, nullptr),     TAVONetSetCard1(&address, nullptr),
            TAVONetDefaultGatewaySet(text),      TAVOLnxSetHostname(text),
            TAVONetDNSSet(servers.get()),        TAVONetSetMTUValue(text, 1500),
            TAVONetSetMTUEth(text, 1500),        TAVOConfGetMTUValue(text, buffer, sizeof buffer),
            TAVOIIpConflict(text, "192.0.2.11"), TAVOIIpConflict("eth0", text),
            TAVONetLinkAggrSet(&bond),           TAVONetLinkAggrSet(&member),
            TAVONetLinkAggrGet(text, &bond),
        };
        EXPECT_THAT(results, Each(-1)) << name;
        EXPECT_EQ(BlTAVOLnxIsDHCP(text), 0) << name;
        EXPECT_EQ(BlTLIBIsConnected(text), 0) << name;
    }
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
