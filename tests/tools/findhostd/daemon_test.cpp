// Appliances that find each other over real UDP, and attacks from the same cable, which have no effect.
#include "tavo_fhost.h"
#include "tavo_proc.h"

#include "packet.h"
#include "support/appliance_root.h"
#include "support/container_text.h"
#include "support/eventually.h"
#include "support/rounds.h"
#include "support/scratch_dir.h"
#include "support/text_lines.h"
#include "support/virtual_cable.h"

#include <gmock/gmock.h>

#include <algorithm>
#include <csignal>
#include <cstdlib>
#include <cstring>
#include <ctime>
#include <filesystem>
#include <memory>
#include <optional>
#include <random>
#include <set>
#include <utility>

#include <arpa/inet.h>
#include <dlfcn.h>
#include <fcntl.h>
#include <sys/file.h>
#include <sys/socket.h>
#include <sys/stat.h>
#include <sys/wait.h>
#include <unistd.h>

using test::Eventually;
using test::Lines;
using test::Node;
using test::ReadFile;
using test::ShellStatus;
using test::VirtualCable;
using test::WriteFile;
using testing::HasSubstr;
using testing::IsEmpty;
using testing::Not;
using testing::UnorderedElementsAre;

namespace {

constexpr const char *kList = "/tmp/tavods.list";
constexpr const char *kDaemon = "/usr/tavo/bin/findhostd";
constexpr const char *kPidFile = "/var/run/findhostd.pid";

size_t awaited_lines = 0;  // the library sleeps until the list has so many, 20 seconds at most

std::string ListText()
{
    return std::filesystem::is_regular_file(kList) ? ReadFile(kList) : "";
}

// The hosts that a caller of the library finds, "NAME(ADDRESS)", sorted. The daemon is started where none runs.
std::vector<std::string> Discover(size_t expected, int *result = nullptr)
{
    awaited_lines = expected;
    const int dumped = TAVOFHOSTDumpHost();
    if (result)
        *result = dumped;
    test::Hash hosts(PshTLIBSzHashAlloc(1024));
    test::Moving(hosts, TAVOFHOSTGet2Hash);
    std::vector<std::string> keys;
    for (const auto &[key, address] : test::Pairs(hosts.get()))
        keys.push_back(key);
    return keys;
}

class Daemons : public testing::Test {
  protected:
    void SetUp() override
    {
        if (const std::string missing = VirtualCable::Missing(); !missing.empty())
            GTEST_SKIP() << missing;
        if (test::RootLacks("uids"))
            GTEST_SKIP() << "the daemon has nobody to become";
        cable_.emplace("cable");
        for (int i = 0; i < 3; ++i) {
            Node &node = nodes_[i].emplace("nas" + std::to_string(i + 1));
            cable_->Plug(node, "eth0");
            ASSERT_EQ(node.Shell("ifconfig eth0 192.0.2." + std::to_string(i + 1) + " netmask 255.255.255.0 up"), 0);
        }
    }

    void StartAll()
    {
        for (auto &node : nodes_)
            ASSERT_EQ(node->Shell(kDaemon), 0);
    }

