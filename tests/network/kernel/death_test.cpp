// Changes of the network that do not get to their end: the program dies in the middle, a system call fails, a command
// fails. The network is as it was or as it was asked for then, in the kernel and in the files, and has a default route.
#include "tavo_net.h"

#include "network/card_record.h"
#include "support/container_text.h"
#include "support/network_scene.h"
#include "support/rounds.h"
#include "support/test.h"
#include "support/traced_call.h"

#include <numeric>
#include <set>

#include <arpa/inet.h>
#include <netdb.h>
#include <netinet/in.h>
#include <sys/mount.h>
#include <sys/socket.h>

using test::Bond;
using test::Card;
using test::kIfcfg;
using test::Node;
using test::ReadFile;
using test::ShellStatus;
using test::WriteFile;

namespace {

constexpr const char *kRecord = "/etc/network.undo";

std::string TextOrNone(const char *path)
{
    return std::filesystem::exists(path) ? ReadFile(path) : "none";
}

// Without the temporary ones that a death leaves: a dot and six characters at the end.
std::string InterfaceFiles()
{
    std::set<std::string> files;
    for (const auto &entry : std::filesystem::directory_iterator("/etc/sysconfig/network-scripts")) {
        if (entry.path().extension().string().size() != 7)
            files.insert(entry.path().string() + "\n" + ReadFile(entry.path()));
    }
    return std::accumulate(files.begin(), files.end(), std::string());
}

// Addresses and routes, without those that the kernel makes by itself.
std::string IPv6State()
{
    std::string state = TextOrNone("/proc/sys/net/ipv6/conf/eth0/disable_ipv6");
    const auto add = [&](const char *table, size_t fields, auto is_ours) {
        std::istringstream lines(TextOrNone(table));
        for (std::string line; std::getline(lines, line);) {
            std::istringstream words(line);
            const std::vector<std::string> field = {std::istream_iterator<std::string>(words), {}};
            if (field.size() == fields && field.back() == "eth0" && !line.starts_with("f") && is_ours(field))
                state += field[0] + "/" + field[fields == 6 ? 2 : 1] + " " + field[fields == 6 ? 3 : 4] + "\n";
        }
    };
    add("/proc/net/if_inet6", 6, [](const auto &) { return true; });
    add("/proc/net/ipv6_route", 10, [](const auto &field) {
        return (std::stoul(field[8], nullptr, 16) & 0x80100000) == 0;  // local, anycast
    });
    return state;
}

// All that a change may leave half done.
std::string NetworkState()
{
    std::string state = InterfaceFiles() + IPv6State();
    for (const char *path : {"/etc/sysconfig/network", "/etc/hosts", "/etc/resolv.conf", "/proc/net/route",
                             "/sys/class/net/eth0/mtu", "/etc/tavoinfo.conf", "/proc/sys/kernel/hostname"})
        state += std::string(path) + "\n" + TextOrNone(path);
    TAVONETCARD card = {};
    TAVONetGetCard1(&card);
    return state + card.szInterface + " " + card.szIp + "/" + card.szMask;
}

bool HasDefaultRoute()
{
    const std::string routes = TextOrNone("/proc/net/route");
    return routes.find("\neth0\t00000000\t") != routes.npos || routes.find("\nbond0\t00000000\t") != routes.npos;
}

// What the C library finds under the appliance's own name.
std::string OwnAddress()
{
    char name[256] = "";
    ::gethostname(name, sizeof name - 1);
    addrinfo hints{};
    hints.ai_family = AF_INET;
    addrinfo *found = nullptr;
    if (::getaddrinfo(name, nullptr, &hints, &found) != 0)
        return "none";
    sockaddr_in address;
    std::memcpy(&address, found->ai_addr, sizeof address);
    ::freeaddrinfo(found);
    return ::inet_ntoa(address.sin_addr);
}

// Gets a lease at once and goes to the background.
constexpr const char *kQuickClient = R"(#!/bin/sh
busybox ifconfig "$2" 192.0.2.40 netmask 255.255.255.0
busybox route add default gw 192.0.2.98
printf 'IPADDR=192.0.2.40\nNETMASK=255.255.255.0\nGATEWAY=192.0.2.98\n' >/etc/dhcpc/dhcpcd-"$2".info
)";

