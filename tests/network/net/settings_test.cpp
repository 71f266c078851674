// What is run, written and logged when an interface, the gateway, the name servers or the host name change.
#include "tavo_net.h"

#include "cards.h"
#include "network/card_record.h"
#include "network/lock_holder.h"
#include "network/named_process.h"
#include "support/container_text.h"
#include "support/hostile_names.h"
#include "support/recorded_commands.h"
#include "support/story.h"
#include "support/test.h"

#include <cstdarg>

#include <dlfcn.h>
#include <sys/syscall.h>

using test::Card;
using test::Cards;
using test::List;
using test::MakeList;
using test::ReadFile;
using test::WriteFile;
using testing::Each;
using testing::HasSubstr;
using testing::IsEmpty;

namespace {

bool unkillable = false;
std::vector<std::string> named_hosts;
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
        WriteFile("/etc/tavoinfo.conf", "");
        WriteFile(kIfcfg,
                  "# mine\nDEVICE=eth0\nONBOOT=yes\nBOOTPROTO=static\nIPADDR=192.0.2.10\nNETMASK=255.255.255.0\n");
        story_.Mask("name " + Own() + "$", "name of this machine");
        story_.Mask("(command|boot|owner) .*", "$1 ...");  // of the record of a change, or a checkpoint
        story_.Mask("(strerror=| error |format, errno=)[A-Z\\[][^)]*", "$1...");  // of an earlier call
    }

    int SetCard(int mode, const char *address = "", const char *mask = "")
    {
        const TAVONETCARD card = Card(mode, address, mask);
        return TAVONetSetCard1(&card, nullptr);
    }

    static std::string Own()
    {
        char own[256] = "";
        ::gethostname(own, sizeof own - 1);
        return own;
    }

    const std::string kIfcfg = test::kScripts + "ifcfg-eth0";
    test::RecordedCommands commands_;
    test::Story story_{TEST_GOLDEN,
                       {test::CommandsOf(commands_), test::LogOf(log_), test::CallsOf(calls_, "sleep"),
                        [] {
                            return std::exchange(named_hosts, {});
                        }},
                       {test::kScripts, "/etc/sysconfig/network", "/etc/hosts", "/etc/resolv.conf", "/var/ns/resolv",
                        "/etc/tavoinfo.conf", "/etc/dhcpc", "/etc/resolv.conf.bak", "/etc/ppp/old_gateway.bak",
                        "/etc/network.checkpoint"}};
};

TEST_F(NetSettings, AStaticAddressIsAppliedAndStored)
{
    WriteFile("/etc/resolv.conf.bak", "");
    std::filesystem::create_directories("/etc/ppp");
    WriteFile("/etc/ppp/old_gateway.bak", "");
    SetRoutes("");
    TELL(SetCard(TAVO_NET_STATIC, "192.0.2.020", "255.255.255.000"));

    // The same once more: the name service need not know, and the routes are there.
    SetRoutes(kConnected + DefaultRoute("010200C0"));
    const TAVONETCARD card = Card(TAVO_NET_STATIC, "192.0.2.020", "255.255.255.000");
    TELL(TAVONetSetCard1(&card, &card));
}

TEST_F(NetSettings, DhcpTakesTheStaticSettingsOut)
{
    WriteFile(kIfcfg,
              "DEVICE=eth0\nBOOTPROTO=static\nIPADDR=192.0.2.10\nNETMASK=255.255.255.0\nMASTER=bond0\nSLAVE=yes\n"
              "USERCTL=no\n");
    TELL(SetCard(TAVO_NET_DHCP));
}

TEST_F(NetSettings, WithoutALeaseTheOldAddressComesBack)
{
    commands_.Fail("/sbin/dhcpcd");
    TELL(SetCard(TAVO_NET_DHCP));
    // Of an interface that had a lease the client's own file knows it.
    WriteFile(kIfcfg, "DEVICE=eth0\nBOOTPROTO=dhcp\n");
    WriteFile(kLease, "IPADDR=192.0.2.77\nNETMASK=255.255.0.0\n");
    commands_.Fail("/sbin/");
    TELL(SetCard(TAVO_NET_DHCP));
}

// A process under another program's name, where the DHCP client writes its number.
struct Client : test::NamedProcess {
    explicit Client(const char *name, const char *argument = "none") : NamedProcess(name, argument)
    {
        WriteFile(kPidFile, std::to_string(Pid()) + "\n");
    }
    ~Client() { ::unlink(kPidFile); }

