// A program that dies in the middle of a change: the next one finds the network as it was or as it was asked for, in the
// kernel and in the files, and a default route in both.
#include "tavo_net.h"

#include "network/card_record.h"
#include "support/container_text.h"
#include "support/fault_state.h"
#include "support/rounds.h"
#include "support/scenario.h"
#include "support/scratch_dir.h"
#include "support/traced_call.h"
#include "support/virtual_cable.h"

#include <gmock/gmock.h>

#include <algorithm>
#include <cstring>
#include <filesystem>
#include <functional>
#include <optional>

#include <sys/utsname.h>
#include <sys/wait.h>
#include <unistd.h>

using test::Card;
using test::Node;
using test::ReadFile;
using test::VirtualCable;
using test::WriteFile;

namespace {

constexpr const char *kRecord = "/etc/network.undo";
constexpr const char *kIfcfg = "/etc/sysconfig/network-scripts/ifcfg-eth0";

std::string Text(const char *path)
{
    return std::filesystem::exists(path) ? ReadFile(path) : "none";
}

// All that a change may leave half done.
std::string State()
{
    std::string state;
    for (const char *path : {kIfcfg, "/etc/sysconfig/network", "/etc/hosts", "/etc/resolv.conf", "/proc/net/route",
                             "/sys/class/net/eth0/mtu", "/etc/tavoinfo.conf"})
        state += std::string(path) + "\n" + Text(path);
    const std::string addresses = Text("/proc/net/if_inet6");
    state += addresses.find("20010db8") != std::string::npos ? "2001:db8\n" : "";
    utsname name;
    ::uname(&name);
    TAVONETCARD card = {};
    TAVONetGetCard1(&card);
    return state + name.nodename + "\n" + card.szIp + "/" + card.szMask;
}

bool HasDefaultRoute()
{
    return Text("/proc/net/route").find("\neth0\t00000000\t") != std::string::npos;
}

// What changes something outside of the process, or starts a program.
bool Matters(const test::SystemCall &call)
{
    static const char *const names[] = {"write",  "pwrite64", "rename",      "renameat", "renameat2",
                                        "unlink", "unlinkat", "ioctl",       "vfork",    "clone",
                                        "clone3", "fork",     "sethostname", "fchmod",   "execve",
                                        "kill",   "fsync",    "openat",      "ftruncate"};
    return std::any_of(std::begin(names), std::end(names), [&](const char *name) { return call.Name() == name; });
}

class Death : public testing::Test {
  protected:
    void SetUp() override
    {
        if (const std::string missing = VirtualCable::Missing(); !missing.empty())
            GTEST_SKIP() << missing;
        if (!test::CanTrace())
            GTEST_SKIP() << "no process may be traced here";
        cable_.emplace("cable");
        here_.emplace("here");
        cable_->Plug(*here_, "eth0");
        EXPECT_TRUE(here_->Run([] {
            WriteFile("/etc/sysconfig/network", "GATEWAY=192.0.2.99\nHOSTNAME=here\n");
            WriteFile(kIfcfg, "DEVICE=eth0\nONBOOT=yes\nBOOTPROTO=static\n");
            const TAVONETCARD card = Card(TAVO_NET_STATIC, "192.0.2.20", "255.255.255.0");
            EXPECT_EQ(TAVONetSetCard1(&card, nullptr), 0);
            EXPECT_EQ(TAVONetDNSSet(test::MakeList({"192.0.2.53"}).get()), 0);
            EXPECT_EQ(TAVONetSetMTUValue("eth0", 1500), 0);
            return true;
        }));
    }