int SetAddress(const char *address)
{
    const TAVONETCARD card = Card(TAVO_NET_STATIC, address, "255.255.255.0");
    return TAVONetSetCard1(&card, &card);
}

int SetDhcp()
{
    const TAVONETCARD card = Card(TAVO_NET_DHCP);
    return TAVONetSetCard1(&card, &card);
}

void BackToStatic()
{
    ShellStatus("busybox ifconfig eth0 0.0.0.0");
    WriteFile(kIfcfg, "DEVICE=eth0\nONBOOT=yes\nBOOTPROTO=static\nIPADDR=192.0.2.20\nNETMASK=255.255.255.0\n"
                      "BROADCAST=192.0.2.255\nNETWORK=192.0.2.0\n");
    EXPECT_EQ(SetAddress("192.0.2.20"), 0);
}

int SetServer(const char *server)
{
    return TAVONetDNSSet(test::MakeList({server}).get());
}

bool HasIPv6Address()
{
    return ShellStatus("grep -q ^20010db8 /proc/net/if_inet6") == 0;
}

bool HasIPv6Route()
{
    return ShellStatus("grep -q ^20010db800010000 /proc/net/ipv6_route") == 0;
}

int AddIPv6Address()
{
    return TAVONetIPv6AddrAdd("eth0", "2001:db8::20", 64);
}

int RemoveIPv6Address()
{
    return TAVONetIPv6AddrDel("eth0", "2001:db8::20", 64);
}

int AddIPv6Route()
{
    return TAVONetIPv6RouteAdd("eth0", "2001:db8:1::", 48, "2001:db8::1");
}

int RemoveIPv6Route()
{
    return TAVONetIPv6RouteDel("eth0", "2001:db8:1::", 48, "2001:db8::1");
}

void EnsureIPv6()
{
    EXPECT_EQ(TAVONetIPv6Set("eth0", 1), 0);
    EXPECT_TRUE(HasIPv6Address() || AddIPv6Address() == 0);
    EXPECT_TRUE(HasIPv6Route() || AddIPv6Route() == 0);
}

int MakeBond()
{
    const TAVONETLINKAGGR bond = Bond();
    return TAVONetLinkAggrSet(&bond);
}

void NoBond()
{
    EXPECT_EQ(ShellStatus("/etc/rc.network stop && cd /etc/sysconfig/network-scripts && rm -f * && "
                          "printf 'DEVICE=eth0\nBOOTPROTO=static\nIPADDR=192.0.2.20\nNETMASK=255.255.255.0\n' "
                          ">ifcfg-eth0 && printf '# second\nDEVICE=eth1\nBOOTPROTO=none\n' >ifcfg-eth1 && "
                          "/etc/rc.network start"),
              0);
}

void BackFromIPv6Route()
{
    EnsureIPv6();
    EXPECT_EQ(RemoveIPv6Route(), 0);
}

struct NetworkChange {
    int (*make)();
    void (*back)();  // from before the change or from after it
    const char *name;
    int stride = 1;  // of a short run
    enum { nothing, ipv6, client } needs = nothing;
    int first_command = 1;  // of those whose failure counts
};