    std::optional<VirtualCable> cable_;
    std::optional<Node> nodes_[3];
};

TEST_F(Daemons, FindEachOther)
{
    for (int i = 1; i < 3; ++i)
        ASSERT_EQ(nodes_[i]->Shell(kDaemon), 0);
    EXPECT_TRUE(nodes_[0]->Run([] {
        EXPECT_THAT(Discover(2), UnorderedElementsAre("nas2(192.0.2.2)", "nas3(192.0.2.3)"));
        EXPECT_FALSE(std::filesystem::exists(kList)) << "taken";
        EXPECT_GT(TLIBReadPidFile(kPidFile), 0) << "the library started it";
        return true;
    }));
    // And the others that one, by now; once more and a second time, since each query begins a new list.
    for (int round = 0; round < 2; ++round) {
        EXPECT_TRUE(nodes_[1]->Run([] {
            EXPECT_THAT(Discover(2), UnorderedElementsAre("nas1(192.0.2.1)", "nas3(192.0.2.3)"));
            return true;
        }));
    }
    // A new name, and one that is switched off, are known once the last answers are old.
    ASSERT_TRUE(nodes_[0]->Run([] { return ::sethostname("attic", 5) == 0; }));
    ASSERT_EQ(nodes_[2]->Shell("ifconfig eth0 down"), 0);
    ::usleep(15500000);
    EXPECT_TRUE(nodes_[1]->Run([] {
        std::filesystem::remove(kList);
        EXPECT_THAT(Discover(1), UnorderedElementsAre("attic(192.0.2.1)"));
        return true;
    }));
}

TEST_F(Daemons, AreHandedToACallbackAsTheyAnswer)
{
    StartAll();
    EXPECT_TRUE(nodes_[0]->Run([] {
        std::vector<std::string> hosts;
        const auto note = [](const TAVOFHOST *host, void *context) {
            static_cast<std::vector<std::string> *>(context)->push_back(std::string(host->szName) + " " + host->szIp +
                                                                        " " + host->szInterface);
            return 0;
        };
        awaited_lines = 2;
        EXPECT_EQ(TAVOFHOSTEnum(note, &hosts, 10), 2);
        EXPECT_THAT(hosts, UnorderedElementsAre("nas2 192.0.2.2 eth0", "nas3 192.0.2.3 eth0"));
        EXPECT_EQ(Lines(ListText()).size(), 2u) << "left for other callers";
        return true;
    }));
}

TEST_F(Daemons, AreFoundFromTheInterfacesThatWork)
{
    StartAll();
    VirtualCable second("second");
    second.Plug(*nodes_[0], "eth1");  // down, without an address
    EXPECT_TRUE(nodes_[0]->Run([] {
        EXPECT_EQ(ErrFHOSTSendQueryPkt(), 0u) << "two ports, one cable";
        EXPECT_TRUE(Eventually([] { return Lines(ListText()).size() == 2; })) << ListText();
        EXPECT_THAT(Lines(ListText()), UnorderedElementsAre("6,240,nas2,192.0.2.2,eth0", "6,240,nas3,192.0.2.3,eth0"));
        EXPECT_THAT(Discover(2), UnorderedElementsAre("nas2(192.0.2.2)", "nas3(192.0.2.3)"));

        // An address that is stored but missing in the kernel is a failure.
        WriteFile("/etc/sysconfig/network-scripts/ifcfg-eth1", "DEVICE=eth1\nBOOTPROTO=static\nIPADDR=198.51.100.1\n");
        EXPECT_EQ(ErrFHOSTSendQueryPkt(), 0x2u);
        int result = 0;
        EXPECT_THAT(Discover(2, &result), IsEmpty());
        EXPECT_EQ(result, -1) << "one interface could not send";
        return true;
    }));
}

// Whatever the ports of the asker have on them: three others on the cable.
TEST_F(Daemons, AreFoundByABoxWithTwoPorts)
{
    StartAll();
    Node asker("asker");
    ASSERT_EQ(asker.Shell("rm -f /etc/sysconfig/network-scripts/*"), 0);
    VirtualCable second("second");
    cable_->Plug(asker, "eth0");
    second.Plug(asker, "eth1");
    const auto all = UnorderedElementsAre("nas1(192.0.2.1)", "nas2(192.0.2.2)", "nas3(192.0.2.3)");
    const auto found = [&](const char *cables, const auto &expected) {
        ASSERT_EQ(asker.Shell(cables), 0) << cables;
        EXPECT_TRUE(asker.Run([&] {
            EXPECT_EQ(ErrFHOSTSendQueryPkt(), 0u);
            int result = -1;
            EXPECT_THAT(Discover(3, &result), expected);
            EXPECT_EQ(result, 0) << "nothing has failed";
            return true;
        })) << cables;
    };
    // No cable: there is no answer, and nothing fails.
    ASSERT_EQ(asker.Shell("ip link set eth0 down && ip link set eth1 down"), 0);
    EXPECT_TRUE(asker.Run([] {
        EXPECT_EQ(ErrFHOSTSendQueryPkt(), 0u);
        int result = -1;
        EXPECT_THAT(Discover(0, &result), IsEmpty());
        EXPECT_EQ(result, 0);
        return true;
    }));
    found("ifconfig eth0 192.0.2.9 netmask 255.255.255.0 up", all);
    found("ip link set eth1 up", all);
    // The cable is in the other port.
    found("ifconfig eth0 0.0.0.0 down; ip link set eth0 name eth9 && ip link set eth1 name eth0 && "
          "ip link set eth9 name eth1 && ifconfig eth1 192.0.2.9 netmask 255.255.255.0 up",
          all);
}

TEST_F(Daemons, AreFoundByABondWithOneLeg)
{
    StartAll();
    Node asker("asker");
    if (asker.Shell("ip link add bond0 type bond 2>/dev/null") != 0)
        GTEST_SKIP() << "this kernel has no bonds";
    VirtualCable second("second");
    second.Plug(asker, "eth0");
    cable_->Plug(asker, "eth1");
    ASSERT_EQ(asker.Shell("rm -f /etc/sysconfig/network-scripts/* && mount -o remount,rw /sys && "
                          "cd /sys/class/net/bond0/bonding && echo active-backup >mode && echo 100 >miimon && "
                          "echo +eth0 >slaves && echo +eth1 >slaves && "
                          "ifconfig bond0 192.0.2.9 netmask 255.255.255.0 up"),
              0);
    ASSERT_EQ(ShellStatus("ip link set second0 down"), 0) << "the cable is cut";
    EXPECT_TRUE(asker.Run([] {
        EXPECT_TRUE(Eventually([] { return ReadFile("/sys/class/net/bond0/bonding/active_slave") == "eth1\n"; }));
        int result = -1;
        EXPECT_THAT(Discover(3, &result),
                    UnorderedElementsAre("nas1(192.0.2.1)", "nas2(192.0.2.2)", "nas3(192.0.2.3)"));
        EXPECT_EQ(result, 0);
        return true;
    }));
}

// What follows looks at the processes of the node in which it runs.
std::string Status(const std::string &pid, const std::string &field)
{
    for (const std::string &line : Lines(ReadFile("/proc/" + pid + "/status"))) {
        if (line.starts_with(field + ":"))
            return line.substr(field.size() + 2);
    }
    return "";
}

bool IsGone(const std::string &pid)
{
    return Eventually([&] { return !std::filesystem::exists("/proc/" + pid); });
}

// The two processes of the daemon: who writes and who listens.
struct Pids {
    std::string root = ReadFile(kPidFile);
    std::string listener;

