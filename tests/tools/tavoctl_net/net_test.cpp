// tavoctl net and discover on cards of a kernel: what they show, refuse and change, and what they put back.
#include "tavo_net.h"

#include "net_scene.h"
#include "support/rounds.h"
#include "support/test.h"

#include <random>

#include <netinet/in.h>
#include <sys/socket.h>

using test::Eventually;
using test::Node;
using test::Ran;
using test::ReadFile;
using test::RunningTavoctl;
using test::Tavoctl;
using testing::AllOf;
using testing::HasSubstr;

namespace {

constexpr const char *kTrial = "/var/run/tavo-net-trial.pid";

// What the kernel says of eth0 and the way out.
std::string Live()
{
    return test::Output("ip -4 addr show dev eth0 | grep inet; ip route | grep default");
}

// The appliance's address is in the kernel, too, and a neighbour has another one.
class Net : public test::NetScene {
  protected:
    void SetUp() override
    {
        NetScene::SetUp();
        if (IsSkipped())
            return;
        there_.emplace("there");
        cable_->Plug(*there_, "eth0");
        ASSERT_EQ(there_->Shell("ifconfig eth0 192.0.2.99 netmask 255.255.255.0 up"), 0);
        Start(*here_);
    }

    static void Start(const Node &node)
    {
        EXPECT_EQ(node.Shell("ifconfig eth0 192.0.2.10 netmask 255.255.255.0 up && route add default gw 192.0.2.1"), 0);
    }

    // Another appliance with the same settings.
    std::unique_ptr<Node> Twin(const std::string &name)
    {
        auto node = std::make_unique<Node>(name);
        cable_->Plug(*node, "eth0");
        node->Do([] { test::WriteOldFiles(); });
        Start(*node);
        return node;
    }