    static constexpr const char *kPidFile = "/etc/dhcpc/dhcpcd-eth0.pid";
};

TEST_F(NetSettings, ARunningClientIsKilledFirst)
{
    // But not another process that got its old number.
    for (const std::string name : {"dhcpcd", "smbd"}) {
        Client client(name.c_str());
        EXPECT_EQ(SetCard(TAVO_NET_DHCP), 0);
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
    TELL(SetCard(TAVO_NET_STATIC, "192.0.2.20", "255.255.255.0"));
    EXPECT_EQ(client.End(), SIGKILL);
}

// The gateway that is stored belongs to a static address, and stays for the way back.
TEST_F(NetSettings, WithDhcpTheClientNamesTheGateway)
{
    const struct {
        const char *what, *live, *leased;
    } rows[] = {
        {"the client has set one", "FE0200C0", ""},
        {"it has none to set", "", ""},
        {"it has noted one", "", "192.0.2.254"},
        {"set and noted", "FE0200C0", "192.0.2.254"},
    };
    for (const auto &row : rows) {
        SetRoutes(kConnected + (*row.live ? DefaultRoute(row.live) : ""));
        WriteFile(kLease, std::string("IPADDR=192.0.2.77\n") + (*row.leased ? "GATEWAY=" : "") + row.leased + "\n");
        story_.Head(row.what);
        TELL(SetCard(TAVO_NET_DHCP));
    }
    EXPECT_THAT(ReadFile("/etc/sysconfig/network"), HasSubstr("GATEWAY=192.0.2.1\n"));
}

TEST_F(NetSettings, AClientThatCannotBeKilledEndsTheChange)
{
    Client client("dhcpcd");
    const std::string before = ReadFile(kIfcfg);
    unkillable = true;
    EXPECT_EQ(SetCard(TAVO_NET_DHCP), -1);
    unkillable = false;
    EXPECT_EQ(test::LastFault(), (test::Fault{ERR_OP_FAILURE, "net_set_card1"}));
    EXPECT_EQ(Sleeps(), std::vector<std::string>(30, "sleep 1"));
    EXPECT_EQ(log_.Lines().size(), 30u);
    EXPECT_THAT(log_.Texts(), Each(testing::EndsWith(" dhcpcd pid[" + std::to_string(client.Pid()) +
                                                     "] still exists, wait 1 second.")));
    EXPECT_THAT(commands_.Commands(), testing::ElementsAre(HasSubstr("/sbin/ifconfig eth0 192.0.2.10 ")));
    EXPECT_EQ(ReadFile(kIfcfg), before);
}

TEST_F(NetSettings, TheCardIsReadFromItsFileAndTheKernel)
{
    TAVONETCARD card = {};
    TELL(TAVONetGetCard1(&card));
    std::ostringstream text;
    text << card.nMode << " " << card.szInterface << " " << card.szIp << "/" << card.szMask << " " << card.szBroadcast
         << " " << card.szNetwork << " " << card.szGateway << " " << card.szMac << " " << card.nMtu << " "
         << card.fLink;
    story_.Show("card", text.str());
    WriteFile(kIfcfg, "DEVICE=eth0\nBOOTPROTO=dhcp\n");
    TELL(TAVONetGetCard1(&card));
    EXPECT_EQ(card.nMode, TAVO_NET_DHCP);
    tree_.Put("/sys/class/net/eth1/type/unreadable", "");
    TELL(TAVONetGetCard1(&card));  // it may be the first one
    tree_.Remove("/proc/net/route");
    char gateway[16];
    TELL(TAVONetDefaultGatewayGet(gateway, sizeof gateway));
    tree_.Remove("/sys/class/net");
    TELL(TAVONetGetCard1(&card));
}

TEST_F(NetSettings, TheGatewayIsStoredBetweenTheTwoCommands)
{
    TELL(TAVONetDefaultGatewaySet("192.0.2.254"));
    char text[16];
    TELL(TAVONetDefaultGatewayGetConf(text, sizeof text));
    story_.Show("gateway", text);
    TELL(TAVONetDefaultGatewayGet(text, sizeof text));
    story_.Show("gateway", text);
    TELL(TAVONetDefaultGatewayGet(text, 9));
}

TEST_F(NetSettings, AGatewayThatCannotBeReachedIsPutBack)
{
    commands_.Fail("/sbin/route add default gw 198.51.100.1");
    TELL(TAVONetDefaultGatewaySet("198.51.100.1"));
    // Looked at before the old route goes.
    for (const char *bad : {"", "127.0.0.1", "10.0.0.255", "192.0.2.1;reboot", "-host"})
        TELL(TAVONetDefaultGatewaySet(bad));
    tree_.Put("/proc/net/route", "Destination Gateway\n");
    char text[16];
    TELL(TAVONetDefaultGatewayGet(text, sizeof text));
}

TEST_F(NetSettings, NameServersGoThroughALink)
{
    std::filesystem::create_directories("/var/ns");
    std::filesystem::remove("/etc/resolv.conf");
    std::filesystem::create_symlink("/var/ns/resolv", "/etc/resolv.conf");
    WriteFile("/var/ns/resolv", "nameserver 198.51.100.9\n");
    const List two = MakeList({"192.0.2.053", "2001:db8::1"});
    TELL(TAVONetDNSSet(two.get()));
    List found = MakeList({});
    TELL(test::Moving(found, TAVONetDNSGet));
    story_.Show("servers", test::Items(found.get()));
    for (const char *bad : {"127.0.0.1", "ns.example.com", "1.2.3.4\nsearch x", "fe80::1%eth0", ""}) {
        const List list = MakeList({"192.0.2.1", bad});
        TELL(TAVONetDNSSet(list.get()));
    }
    std::filesystem::remove("/etc/resolv.conf");
}

// The line of the appliance's own name, in every state of its addresses.
TEST_F(NetSettings, HostsHasTheNameAtTheFirstAddress)
{
    WriteFile("/etc/hosts", "127.0.0.1 localhost\n10.0.0.5 tavo\n# printers\n192.0.2.50\tlp lp.local\n");
    TELL(TAVONetHostsRefresh());
    addresses_.clear();
    TELL(TAVOLnxSetHostname("attic"));  // no card has an address
    char name[16];
    TELL(TAVOLnxGetHostname(name, sizeof name));
    story_.Show("name", name);
    TELL(TAVOLnxGetHostname(name, 1));

    refuses_name = true;
    TELL(TAVOLnxSetHostname("cellar"));
    refuses_name = false;

    // Any change of the network finds what has changed meanwhile, and so does who only held up the client's hook.
    addresses_["eth0"] = {"192.0.2.60", "255.255.255.0"};
    TELL(TAVONetRouteAdd("10.20.0.0", "255.255.0.0", "eth0"));
    addresses_["eth0"].first = "192.0.2.61";
    {
        const test::LockHolder other(0x106);  // the client's hook never waits
        TELL(TAVONetHostsRefresh());
    }
    TELL(BlTAVOLnxIsDHCP("eth0"));

    // Without a stored name the kernel's counts.
    WriteFile("/etc/sysconfig/network", "GATEWAY=192.0.2.1\n");
    EXPECT_EQ(TAVONetHostsRefresh(), 0);
    EXPECT_THAT(ReadFile("/etc/hosts"), HasSubstr("192.0.2.61\t" + Own() + "\n"));
    const auto written = std::filesystem::last_write_time("/etc/hosts");
    EXPECT_EQ(TAVONetHostsRefresh(), 0);
    EXPECT_EQ(std::filesystem::last_write_time("/etc/hosts"), written) << "a file that is true stays";
}

// A folder has the place of one file. What needs the file fails and puts back what it has done; the rest works.
TEST_F(NetSettings, ReportsFilesThatCannotBeReadOrWritten)
{
    const std::filesystem::path kept = "/etc/kept";
    const List servers = MakeList({"192.0.2.53"});
    List found = MakeList({});
    for (const std::string path : {kIfcfg.c_str(), "/etc/sysconfig/network", "/etc/resolv.conf", "/etc/hosts"}) {
        for (const char *text : {"/etc/resolv.conf", "/etc/hosts"})
            WriteFile(text, "");
        std::filesystem::rename(path, kept);
        std::filesystem::create_directory(path);
        story_.Head(path);
        TELL(TAVONetCheckpointTake());
        TELL(SetCard(TAVO_NET_STATIC, "192.0.2.20", "255.255.255.0"));
        TELL(TAVONetIPv6Set("eth0", 1));
        TELL(BlTAVOLnxIsDHCP("eth0"));
        TELL(TAVONetDefaultGatewaySet("192.0.2.254"));
        TELL(TAVOLnxSetHostname("attic"));
        TELL(TAVONetHostsRefresh());
        TELL(TAVONetDNSSet(servers.get()));
        TELL(test::Moving(found, TAVONetDNSGet));
        EXPECT_FALSE(std::filesystem::exists("/etc/network.checkpoint"));
        std::filesystem::remove_all(path);
        std::filesystem::rename(kept, path);
    }
}

TEST_F(NetSettings, ACheckpointHasTheWholeNetwork)
{
    AddCard("eth1");
    tree_.Put("/sys/class/net/eth0/flags", "0x1003\n");
    tree_.Put("/sys/class/net/eth0/iflink", "2\n");
    tree_.Put("/sys/class/net/bond0/type", "1\n");
    tree_.Put("/sys/class/net/bond0/bonding/mode", "802.3ad 4\n");
    tree_.Put("/sys/class/net/bond0/bonding/slaves", "eth0 eth1\n");
    tree_.Put("/sys/class/net/lo/type", "772\n");
    tree_.Put("/proc/net/if_inet6", "20010db8000000000000000000000001 02 40 00 80     eth0\n");
    WriteFile("/etc/hosts", "127.0.0.1\tlocalhost\n192.0.2.10\ttavo\n");
    WriteFile("/etc/resolv.conf", "nameserver 192.0.2.53\n");
    WriteFile("/etc/tavoinfo.conf", "eth0_mtu=9000\nrunsamba=yes\neth0_wol_options=g\n");
    WriteFile(test::kScripts + "more-eth0", "192.0.2.11\n");
    WriteFile(test::kScripts + "rules", "no part of it\n");
    TELL(TAVONetCheckpointPutBack());
    TELL(TAVONetCheckpointEnd());
    TELL(TAVONetCheckpointTake());
    TELL(TAVONetCheckpointTake());

    const auto change = [&] {
        std::filesystem::remove(kIfcfg);
        WriteFile(test::kScripts + "ifcfg-eth1", "DEVICE=eth1\n");
        WriteFile(test::kScripts + "more-eth0", "192.0.2.12\n");
        WriteFile("/etc/tavoinfo.conf", "eth1_mtu=1400\nrunsamba=no\neth0_wol_options=d\n");
        WriteFile("/etc/sysconfig/network", "GATEWAY=192.0.2.254\nHOSTNAME=attic\n");
        tree_.Put("/sys/class/net/eth0/mtu", "1400\n");
        SetRoutes(kConnected);
    };
    change();
    TELL(TAVONetCheckpointPutBack());
    // With other cards the network is stopped before its files change, and started.
    ASSERT_EQ(TAVONetCheckpointTake(), 0);
    change();
    tree_.Put("/sys/class/net/bond0/bonding/slaves", "eth0\n");
    TELL(TAVONetCheckpointPutBack());
    // A program that died has left it.
    ASSERT_EQ(TAVONetCheckpointTake(), 0);
    std::string record = ReadFile("/etc/network.checkpoint");
    WriteFile("/etc/network.checkpoint", record.replace(6, record.find('\n') - 6, "1 1"));
    change();
    TELL(TAVONetHostsRefresh());
    // Before the machine was started again.
    ASSERT_EQ(TAVONetCheckpointTake(), 0);
    record = ReadFile("/etc/network.checkpoint");
    WriteFile("/etc/network.checkpoint", record.replace(record.find("\nboot ") + 6, 4, "past"));
    change();
    TELL(TAVONetHostsRefresh());
}

// What was started since the checkpoint ends, and the client of that time goes on.
TEST_F(NetSettings, ACheckpointKeepsItsClient)
{
    WriteFile(kIfcfg, "DEVICE=eth0\nBOOTPROTO=dhcp\n");
    Client client("/sbin/dhcpcd", "eth0");
    EXPECT_EQ(TAVONetCheckpointTake(), 0);
    tree_.Put("/sys/class/net/eth0/mtu", "1400\n");
    test::NamedProcess late("/sbin/dhcpcd", "eth0"), other("/sbin/dhcpcd", "eth1");
    EXPECT_EQ(TAVONetCheckpointPutBack(), 0);
    EXPECT_EQ(late.End(), SIGKILL);
    EXPECT_EQ(other.End(), 0);
    EXPECT_EQ(client.End(), 0);
}

TEST_F(NetSettings, TheMtuHasAKeyForEachInterface)
{
    WriteFile("/etc/tavoinfo.conf", "eth1_mtu=\"4000\"\nrunsamba=\"yes\"\n");
    char text[16];
    TELL(TAVOConfGetMTUValue("eth0", text, sizeof text));
    story_.Show("MTU", text);
    TELL(TAVOGetMTUSetting("eth1"));
    TELL(TAVONetSetMTUValue("eth0", 9000));
    TELL(TAVOGetMTUSetting("eth0"));

    // What the card refuses is not stored.
    commands_.Fail("/sbin/ifconfig");
    TELL(TAVONetSetMTUEth("eth0", 1400));
    TELL(TAVONetSetMTUValue("eth0", 1400));
    {
        const test::LockHolder other(0x106);
        TELL(TAVONetSetMTUEth("eth0", 1400));
    }
    for (const int bad : {-1, 0, 67, 65536})
        TELL(TAVONetSetMTUValue("eth0", bad));
    TELL(TAVOConfGetMTUValue("abcdefghijklmnop", text, sizeof text));
    WriteFile("/etc/tavoinfo.conf", "eth1_mtu=\"4k\"\n");
    TELL(TAVOGetMTUSetting("eth1"));
}

TEST_F(NetSettings, AConflictIsWhatAnswersAPing)
{
    TELL(TAVOIIpConflict("eth0", "192.0.2.10"));  // our own address
    for (const int status : {0, 1, 2, 127}) {
        commands_.Exit(status);
        TELL(TAVOIIpConflict("eth0", "192.0.2.11"));
    }
}

TEST_F(NetSettings, IsDhcpRepairsAFileThatDoesNotSay)
{
    for (const std::string line :
         {"BOOTPROTO=dhcp", "BOOTPROTO=DHCP", "BOOTPROTO=dhcpx", "BOOTPROTO=static", "DEVICE=eth0"}) {
        WriteFile(kIfcfg, line + "\n");
        story_.Head(line);
        TELL(BlTAVOLnxIsDHCP("eth0"));
    }
}

TEST_F(NetSettings, RoutesAreAddedAndRemoved)
{
    TELL(TAVONetRouteAdd("010.20.0.0", "255.255.0.0", "ppp0"));
    TELL(TAVONetRouteDel("10.20.0.0", "255.255.0.0", "eth0"));
    commands_.Fail("/sbin/route");
    TELL(TAVONetRouteAdd("10.20.0.0", "255.255.0.0", "eth0"));
    const char *const rows[][3] = {{"10.20.0.1", "255.255.0.0", "eth0"},
                                   {"10.20.0.0", "255.0.255.0", "eth0"},
                                   {"default", "255.255.0.0", "eth0"},
                                   {"10.20.0.0", "255.255.0.0", "eth0;reboot"}};
    for (const auto &row : rows) {
        TELL(TAVONetRouteAdd(row[0], row[1], row[2]));
        TELL(TAVONetRouteDel(row[0], row[1], row[2]));
    }
}

TEST_F(NetSettings, IPv6IsSwitchedForOneInterface)
{
    WriteFile(kIfcfg, "DEVICE=eth0\n");
    TELL(TAVONetIPv6Set("eth0", 0));
    TELL(TAVONetIPv6Set("eth0", 1));
    commands_.Fail("/bin/echo", 2);
    TELL(TAVONetIPv6Set("eth0", 0));
}

TEST_F(NetSettings, APortIsInUseWhenASocketHasIt)
{
    const std::string header = "  sl  local_address rem_address   st\n";
    tree_.Put("/proc/net/tcp", header + "   0: 0100007F:1F90 00000000:0000 0A\n"
                                        "   0: :1F92 00000000:0000\n   0: 0100007F:11F92 00000000:0000\n"
                                        "   0: 0100007F:1F92x\n   0: 0100007F\n\n    \n1234: 00000000:2710");
    tree_.Put("/proc/net/udp", header + "  12: 00000000:270F 00000000:0000 07\n");
    TELL(BlTLIBIsPortInUse(8080));
    TELL(BlTLIBIsPortInUse(9999));
    TELL(BlTLIBIsPortInUse(10000));
    TELL(BlTLIBIsPortInUse(8082));  // in broken rows alone
    TELL(BlTLIBIsPortInUse(10));    // a state is not a port
    tree_.Put("/proc/net/tcp6",
              header + "   0: " + std::string(32, '0') + ":1F91 " + std::string(32, '0') + ":0000 0A\n");
    TELL(BlTLIBIsPortInUse(8081));
    tree_.Remove("/proc/net/udp");
    TELL(BlTLIBIsPortInUse(10));
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
    named_hosts.push_back("name " + std::string(name, length));
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