    // At every system call that matters. `back` undoes the whole change.
    void DieEverywhere(const std::function<int()> &change, const std::function<void()> &back)
    {
        EXPECT_TRUE(here_->Run([&] {
            const std::string before = State();
            EXPECT_TRUE(HasDefaultRoute());
            const std::function<void()> work = [&] {
                ::_exit(change() == 0 ? 0 : 1);
            };
            std::vector<int> indexes;
            for (const test::SystemCall &call : test::SystemCallsOf(work)) {
                if (Matters(call))
                    indexes.push_back(call.index);
            }
            EXPECT_GT(indexes.size(), 10u);
            const std::string asked = State();
            EXPECT_NE(asked, before);
            size_t as_before = 0;
            for (size_t i = 0; i < indexes.size(); i += static_cast<size_t>(test::Stride())) {
                back();
                EXPECT_EQ(State(), before);
                if (!test::DiesAtCall(indexes[i], work))
                    break;
                EXPECT_EQ(TAVONetHostsRefresh(), 0);
                const std::string found = State();
                EXPECT_TRUE(found == before || found == asked) << "call " << indexes[i] << "\n"
                                                               << found << "\nbefore:\n"
                                                               << before << "\nasked:\n"
                                                               << asked;
                EXPECT_TRUE(HasDefaultRoute()) << "call " << indexes[i];
                EXPECT_FALSE(std::filesystem::exists(kRecord)) << "call " << indexes[i];
                as_before += found == before;
            }
            EXPECT_GT(as_before, 0u);
            return true;
        }));
    }

    // One system call of the library's fails at each place. What is said of the result is true of the network.
    void FailEverywhere(const std::function<int()> &change, const std::function<void()> &back)
    {
        EXPECT_TRUE(here_->Run([&] {
            const std::string before = State();
            const std::function<void()> work = [&] {
                const int result = change();
                ::_exit(result == 0 ? 0 : result == -2 ? 2 : 1);
            };
            const auto calls = test::DistinctCalls(test::SystemCallsOf(work));
            EXPECT_GT(calls.size(), 20u);
            const std::string asked = State();
            size_t failed = 0;
            for (size_t i = 0; i < calls.size(); i += static_cast<size_t>(test::Stride())) {
                for (const int error : {EIO, ENOSPC}) {
                    back();
                    EXPECT_EQ(State(), before);
                    const test::Ending ending = test::FailsAtCall(calls[i], error, work);
                    EXPECT_FALSE(ending.hung) << calls[i].Name();
                    const int status = WIFEXITED(ending.status) ? WEXITSTATUS(ending.status) : 128;
                    EXPECT_LE(status, 2) << calls[i].Name() << " " << ending;
                    EXPECT_TRUE(HasDefaultRoute()) << calls[i].Name() << " " << calls[i].index;
                    EXPECT_EQ(TAVONetHostsRefresh(), 0);
                    const std::string found = State();
                    EXPECT_TRUE(status == 2 || found == before || found == asked)
                        << calls[i].Name() << " " << calls[i].index << " status " << status << "\n"
                        << found << "\nbefore:\n"
                        << before << "\nasked:\n"
                        << asked;
                    failed += status == 1;
                }
            }
            EXPECT_GT(failed, 0u);
            return true;
        }));
    }

    std::optional<VirtualCable> cable_;
    std::optional<Node> here_;
};

TEST_F(Death, LeavesAnAddress)
{
    const auto set = [](const char *address) {
        const TAVONETCARD card = Card(TAVO_NET_STATIC, address, "255.255.255.0");
        return TAVONetSetCard1(&card, &card);
    };
    DieEverywhere([=] { return set("192.0.2.60"); }, [=] { EXPECT_EQ(set("192.0.2.20"), 0); });
    EXPECT_TRUE(here_->Run([=] { return set("192.0.2.20") == 0; }));
    FailEverywhere([=] { return set("192.0.2.60"); }, [=] { EXPECT_EQ(set("192.0.2.20"), 0); });
}

// A client that sets what it gets and goes to the background; /sbin/dhcpcd of the scenario.
constexpr const char *kClient = R"(#!/bin/sh
busybox ifconfig "$2" 192.0.2.40 netmask 255.255.255.0
busybox route add default gw 192.0.2.98
printf 'IPADDR=192.0.2.40\nNETMASK=255.255.255.0\nGATEWAY=192.0.2.98\n' >/etc/dhcpc/dhcpcd-"$2".info
)";