    Pids()
    {
        root.resize(root.find('\n'));
        listener = ReadFile("/proc/" + root + "/task/" + root + "/children");
        listener.resize(listener.find(' '));
    }
};

TEST_F(Daemons, TheListenerHasNoRights)
{
    StartAll();
    EXPECT_TRUE(nodes_[0]->Run([] {
        const Pids pids;
        EXPECT_EQ(Status(pids.listener, "Uid"), "65534\t65534\t65534\t65534");
        EXPECT_EQ(Status(pids.listener, "Gid"), "65534\t65534\t65534\t65534");
        EXPECT_EQ(Status(pids.listener, "Groups"), " ");
        for (const char *set : {"CapInh", "CapPrm", "CapEff", "CapAmb"})
            EXPECT_EQ(Status(pids.listener, set), "0000000000000000") << set;
        EXPECT_EQ(Status(pids.listener, "NoNewPrivs"), "1");
        EXPECT_THAT(std::filesystem::read_symlink("/proc/" + pids.listener + "/root").string(), HasSubstr("(deleted)"));
        // Standard streams, the network, the other part: nothing else is open.
        size_t sockets = 0;
        for (const auto &fd : std::filesystem::directory_iterator("/proc/" + pids.listener + "/fd")) {
            const std::string what = std::filesystem::read_symlink(fd.path());
            sockets += what.starts_with("socket:");
            EXPECT_TRUE(what.starts_with("socket:") || std::atoi(fd.path().filename().c_str()) < 3) << what;
        }
        EXPECT_EQ(sockets, 2u);
        // The writer has one, and never hears the network.
        sockets = 0;
        for (const auto &fd : std::filesystem::directory_iterator("/proc/" + pids.root + "/fd"))
            sockets += std::filesystem::read_symlink(fd.path()).string().starts_with("socket:");
        EXPECT_EQ(sockets, 1u);
        return true;
    }));
}

TEST_F(Daemons, OneEndsWithTheOther)
{
    StartAll();
    EXPECT_TRUE(nodes_[0]->Run([] {
        const Pids first;
        EXPECT_NE(ShellStatus(std::string(kDaemon) + " 2>/dev/null"), 0) << "one is enough";
        EXPECT_EQ(::kill(std::atoi(first.root.c_str()), SIGTERM), 0);
        EXPECT_TRUE(IsGone(first.root) && IsGone(first.listener));
        EXPECT_FALSE(std::filesystem::exists(kPidFile));

        EXPECT_EQ(ShellStatus(kDaemon), 0);
        const Pids second;
        EXPECT_EQ(::kill(std::atoi(second.listener.c_str()), SIGKILL), 0);
        EXPECT_TRUE(IsGone(second.root));
        EXPECT_FALSE(std::filesystem::exists(kPidFile));

        EXPECT_EQ(ShellStatus(kDaemon), 0);
        const Pids third;
        EXPECT_EQ(::kill(std::atoi(third.root.c_str()), SIGKILL), 0);
        EXPECT_TRUE(IsGone(third.root) && IsGone(third.listener));
        EXPECT_EQ(ShellStatus(kDaemon), 0) << "what a crash left is in nobody's way";
        return true;
    }));
}

// The starting program reads to the end of its output, or has no streams at all.
TEST_F(Daemons, LeaveTheCallersStreams)
{
    EXPECT_TRUE(nodes_[0]->Run([] {
        const std::string daemon = kDaemon;
        EXPECT_EQ(ShellStatus("x=$(timeout 20 sh -c '" + daemon + " 2>&1; echo $?'); [ \"$x\" = 0 ]"), 0);
        for (const char *closed : {"0<&-", "1>&-", "2>&-", "0<&- 1>&- 2>&-"}) {
            const Pids pids;
            EXPECT_EQ(::kill(std::atoi(pids.root.c_str()), SIGTERM), 0);
            EXPECT_TRUE(IsGone(pids.root) && IsGone(pids.listener));
            EXPECT_EQ(ShellStatus(daemon + " " + closed), 0) << closed;
            EXPECT_NE(ShellStatus(daemon + " 2>/dev/null"), 0) << "one is enough, " << closed;
        }
        const Pids pids;
        for (const std::string &pid : {pids.root, pids.listener}) {
            for (const char *fd : {"0", "1", "2"})
                EXPECT_EQ(std::filesystem::read_symlink("/proc/" + pid + "/fd/" + fd), "/dev/null") << pid << fd;
        }
        return true;
    }));
}

TEST_F(Daemons, IgnoreALockOfAnotherProgram)
{
    EXPECT_TRUE(nodes_[0]->Run([] {
        WriteFile(kPidFile, "1\n");
        const int fd = ::open(kPidFile, O_RDONLY | O_CLOEXEC);
        EXPECT_EQ(::flock(fd, LOCK_EX), 0);
        EXPECT_EQ(ShellStatus(kDaemon), 0);
        EXPECT_GT(TLIBReadPidFile(kPidFile), 1);
        ::close(fd);
        return true;
    }));
}

class UdpSocket {
  public:
    explicit UdpSocket(uint16_t port = 0, const std::string &from = "0.0.0.0")
    {
        const int on = 1;
        ::setsockopt(fd_, SOL_SOCKET, SO_BROADCAST, &on, sizeof on);
        const sockaddr_in here = Address(from.c_str(), port);
        EXPECT_EQ(::bind(fd_, reinterpret_cast<const sockaddr *>(&here), sizeof here), 0);
    }
    ~UdpSocket() { ::close(fd_); }