// Every change of the network that has steps: how it is made, and how it is taken back from wherever it stopped.
const NetworkChange kNetworkChanges[] = {
    {[] { return SetAddress("192.0.2.60"); }, [] { EXPECT_EQ(SetAddress("192.0.2.20"), 0); }, "Address"},
    {SetDhcp, BackToStatic, "ToDhcp", 3, NetworkChange::client},
    {[] { return SetAddress("192.0.2.20"); }, [] { EXPECT_EQ(SetDhcp(), 0); }, "FromDhcp", 3, NetworkChange::client},
    {[] { return TAVONetDefaultGatewaySet("192.0.2.30"); },
     [] { EXPECT_EQ(TAVONetDefaultGatewaySet("192.0.2.99"), 0); }, "Gateway"},
    {[] { return TAVOLnxSetHostname("attic"); }, [] { EXPECT_EQ(TAVOLnxSetHostname("here"), 0); }, "Name"},
    {[] { return TAVONetSetMTUValue("eth0", 1400); }, [] { EXPECT_EQ(TAVONetSetMTUValue("eth0", 1500), 0); }, "Mtu"},
    {[] { return SetServer("192.0.2.54"); }, [] { EXPECT_EQ(SetServer("192.0.2.53"), 0); }, "Servers"},
    {[] { return TAVONetRouteAdd("198.51.100.0", "255.255.255.0", "eth0"); },
     [] { ShellStatus("busybox route del -net 198.51.100.0 netmask 255.255.255.0 dev eth0 2>/dev/null"); }, "Route"},
    {[] { return TAVONetRouteDel("198.51.100.0", "255.255.255.0", "eth0"); },
     [] { TAVONetRouteAdd("198.51.100.0", "255.255.255.0", "eth0"); }, "RouteGone", 2},
    {MakeBond, NoBond, "Bond", 12, NetworkChange::nothing, 2},
    {AddIPv6Address, [] { EXPECT_TRUE((HasIPv6Address() || AddIPv6Address() == 0) && RemoveIPv6Address() == 0); },
     "IPv6Address", 2, NetworkChange::ipv6},
    {RemoveIPv6Address, EnsureIPv6, "IPv6AddressGone", 2, NetworkChange::ipv6},
    {AddIPv6Route, BackFromIPv6Route, "IPv6Route", 2, NetworkChange::ipv6},
    {RemoveIPv6Route, EnsureIPv6, "IPv6RouteGone", 2, NetworkChange::ipv6},
    {[] { return TAVONetIPv6Set("eth0", 0); }, EnsureIPv6, "IPv6Off", 2, NetworkChange::ipv6},
    {[] { return TAVONetIPv6Set("eth0", 1); }, [] { EXPECT_EQ(TAVONetIPv6Set("eth0", 0), 0); }, "IPv6On", 2,
     NetworkChange::ipv6},
};

// What changes something outside of the process, or starts a program.
bool Matters(const test::SystemCall &call)
{
    static const char *const names[] = {"write",  "pwrite64", "rename",      "renameat", "renameat2",
                                        "unlink", "unlinkat", "ioctl",       "vfork",    "clone",
                                        "clone3", "fork",     "sethostname", "fchmod",   "execve",
                                        "kill",   "fsync",    "openat",      "ftruncate"};
    return std::any_of(std::begin(names), std::end(names), [&](const char *name) { return call.Name() == name; });
}

// The shell of the library's commands: fails the command that /tmp/failing counts down to, before or after it was run.
constexpr const char *kShell = R"(#!/tmp/sh
if [ "$1" = -c ] && [ -f /tmp/failing ]; then
    read -r left is_run </tmp/failing
    echo "$((left - 1)) $is_run" >/tmp/failing
    if [ "$left" = 1 ]; then
        [ "$is_run" = 0 ] || /tmp/sh "$@"
        exit 1
    fi
fi
exec /tmp/sh "$@"
)";

// A kernel without bonds: a bridge carries the members' packets as well. The start script runs this first.
constexpr const char *kBondHook = R"(#!/bin/sh
scripts=/etc/sysconfig/network-scripts
case $1 in
start)
    [ -f $scripts/ifcfg-bond0 ] || exit 0
    [ -d /sys/class/net/bond0 ] || ip link add bond0 type bridge
    for name in eth0 eth1; do
        ! grep -q '^MASTER=bond0' $scripts/ifcfg-$name || ip link set $name master bond0 up
    done
    ;;
stop) ip link del bond0 2>/dev/null ;;
esac
exit 0
)";