    std::optional<Node> there_;
};

TEST_F(Net, ShowsWhatWasSet)
{
    here_->Do([] {
        EXPECT_EQ(Tavoctl({"net", "set", "192.0.2.20/25", "--gateway", "192.0.2.99"}).status, 0);
        EXPECT_EQ(Tavoctl({"net", "dns", "192.0.2.53", "2001:db8::53"}).status, 0);
        EXPECT_EQ(Tavoctl({"net", "hostname", "attic"}).status, 0);
        EXPECT_EQ(Tavoctl({"net", "hostname", "--dry-run", "cellar"}).status, 0);
        EXPECT_EQ(Tavoctl({"net", "mtu", "eth0", "1400"}).status, 0);
        EXPECT_EQ(Tavoctl({"conf", "set", "eth0_mtu", "1300"}).status, 0);
        EXPECT_THAT(Tavoctl({"net", "mtu", "eth0", "1400", "--json"}).out, HasSubstr(R"("changed": true)")) << "stored";
        EXPECT_THAT(Tavoctl({"net", "mtu", "eth0", "1400", "--json"}).out, HasSubstr(R"("changed": false)"));
        EXPECT_THAT(Tavoctl({"net", "bond", "--yes", "none", "--json"}).out, HasSubstr(R"("changed": false)"));
        EXPECT_EQ(Tavoctl({"net", "ipv6", "eth0", "on"}).status, 0);
        EXPECT_EQ(Tavoctl({"net", "ipv6", "eth0", "2001:db8::20/64", "--gateway", "2001:db8::1"}).status, 0);
        const Ran shown = Tavoctl({"net", "show", "--json"});
        EXPECT_EQ(shown.status, 0) << shown;
        for (const char *fact :
             {R"("hostname": "attic")", R"("interface": "eth0")", R"("mode": "static")", R"("address": "192.0.2.20")",
              R"("mask": "255.255.255.128")", R"("broadcast": "192.0.2.127")", R"("gateway": "192.0.2.99")",
              R"("live_gateway": "192.0.2.99")", R"("192.0.2.53")", R"("2001:db8::53")", R"("mtu": 1400)",
              R"("link": true)", R"("ipv6": true)", R"("2001:db8::20/64")", R"("wake_on_lan": null)"})
            EXPECT_THAT(shown.out, HasSubstr(fact));
        EXPECT_EQ(Tavoctl({"net", "ipv6", "--remove", "eth0", "2001:db8::20/64", "--gateway", "2001:db8::1"}).status,
                  0);
        EXPECT_EQ(Tavoctl({"net", "ipv6", "eth0", "off"}).status, 0);
        EXPECT_THAT(Tavoctl({"net", "show", "--json"}).out,
                    AllOf(HasSubstr(R"("ipv6": false)"), HasSubstr(R"("ipv6_addresses": [])")));
        EXPECT_THAT(Tavoctl({"net", "show"}).out, HasSubstr("192.0.2.20"));
    });
    test::VirtualCable second("second");
    second.Plug(*here_, "eth1");
    here_->Do([] {
        const nlohmann::json cards = test::Facts({"net", "show", "--json"});
        EXPECT_EQ(cards.size(), 2u) << cards;
        EXPECT_EQ(cards.at(1).at("interface"), "eth1");
        EXPECT_TRUE(cards.at(1).at("address").is_null());
        EXPECT_EQ(test::Facts({"net", "show", "--json", "eth1"}), cards.at(1));
        EXPECT_THAT(Tavoctl({"net", "show"}).out, AllOf(HasSubstr("eth0"), HasSubstr("eth1"), HasSubstr("attic")));
        EXPECT_EQ(Tavoctl({"net", "show", "eth7"}).status, 3);
    });
}

TEST_F(Net, RefusesWhatCannotBe)
{
    here_->Do([] {
        const std::string live = Live();
        const struct {
            test::Words words;
            int status;
            const char *says;
        } rows[] = {
            {{"net", "set", "192.0.2.300/24"}, 2, "no host can have that address"},
            {{"net", "set", "192.0.2.20"}, 2, "an address and a mask"},
            {{"net", "set", "192.0.2.20/33"}, 2, "1 to 32 bits"},
            {{"net", "set", "192.0.2.20/255.0.255.0"}, 2, "not a mask"},
            {{"net", "set", "--interface", "eth0;reboot", "192.0.2.20/24"}, 2, "allowed: 1 to 15 letters"},
            {{"net", "set", "--interface", "../../shadow", "192.0.2.20/24"}, 2, "allowed: 1 to 15 letters"},
            {{"net", "set", "192.0.2.20/24", "--gateway", "router"}, 2, "cannot take router as --gateway: allowed: "},
            {{"net", "set", "--try", "0", "192.0.2.20/24"}, 2, "--try"},
            {{"net", "gateway", "198.51.100.1"}, 1, "is it on the network of an interface?"},
            {{"net", "gateway", "$(reboot)"}, 2, "allowed: the IPv4 address of a host"},
            {{"net", "dns"}, 2, "none was named"},
            {{"net", "dns", "--none", "192.0.2.53"}, 2, "there are some, and --none"},
            {{"net", "dns", "192.0.2.53", "ns.example"}, 2, "ERR_INVALID_NETNAME"},
            {{"net", "hostname", "0attic"}, 2, "ERR_INVALID_NETNAME"},
            {{"net", "mtu", "eth0", "67"}, 2, "a number from 68 to 65535"},
            {{"net", "mtu", "eth9", "1400"}, 3, "there is no interface eth9"},
            {{"net", "ipv6", "eth0", "2001:db8::1/129"}, 2, "ERR_INVALID_NETNAME"},
            {{"net", "wol", "eth0", "on"}, 1, "ERR_OP_FAILURE"},
            {{"net", "bond", "--yes", "backup"}, 2, "it has no members"},
            {{"net", "bond", "--yes", "backup", "lo"}, 1, "it is not an Ethernet card"},
            {{"net", "bond", "backup", "eth0"}, 2, "there is no terminal to ask at"},
            {{"net", "confirm"}, 3, "none are on trial"},
            {{"net", "check-address", "nonsense"}, 2, "cannot take nonsense as ADDRESS: allowed: "},
        };
        for (const auto &row : rows)
            test::IsRefused(row.words, row.says, row.status);
        EXPECT_EQ(Live(), live);
        EXPECT_EQ(ReadFile(test::kIfcfg), test::kOldFile);
        EXPECT_EQ(ReadFile(test::kNetwork), test::kOldNetwork);
    });
}

// A host that answers no ping must answer ARP.
TEST_F(Net, TakesNoAddressOfAnotherHost)
{
    ASSERT_EQ(there_->Shell("echo 1 >/proc/sys/net/ipv4/icmp_echo_ignore_all"), 0);
    here_->Do([] {
        const std::string live = Live();
        EXPECT_EQ(TAVOIIpConflict("eth0", "192.0.2.99"), 0) << "as it stays";
        const Ran used = Tavoctl({"net", "check-address", "192.0.2.99"});
        EXPECT_EQ(used.status, 4) << used;
        EXPECT_EQ(used.out, "used\n");
        const Ran own = Tavoctl({"net", "check-address", "--json", "192.0.2.10"});
        EXPECT_EQ(own.status, 0) << own;
        EXPECT_THAT(own.out, HasSubstr(R"("used": false)"));
        test::IsRefused({"net", "set", "192.0.2.99/24"}, "another host uses it");
        EXPECT_EQ(Live(), live);
        EXPECT_EQ(Tavoctl({"net", "set", "--no-probe", "192.0.2.99/24"}).status, 0);
    });
}

TEST_F(Net, ShowsWhichPortsAreTaken)
{
    EXPECT_TRUE(here_->Run([] {
        for (const int type : {SOCK_STREAM, SOCK_DGRAM}) {
            const int fd = ::socket(AF_INET6, type | SOCK_CLOEXEC, 0);
            if (fd < 0)
                return true;  // no IPv6 here
            sockaddr_in6 where{};
            where.sin6_family = AF_INET6;
            where.sin6_port = htons(5121);
            EXPECT_EQ(::bind(fd, reinterpret_cast<const sockaddr *>(&where), sizeof where), 0);
            EXPECT_EQ(type == SOCK_STREAM ? ::listen(fd, 1) : 0, 0);
            const Ran used = Tavoctl({"net", "check-port", "5121"});
            EXPECT_EQ(used.status, 4) << used;
            EXPECT_EQ(used.out, "used\n");
            EXPECT_THAT(Tavoctl({"net", "check-port", "--json", "5122"}).out, HasSubstr(R"("used": false)"));
            ::close(fd);
        }
        return true;
    }));
}

bool IsAsBefore(const std::string &live)
{
    EXPECT_EQ(Live(), live);
    EXPECT_EQ(ReadFile(test::kIfcfg), test::kOldFile);
    EXPECT_EQ(ReadFile(test::kNetwork), test::kOldNetwork);
    return !testing::Test::HasFailure();
}

bool TrialIsOver()
{
    return ::access(kTrial, F_OK) != 0;
}

TEST_F(Net, ATrialEndsWithoutAnAnswer)
{
    EXPECT_TRUE(here_->Run([] {
        const std::string live = Live();
        RunningTavoctl trial({"net", "set", "--no-probe", "--try", "2", "192.0.2.20/24", "--gateway", "192.0.2.2"});
        EXPECT_TRUE(Eventually([] { return Live().find("via 192.0.2.2 ") != std::string::npos; }));
        const Ran second = Tavoctl({"net", "set", "--no-probe", "--try", "9", "192.0.2.30/24"});
        EXPECT_EQ(second.status, 4) << second;
        const Ran ran = trial.Wait();
        EXPECT_EQ(ran.status, 1);
        EXPECT_THAT(ran.err, HasSubstr("the old ones are back"));
        EXPECT_TRUE(TrialIsOver());
        return IsAsBefore(live);
    }));
}

TEST_F(Net, ATrialThatIsConfirmedStays)
{
    here_->Do([] {
        RunningTavoctl trial({"net", "set", "--no-probe", "--try", "60", "192.0.2.20/24"});
        EXPECT_TRUE(Eventually([] { return Live().find("192.0.2.20/24") != std::string::npos; }));
        EXPECT_EQ(Tavoctl({"net", "confirm"}).status, 0);
        EXPECT_EQ(trial.Wait().status, 0);
        EXPECT_TRUE(TrialIsOver());
        EXPECT_THAT(ReadFile(test::kIfcfg), HasSubstr("IPADDR=192.0.2.20\n"));
        EXPECT_EQ(Tavoctl({"net", "confirm"}).status, 3) << "once";

        // The old address's connection is cut; the administrator reconnects to the new one and confirms.
        std::optional<RunningTavoctl> cut(std::in_place,
                                          test::Words{"net", "set", "--no-probe", "--try", "60", "192.0.2.30/24"});
        EXPECT_TRUE(Eventually([] { return Live().find("192.0.2.30/24") != std::string::npos; }));
        ::usleep(500000);
        ::kill(cut->Pid(), SIGKILL);
        cut.reset();
        EXPECT_EQ(Tavoctl({"net", "confirm"}).status, 0);
        EXPECT_THAT(Live(), HasSubstr("192.0.2.30/24"));
        EXPECT_TRUE(TrialIsOver());

        const Ran kept = test::TavoctlAtTerminal({"net", "set", "--no-probe", "--try", "60", "192.0.2.40/24"}, "y\n");
        EXPECT_EQ(kept.status, 0) << kept;
        EXPECT_THAT(Live(), HasSubstr("192.0.2.40/24"));
        const Ran given_up =
            test::TavoctlAtTerminal({"net", "set", "--no-probe", "--try", "60", "192.0.2.50/24"}, "n\n");
        EXPECT_EQ(given_up.status, 1) << given_up;
        EXPECT_THAT(Live(), HasSubstr("192.0.2.40/24"));
    });
}

// Everything that was changed meanwhile comes back, by whatever it was changed, and cards that were not changed are not
// touched. When the guardian is killed, the next change or refresh does it.
TEST_F(Net, ATrialPutsTheWholeNetworkBack)
{
    test::VirtualCable second("second");
    second.Plug(*here_, "eth1");
    here_->Do([] {
        EXPECT_EQ(
            test::ShellStatus(
                "ifconfig eth1 198.51.100.5 netmask 255.255.255.0 up; "
                "ip addr add 192.0.2.11/24 dev eth0; ip addr add 203.0.113.5/28 dev eth0; "
                "route add -net 233.252.0.0 netmask 255.255.255.0 gw 192.0.2.7; "
                "ip -6 addr add 2001:db8::5/64 dev eth0; ip -6 route add 2001:db8:9::/48 via 2001:db8::1 dev eth0"),
            0);
        test::WriteFile("/etc/tavoinfo.conf", "eth0_mtu=\"1500\"\nother=\"x\"\n");
        test::WriteFile("/etc/resolv.conf", "nameserver 192.0.2.53\n");
        EXPECT_EQ(TAVONetHostsRefresh(), 0);
        const auto all = [] {
            const std::string text = Live() + ReadFile("/etc/resolv.conf") + ReadFile("/etc/tavoinfo.conf") +
                                     ReadFile("/etc/hosts") + ReadFile(test::kIfcfg) + ReadFile(test::kNetwork);
            return text +
                   test::Output("ip route; ip -4 addr show dev eth1 | grep inet; ip -6 addr show dev eth0 scope "
                                "global | grep inet6 | sed 's/ tentative//'; ip -6 route show dev eth0 | grep via; "
                                "cat /sys/class/net/eth0/mtu; hostname; ls /etc/sysconfig/network-scripts");
        };
        const auto change = [] {
            EXPECT_EQ(TAVOLnxSetHostname("attic"), 0);
            EXPECT_EQ(TAVONetSetMTUValue("eth0", 1400), 0);
            EXPECT_EQ(TAVONetSetMTUValue("eth1", 1300), 0);
            EXPECT_EQ(Tavoctl({"net", "dns", "--none"}).status, 0);
            EXPECT_EQ(test::ShellStatus("ip addr add 203.0.113.9/24 dev eth0; ip -6 addr add 2001:db8::6/64 dev eth0"),
                      0);
            test::WriteFile("/etc/sysconfig/network-scripts/more-eth0", "address 203.0.113.9/24\n");
        };
        const std::string before = all();
        {
            RunningTavoctl trial(
                {"net", "set", "--no-probe", "--try", "60", "192.0.2.20/25", "--gateway", "192.0.2.2"});
            EXPECT_TRUE(Eventually([] { return Live().find("via 192.0.2.2 ") != std::string::npos; }));
            change();
            EXPECT_NE(all(), before);
            EXPECT_EQ(TAVONetCheckpointTake(), -1) << "there is one";
            EXPECT_EQ(TLIBErrGet(), ERR_FILE_EXISTS);
            test::ShellStatus("kill $(cat /var/run/tavo-net-trial.pid)");
            EXPECT_EQ(trial.Wait().status, 1);
        }
        EXPECT_EQ(all(), before);
        {
            RunningTavoctl trial({"net", "set", "--no-probe", "--try", "60", "192.0.2.20/25"});
            EXPECT_TRUE(Eventually([] { return Live().find("192.0.2.20") != std::string::npos; }));
            ::usleep(300000);
            change();
            test::ShellStatus("kill -9 $(cat /var/run/tavo-net-trial.pid)");
            EXPECT_EQ(trial.Wait().status, 1);
        }
        EXPECT_EQ(TAVONetHostsRefresh(), 0);
        EXPECT_EQ(all(), before);
        EXPECT_FALSE(std::filesystem::exists("/etc/network.checkpoint"));

        // In one process: kept, given up, and of another start of the system, of which only the files come back.
        EXPECT_EQ(TAVONetCheckpointEnd(), -1);
        EXPECT_EQ(TLIBErrGet(), ERR_FILE_NOT_FOUND);
        EXPECT_EQ(TAVONetCheckpointTake(), 0);
        change();
        EXPECT_EQ(TAVONetCheckpointPutBack(), 0);
        EXPECT_EQ(all(), before);
        EXPECT_EQ(TAVONetCheckpointTake(), 0);
        EXPECT_EQ(TAVONetCheckpointEnd(), 0);
        EXPECT_EQ(TAVONetCheckpointTake(), 0);
        std::string record = ReadFile("/etc/network.checkpoint");
        record.replace(record.find("boot ") + 5, 4, "past");
        change();
        test::WriteFile("/etc/network.checkpoint", record);
        EXPECT_EQ(TAVONetHostsRefresh(), 0);
        EXPECT_EQ(test::ReadFile("/sys/class/net/eth0/mtu"), "1400\n");
        EXPECT_EQ(ReadFile("/etc/tavoinfo.conf"), "eth0_mtu=\"1500\"\nother=\"x\"\n");
    });
}

TEST_F(Net, AChangeThatFailsIsNotTried)
{
    EXPECT_TRUE(here_->Run([] {
        const std::string live = Live();
        const Ran ran =
            Tavoctl({"net", "set", "--no-probe", "--try", "60", "192.0.2.20/24", "--gateway", "198.51.100.1"});
        EXPECT_EQ(ran.status, 1);
        EXPECT_THAT(ran.err, HasSubstr("the old settings are back"));
        EXPECT_TRUE(TrialIsOver());
        // The same for half of a setting that is not on trial.
        test::IsRefused({"net", "set", "--no-probe", "192.0.2.20/24", "--gateway", "198.51.100.1"},
                        "the old settings are back", 1);
        return IsAsBefore(live);
    }));
}

// The command dies at any moment: before the change, in the middle of it, and while it waits.
TEST_F(Net, AKilledTrialPutsTheOldSettingsBack)
{
    constexpr int nodes = 4;
    std::vector<std::unique_ptr<Node>> others;
    for (int i = 0; i < nodes; ++i)
        others.push_back(Twin("node" + std::to_string(i)));
    const int rounds = test::Rounds(104) / nodes + 1;
    std::vector<pid_t> running;
    for (int i = 0; i < nodes; ++i) {
        const pid_t pid = ::fork();
        if (pid != 0) {
            running.push_back(pid);
            continue;
        }
        const bool done = others[static_cast<size_t>(i)]->Run([&] {
            std::mt19937 random(static_cast<unsigned>(i));
            const std::string live = Live();
            bool same = true;
            for (int round = 0; round < rounds && same; ++round) {
                {
                    const RunningTavoctl trial(
                        {"net", "set", "--no-probe", "--try", "1", "192.0.2.20/25", "--gateway", "192.0.2.2"});
                    // Until it has begun, nothing is changed; from then on at any moment of the change and the wait.
                    Eventually([&] { return !TrialIsOver() && (round != 0 || Live() != live); });
                    ::usleep(static_cast<useconds_t>(random() % 600000));
                    ::kill(trial.Pid(), SIGKILL);
                }
                same = Eventually(TrialIsOver) && IsAsBefore(live);
                EXPECT_TRUE(same) << "round " << round;
            }
            return same;
        });
        std::fflush(nullptr);
        ::_exit(done ? 0 : 1);
    }
    for (const pid_t pid : running) {
        int status = 1;
        ::waitpid(pid, &status, 0);
        EXPECT_EQ(status, 0);
    }
    RecordProperty("kills", rounds * nodes);
}

TEST_F(Net, DiscoverListsWhoAnswers)
{
    if (test::RootLacks("uids"))
        GTEST_SKIP() << "the daemon has nobody to become";
    ASSERT_EQ(there_->Shell("/usr/tavo/bin/findhostd"), 0);
    ASSERT_EQ(here_->Shell("/usr/tavo/bin/findhostd"), 0);
    here_->Do([] {
        const Ran found = Tavoctl({"discover", "--json"});
        EXPECT_EQ(found.status, 0) << found;
        EXPECT_THAT(found.out, AllOf(HasSubstr(R"("name": "there")"), HasSubstr(R"("address": "192.0.2.99")")));
    });
    // A stream of what happens: a host that is there, has another name, and leaves.
    int renamed[2];
    ASSERT_EQ(::pipe2(renamed, O_CLOEXEC), 0);
    const pid_t neighbour = ::fork();
    if (neighbour == 0) {
        char byte;
        (void)!::read(renamed[0], &byte, 1);
        there_->Shell("hostname attic");
        (void)!::read(renamed[0], &byte, 1);
        there_->Shell("kill $(cat /var/run/findhostd.pid)");
        ::_exit(0);
    }
    here_->Do([&] {
        test::ShellStatus(": >/tmp/stream; tavoctl discover --watch --json >/tmp/stream 2>&1 & echo $! >/tmp/watcher");
        const auto lines = [] {
            std::vector<nlohmann::json> events;
            std::istringstream in(ReadFile("/tmp/stream"));
            for (std::string line; std::getline(in, line);) {
                nlohmann::json event = nlohmann::json::parse(line, nullptr, false);
                EXPECT_TRUE(event.is_object()) << line;
                if (event.is_object() && event.at("address") == "192.0.2.99")
                    events.push_back(event);
            }
            return events;
        };
        const auto comes = [&](std::size_t count) {
            for (int i = 0; i < 700 && lines().size() < count; ++i)
                ::usleep(100000);
            return lines().size() == count;
        };
        EXPECT_TRUE(comes(1));
        EXPECT_EQ(lines().at(0), nlohmann::json({{"format_version", 1},
                                                 {"event", "arrived"},
                                                 {"name", "there"},
                                                 {"address", "192.0.2.99"},
                                                 {"old_name", nullptr}}));
        EXPECT_EQ(::write(renamed[1], "r", 1), 1);
        EXPECT_TRUE(comes(2));
        EXPECT_EQ(lines().at(1).at("event"), "changed");
        EXPECT_EQ(lines().at(1).at("name"), "attic");
        EXPECT_EQ(lines().at(1).at("old_name"), "there");
        EXPECT_EQ(::write(renamed[1], "l", 1), 1);
        EXPECT_TRUE(comes(3));
        EXPECT_EQ(lines().at(2).at("event"), "departed");
        EXPECT_EQ(test::ShellStatus("kill $(cat /tmp/watcher)"), 0);
    });
    ::waitpid(neighbour, nullptr, 0);
    ASSERT_EQ(there_->Shell("/usr/tavo/bin/findhostd"), 0);
    test::VirtualCable second("second");
    second.Plug(*here_, "eth1");
    here_->Do([] {
        const Ran found = Tavoctl({"discover"});
        EXPECT_EQ(found.status, 0) << found;
        EXPECT_THAT(found.out, HasSubstr("192.0.2.99"));
        EXPECT_EQ(found.err, "") << "a port without a cable is nothing to speak of";
        EXPECT_TRUE(std::filesystem::exists("/tmp/tavods.list")) << "left for other callers";
    });
}

}  // namespace