    void Send(const char *to, std::string_view bytes) const
    {
        const sockaddr_in where = Address(to, findhostd::kPort);
        ::sendto(fd_, bytes.data(), bytes.size(), 0, reinterpret_cast<const sockaddr *>(&where), sizeof where);
    }

    // How many packets have come.
    size_t Waiting() const
    {
        char bytes[600];
        size_t count = 0;
        while (::recv(fd_, bytes, sizeof bytes, MSG_DONTWAIT) >= 0)
            ++count;
        return count;
    }

    // How many packets come until none has for half a second.
    size_t Count() const
    {
        const timeval patience = {0, 500000};
        ::setsockopt(fd_, SOL_SOCKET, SO_RCVTIMEO, &patience, sizeof patience);
        char bytes[600];
        size_t count = 0;
        while (::recv(fd_, bytes, sizeof bytes, 0) >= 0)
            ++count;
        return count;
    }

  private:
    static sockaddr_in Address(const char *address, uint16_t port)
    {
        sockaddr_in where{};
        where.sin_family = AF_INET;
        where.sin_addr.s_addr = ::inet_addr(address);
        where.sin_port = htons(port);
        return where;
    }

    const int fd_ = ::socket(AF_INET, SOCK_DGRAM | SOCK_CLOEXEC, 0);
};

std::string Reply(const char *address, const std::string &name)
{
    findhostd::Host host{};
    host.model = 7;
    host.protocol = 250;
    host.address.s_addr = ::inet_addr(address);
    name.copy(host.name, findhostd::kLongestName);
    std::array<uint8_t, findhostd::kLargestPacket> packet;
    return {reinterpret_cast<const char *>(packet.data()), findhostd::WriteReply(host, packet)};
}

TEST_F(Daemons, HostileRepliesChangeNothing)
{
    ASSERT_EQ(nodes_[0]->Shell(kDaemon), 0);
    ASSERT_EQ(nodes_[1]->Shell(kDaemon), 0);
    const Node &attacker = *nodes_[2];
    EXPECT_TRUE(attacker.Run([] {
        UdpSocket().Send("192.0.2.1", Reply("192.0.2.3", "unasked"));
        ::usleep(300000);
        return true;
    }));
    EXPECT_TRUE(nodes_[0]->Run([] {
        EXPECT_EQ(ErrFHOSTSendQueryPkt(), 0u);
        EXPECT_TRUE(Eventually([] { return Lines(ListText()).size() == 1; })) << ListText();
        return true;
    }));
    EXPECT_TRUE(attacker.Run([] {
        const UdpSocket socket;
        const std::string good = Reply("192.0.2.3", "mallory");
        std::srand(1);
        for (int i = 0; i < 3000; ++i) {
            std::string bytes = i % 3 ? good : Reply("192.0.2.2", "stolen");
            if (i % 3 == 1)
                bytes.resize(static_cast<size_t>(std::rand()) % good.size());
            else if (i % 3 == 2)
                for (char &byte : bytes)
                    byte = std::rand() % 4 ? byte : static_cast<char>(std::rand());
            if (i % 3 == 2)
                std::memcpy(bytes.data() + bytes.size() - 4, "\x09\x09\x09\x09", 4);  // never its own address
            socket.Send("192.0.2.1", bytes);
        }
        socket.Send("192.0.2.1", std::string(60000, 'x'));
        socket.Send("192.0.2.1", "");
        socket.Send("192.0.2.1", good);  // the last one: when it is there, all the others have been seen
        return true;
    }));
    EXPECT_TRUE(nodes_[0]->Run([] {
        EXPECT_TRUE(Eventually([] { return Lines(ListText()).size() == 2; })) << ListText();
        EXPECT_THAT(Lines(ListText()),
                    UnorderedElementsAre("6,240,nas2,192.0.2.2,eth0", "7,250,mallory,192.0.2.3,eth0"));
        struct stat st;
        EXPECT_EQ(::stat(kList, &st), 0);
        EXPECT_EQ(st.st_uid, 0u);
        EXPECT_EQ(st.st_mode & 07777, 0644u);
        EXPECT_LT(std::atoi(Status(Pids().listener, "VmData").c_str()), 16384) << "kB";
        return true;
    }));
}

TEST_F(Daemons, CannotBeUsedToFloodAnotherHost)
{
    ASSERT_EQ(nodes_[0]->Shell(kDaemon), 0);
    const std::string query(reinterpret_cast<const char *>(stFHOSTBroadCast), sizeof stFHOSTBroadCast);
    EXPECT_TRUE(nodes_[1]->Run([&] {
        const UdpSocket socket(findhostd::kPort);
        socket.Send("192.0.2.1", query);
        EXPECT_EQ(socket.Count(), 1u);
        for (int i = 0; i < 2000; ++i)
            socket.Send("192.0.2.1", query);
        const size_t answers = socket.Count();
        EXPECT_GE(answers, 1u);
        EXPECT_LE(answers, 20u) << "2 a second, for as long as it takes to send";
        return true;
    }));
    // An asker whose address is not of this network.
    ASSERT_EQ(nodes_[2]->Shell("ifconfig eth0 198.51.100.3 netmask 255.255.255.0 && route add default dev eth0"), 0);
    ASSERT_EQ(nodes_[0]->Shell("route add default dev eth0"), 0);
    EXPECT_TRUE(nodes_[2]->Run([&] {
        const UdpSocket socket(findhostd::kPort);
        socket.Send("192.0.2.1", query);
        EXPECT_EQ(socket.Count(), 0u);
        return true;
    }));
}

// One host asks as fast as it can; another one asks once a second and is answered each time.
TEST_F(Daemons, OneHostDoesNotSilenceDiscovery)
{
    ASSERT_EQ(nodes_[0]->Shell(kDaemon), 0);
    const std::string query(reinterpret_cast<const char *>(stFHOSTBroadCast), sizeof stFHOSTBroadCast);
    const pid_t flooder = ::fork();
    if (flooder == 0) {
        nodes_[1]->Run([&] {
            const UdpSocket socket;
            for (const int64_t end = std::time(nullptr) + 30; std::time(nullptr) < end; ::usleep(1000))
                socket.Send("192.0.2.1", query);
            return true;
        });
        ::_exit(0);
    }
    EXPECT_TRUE(nodes_[2]->Run([&] {
        const UdpSocket socket(findhostd::kPort);
        for (int i = 0; i < 6; ++i) {
            ::usleep(600000);
            socket.Send("192.0.2.1", query);
            EXPECT_EQ(socket.Count(), 1u) << i;
        }
        return true;
    }));
    ::kill(flooder, SIGKILL);
    ::waitpid(flooder, nullptr, 0);
}

// Adds all addresses from 192.0.2.4 to 192.0.2.254 to those of the node.
void TakeManyAddresses(const Node &node)
{
    ASSERT_EQ(node.Shell("for net in 4/30 8/29 16/28 32/27 64/26 128/25; do "
                         "ip route add local 192.0.2.$net dev lo table local || exit 1; done"),
              0);
}

// A hostile host with 250 addresses.
class Crowd {
  public:
    Crowd()
    {
        for (int i = 4; i < 254; ++i)
            sockets_.push_back(std::make_unique<UdpSocket>(findhostd::kPort, "192.0.2." + std::to_string(i)));
    }