class Death : public test::NetworkScene {
  protected:
    void SetUp() override
    {
        NetworkScene::SetUp();
        if (IsSkipped())
            return;
        if (!test::CanTrace())
            GTEST_SKIP() << "no process may be traced here";
        cable_->Plug(*here_, "eth1");
        EXPECT_TRUE(here_->Run([] {
            std::filesystem::create_directories("/etc/dhcpc");
            EXPECT_EQ(SetAddress("192.0.2.20"), 0);
            EXPECT_EQ(SetServer("192.0.2.53"), 0);
            EXPECT_EQ(TAVONetSetMTUValue("eth0", 1500), 0);
            return true;
        }));
    }
};

class AnyChange : public Death, public testing::WithParamInterface<NetworkChange> {
  protected:
    void SetUp() override
    {
        Death::SetUp();
        if (IsSkipped())
            return;
        if (test::TakesLong() && !std::getenv("TAVO_LONG_TESTS") && GetParam().stride == 2)
            GTEST_SKIP() << "the other changes are enough here, where all takes long";
        if (GetParam().needs == NetworkChange::ipv6 && !std::filesystem::exists("/proc/net/if_inet6"))
            GTEST_SKIP() << "the kernel has no IPv6";
        WriteFile("/var/standin/rc.network.hook", kBondHook, 0755);
    }

    // `body` gets the states before the change and after it.
    void Try(const std::function<void(const std::string &before, const std::string &asked)> &body)
    {
        std::optional<test::ScriptedClient> client;
        if (GetParam().needs == NetworkChange::client)
            client.emplace(kQuickClient);
        EXPECT_TRUE(here_->Run([&] {
            if (GetParam().needs == NetworkChange::ipv6)
                EnsureIPv6();
            GetParam().back();
            const std::string before = NetworkState();
            EXPECT_TRUE(HasDefaultRoute());
            EXPECT_EQ(GetParam().make(), 0);
            const std::string asked = NetworkState();
            EXPECT_NE(asked, before);
            EXPECT_TRUE(HasDefaultRoute());
            EXPECT_NE(OwnAddress(), "127.0.1.1") << "there is a card with an address";
            GetParam().back();
            EXPECT_EQ(NetworkState(), before);
            if (!HasFailure())
                body(before, asked);
            return true;
        }));
    }

    // In the child that is traced: 0, 1, or 2 for a change that was made and not stored.
    static void Make()
    {
        const int result = GetParam().make();
        ::_exit(result == 0 ? 0 : result == -2 ? 2 : 1);
    }

    static size_t Stride()
    {
        return static_cast<size_t>(test::Stride() * (std::getenv("TAVO_LONG_TESTS") ? 1 : GetParam().stride));
    }

    // A death has no status: -1. Afterwards all is as it was.
    static void Judge(int status, const std::string &before, const std::string &asked, const std::string &place)
    {
        EXPECT_LE(status, 2) << place;
        EXPECT_TRUE(HasDefaultRoute()) << place;
        EXPECT_EQ(TAVONetHostsRefresh(), 0);
        EXPECT_NE(OwnAddress(), "none") << place;
        const std::string found = NetworkState();
        EXPECT_TRUE(status == 2 || found == asked || (status != 0 && found == before))
            << place << " status " << status << "\n"
            << found << "\nbefore:\n"
            << before << "\nasked:\n"
            << asked;
        EXPECT_FALSE(std::filesystem::exists(kRecord)) << place;
        if (found != before)
            GetParam().back();
        EXPECT_EQ(NetworkState(), before) << place;
    }
};

TEST_P(AnyChange, DiesAnywhere)
{
    Try([](const std::string &before, const std::string &asked) {
        std::vector<test::SystemCall> calls = test::SystemCallsOf(Make);
        GetParam().back();
        std::erase_if(calls, [](const test::SystemCall &call) { return !Matters(call); });
        EXPECT_GT(calls.size(), 5u);
        size_t as_before = 0;
        for (size_t i = 0; i < calls.size(); i += Stride()) {
            if (!test::DiesAtCall(calls[i].index, Make))
                break;
            EXPECT_EQ(TAVONetHostsRefresh(), 0);
            as_before += NetworkState() == before;
            Judge(-1, before, asked, "death at call " + std::to_string(calls[i].index) + ", " + calls[i].Name());
            if (HasFailure())
                return;
        }
        EXPECT_GT(as_before, 0u);
    });
}

