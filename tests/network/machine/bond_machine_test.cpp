// Bonds of the machine's two cards: made in each mode, cut off from a cable, dissolved, and interrupted at any moment.
#include "tavo_net.h"

#include "machine_network.h"
#include "support/eventually.h"
#include "support/rounds.h"

#include <gmock/gmock.h>

#include <chrono>
#include <csignal>
#include <cstring>
#include <filesystem>
#include <map>
#include <random>

#include <sys/wait.h>
#include <unistd.h>

using test::Eventually;
using test::Happen;
using test::kScripts;
using test::ReadFile;
using test::Told;
using test::WriteFile;
using testing::HasSubstr;

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
    TAVONETLINKAGGR record = {};
    std::strcpy(record.szBond, "bond0");
    record.nMode = mode;
    for (const char *member : members)
        std::strcpy(record.rgszMember[record.nMember++], member);
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

// The program that changes the bond is killed, or the power goes: what the files say then must be a network.
TEST_F(MachineBond, ADeathAtAnyMomentLeavesANetworkThatStarts)
{
    std::mt19937 random(7);
    int died = 0;
    const int rounds = test::Rounds(80);
    // Two minutes are enough: the emulated machine may be a slow one.
    const auto until = std::chrono::steady_clock::now() + std::chrono::minutes(2);
    int round = 0;
    for (; round < rounds && std::chrono::steady_clock::now() < until; ++round) {
        const int mode = round % 2 == 0 ? 1 + round / 2 % 3 : TAVO_NET_AGGR_NONE;
        const pid_t child = ::fork();
        if (child == 0)
            ::_exit(Set(mode, mode == TAVO_NET_AGGR_NONE ? std::vector<const char *>() : kBoth) == 0 ? 0 : 1);
        ::usleep(static_cast<useconds_t>(random() % 1200000));
        ::kill(child, SIGKILL);
        int status = 0;
        ::waitpid(child, &status, 0);
        died += WIFSIGNALED(status);
        // A command that it ran may outlive it; the machine is switched off and on again.
        Eventually([] { return test::Shell("pgrep -f '/etc/rc[.]network st'").status != 0; });
        Told("/etc/rc.network stop && /etc/rc.network start");
        const bool bonded = std::filesystem::exists("/sys/class/net/bond0");
        const std::string card = bonded ? "bond0" : "eth0";
        ASSERT_TRUE(HasAddress(card, "192.0.2.10")) << "round " << round << " " << card;
        ASSERT_TRUE(Eventually([&] { return BlTLIBIsConnected(card.c_str()) == 1; })) << "round " << round;
        EXPECT_EQ(std::filesystem::exists(kScripts + "ifcfg-bond0"), bonded) << "round " << round;
    }
    EXPECT_GT(died, round / 4) << "of " << round;
    ASSERT_EQ(Set(TAVO_NET_AGGR_NONE), 0) << std::hex << TLIBErrGet();
    EXPECT_EQ(ReadFile(kScripts + "ifcfg-eth0"), kEth0);
    EXPECT_EQ(ReadFile(kScripts + "ifcfg-eth1"), kEth1);
}

// A document becomes the network, and a boot, which finds nothing of it in the kernel, makes the same one of the files.
TEST_F(MachineBond, ABootAfterApplyHasTheSameNetwork)
{
    WriteFile("/tmp/net.json",
              R"({"format_version": 1, "hostname": "attic", "gateway": "192.0.2.1", "dns": ["192.0.2.53"],
        "search": ["example.com"], "cards": [
        {"name": "bond0", "bond": "backup", "members": ["eth0", "eth1"], "address": "192.0.2.10/24",
         "more_addresses": ["203.0.113.1/29"], "routes": ["233.252.0.0/24 via 192.0.2.4"], "mtu": 1450}]})");
    Told("tavoctl net apply --no-probe /tmp/net.json");
    const std::string exported = Told("tavoctl net export");
    const std::string routes = Told("ip -4 route | sort");
    EXPECT_THAT(routes, HasSubstr("default via 192.0.2.1 dev bond0"));
    EXPECT_THAT(routes, HasSubstr("233.252.0.0/24 via 192.0.2.4 dev bond0"));

    Told("/etc/rc.network stop; killall findhostd; for card in eth0 eth1; do ip addr flush dev $card; "
         "ip link set $card down mtu 1500; done; modprobe -r bonding 2>/dev/null; modprobe bonding max_bonds=0 "
         "2>/dev/null; "
         "rm -rf /tmp/lock; mkdir /tmp/lock; [ ! -e /sys/class/net/bond0 ]");
    Told("/etc/rc.network start");
    EXPECT_TRUE(Eventually([] { return BlTLIBIsConnected("bond0") == 1; }));
    EXPECT_EQ(Told("tavoctl net export"), exported);
    EXPECT_EQ(Told("ip -4 route | sort"), routes);
    EXPECT_THAT(Told("getent hosts $(hostname)"), HasSubstr("192.0.2.10"));
    EXPECT_THAT(Told("tavoctl net apply --no-probe --json /tmp/net.json"), HasSubstr("\"changed\": false"));
}

}  // namespace