    // `pause` microseconds after each ten packets; what they are is random.
    void Flood(int packets, int pause, std::mt19937 &random)
    {
        const std::string query(reinterpret_cast<const char *>(stFHOSTBroadCast), sizeof stFHOSTBroadCast);
        for (int i = 0; i < packets; ++i) {
            const size_t who = random() % sockets_.size();
            const std::string own = "192.0.2." + std::to_string(who + 4);
            std::string bytes = query;
            switch (random() % 6) {
            case 0:  // a forged length
                bytes[8 + random() % (bytes.size() - 8)] = static_cast<char>(random());
                break;
            case 1:
                bytes.resize(random() % 600, static_cast<char>(random()));
                break;
            case 2:
                bytes = Reply(own.c_str(), "crowd" + std::to_string(random() % 1000));
                break;
            case 3:
                bytes = Reply("192.0.2.2", "forged");
                break;
            }
            sockets_[who]->Send("192.0.2.1", bytes);
            if (i % 10 == 9)
                Collect();
            if (pause != 0 && i % 10 == 9)
                ::usleep(static_cast<useconds_t>(pause));
        }
    }

    // The most answers that one address has got, and all of them.
    std::pair<size_t, size_t> Answers() const
    {
        size_t all = 0;
        for (const size_t one : answers_)
            all += one;
        return {*std::max_element(answers_.begin(), answers_.end()), all};
    }