TEST_P(AnyChange, FailsAtAnySystemCall)
{
    Try([](const std::string &before, const std::string &asked) {
        const auto calls = test::DistinctCalls(test::SystemCallsOf(Make));
        GetParam().back();
        EXPECT_GT(calls.size(), 20u);
        size_t failed = 0;
        for (size_t i = 0; i < calls.size(); i += Stride()) {
            for (const int error : {EIO, ENOSPC}) {
                if (!std::getenv("TAVO_LONG_TESTS") && (error == EIO) != (i % 2 == 0))
                    continue;
                const test::Ending ending = test::FailsAtCall(calls[i], error, Make);
                EXPECT_FALSE(ending.hung) << calls[i].Name();
                const int status = WIFEXITED(ending.status) ? WEXITSTATUS(ending.status) : 128;
                failed += status == 1;
                Judge(status, before, asked,
                      calls[i].Name() + " " + std::to_string(calls[i].index) + " with " + std::strerror(error));
                if (HasFailure())
                    return;
            }
        }
        // Of a sample, every one may be an error that the change can do without.
        EXPECT_TRUE(failed > 0 || Stride() > 1);
    });
}

// Without having done anything, and after it had done all.
TEST_P(AnyChange, FailsAtAnyCommand)
{
    EXPECT_TRUE(here_->Run([] {
        std::filesystem::copy_file("/bin/sh", "/tmp/sh");
        WriteFile("/tmp/shell", kShell, 0755);
        return ::mount("/tmp/shell", "/bin/sh", nullptr, MS_BIND, nullptr) == 0;
    }));
    Try([](const std::string &before, const std::string &asked) {
        const auto commands_left = [](int from, int is_run, int &result) {
            WriteFile("/tmp/failing", std::to_string(from) + " " + std::to_string(is_run) + "\n");
            result = GetParam().make();
            const int left = std::stoi(ReadFile("/tmp/failing"));
            std::filesystem::remove("/tmp/failing");
            return left;
        };
        constexpr int many = 1000;
        int result = -1;
        const int commands = many - commands_left(many, 0, result);
        EXPECT_EQ(result, 0);
        GetParam().back();
        for (int i = 1; i <= commands; ++i) {
            for (const int is_run : {0, 1}) {
                if (i < GetParam().first_command && !is_run)
                    continue;  // a network that was not stopped is the start script's affair
                EXPECT_LE(commands_left(i, is_run, result), 0);
                Judge(result == -2  ? 2
                      : result == 0 ? 0
                                    : 1,
                      before, asked,
                      "command " + std::to_string(i) + " of " + std::to_string(commands) + ", run " +
                          std::to_string(is_run));
                if (HasFailure())
                    return;
            }
        }
    });
}

std::string NameOf(const testing::TestParamInfo<NetworkChange> &change)
{
    return change.param.name;
}

INSTANTIATE_TEST_SUITE_P(Of, AnyChange, testing::ValuesIn(kNetworkChanges), NameOf);

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

// The start of the network undoes what a program left that died while it ran the same command, and is not ended as that.
TEST_F(Death, ARestartByHandGoesOnAfterItHasUndoneWhatWasCutOff)
{
    EXPECT_TRUE(here_->Run([] {
        WriteFile(kRecord, "command          0                    - /etc/rc.network start\nboot " +
                               ReadFile("/proc/sys/kernel/random/boot_id") + "end\n");
        return true;
    }));
    EXPECT_EQ(here_->Shell("/etc/rc.network stop && /etc/rc.network start && test ! -e " + std::string(kRecord)), 0);
}

}  // namespace

// The seconds for which the client's end is given time.
extern "C" unsigned sleep(unsigned)
{
    ::usleep(1000);
    return 0;
}