TEST_F(Death, LeavesAnAddressAlsoOnTheWayToDhcp)
{
    const auto scripted = [](const char *tool) {
        return std::string("#!/bin/sh\nexec /bin/busybox ") + tool + " \"$@\"\n";
    };
    test::Scenario scenario;
    scenario.InAnyOrder();
    scenario.ExpectAny("/sbin/ifconfig").AnyTimes().Runs(scripted("ifconfig"));
    scenario.ExpectAny("/sbin/route").AnyTimes().Runs(scripted("route"));
    scenario.ExpectAny("/sbin/dhcpcd").AnyTimes().Runs(kClient);
    EXPECT_TRUE(here_->Run([] {
        std::filesystem::create_directories("/etc/dhcpc");
        return true;
    }));
    DieEverywhere(
        [] {
            const TAVONETCARD card = Card(TAVO_NET_DHCP);
            return TAVONetSetCard1(&card, &card);
        },
        [] {
            const TAVONETCARD card = Card(TAVO_NET_STATIC, "192.0.2.20", "255.255.255.0");
            test::ShellStatus("busybox ifconfig eth0 0.0.0.0");
            WriteFile(kIfcfg, "DEVICE=eth0\nONBOOT=yes\nBOOTPROTO=static\nIPADDR=192.0.2.20\nNETMASK=255.255.255.0\n"
                              "BROADCAST=192.0.2.255\nNETWORK=192.0.2.0\n");
            EXPECT_EQ(TAVONetSetCard1(&card, &card), 0);
        });
}

TEST_F(Death, LeavesAGateway)
{
    const auto set = [] {
        return TAVONetDefaultGatewaySet("192.0.2.30");
    };
    const auto back = [] {
        EXPECT_EQ(TAVONetDefaultGatewaySet("192.0.2.99"), 0);
    };
    DieEverywhere(set, back);
    EXPECT_TRUE(here_->Run([=] {
        back();
        return true;
    }));
    FailEverywhere(set, back);
}

TEST_F(Death, LeavesAName)
{
    DieEverywhere([] { return TAVOLnxSetHostname("attic"); }, [] { EXPECT_EQ(TAVOLnxSetHostname("here"), 0); });
}

TEST_F(Death, LeavesAnMtuAndServers)
{
    DieEverywhere([] { return TAVONetSetMTUValue("eth0", 1400); },
                  [] { EXPECT_EQ(TAVONetSetMTUValue("eth0", 1500), 0); });
    DieEverywhere([] { return TAVONetDNSSet(test::MakeList({"192.0.2.54"}).get()); },
                  [] { EXPECT_EQ(TAVONetDNSSet(test::MakeList({"192.0.2.53"}).get()), 0); });
}

TEST_F(Death, LeavesAnIPv6Address)
{
    const auto remove = [] {
        return TAVONetIPv6AddrDel("eth0", "2001:db8::20", 64);
    };
    const auto add = [] {
        return TAVONetIPv6AddrAdd("eth0", "2001:db8::20", 64);
    };
    if (!std::filesystem::exists("/proc/net/if_inet6"))
        GTEST_SKIP() << "the kernel has no IPv6";
    EXPECT_TRUE(here_->Run([&] { return add() == 0 && remove() == 0; }));
    DieEverywhere(add, [=] {
        if (State().find("2001:db8") != std::string::npos) {
            EXPECT_EQ(remove(), 0);
        }
    });
}

