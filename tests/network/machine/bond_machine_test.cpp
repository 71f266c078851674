// Bonds of the machine's two cards: made in each mode, cut off from a cable, dissolved.
#include "tavo_net.h"

#include "machine_network.h"
#include "network/card_record.h"
#include "support/test.h"

using test::Eventually;
using test::Happen;
using test::kScripts;
using test::ReadFile;

namespace {

constexpr const char *kCalls = "/var/standin/rc.log";

constexpr const char *kEth0 = "DEVICE=eth0\nONBOOT=yes\nBOOTPROTO=static\nIPADDR=192.0.2.10\nNETMASK=255.255.255.0\n";
constexpr const char *kEth1 = "# uplink\nDEVICE=eth1\nBOOTPROTO=static\nIPADDR=198.51.100.10\nNETMASK=255.255.255.0\n";

std::string Line(const std::string &path)
{
    if (!std::filesystem::exists(path))
        return "";
    const std::string text = ReadFile(path);
    return text.substr(0, text.find('\n'));
}

std::string Bonding(const std::string &attribute)
{
    return Line("/sys/class/net/bond0/bonding/" + attribute);
}

bool HasAddress(const std::string &interface, const std::string &address)
{
    return test::Shell("ip -4 addr show dev " + interface).output.find("inet " + address + "/24") != std::string::npos;
}

int Set(int mode, const std::vector<const char *> &members = {})
{
    const TAVONETLINKAGGR record = test::Bond(mode, members);
    return TAVONetLinkAggrSet(&record);
}

const std::vector<const char *> kBoth = {"eth0", "eth1"};

class MachineBond : public test::MachineNetwork {
  protected:
    void SetUp() override
    {
        MachineNetwork::SetUp();
        if (IsSkipped())
            return;
        Start(kEth0, kEth1, "HOSTNAME=appliance\n");
        ASSERT_TRUE(HasAddress("eth0", "192.0.2.10"));
        ASSERT_TRUE(HasAddress("eth1", "198.51.100.10"));
    }

    static std::map<std::string, std::string> Files()
    {
        std::map<std::string, std::string> files;
        for (const auto &entry : std::filesystem::directory_iterator(kScripts))
            files[entry.path().filename()] = ReadFile(entry.path());
        return files;
    }
};

TEST_F(MachineBond, IsMadeInEachModeAndDissolved)
{
    const auto before = Files();
    const struct {
        int mode;
        const char *kernel;
    } rows[] = {
        {TAVO_NET_AGGR_LACP, "802.3ad 4"},
        {TAVO_NET_AGGR_ADAPTIVE, "balance-alb 6"},
        {TAVO_NET_AGGR_BACKUP, "active-backup 1"},
    };
    for (const auto &row : rows) {
        SCOPED_TRACE(row.kernel);
        ASSERT_EQ(Set(row.mode, kBoth), 0) << std::hex << TLIBErrGet();
        EXPECT_EQ(Bonding("mode"), row.kernel);
        EXPECT_EQ(Bonding("miimon"), "100");
        EXPECT_EQ(Bonding("updelay"), "100");
        TAVONETLINKAGGR record;
        EXPECT_EQ(TAVONetLinkAggrGet("bond0", &record), 0);
        EXPECT_EQ(record.nMode, row.mode);
        EXPECT_EQ(record.nMember, 2);
        EXPECT_STREQ(record.szPartner, "") << "the cable has no switch";
        EXPECT_TRUE(HasAddress("bond0", "192.0.2.10")) << "the first member's";
        EXPECT_FALSE(HasAddress("eth0", "192.0.2.10"));
        EXPECT_TRUE(Eventually([] { return BlTLIBIsConnected("bond0") == 1; }));
        TAVONETCARD card;
        EXPECT_EQ(TAVONetGetCard1(&card), 0);
        EXPECT_STREQ(card.szInterface, "bond0") << "members are no cards of their own";

        const std::string calls = ReadFile(kCalls);
        EXPECT_EQ(Set(row.mode, kBoth), 0);
        EXPECT_EQ(ReadFile(kCalls), calls) << "it is as asked: the network is left alone";
    }
    EXPECT_EQ(Bonding("primary"), "eth0");
    ASSERT_EQ(Set(TAVO_NET_AGGR_NONE), 0) << std::hex << TLIBErrGet();
    EXPECT_FALSE(std::filesystem::exists("/sys/class/net/bond0"));
    EXPECT_EQ(Files(), before);
    EXPECT_TRUE(HasAddress("eth0", "192.0.2.10"));
    EXPECT_TRUE(HasAddress("eth1", "198.51.100.10"));
}

long Sent(const std::string &card)
{
    return std::stol(Line("/sys/class/net/" + card + "/statistics/tx_packets"));
}

// Whether questions for a host that is not there leave by the card.
bool SendsBy(const std::string &card)
{
    const long before = Sent(card);
    test::Shell("ping -c 2 -W 1 192.0.2.77");
    return Sent(card) > before;
}

TEST_F(MachineBond, SurvivesALostCable)
{
    for (const int mode : {TAVO_NET_AGGR_BACKUP, TAVO_NET_AGGR_ADAPTIVE}) {
        SCOPED_TRACE(mode);
        ASSERT_EQ(Set(mode, kBoth), 0) << std::hex << TLIBErrGet();
        ASSERT_TRUE(Eventually([] { return Bonding("mii_status") == "up"; }));
        const std::string first = Bonding("active_slave");
        ASSERT_TRUE(first == "eth0" || first == "eth1") << first;
        const std::string other = first == "eth0" ? "eth1" : "eth0";
        if (mode == TAVO_NET_AGGR_BACKUP) {
            EXPECT_EQ(first, "eth0") << "the first choice";
        }

        Happen("cut " + first);
        EXPECT_TRUE(Eventually([&] { return Bonding("active_slave") == other; }));
        EXPECT_EQ(BlTLIBIsConnected("bond0"), 1);
        EXPECT_TRUE(HasAddress("bond0", "192.0.2.10"));
        EXPECT_TRUE(SendsBy(other));

        Happen("restore " + first);
        EXPECT_TRUE(Eventually(
            [&] { return ReadFile("/proc/net/bonding/bond0").find("MII Status: down") == std::string::npos; }));
        if (mode == TAVO_NET_AGGR_BACKUP) {
            EXPECT_TRUE(Eventually([] { return Bonding("active_slave") == "eth0"; })) << "the first choice again";
            EXPECT_TRUE(SendsBy("eth0"));
        }
    }
    // Without a switch that knows it, one card at a time carries an 802.3ad bond.
    ASSERT_EQ(Set(TAVO_NET_AGGR_LACP, kBoth), 0) << std::hex << TLIBErrGet();
    ASSERT_TRUE(Eventually([] { return BlTLIBIsConnected("bond0") == 1; }));
    Happen("cut eth0");
    EXPECT_TRUE(Eventually([] {
        return ReadFile("/proc/net/bonding/bond0").find("MII Status: down") != std::string::npos &&
               BlTLIBIsConnected("bond0") == 1;
    }));
    EXPECT_TRUE(Eventually([] { return SendsBy("eth1"); }));
    Happen("restore eth0");

    // Both cables: then it is said so.
    Happen("cut eth0");
    Happen("cut eth1");
    EXPECT_TRUE(Eventually([] { return BlTLIBIsConnected("bond0") == 0; }));
    Happen("restore eth0");
    Happen("restore eth1");
}

}  // namespace