    // One address a call: its queue holds many.
    void Collect()
    {
        next_ = (next_ + 1) % sockets_.size();
        answers_[next_] += sockets_[next_]->Waiting();
    }

    size_t Size() const { return sockets_.size(); }

  private:
    std::vector<std::unique_ptr<UdpSocket>> sockets_;
    std::vector<size_t> answers_ = std::vector<size_t>(250);
    size_t next_ = 0;
};

int64_t Seconds()
{
    timespec now;
    ::clock_gettime(CLOCK_MONOTONIC, &now);
    return now.tv_sec;
}

// Packets that the node's processes have sent.
long SentBy(const Node &node)
{
    return std::stol(node.Output("awk '$1 == \"Udp:\" { n = $5 } END { print n }' /proc/net/snmp"));
}

// Writable memory of both parts, in kB.
long MemoryOf(const Node &node)
{
    return std::stol(node.Output("p=$(cat /var/run/findhostd.pid); cat /proc/$p/status "
                                 "/proc/$(echo $(cat /proc/$p/task/$p/children))/status | "
                                 "awk '$1 == \"VmData:\" { n += $2 } END { print n }'"));
}

TEST_F(Daemons, AMillionHostilePacketsCostNothing)
{
    ASSERT_EQ(nodes_[0]->Shell(kDaemon), 0);
    TakeManyAddresses(*nodes_[1]);
    const auto flood = [&](int packets, unsigned seed) {
        EXPECT_TRUE(nodes_[0]->Run([] { return ErrFHOSTSendQueryPkt() == 0; }));  // from now on replies are listed
        const long before = SentBy(*nodes_[0]);
        const int64_t begin = Seconds();
        EXPECT_TRUE(nodes_[1]->Run([&] {
            Crowd crowd;
            std::mt19937 random(seed);
            crowd.Flood(packets, 0, random);
            ::usleep(200000);
            for (size_t i = 0; i < crowd.Size(); ++i)
                crowd.Collect();
            const auto seconds = static_cast<size_t>(Seconds() - begin + 2);
            const auto [most, all] = crowd.Answers();
            EXPECT_GE(all, seed == 1 ? 1u : 0u) << "the first ones of a second";
            EXPECT_LE(most, 2 * seconds) << "to one address";
            return true;
        }));
        EXPECT_LE(SentBy(*nodes_[0]) - before, 50 * (Seconds() - begin + 2) + 2) << "in all, and its own query";
    };
    const int packets = test::Rounds(1000000) / (std::getenv("TAVO_LONG_TESTS") ? 1 : 4);
    flood(packets / 10, 1);
    const long memory = MemoryOf(*nodes_[0]);
    flood(packets - packets / 10, 2);
    EXPECT_EQ(MemoryOf(*nodes_[0]), memory);
    // No host speaks for another one, and each is answered.
    EXPECT_TRUE(nodes_[0]->Run([] {
        EXPECT_THAT(ListText(), Not(HasSubstr("forged")));
        return true;
    }));
    EXPECT_TRUE(nodes_[2]->Run([] {
        const UdpSocket socket(findhostd::kPort);
        const std::string query(reinterpret_cast<const char *>(stFHOSTBroadCast), sizeof stFHOSTBroadCast);
        EXPECT_TRUE(Eventually([&] {
            socket.Send("192.0.2.1", query);
            return socket.Count() > 0;
        }));
        return true;
    }));
}

// It asks once a second, and is one of 251.
TEST_F(Daemons, ACrowdDoesNotSilenceDiscovery)
{
    ASSERT_EQ(nodes_[0]->Shell(kDaemon), 0);
    TakeManyAddresses(*nodes_[1]);
    const pid_t flooder = ::fork();
    if (flooder == 0) {
        nodes_[1]->Run([&] {
            Crowd crowd;
            std::mt19937 random(3);
            for (const int64_t end = Seconds() + 60; Seconds() < end;)
                crowd.Flood(100, 5000, random);
            return true;
        });
        ::_exit(0);
    }
    ::usleep(1000000);
    EXPECT_TRUE(nodes_[2]->Run([] {
        const UdpSocket socket(findhostd::kPort);
        const std::string query(reinterpret_cast<const char *>(stFHOSTBroadCast), sizeof stFHOSTBroadCast);
        size_t answers = 0;
        for (int second = 0; second < 10 && answers == 0; ++second) {
            socket.Send("192.0.2.1", query);
            ::usleep(500000);
            answers = socket.Count();
        }
        EXPECT_GE(answers, 1u);
        return true;
    }));
    ::kill(flooder, SIGKILL);
    ::waitpid(flooder, nullptr, 0);
}

// Every local user may ask, too, at any rate.
TEST_F(Daemons, ALocalQueryEmptiesNoList)
{
    StartAll();
    EXPECT_TRUE(nodes_[0]->Run([] {
        EXPECT_EQ(ErrFHOSTSendQueryPkt(), 0u);
        EXPECT_TRUE(Eventually([] { return Lines(ListText()).size() == 2; })) << ListText();
        const std::string query(reinterpret_cast<const char *>(stFHOSTBroadCast), sizeof stFHOSTBroadCast);
        const UdpSocket socket;
        std::set<ino_t> lists;
        for (int i = 0; i < 1000; ++i) {
            socket.Send("127.0.0.1", query);
            ::usleep(2000);
            struct stat st;
            if (::stat(kList, &st) == 0)
                lists.insert(st.st_ino);
            EXPECT_EQ(Lines(ListText()).size(), 2u);
        }
        EXPECT_LE(lists.size(), 30u) << "four a second";
        return true;
    }));
    // The other two: a later answer in the same collection does not rename a host.
    EXPECT_TRUE(nodes_[1]->Run([] {
        UdpSocket().Send("192.0.2.1", Reply("192.0.2.2", "forged"));
        return true;
    }));
    // And one that is not of the interface's network is none.
    ASSERT_EQ(nodes_[2]->Shell("ifconfig eth0 198.51.100.3 netmask 255.255.255.0 && route add default dev eth0"), 0);
    EXPECT_TRUE(nodes_[2]->Run([] {
        UdpSocket().Send("192.0.2.1", Reply("198.51.100.3", "foreign"));
        return true;
    }));
    ::usleep(600000);
    EXPECT_TRUE(nodes_[0]->Run([] {
        EXPECT_THAT(Lines(ListText()), UnorderedElementsAre("6,240,nas2,192.0.2.2,eth0", "6,240,nas3,192.0.2.3,eth0"));
        return true;
    }));
}

TEST_F(Daemons, ReplaceForeignFilesAtTheListsPath)
{
    StartAll();
    EXPECT_TRUE(nodes_[0]->Run([] {
        WriteFile("/tmp/victim", "root:x\n");
        std::filesystem::create_symlink("/tmp/victim", kList);
        EXPECT_EQ(ErrFHOSTSendQueryPkt(), 0u);
        EXPECT_TRUE(Eventually([] { return Lines(ListText()).size() == 2; })) << ListText();
        EXPECT_FALSE(std::filesystem::is_symlink(kList));
        EXPECT_EQ(ReadFile("/tmp/victim"), "root:x\n");
        std::filesystem::remove(kList);
        std::filesystem::create_directory(kList);
        EXPECT_EQ(ErrFHOSTSendQueryPkt(), 0u);
        EXPECT_TRUE(Eventually([] { return Lines(ListText()).size() == 2; })) << "in a folder's place";
        for (const auto &entry : std::filesystem::directory_iterator("/tmp"))
            EXPECT_FALSE(entry.path().filename().string().starts_with(".tavods.list")) << entry.path();
        return true;
    }));
}

}  // namespace

// The library's waiting: a tenth of the time between two looks at the list, not for the daemon, which is ready when its
// start is over, and for answers until they are there.
extern "C" unsigned sleep(unsigned seconds)
{
    if (seconds == 1)
        ::usleep(100000);
    for (int i = 0; seconds >= 10 && i < 2000 && Lines(ListText()).size() < awaited_lines; ++i)
        ::usleep(10000);
    return 0;
}