// To DHCP and back, whatever the server does: the box can always be reached from beyond its router.
TEST_F(Death, IsNotWhatALeaseCosts)
{
    Node router("router");
    cable_->Plug(router, "eth0");
    ASSERT_EQ(router.Shell("ifconfig eth0 192.0.2.99 netmask 255.255.255.0 up && ip addr add 192.0.2.98/24 dev eth0 && "
                           "ip addr add 198.51.100.1/32 dev lo"),
              0);
    const auto scripted = [](const char *tool) {
        return std::string("#!/bin/sh\nexec /bin/busybox ") + tool + " \"$@\"\n";
    };
    test::Scenario scenario;
    scenario.InAnyOrder();
    scenario.ExpectAny("/sbin/ifconfig").AnyTimes().Runs(scripted("ifconfig"));
    scenario.ExpectAny("/sbin/route").AnyTimes().Runs(scripted("route"));
    // As /tmp/server says: a lease, with this router or that, none at all, or one of which the client dies.
    scenario.ExpectAny("/sbin/dhcpcd").AnyTimes().Runs(R"(#!/bin/sh
read server router </tmp/server
[ "$server" != absent ] || exit 1
busybox ifconfig "$2" 192.0.2.40 netmask 255.255.255.0
[ "$server" != dying ] || kill -9 $$
busybox route add default gw $router
printf 'IPADDR=192.0.2.40\nNETMASK=255.255.255.0\nGATEWAY=%s\n' $router >/etc/dhcpc/dhcpcd-"$2".info
)");
    const char *const servers[] = {"there 192.0.2.98", "absent", "dying", "there 192.0.2.99"};
    const int rounds = test::Rounds(100);
    for (int round = 0; round < rounds; ++round) {
        const std::string server = servers[round % 4];
        EXPECT_TRUE(here_->Run([&] {
            std::filesystem::create_directories("/etc/dhcpc");
            WriteFile("/tmp/server", server + "\n");
            const TAVONETCARD lease = Card(TAVO_NET_DHCP);
            const TAVONETCARD fixed = Card(TAVO_NET_STATIC, "192.0.2.20", "255.255.255.0");
            const bool works = server.starts_with("there");
            for (const TAVONETCARD *card : {&lease, &fixed}) {
                EXPECT_EQ(TAVONetSetCard1(card, nullptr), card == &fixed || works ? 0 : -1) << server;
                const std::string gateway = card == &lease && works ? server.substr(6) : "192.0.2.99";
                char live[20] = "";
                EXPECT_EQ(TAVONetDefaultGatewayGet(live, sizeof live), 0);
                EXPECT_EQ(live, gateway) << server;
                EXPECT_EQ(test::ShellStatus("busybox ping -c 1 -w 5 198.51.100.1 >/dev/null"), 0) << server;
                EXPECT_THAT(Text("/etc/hosts"),
                            testing::HasSubstr(card == &lease && works ? "192.0.2.40\there\n" : "192.0.2.20\there\n"));
            }
            return true;
        })) << "round "
            << round << ", " << server;
    }
}

// After a restart of the system the kernel has nothing that could be put back, and the files count.
TEST_F(Death, OnlyFilesComeBackAfterARestart)
{
    EXPECT_TRUE(here_->Run([] {
        WriteFile(kRecord, "command          0                    -\nboot another\n"
                           "f 0 22 28 3\n/etc/sysconfig/networkGATEWAY=192.0.2.99\nHOSTNAME=644\n"
                           "c 0 15 0 0\ntouch /etc/hurt\nend\n");
        return true;
    }));
    EXPECT_TRUE(here_->Run([] {
        EXPECT_EQ(TAVONetHostsRefresh(), 0);
        EXPECT_EQ(ReadFile("/etc/sysconfig/network"), "GATEWAY=192.0.2.99\nHOSTNAME=");
        EXPECT_FALSE(std::filesystem::exists("/etc/hurt"));
        EXPECT_FALSE(std::filesystem::exists(kRecord));
        // What was cut off before it was whole is not a change yet.
        for (const char *half : {"", "command", "command 0 -\nboot another\nF 0 10 0 0\n/etc/hosts\n"}) {
            WriteFile(kRecord, half);
            EXPECT_EQ(TAVONetHostsRefresh(), 0);
            EXPECT_TRUE(std::filesystem::exists("/etc/hosts"));
            EXPECT_FALSE(std::filesystem::exists(kRecord));
        }
        return true;
    }));
}

}  // namespace

// The seconds for which the client's end is given time.
extern "C" unsigned sleep(unsigned)
{
    ::usleep(1000);
    return 0;
}
